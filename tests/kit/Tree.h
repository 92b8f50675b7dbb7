#pragma once

#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

/// Instrumentation trees for tests of the provider: written as JSON files and read
/// by the real source, as an administrator's file would be.
namespace test {

using Json = nlohmann::ordered_json;

/// An interface node. Properties as the tree's JSON has them; "Name" is added.
inline Json interface(const std::string& name, Json properties = Json::object()) {
    properties["Name"] = name;
    return {{"type", "NetworkInterface"},
            {"description", "Ethernet interface " + name},
            {"properties", std::move(properties)}};
}

/// An interface that takes its address from DHCP, active, with these servers.
inline Json dhcpInterface(const std::string& name, const std::vector<std::string>& servers = {}) {
    return interface(name, {{"DHCPEnabled", true},
                            {"AddressSource", 1},
                            {"InterfaceState", 1},
                            {"NameMaxLength", 15},
                            {"DHCPServerAddresses", servers}});
}

/// An interface with a fixed address.
inline Json staticInterface(const std::string& name) {
    return interface(name, {{"DHCPEnabled", false}, {"AddressSource", 3}, {"InterfaceState", 1}});
}

/// A computer with its interfaces, two levels above them.
inline Json computer(const std::string& description, const std::string& name,
                     const std::vector<Json>& interfaces) {
    return {{"type", "ComputerSystem"},
            {"description", description},
            {"properties", {{"Name", name}}},
            {"children",
             {{{"type", "Network"}, {"description", "Network"}, {"children", interfaces}}}}};
}

inline Json host(const std::vector<Json>& interfaces) {
    return computer("Computer", "${HOSTNAME}", interfaces);
}

inline Json serviceProcessor(const std::vector<Json>& interfaces) {
    return computer("BMC", "BMC:-1", interfaces);
}

/// Tests on a tree of their own and on a data directory of their own. The platform
/// settings of the process name both; they are set before main.
class TreeTest : public ::testing::Test {
  public:
    /// Puts a new tree in place; the next selection of a node type sees it.
    static void setTree(const std::vector<Json>& nodes);

    /// The directory of the ifcfg files, with its end separator.
    static const std::string& dataDirectory();

    static std::string hostName();

  protected:
    void SetUp() override { setTree({}); }
};

}  // namespace test
