#pragma once

#include <string>
#include <vector>

#include "kit/Host.h"
#include "kit/Tree.h"

namespace test {

using Texts = std::vector<std::string>;

/// A path in few words: the class without its prefix, and the key that tells one
/// object from the other. References are written in brackets, in the order of roles.
std::string brief(const std::optional<cimom::ObjectPath>& path);

/// All that a response has, paths or instances.
Texts briefs(const Host::Response& response);

/// A path of the default namespace from its text, with this host's name for "@".
cimom::ObjectPath pathFrom(const std::string& text);

/// The text of a path of one of the classes at the ends of associations: the object
/// of this interface, with "@" for the host's name. An access point is that of the
/// interface's server at an IPv4 address.
std::string endPath(const std::string& className, const std::string& interface);

/// The texts with this host's name for "@".
Texts ofHost(const Texts& texts);
std::string ofHost(const std::string& text);

/// One machine for the tests of the associations: a host with three DHCP
/// interfaces, one of which has two servers, a static one, and a service processor.
class MachineTest : public TreeTest {
  protected:
    void SetUp() override;

    static cimom::ObjectPath endpoint(const std::string& name);
    static cimom::ObjectPath computer(const std::string& name);
};

}  // namespace test
