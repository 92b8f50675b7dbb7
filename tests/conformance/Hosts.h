#pragma once

#include <functional>
#include <memory>
#include <optional>
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
    /// Without a list, all properties of the instance are meant.
    virtual Response modify(const cimom::Instance& instance,
                            const std::optional<Texts>& properties) = 0;
};

/// A kind of object manager. One at a time: the library knows one broker.
struct HostKind {
    std::string name;
    std::function<std::unique_ptr<Host>()> make;
    /// Whether nothing stands between clients and providers, so that the responses to
    /// requests that name unknown things are the providers'.
    bool isBare = false;
};

/// For the names of tests.
inline std::ostream& operator<<(std::ostream& out, const HostKind& kind) {
    return out << kind.name;
}

/// The strict host with each of the traits that this build tests, the embedded object
/// manager unless its server stands for it, too, and its server over HTTP.
std::vector<HostKind> hostKinds();

}  // namespace conformance
