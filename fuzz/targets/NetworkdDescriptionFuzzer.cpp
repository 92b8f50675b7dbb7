// The JSON in which networkd describes itself over D-Bus.
#include <nlohmann/json.hpp>

#include "Input.h"
#include "clients/NetworkdBus.h"
#include "support/Addresses.h"

namespace {

using Addresses = std::vector<ZR::Live::NetworkdAddress>;

std::string written(const Addresses& addresses) {
    nlohmann::json links = nlohmann::json::array();
    for (const auto& address : addresses) {
        nlohmann::json each{{"Family", address.address.family()},
                            {"Address", fuzz::addressBytes(address.address)},
                            {"ConfigSource", address.source}};
        if (address.provider) {
            each["ConfigProvider"] = fuzz::addressBytes(*address.provider);
        }
        links.push_back(nlohmann::json{{"Index", address.ifindex},
                                       {"Addresses", nlohmann::json::array({each})}});
    }
    return nlohmann::json{{"Interfaces", links}}.dump();
}

void checkFacts(const Addresses& addresses) {
    ZR::Live::ClientFacts facts;
    facts.managements.push_back({.client = ZR::Live::Client::Networkd,
                                 .ifindex = 2,
                                 .dhcp4 = {},
                                 .dhcp6 = {},
                                 .staticAddresses = {}});
    ZR::Live::addNetworkdDescription(addresses, facts);
    fuzz::require(facts.leases.size() <= addresses.size(), "an address is leased once");
    ZR::Live::ClientFacts twice = facts;
    ZR::Live::addNetworkdDescription(addresses, twice);
    fuzz::require(twice == facts, "what is known already is not added");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto parsed = ZR::Live::parseNetworkdDescription(fuzz::text(data, size));
    const auto* const addresses = std::get_if<Addresses>(&parsed);
    if (addresses == nullptr) {
        return 0;
    }
    const auto again = ZR::Live::parseNetworkdDescription(written(*addresses));
    fuzz::require(again == parsed, "addresses survive being written");
    checkFacts(*addresses);
    return 0;
}
