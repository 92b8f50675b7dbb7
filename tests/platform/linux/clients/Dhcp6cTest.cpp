#include "clients/Dhcp6c.h"

#include <gtest/gtest.h>

#include <sstream>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

std::optional<ClientProcess> parsedDhcp6c(std::vector<std::string_view> arguments) {
    return parseDhcp6cArguments(arguments);
}

TEST(Dhcp6cArguments, Captured) {
    const std::string line = sample("wide-dhcpv6/proc-cmdline.txt");
    std::istringstream words{line};
    std::vector<std::string> texts;
    for (std::string word; words >> word;) {
        texts.push_back(word);
    }
    EXPECT_EQ(
        parsedDhcp6c({texts.begin(), texts.end()}),
        (ClientProcess{
            .client = Client::Dhcp6c, .interfaces = {"eth1"_name}, .leaseFile = "", .ipv6 = true}));
}

TEST(Dhcp6cArguments, ItsInterfacesStandBehindTheOptions) {
    EXPECT_EQ(parsedDhcp6c({"/usr/sbin/dhcp6c", "-Pdefault", "-p", "/run/dhcp6c.pid", "-c", "conf",
                            "-f", "eth1", "eth2"}),
              (ClientProcess{.client = Client::Dhcp6c,
                             .interfaces = {"eth1"_name, "eth2"_name},
                             .leaseFile = "",
                             .ipv6 = true}));
    EXPECT_EQ(parsedDhcp6c({}), std::nullopt);
}

}  // namespace
}  // namespace ZR::Live
