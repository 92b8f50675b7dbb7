#include "NamespaceMachine.h"

#include <cstdlib>
#include <filesystem>

#include "kit/Files.h"
#include "kit/Namespaces.h"

namespace test {

LiveMachine::LiveMachine() {
    ::unsetenv("ZR_INSTRUMENTATION_TREE");
    ZR::Live::run("ip link add eth0 type bridge");
    ZR::Live::run("ip addr add 198.51.100.106/24 dev eth0 valid_lft 6000 preferred_lft 6000");
    std::filesystem::create_directory("/var/lib/dhcp");
}

void LiveMachine::enter(unsigned state) {
    const std::string server = "198.51.100." + std::to_string(1 + state);
    ZR::Testing::writeFile("/var/lib/dhcp/next",
                           "lease {\n"
                           "  interface \"eth0\";\n"
                           "  fixed-address 198.51.100.106;\n"
                           "  option dhcp-lease-time 600;\n"
                           "  option dhcp-server-identifier " +
                               server +
                               ";\n"
                               "  expire 5 2099/11/20 23:19:41;\n"
                               "}\n");
    std::filesystem::rename("/var/lib/dhcp/next", "/var/lib/dhcp/dhclient.eth0.leases");
}

}  // namespace test
