#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <nlohmann/json_fwd.hpp>
#include <optional>
#include <string>

#include "clients/SdBus.h"

namespace ZR::Live {

/// What a manager says of itself as a JSON text, or the reason why it does not; both empty
/// where there is no bus, or where the manager is not on it.
struct BusResponse {
    std::string json;
    std::string reason;

    bool operator==(const BusResponse&) const = default;
};

/// A method that only reads.
struct BusMethod {
    std::string path;
    const char* interface;
    const char* name;
    std::optional<std::uint32_t> argument{};  ///< the only one, where it takes one
    const char* nothing = nullptr;  ///< the program's own error that says that there is none
};

/// Requests to one program on the system bus, over one connection. Starts no program, and
/// returns at the deadline at the latest, whatever the bus and the program do. Never throws
/// apart from std::bad_alloc. One thread.
class BusRequests {
  public:
    using Deadline = std::chrono::steady_clock::time_point;

    /// `program`: its name for people; `service`: its name on the bus. Neither is copied.
    BusRequests(const char* program, const char* service, Deadline deadline);
    ~BusRequests();
    BusRequests(const BusRequests&) = delete;
    BusRequests& operator=(const BusRequests&) = delete;

    /// What the method returns, or the first of several things; nullopt where there is no
    /// bus, no such program, no such object or method, or, with failure() set, where
    /// something else went wrong. Byte arrays are arrays of numbers.
    [[nodiscard]] std::optional<nlohmann::json> call(const BusMethod& method);

    /// Why the program cannot be asked, in a sentence; empty while nothing went wrong.
    /// After a failure there is no use in further calls.
    [[nodiscard]] const std::string& failure() const noexcept { return failure_; }

  private:
    void open();
    void fail(const std::string& reason);
    void fail(int error);

    const char* program_;
    const char* service_;
    Deadline deadline_;
    std::shared_ptr<const SdBus> functions_;
    BusConnection bus_;
    std::string failure_;
};

}  // namespace ZR::Live
