#pragma once

#include <array>
#include <chrono>
#include <functional>
#include <string>
#include <string_view>

#include "clients/BusRequest.h"
#include "clients/NetworkdBus.h"
#include "facts/ClientFacts.h"
#include "zrcommon/BuiltSources.h"

namespace ZR::Live {

/// Asks the NetworkManager of this machine for its devices, their leases, and what of its
/// profiles it has applied to them: { "objects": as of org.freedesktop.DBus.ObjectManager,
/// "applied": by the paths of devices }.
[[nodiscard]] BusResponse askNetworkManager(BusRequests::Deadline deadline);

/// Puts in the place of what its state files tell what it says itself. Returns why that
/// cannot be used, empty when it can; then nothing was changed.
[[nodiscard]] std::string_view addNetworkManagerDescription(std::string_view json,
                                                            ClientFacts& facts);

/// Asks the connman of this machine for its services: an array of [path, properties].
[[nodiscard]] BusResponse askConnman(BusRequests::Deadline deadline);

/// Adds the links on which connman asks for addresses or has them, and those that it got. It
/// names no servers and no times. Returns why the text cannot be used, empty when it can.
[[nodiscard]] std::string_view addConnmanServices(std::string_view json, ClientFacts& facts);

/// Whether the build has what asks a manager over the system bus.
[[nodiscard]] constexpr bool isAskable(Client manager) {
    return Built::has("bus") && isBuilt(manager);
}

/// In place of asking one.
template <Client manager>
[[nodiscard]] BusResponse doNotAsk(BusRequests::Deadline /*deadline*/) {
    return {.json = {},
            .reason = std::string{nameOf(manager)} +
                      " runs, which this build does not ask over the system bus"};
}

using WayToAsk = BusResponse (*)(BusRequests::Deadline);
template <Client manager>
[[nodiscard]] constexpr WayToAsk wayToAsk() {
    if constexpr (!isAskable(manager)) {
        return doNotAsk<manager>;
    } else if constexpr (manager == Client::Networkd) {
        return askNetworkd;
    } else if constexpr (manager == Client::NetworkManager) {
        return askNetworkManager;
    } else {
        static_assert(manager == Client::Connman);
        return askConnman;
    }
}

/// Asks those managers over the system bus that run and can be asked there: they know more
/// than their files tell. One that does not respond in time is left alone for a while, as
/// each request to it would make a reading wait: for a second, and twice as long each time
/// up to half a minute. Until it responds, each reading has it among the unheard managers,
/// and the reason among its diagnostics. One thread.
class ManagerBuses {
  public:
    using Time = std::chrono::steady_clock::time_point;
    using Ask = std::function<BusResponse(BusRequests::Deadline)>;

    /// How each is asked; one without a way is not.
    struct Ways {
        Ask networkd = wayToAsk<Client::Networkd>();
        Ask networkManager = wayToAsk<Client::NetworkManager>();
        Ask connman = wayToAsk<Client::Connman>();
    };

    explicit ManagerBuses(Ways ways);

    /// Adds to the facts, which have those of the files already, what the managers say.
    /// `now`: the time since the start of the system, by whatever clock.
    void consult(ClientFacts& facts, Time now);

  private:
    struct Manager {
        Client client{};
        Ask ask;
        /// Returns why the text cannot be used, empty when it can.
        std::string_view (*add)(std::string_view json, ClientFacts& facts) = nullptr;
        Time rest{};                   ///< not to be asked before
        std::chrono::seconds pause{};  ///< the last one; 0 when it responded
        std::string reason{};          ///< why it did not respond
    };

    [[nodiscard]] static bool hear(const Manager& manager, std::string_view json,
                                   ClientFacts& facts);

    std::array<Manager, 3> managers_;
};

}  // namespace ZR::Live
