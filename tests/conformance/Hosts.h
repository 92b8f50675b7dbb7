#pragma once

#include <functional>
#include <memory>
#include <ostream>
#include <string>
#include <vector>

#include "Request.h"

namespace conformance {

/// An object manager with the providers in it, as a client sees it.
class Host {
  public:
    Host() = default;
    virtual ~Host() = default;
    Host(const Host&) = delete;
    Host& operator=(const Host&) = delete;

    virtual Response ask(const Request& request) = 0;
};

/// A kind of object manager. One at a time: the library knows one broker.
struct HostKind {
    std::string name;
    std::function<std::unique_ptr<Host>()> make;
    /// Whether it adds defaults of its schema to instances, whatever properties were asked
    /// for.
    bool addsDefaults = false;
    /// Whether nothing stands between clients and providers, so that the responses to
    /// requests that name unknown things are the providers'.
    bool isBare = false;
};

/// For the names of tests.
inline std::ostream& operator<<(std::ostream& out, const HostKind& kind) {
    return out << kind.name;
}

/// The strict host with each of its traits, the embedded object manager, and its server
/// over HTTP.
std::vector<HostKind> hostKinds();

}  // namespace conformance
