// What objects are made of a snapshot, and the tables of the classes.
#include "MachineObjects.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "ExtensionClasses.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "zrclient/NodeLexicon.h"

namespace ZR::DHCPClientExtensions {
namespace {

using NodeLexicon::Properties;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

TEST(DateTimeText, IsOfUtcAndEndsWhereTheYearsEnd) {
    EXPECT_EQ(dateTimeText(0), "19700101000000.000000+000");
    EXPECT_EQ(dateTimeText(951'827'696), "20000229123456.000000+000");
    EXPECT_EQ(dateTimeText(NodeLexicon::never), "99991231235959.000000+000");
    EXPECT_EQ(dateTimeText(NodeLexicon::never + 1), "99991231235959.000000+000");
    EXPECT_EQ(dateTimeText(UINT64_MAX), "99991231235959.000000+000");
}

/// A machine with one interface that uses DHCP, and leases below it.
class MachineObjects : public ::testing::Test {
  protected:
    MachineObjects() {
        const auto computer = builder_.add(Snapshot::none, "ComputerSystem", "Computer");
        const auto network = builder_.add(computer, "Network", "Network");
        interface_ = builder_.add(network, "NetworkInterface", "Ethernet interface");
        builder_.property(Properties::Name, std::string("eth0"));
        builder_.property(Properties::DHCPEnabled, true);
    }

    void addLease(const std::string& family, const std::string& client) {
        builder_.add(interface_, "DHCPLease", "DHCP lease");
        builder_.property(Properties::Family, family);
        builder_.property(Properties::Client, client);
    }

    static std::vector<std::string> idsOf(const std::vector<ExtensionObject>& objects) {
        std::vector<std::string> ids;
        for (const ExtensionObject& object : objects) {
            ids.push_back(object.id);
        }
        return ids;
    }

    static PropertyContent valueOf(const ExtensionObject& object, const std::string& name) {
        const auto found =
            std::find_if(object.properties.begin(), object.properties.end(),
                         [&name](const ObjectProperty& each) { return each.name == name; });
        return found == object.properties.end() ? PropertyContent(std::string("no property"))
                                                : found->value;
    }

    SnapshotBuilder builder_;
    Snapshot::Index interface_ = Snapshot::none;
};

TEST_F(MachineObjects, LeasesAreNamedByInterfaceFamilyAndClient) {
    addLease("IPv4", "dhclient");
    addLease("IPv6", "dhclient");
    addLease("IPv6", "dhclient");
    addLease("IPv4", "udhcpc");
    EXPECT_THAT(idsOf(leaseObjects(*builder_.build())),
                ElementsAre("Computer%eth0%IPv4%dhclient", "Computer%eth0%IPv6%dhclient",
                            "Computer%eth0%IPv6%dhclient%2", "Computer%eth0%IPv4%udhcpc"));
}

TEST_F(MachineObjects, ALeaseThatIsOfNoInterfaceIsLeftOut) {
    builder_.add(Snapshot::none, "DHCPLease", "DHCP lease");
    EXPECT_THAT(leaseObjects(*builder_.build()), IsEmpty());
}

TEST_F(MachineObjects, WhatATypeCannotHoldIsNotKnown) {
    addLease("IPv4", "dhclient");
    builder_.property(Properties::Process, std::uint64_t{UINT32_MAX} + 1);
    builder_.property(Properties::ClientState, std::uint64_t{UINT16_MAX} + 1);
    builder_.property(Properties::OptionsReceived,
                      NumberList{{1, std::uint64_t{UINT16_MAX} + 1, 51}});
    const auto leases = leaseObjects(*builder_.build());
    EXPECT_EQ(valueOf(leases.at(0), "Process"), PropertyContent());
    EXPECT_EQ(valueOf(leases.at(0), "ClientState"), PropertyContent());
    EXPECT_EQ(valueOf(leases.at(0), "OptionsReceived"),
              PropertyContent(std::vector<unsigned short>{1, 51}));
}

TEST_F(MachineObjects, WhatIsNotKnownOfAnInterfaceStaysSo) {
    const auto bare = builder_.add(Snapshot::none, "NetworkInterface", "Ethernet interface");
    ASSERT_NE(bare, Snapshot::none);
    builder_.property(Properties::Name, std::string("eth1"));
    const auto interfaces = interfaceObjects(*builder_.build());
    EXPECT_THAT(idsOf(interfaces), ElementsAre("Computer%eth0", "Computer%eth1"));
    for (const char* name : {"DHCPEnabled", "LinkUp", "IPv4Address", "AddressOrigin"}) {
        EXPECT_EQ(valueOf(interfaces.at(1), name), PropertyContent()) << name;
    }
    EXPECT_EQ(valueOf(interfaces.at(0), "DHCPEnabled"), PropertyContent(true));
}

TEST_F(MachineObjects, DiagnosticsAreToldOnceEach) {
    builder_.diagnostic(Diagnostic("eth0: a lease has ended", Diagnostic::Kind::LeaseEnded));
    builder_.diagnostic(Diagnostic("eth0: a lease has ended", Diagnostic::Kind::LeaseEnded));
    builder_.diagnostic(Diagnostic("eth0: a lease has ended", Diagnostic::Kind::Note));
    const auto diagnostics = diagnosticObjects(*builder_.build());
    EXPECT_THAT(idsOf(diagnostics),
                ElementsAre("5%eth0: a lease has ended", "7%eth0: a lease has ended"));
    EXPECT_EQ(valueOf(diagnostics.at(0), "Kind"), PropertyContent(std::uint64_t{5}));
    EXPECT_EQ(valueOf(diagnostics.at(0), "Description"),
              PropertyContent(std::string("eth0: a lease has ended")));
}

TEST_F(MachineObjects, OnlyInterfacesThatUseDhcpHaveEndpoints) {
    const auto off = builder_.add(Snapshot::none, "NetworkInterface", "Ethernet interface");
    builder_.property(Properties::Name, std::string("eth1"));
    builder_.property(Properties::DHCPEnabled, false);
    builder_.add(off, "DHCPLease", "DHCP lease");
    const auto snapshot = builder_.build();
    EXPECT_EQ(endpointNames(*snapshot).size(), 1U);
    EXPECT_THAT(leasesOfEndpoints(*snapshot), IsEmpty());
    EXPECT_EQ(leaseObjects(*snapshot).size(), 1U);
}

// The tables.

class Tables : public ::testing::Test {
  protected:
    Tables() {
        repository_.loadDirectory(ZR_SOURCE_DIR "/schema");
        repository_.complete();
    }

