#include "kit/TreeMachine.h"

#include <cstdlib>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "kit/Files.h"

namespace test {
namespace {

using Json = nlohmann::ordered_json;

Json interface(const std::string& name, Json properties) {
    properties["Name"] = name;
    return {{"type", "NetworkInterface"},
            {"description", "Ethernet interface " + name},
            {"properties", std::move(properties)}};
}

Json dhcpInterface(const std::string& name, const std::string& address,
                   const std::vector<std::string>& servers) {
    return interface(name, {{"DHCPEnabled", true},
                            {"AddressSource", 1},
                            {"InterfaceState", 1},
                            {"NameMaxLength", 15},
                            {"IPv4Address", address},
                            {"DHCPServerAddresses", servers}});
}

}  // namespace

TreeMachine::TreeMachine() {
    ::setenv("ZR_INSTRUMENTATION_TREE", (directory_ / "tree.json").c_str(), 1);
}

std::string TreeMachine::tree(unsigned state) {
    std::vector<Json> interfaces{
        interface("eth1", {{"DHCPEnabled", false}, {"AddressSource", 3}, {"InterfaceState", 1}}),
        dhcpInterface("eth0", "192.0.2.10", {"192.0.2." + std::to_string(100 + state)})};
    if (state % 2 == 1) {
        interfaces.push_back(dhcpInterface("eth2", "192.0.2.12", {"192.0.2.1", "2001:db8::1"}));
    }
    return Json{
        {"nodes",
         {{{"type", "ComputerSystem"},
           {"description", "Computer"},
           {"properties", {{"Name", "${HOSTNAME}"}}},
           {"children",
            {{{"type", "Network"}, {"description", "Network"}, {"children", interfaces}}}}}}}}
        .dump();
}

void TreeMachine::enter(unsigned state) {
    ZR::Testing::writeFile(directory_ / "next", tree(state));
    std::filesystem::rename(directory_ / "next", directory_ / "tree.json");
}

}  // namespace test
