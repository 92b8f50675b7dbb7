// The JSON in which networkd describes itself over D-Bus.
#include <nlohmann/json.hpp>

#include "Input.h"
#include "clients/NetworkdBus.h"
#include "support/Texts.h"

namespace {

using ZR::Live::NetworkdDescription;

std::string written(const NetworkdDescription& description) {
    nlohmann::json links = nlohmann::json::array();
    for (const auto& address : description.addresses) {
        nlohmann::json each{{"Family", address.address.family()},
                            {"Address", fuzz::addressBytes(address.address)},
                            {"ConfigSource", address.source}};
        if (address.provider) {
            each["ConfigProvider"] = fuzz::addressBytes(*address.provider);
        }
        if (address.validUntil) {
            each["ValidLifetimeUSec"] = *address.validUntil;
        }
        links.push_back(nlohmann::json{{"Index", address.ifindex},
                                       {"Addresses", nlohmann::json::array({each})}});
    }
    return nlohmann::json{{"Interfaces", links}}.dump();
}

void checkFacts(const NetworkdDescription& description) {
    ZR::Live::ClientFacts facts;
    facts.managements.push_back({.client = ZR::Live::Client::Networkd,
                                 .ifindex = 2,
                                 .dhcp4 = {},
                                 .dhcp6 = {},
                                 .staticAddresses = {}});
    constexpr std::int64_t start = 1'795'213'000'000'000;
    ZR::Live::addNetworkdDescription(description, start, facts);
    fuzz::require(facts.leases.size() <= description.addresses.size(), "an address is leased once");
    ZR::Live::ClientFacts twice = facts;
    ZR::Live::addNetworkdDescription(description, start, twice);
    fuzz::require(twice == facts, "what is known already is not added");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto parsed = ZR::Live::parseNetworkdDescription(fuzz::text(data, size));
    const auto* const description = std::get_if<NetworkdDescription>(&parsed);
    if (description == nullptr) {
        return 0;
    }
    const auto again = ZR::Live::parseNetworkdDescription(written(*description));
    const auto* const same = std::get_if<NetworkdDescription>(&again);
    fuzz::require(same != nullptr && same->addresses == description->addresses,
                  "addresses survive being written");
    checkFacts(*description);
    return 0;
}