    std::vector<std::string> ancestorsOf(const std::string& name) const {
        std::vector<std::string> ancestors;
        for (std::string parent = repository_.find(name)->superclass; !parent.empty();
             parent = repository_.find(parent)->superclass) {
            ancestors.push_back(parent);
        }
        return ancestors;
    }

    /// The keys of a class, of one kind.
    std::vector<std::string> keysOf(const std::string& name, bool references) const {
        std::vector<std::string> keys;
        for (const cimom::PropertyDeclaration& each : repository_.find(name)->properties) {
            if (each.isKey() && (each.type == cimom::Type::reference) == references) {
                keys.push_back(each.name);
            }
        }
        return keys;
    }

    cimom::ClassRepository repository_;
};

TEST_F(Tables, HaveAncestorsAndKeysOfTheSchema) {
    for (const ElementClass& each : elementClasses()) {
        ASSERT_NE(repository_.find(each.name), nullptr) << each.name;
        EXPECT_THAT(ancestorsOf(each.name), ::testing::ElementsAreArray(each.ancestors));
        EXPECT_THAT(keysOf(each.name, false), ::testing::UnorderedElementsAreArray(each.keys));
    }
    for (const AssociationClass& each : associationClasses()) {
        ASSERT_NE(repository_.find(each.name), nullptr) << each.name;
        EXPECT_THAT(ancestorsOf(each.name), ::testing::ElementsAreArray(each.ancestors));
        EXPECT_THAT(keysOf(each.name, true), ::testing::ElementsAreArray(each.roles));
        for (const char* end : each.ends) {
            EXPECT_NE(findElement(end), nullptr) << end;
        }
    }
}

TEST_F(Tables, HaveThePropertiesOfTheSchemaInTheirTypes) {
    SnapshotBuilder builder;
    const auto interface = builder.add(Snapshot::none, "NetworkInterface", "Ethernet interface");
    builder.add(interface, "DHCPLease", "DHCP lease");
    builder.diagnostic(Diagnostic("x"));
    const auto machine = builder.build();
    for (const ElementClass& each : elementClasses()) {
        if (each.objects == nullptr) {
            continue;
        }
        const auto objects = each.objects(*machine);
        ASSERT_EQ(objects.size(), 1U) << each.name;
        for (const ObjectProperty& property : objects.front().properties) {
            const cimom::PropertyDeclaration* declared =
                repository_.find(each.name)->property(property.name);
            ASSERT_NE(declared, nullptr) << each.name << ' ' << property.name;
            const bool isArray = (property.type & CMPI_ARRAY) != 0;
            EXPECT_EQ(declared->isArray, isArray) << property.name;
            const auto type = static_cast<CMPIType>(property.type & ~CMPI_ARRAY);
            EXPECT_EQ(declared->type, type == CMPI_string    ? cimom::Type::string
                                      : type == CMPI_uint16  ? cimom::Type::uint16
                                      : type == CMPI_uint32  ? cimom::Type::uint32
                                      : type == CMPI_boolean ? cimom::Type::boolean
                                                             : cimom::Type::datetime)
                << property.name;
        }
    }
}

}  // namespace
}  // namespace ZR::DHCPClientExtensions
