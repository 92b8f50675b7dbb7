// The tree tells more of an interface's leases than the classes have properties for. The
// library as it is deployed must give the same with and without.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "kit/Files.h"
#include "kit/ProviderHost.h"
#include "kit/Script.h"
#include "kit/TreeMachine.h"

namespace test {
namespace {

using Json = nlohmann::ordered_json;

/// What an object manager has loaded, and the tree that it reads.
class LeaseNodesTest : public ::testing::Test {
  protected:
    LeaseNodesTest() {
        ::setenv("ZR_INSTRUMENTATION_TREE", (directory_ / "tree.json").c_str(), 1);
        ::setenv("ZR_DATA_DIR", directory_.path().c_str(), 1);
        ::setenv("ZR_LOG_SINK", "none", 1);
    }

    void enter(const Json& tree) {
        ZR::Testing::writeFile(directory_ / "next", tree.dump());
        std::filesystem::rename(directory_ / "next", directory_ / "tree.json");
    }

    ScriptResponse ask(const ScriptRequest& request) {
        ZR::Testing::writeFile(directory_ / "ifcfg-eth0", "CONFIG_NAME=old\n");
        return host().run(request);
    }

    /// Loaded with the environment in place.
    ProviderHost& host() {
        if (!host_) {
            host_ = std::make_unique<ProviderHost>();
        }
        return *host_;
    }

  private:
    ZR::Testing::TemporaryDirectory directory_;
    std::unique_ptr<ProviderHost> host_;
};

/// A lease of each family, and a client that asks, below each interface: with the properties
/// of interfaces and computers, too, which must not be taken for theirs.
Json withLeases(Json tree) {
    for (Json& interface : tree["nodes"][0]["children"][0]["children"]) {
        for (const char* family : {"IPv4", "IPv6"}) {
            interface["children"].push_back({{"type", "DHCPLease"},
                                             {"description", "DHCP lease"},
                                             {"properties",
                                              {{"Family", family},
                                               {"ClientState", 8},
                                               {"Address", "192.0.2.77"},
                                               {"ServerAddress", "192.0.2.78"},
                                               {"LeaseObtained", 1'800'000'000},
                                               {"LeaseExpires", 1'800'000'600},
                                               {"OptionsReceived", {1, 3, 51}},
                                               {"Client", "dhclient"},
                                               {"Process", 17},
                                               {"Name", "lease"},
                                               {"DHCPEnabled", true},
                                               {"AddressSource", 1},
                                               {"DHCPServerAddresses", {"192.0.2.79"}}}}});
        }
        interface["children"].push_back({{"type", "DHCPLease"},
                                         {"description", "DHCP lease"},
                                         {"properties", {{"Family", "IPv4"}, {"ClientState", 0}}}});
    }
    return tree;
}

TEST_F(LeaseNodesTest, ChangeNothingForTheClasses) {
    const Json plain = Json::parse(TreeMachine::tree(1));
    std::vector<ScriptResponse> before;
    enter(plain);
    for (const ScriptRequest& request : script()) {
        before.push_back(ask(request));
    }
    EXPECT_TRUE(std::any_of(before.begin(), before.end(), [](const ScriptResponse& response) {
        return response.objects.size() > 1;
    })) << "there is nothing to compare";
    enter(withLeases(plain));
    for (std::size_t i = 0; i < script().size(); ++i) {
        EXPECT_EQ(ask(script()[i]), before[i]) << script()[i];
    }
}

}  // namespace
}  // namespace test
