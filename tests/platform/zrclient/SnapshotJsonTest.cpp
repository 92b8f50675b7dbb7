#include "zrclient/SnapshotJson.h"

#include <algorithm>

#include "kit/ZrclientSupport.h"
#include "sources/JsonTreeSource.h"

namespace ZR::Testing {
namespace {

using NodeLexicon::Properties;

std::shared_ptr<const Snapshot> everyKind() {
    SnapshotBuilder builder;
    const auto computer = builder.add(Snapshot::none, "ComputerSystem", "Computer \"A\"\n\\");
    builder.property(Properties::Name, std::string("host/1%"), true);
    const auto network = builder.add(computer, "Network", "Network");
    builder.add(network, "NetworkInterface", "Ethernet interface");
    builder.property(Properties::IPv4Address, std::string("192.0.2.17"));
    builder.property(Properties::Name, std::string("\xc3\xa4th0"), true);
    builder.property(Properties::NameMaxLength, std::uint64_t{UINT64_MAX});
    builder.property(Properties::DHCPEnabled, false);
    builder.property(Properties::AddressSource, PropertyValue(), true);
    builder.property(Properties::DHCPServerAddresses, std::vector<std::string>{"192.0.2.1", ""});
    const auto twin = builder.add(network, "NetworkInterface", "twin");
    builder.add(twin, "DHCPLease", "DHCP lease");
    builder.property(Properties::LeaseExpires, NodeLexicon::never);
    builder.property(Properties::OptionsReceived, NumberList{{1, 54, 119}});
    builder.add(twin, "NetworkInterface", "below");
    builder.property(Properties::DHCPServerAddresses, std::vector<std::string>{});
    builder.add(network, "NetworkInterface", "twin");
    builder.add(Snapshot::none, "ComputerSystem", "");
    return builder.build();
}

TEST(SnapshotJson, WritesWhatIsReadBackAsEqual) {
    const auto snapshot = everyKind();
    EXPECT_TRUE(*parsed(toJson(*snapshot)) == *snapshot) << toJson(*snapshot);
}

TEST(SnapshotJson, WritesAFileThatTheSourceReadsBackAsEqual) {
    const TemporaryDirectory directory;
    const auto snapshot = everyKind();
    writeFile(directory / "tree.json", toJson(*snapshot));
    const auto again = JsonTreeSource(directory / "tree.json").read();
    // It tells of the oddities in it, besides.
    EXPECT_EQ(toJson(*again), toJson(*snapshot));
    EXPECT_TRUE(std::ranges::equal(again->nodes(), snapshot->nodes()));
}

TEST(SnapshotJson, DifferentTreesAreNotEqual) {
    const auto snapshot = everyKind();
    std::string other = toJson(*snapshot);
    other.replace(other.find("192.0.2.17"), 10, "192.0.2.18");
    EXPECT_FALSE(*parsed(other) == *snapshot);
}

TEST(SnapshotJson, IsIndentedByTwo) {
    SnapshotBuilder builder;
    const auto computer = builder.add(Snapshot::none, "ComputerSystem", "Computer");
    builder.property(Properties::Name, std::string("host"), true);
    builder.add(computer, "Network", "Network");
    EXPECT_EQ(toJson(*builder.build()), R"({
  "nodes": [
    {
      "type": "ComputerSystem",
      "description": "Computer",
      "properties": {
        "Name": "host"
      },
      "readOnly": [
        "Name"
      ],
      "children": [
        {
          "type": "Network",
          "description": "Network"
        }
      ]
    }
  ]
}
)");
}

TEST(SnapshotJson, AnEmptyTreeHasNoNodes) {
    EXPECT_EQ(toJson(*SnapshotBuilder().build()), "{\n  \"nodes\": []\n}\n");
}

TEST(SnapshotJson, StaysJsonWithBytesThatAreNoText) {
    SnapshotBuilder builder;
    builder.add(Snapshot::none, "T", "\xff\xfe");
    EXPECT_EQ(parsed(toJson(*builder.build()))->node(0).description, "\xef\xbf\xbd\xef\xbf\xbd");
}

TEST(SnapshotJson, TheNameOfTheMachineItselfIsWrittenForAnyMachine) {
    SnapshotBuilder builder;
    const auto computer = builder.add(Snapshot::none, "ComputerSystem", "Computer");
    builder.property(Properties::Name, std::string("testhost"));
    builder.add(computer, "NetworkInterface", "testhost");
    builder.property(Properties::Name, std::string("testhost"));
    builder.add(Snapshot::none, "ComputerSystem", "BMC");
    builder.property(Properties::Name, std::string("testhost"));
    builder.add(Snapshot::none, "ComputerSystem", "another");
    builder.property(Properties::Name, std::string("testhost.example"));
    const auto snapshot = builder.build();
    const std::string json = toJson(*snapshot, "testhost");
    EXPECT_NE(json.find("\"Name\": \"${HOSTNAME}\""), std::string::npos) << json;
    EXPECT_EQ(json.find("${HOSTNAME}"), json.rfind("${HOSTNAME}")) << "the computer's alone";
    EXPECT_TRUE(*parsed(json) == *snapshot);
    EXPECT_EQ(toJson(*snapshot).find("${HOSTNAME}"), std::string::npos);
    EXPECT_EQ(toJson(*snapshot, "").find("${HOSTNAME}"), std::string::npos);
}

TEST(SnapshotJson, TenThousandInterfacesComeBackEqual) {
    SnapshotBuilder builder;
    const auto computer = builder.add(Snapshot::none, "ComputerSystem", "Computer");
    for (unsigned number = 0; number < 10'000; ++number) {
        builder.add(computer, "NetworkInterface", "Ethernet interface");
        builder.property(Properties::Name, "eth" + std::to_string(number));
    }
    const auto snapshot = builder.build();
    EXPECT_TRUE(*parsed(toJson(*snapshot)) == *snapshot);
}

TEST(SnapshotJson, WhereAPropertyCameFromIsWrittenAndPassedOver) {
    const auto build = [](const std::string& origin) {
        SnapshotBuilder builder;
        builder.origin(origin);
        builder.add(Snapshot::none, "ComputerSystem", "Computer");
        builder.property(Properties::Name, std::string("host"));
        return builder.build();
    };
    const std::string json = toJson(*build("a file"));
    EXPECT_NE(json.find(R"("origins": {
        "Name": "a file"
      })"),
              std::string::npos)
        << json;
    EXPECT_TRUE(*parsed(json) == *build(""));
    EXPECT_EQ(toJson(*build("")).find("origins"), std::string::npos);
}

}  // namespace
}  // namespace ZR::Testing
