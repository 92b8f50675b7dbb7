#pragma once

#include <cmpift.h>

#include <memory>
#include <ostream>
#include <string>
#include <vector>

#include "broker/Broker.h"
#include "cimom/ObjectManager.h"
#include "kit/Script.h"

namespace test {

/// What a request gave, as text that can be compared and printed.
struct ScriptResponse {
    int code = 0;
    std::string message;
    std::vector<std::string> objects;  ///< a path, or a path and its properties, each

    bool operator==(const ScriptResponse&) const = default;
};

inline std::ostream& operator<<(std::ostream& out, const ScriptResponse& response) {
    out << "status " << response.code << ' ' << response.message << '\n';
    for (const std::string& object : response.objects) {
        out << object << '\n';
    }
    return out;
}

/// The object manager with the provider's library as it is deployed, loaded at the
/// start and unloaded at the end. Requests may come from many threads. One at a time:
/// the library is one in a process, and works for whom it met last. Copies of it in
/// other directories are others.
class ProviderHost {
  public:
    explicit ProviderHost(const std::string& directory = builtLibraries());
    ~ProviderHost();
    ProviderHost(const ProviderHost&) = delete;
    ProviderHost& operator=(const ProviderHost&) = delete;

    ScriptResponse run(const ScriptRequest& request);

    /// The file name of the library.
    static constexpr const char* library = "libDHCPClientProvider.so";
    static std::string builtLibraries();

  private:
    struct Closed {
        void operator()(void* handle) const noexcept;
    };
    ScriptResponse runDirectly(const ScriptRequest& request, const cimom::ObjectPath& path);

    cimom::ObjectManager manager_;
    // For what the object manager does not offer: the same library's table, asked with
    // a broker of its own.
    cimom::broker::Broker broker_;
    std::unique_ptr<void, Closed> handle_;
    CMPIInstanceMI* instance_ = nullptr;
};

}  // namespace test
