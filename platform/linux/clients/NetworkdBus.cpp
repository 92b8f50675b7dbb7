#include "clients/NetworkdBus.h"

#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <memory>
#include <nlohmann/json.hpp>
#include <optional>
#include <utility>

#include "clients/SdBus.h"
#include "formats/SystemErrors.h"

namespace ZR::Live {
namespace {

using Json = nlohmann::json;
using Deadline = std::chrono::steady_clock::time_point;

constexpr const char* service = "org.freedesktop.network1";
constexpr std::string_view origin = "D-Bus org.freedesktop.network1";

/// The address in an array of the numbers of its bytes; nullopt for anything else.
std::optional<IpAddress> addressOf(const Json& value, int family) {
    std::vector<std::byte> bytes;
    if (!value.is_array()) {
        return std::nullopt;
    }
    for (const Json& number : value) {
        if (!number.is_number_unsigned() || number.get<std::uint64_t>() > UINT8_MAX) {
            return std::nullopt;
        }
        bytes.push_back(static_cast<std::byte>(number.get<std::uint8_t>()));
    }
    return IpAddress::fromBytes(family, bytes);
}

/// The member of an object; null where it has none, or is not an object.
const Json& member(const Json& object, const char* name) {
    static const Json none;
    if (!object.is_object()) {
        return none;
    }
    const auto found = object.find(name);
    return found == object.end() ? none : *found;
}

std::string textOf(const Json& value) {
    return value.is_string() ? value.get<std::string>() : std::string{};
}

void addAddresses(const Json& link, std::vector<NetworkdAddress>& addresses) {
    const Json& index = member(link, "Index");
    const Json& list = member(link, "Addresses");
    if (!index.is_number_unsigned() || index.get<std::uint64_t>() > UINT32_MAX ||
        !list.is_array()) {
        return;
    }
    for (const Json& each : list) {
        const Json& number = member(each, "Family");
        if (number != AF_INET && number != AF_INET6) {
            continue;
        }
        const int family = number.get<std::uint8_t>();
        if (const auto address = addressOf(member(each, "Address"), family)) {
            addresses.push_back({.ifindex = index.get<std::uint32_t>(),
                                 .address = *address,
                                 .source = textOf(member(each, "ConfigSource")),
                                 .provider = addressOf(member(each, "ConfigProvider"), family)});
        }
    }
}

struct CloseBus {
    void operator()(sd_bus* bus) const noexcept { SdBus::get()->closeUnref(bus); }
};
using Bus = std::unique_ptr<sd_bus, CloseBus>;

struct UnrefMessage {
    void operator()(sd_bus_message* message) const noexcept { SdBus::get()->messageUnref(message); }
};
using BusMessage = std::unique_ptr<sd_bus_message, UnrefMessage>;

/// Frees what a failed call leaves.
class BusError {
  public:
    BusError() = default;
    BusError(const BusError&) = delete;
    BusError& operator=(const BusError&) = delete;
    ~BusError() { SdBus::get()->errorFree(&error_); }

    sd_bus_error* get() noexcept { return &error_; }
    [[nodiscard]] bool is(const char* name) const noexcept {
        return SdBus::get()->errorHasName(&error_, name) != 0;
    }

