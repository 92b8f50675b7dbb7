#include "Dhcp6c.h"

#include <gtest/gtest.h>

namespace ZR::Live {
namespace {

std::optional<ClientProcess> parse(std::vector<std::string_view> arguments) {
    return parseDhcp6cArguments(arguments);
}

TEST(Dhcp6cArguments, ItsInterfacesStandBehindTheOptions) {
    EXPECT_EQ(parse({"/usr/sbin/dhcp6c", "-Pdefault", "-p", "/run/dhcp6c.pid", "-c", "conf", "-f",
                     "eth1", "eth2"}),
              (ClientProcess{.client = Client::Dhcp6c,
                             .interfaces = {"eth1", "eth2"},
                             .leaseFile = "",
                             .ipv6 = true}));
    EXPECT_EQ(parse({}), std::nullopt);
}

}  // namespace
}  // namespace ZR::Live