  private:
    sd_bus_error error_{};
};

/// Microseconds to a deadline; 0 when it has passed.
std::uint64_t left(Deadline deadline) {
    const auto time = std::chrono::duration_cast<std::chrono::microseconds>(
        deadline - std::chrono::steady_clock::now());
    return static_cast<std::uint64_t>(std::max<std::int64_t>(time.count(), 0));
}

/// Waits until the bus has accepted the connection. The library's own calls would wait for
/// that without a limit. Returns an errno, 0 for none.
int awaitReady(sd_bus* bus, Deadline deadline) {
    for (;;) {
        const int ready = SdBus::get()->isReady(bus);
        if (ready != 0) {
            return ready < 0 ? -ready : 0;
        }
        const int done = SdBus::get()->process(bus, nullptr);
        if (done < 0) {
            return -done;
        }
        if (done == 0) {
            const std::uint64_t time = left(deadline);
            if (time == 0) {
                return ETIMEDOUT;
            }
            if (const int waited = SdBus::get()->wait(bus, time); waited < 0 && waited != -EINTR) {
                return -waited;
            }
        }
    }
}

NetworkdResponse failure(const std::string& reason) {
    return {.json = {}, .reason = "systemd-networkd cannot be asked: " + reason};
}

NetworkdResponse failure(int error) {
    return failure(reasonOf(error));
}

}  // namespace

Parsed<std::vector<NetworkdAddress>> parseNetworkdDescription(std::string_view json) {
    const Json document = Json::parse(json, nullptr, false);
    if (!document.is_object()) {
        return std::string_view{"not a JSON object"};
    }
    std::vector<NetworkdAddress> addresses;
    const Json& links = member(document, "Interfaces");
    if (links.is_array()) {
        for (const Json& link : links) {
            addAddresses(link, addresses);
        }
    } else {
        addAddresses(document, addresses);
    }
    return addresses;
}

NetworkdResponse askNetworkd(Deadline deadline) {
    const std::shared_ptr<const SdBus> functions = SdBus::get();
    if (!functions->missing().empty()) {
        return failure(functions->missing());
    }
    sd_bus* opened = nullptr;
    const int open = functions->openSystem(&opened);
    const Bus bus{opened};
    if (open < 0) {
        // Many a machine has networkd and no bus.
        return open == -ENOENT || open == -ECONNREFUSED ? NetworkdResponse{} : failure(-open);
    }
    if (const int error = awaitReady(bus.get(), deadline); error != 0) {
        return failure(error);
    }
    sd_bus_message* made = nullptr;
    const int make =
        functions->newMethodCall(bus.get(), &made, service, "/org/freedesktop/network1",
                                 "org.freedesktop.network1.Manager", "Describe");
    const BusMessage request{made};
    if (make < 0) {
        return failure(-make);
    }
    if (const int set = functions->setAutoStart(request.get(), 0); set < 0) {
        return failure(-set);
    }
    BusError error;
    sd_bus_message* responded = nullptr;
    // A timeout of 0 would mean the library's own of 25 seconds.
    const int call =
        functions->call(bus.get(), request.get(), std::max<std::uint64_t>(left(deadline), 1),
                        error.get(), &responded);
    const BusMessage response{responded};
    if (call < 0) {
        const bool absent = error.is(SD_BUS_ERROR_SERVICE_UNKNOWN) ||
                            error.is(SD_BUS_ERROR_NAME_HAS_NO_OWNER) ||
                            error.is(SD_BUS_ERROR_UNKNOWN_METHOD);  // before version 250
        return absent ? NetworkdResponse{} : failure(-call);
    }
    const char* text = nullptr;
    if (const int read = functions->readBasic(response.get(), SD_BUS_TYPE_STRING, &text);
        read < 0) {
        return failure(-read);
    }
    return {.json = text, .reason = {}};
}

void addNetworkdDescription(const std::vector<NetworkdAddress>& addresses, ClientFacts& facts) {
    for (const NetworkdAddress& address : addresses) {
        const auto isOfThatLink = [&](const auto& fact) {
            return fact.client == Client::Networkd && fact.ifindex == address.ifindex;
        };
        if (address.source == "DHCPv4" || address.source == "DHCPv6") {
            const bool known =
                std::any_of(facts.leases.begin(), facts.leases.end(), [&](const Lease& lease) {
                    return isOfThatLink(lease) && lease.address == address.address;
                });
            if (!known) {
                facts.leases.push_back({.client = Client::Networkd,
                                        .interfaceName = {},
                                        .ifindex = address.ifindex,
                                        .address = address.address,
                                        .server = address.provider,
                                        .clientAlive = true,
                                        .expires = {},
                                        .origin = std::string{origin}});
            }
        } else if (address.source == "static" && address.address.isIPv4()) {
            const auto management =
                std::find_if(facts.managements.begin(), facts.managements.end(), isOfThatLink);
            if (management != facts.managements.end()) {
                auto& told = management->staticAddresses;
                if (std::find(told.begin(), told.end(), address.address) == told.end()) {
                    told.push_back(address.address);
                }
            }
        }
    }
}

}  // namespace ZR::Live
