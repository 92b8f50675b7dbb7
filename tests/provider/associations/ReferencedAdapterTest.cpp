// The three adapters that fetch the far ends which other providers serve.

#include "CMPI/ReferencedAdapter.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "CMPI/CMPIDHCPAssignmentSettingData.h"
#include "CMPI/CMPIDHCPComputerSystem.h"
#include "CMPI/CMPIIPProtocolEndpoint.h"
#include "cimom/Instance.h"
#include "include/Exceptions.h"
#include "kit/AssociationMachine.h"
#include "kit/LogCapture.h"

namespace {

using test::Fault;
using test::Function;
using test::Host;
using test::pathFrom;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ZR::DHCPClientProvider::CMPIDHCPAssignmentSettingData;
using ZR::DHCPClientProvider::CMPIDHCPComputerSystem;
using ZR::DHCPClientProvider::CMPIIPProtocolEndpoint;

constexpr const char* noComputer = "Could not obtain an instance of Computer System";
constexpr const char* noIPEndpoint = "Could not obtain an instance of IP Protocol Endpoint";

/// A machine with so many interfaces, each with an IP address.
void setInterfaces(unsigned count) {
    std::vector<test::Json> interfaces;
    for (unsigned i = 0; i < count; ++i) {
        interfaces.push_back(test::dhcpInterface("eth" + std::to_string(i)));
        interfaces.back()["properties"]["IPv4Address"] = "192.0.2." + std::to_string(i);
    }
    test::TreeTest::setTree({test::host(interfaces)});
}

class ReferencedAdapterTest : public test::TreeTest {
  protected:
    /// Runs something with an adapter in a request for a path.
    template <typename Adapter, typename Use>
    void with(const char* path, const Use& use) {
        host_.request(Host::Kind::paths, pathFrom(path),
                      [&](auto* context, auto* /*result*/, auto* record) {
                          Adapter adapter(host_.broker(), context, "root/cimv2");
                          use(adapter, record);
                          return CMPIStatus{CMPI_RC_OK, nullptr};
                      });
    }

    template <typename Adapter>
    static bool stands(Adapter& adapter) {
        return static_cast<bool>(adapter);
    }

    /// How many steps a walk takes after `place` placed the adapter.
    template <typename Adapter>
    static unsigned steps(Adapter& adapter) {
        unsigned count = 0;
        for (; adapter; ++adapter) {
            ++count;
        }
        return count;
    }

    template <typename Place>
    static std::string refusalOf(const Place& place) {
        try {
            place();
        } catch (const ZR::ProviderException& exception) {
            return exception.what();
        }
        return "(none)";
    }

    Host host_{Host::Neighbours::served, Host::Calls::counted};
};

template <typename Adapter>
constexpr bool standsOnOneByItsPath = requires(Adapter& adapter, const CMPIObjectPath* path) {
    adapter.setSingleObjectPath(path);
};

TEST(ReferencedAdapters, OnlyComputersAreNeverFetchedSingly) {
    EXPECT_TRUE(standsOnOneByItsPath<CMPIDHCPAssignmentSettingData>);
    EXPECT_TRUE(standsOnOneByItsPath<CMPIIPProtocolEndpoint>);
    EXPECT_FALSE(standsOnOneByItsPath<CMPIDHCPComputerSystem>);
}

TEST_F(ReferencedAdapterTest, ClassWithoutInstancesIsAnEmptyWalkAndNoFailure) {
    setTree({});
    with<CMPIDHCPComputerSystem>("QVXZR_ComputerSystem", [](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_FALSE(stands(adapter));
        EXPECT_EQ(adapter.getObjectPath(), nullptr);
        EXPECT_EQ(adapter.getCMPIInstance(nullptr), nullptr);
    });
    with<CMPIIPProtocolEndpoint>("QVXZR_IPProtocolEndpoint", [](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_FALSE(stands(adapter));
    });
    with<CMPIDHCPAssignmentSettingData>("QVXZR_IPAssignmentSettingData",
                                        [](auto& adapter, auto* path) {
                                            adapter.setObjectPath(path);
                                            EXPECT_FALSE(stands(adapter));
                                        });
}

TEST_F(ReferencedAdapterTest, NullEnumerationIsAnEmptyOne) {
    setInterfaces(1);
    host_.counted().fail(Function::enumerateInstances, 1, Fault::null);
    with<CMPIDHCPComputerSystem>("QVXZR_ComputerSystem", [](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_FALSE(stands(adapter));
        ++adapter;
        EXPECT_FALSE(stands(adapter));
    });
    with<CMPIDHCPAssignmentSettingData>("QVXZR_IPAssignmentSettingData",
                                        [](auto& adapter, auto* path) {
                                            adapter.setObjectPath(path);
                                            EXPECT_FALSE(stands(adapter));
                                        });
}

TEST_F(ReferencedAdapterTest, UnplacedAdapterStandsOnNothing) {
    setInterfaces(1);
    with<CMPIDHCPComputerSystem>("QVXZR_ComputerSystem", [](auto& adapter, auto* /*path*/) {
        EXPECT_FALSE(stands(adapter));
        ++adapter;
        EXPECT_FALSE(stands(adapter));
        EXPECT_EQ(adapter.getObjectPath(), nullptr);
    });
    EXPECT_EQ(host_.counted().calls(Function::enumerateInstances), 0U);
}

TEST_F(ReferencedAdapterTest, RefusedEnumerationIsThrownWithTheClassesMessage) {
    setInterfaces(1);
    host_.counted().fail(Function::enumerateInstances, 1, Fault::status);
    with<CMPIDHCPComputerSystem>("QVXZR_ComputerSystem", [](auto& adapter, auto* path) {
        EXPECT_EQ(refusalOf([&] { adapter.setObjectPath(path); }), noComputer);
    });
    with<CMPIIPProtocolEndpoint>("QVXZR_IPProtocolEndpoint", [](auto& adapter, auto* path) {
        EXPECT_EQ(refusalOf([&] { adapter.setObjectPath(path); }), noIPEndpoint);
    });
    // The text is the IP endpoint's here, too.
    with<CMPIDHCPAssignmentSettingData>(
        "QVXZR_IPAssignmentSettingData", [](auto& adapter, auto* path) {
            EXPECT_EQ(refusalOf([&] { adapter.setObjectPath(path); }), noIPEndpoint);
        });
}

TEST_F(ReferencedAdapterTest, NullPathIsRefusedWithoutAskingTheBroker) {
    setInterfaces(1);
    with<CMPIDHCPComputerSystem>("QVXZR_ComputerSystem", [](auto& adapter, auto* /*path*/) {
        EXPECT_EQ(refusalOf([&] { adapter.setObjectPath(nullptr); }), noComputer);
    });
    EXPECT_EQ(host_.counted().calls(), 0U);
    with<CMPIIPProtocolEndpoint>("QVXZR_IPProtocolEndpoint", [](auto& adapter, auto* /*path*/) {
        EXPECT_EQ(refusalOf([&] { adapter.setObjectPath(nullptr); }), noIPEndpoint);
        EXPECT_EQ(refusalOf([&] { adapter.setSingleObjectPath(nullptr); }), noComputer);
    });
    EXPECT_EQ(host_.counted().calls(), 0U);
}

TEST_F(ReferencedAdapterTest, NamedInstanceIsTheOnlyOne) {
    setInterfaces(3);
    with<CMPIIPProtocolEndpoint>(R"(QVXZR_IPProtocolEndpoint.SystemName="@",Name="eth1")",
                                 [](auto& adapter, auto* path) {
                                     adapter.setSingleObjectPath(path);
                                     EXPECT_TRUE(stands(adapter));
                                     EXPECT_NE(adapter.getCMPIInstance(nullptr), nullptr);
                                     ++adapter;
                                     EXPECT_FALSE(stands(adapter));
                                     EXPECT_EQ(adapter.getCMPIInstance(nullptr), nullptr);
                                 });
    EXPECT_EQ(host_.counted().calls(Function::getInstance), 1U);
    EXPECT_EQ(host_.counted().calls(Function::hasNext), 0U);
}

TEST_F(ReferencedAdapterTest, MissingNamedInstanceIsThrownAsAComputerSystem) {
    setInterfaces(1);
    with<CMPIIPProtocolEndpoint>(
        R"(QVXZR_IPProtocolEndpoint.Name="eth9")", [](auto& adapter, auto* path) {
            EXPECT_EQ(refusalOf([&] { adapter.setSingleObjectPath(path); }), noComputer);
            EXPECT_FALSE(stands(adapter));
        });
    with<CMPIDHCPAssignmentSettingData>(
        R"(QVXZR_IPAssignmentSettingData.InstanceID="x")", [](auto& adapter, auto* path) {
            EXPECT_EQ(refusalOf([&] { adapter.setSingleObjectPath(path); }), noComputer);
        });
}

// The walk asks for another element after it has taken the next: one of two is lost,
// two of three are delivered.
TEST_F(ReferencedAdapterTest, LastOfSeveralInstancesIsNeverDelivered) {
    const std::vector<std::pair<unsigned, unsigned>> expected{{1, 1}, {2, 1}, {3, 2}, {10, 9}};
    for (const auto& [instances, delivered] : expected) {
        setInterfaces(instances);
        with<CMPIIPProtocolEndpoint>("QVXZR_IPProtocolEndpoint",
                                     [&, wanted = delivered](auto& adapter, auto* path) {
                                         adapter.setObjectPath(path);
                                         EXPECT_EQ(steps(adapter), wanted);
                                     });
        with<CMPIDHCPAssignmentSettingData>("QVXZR_IPAssignmentSettingData",
                                            [&, wanted = delivered](auto& adapter, auto* path) {
                                                adapter.setObjectPath(path);
                                                EXPECT_EQ(steps(adapter), wanted);
                                            });
    }
    setTree({test::computer("Computer", "twin", {}), test::computer("Computer", "twin", {})});
    with<CMPIDHCPComputerSystem>(R"(QVXZR_ComputerSystem.Name="twin")",
                                 [](auto& adapter, auto* path) {
                                     adapter.setObjectPath(path);
                                     EXPECT_EQ(steps(adapter), 1U);
                                 });
}

TEST_F(ReferencedAdapterTest, SecondOfTwoIsTakenByTheStepAlthoughTheWalkEnds) {
    setInterfaces(2);
    with<CMPIIPProtocolEndpoint>("QVXZR_IPProtocolEndpoint", [](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_TRUE(stands(adapter));
        CMPIInstance* first = adapter.getCMPIInstance(nullptr);
        ++adapter;
        CMPIInstance* second = adapter.getCMPIInstance(nullptr);
        EXPECT_NE(second, nullptr);
        EXPECT_NE(second, first);
        EXPECT_FALSE(stands(adapter));
    });
}

// Who asks whether there is an element before it takes one.
TEST_F(ReferencedAdapterTest, AdaptersDifferInWhetherTheyAskBeforeTheyTake) {
    setInterfaces(1);
    const auto asked = [this] { return host_.counted().calls(Function::hasNext); };
    with<CMPIDHCPComputerSystem>("QVXZR_ComputerSystem", [&](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_EQ(asked(), 1U);
        ++adapter;
        EXPECT_EQ(asked(), 1U);
    });
    with<CMPIIPProtocolEndpoint>("QVXZR_IPProtocolEndpoint", [&](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_EQ(asked(), 1U);
        ++adapter;
        EXPECT_EQ(asked(), 2U);
    });
    with<CMPIDHCPAssignmentSettingData>("QVXZR_IPAssignmentSettingData",
                                        [&](auto& adapter, auto* path) {
                                            adapter.setObjectPath(path);
                                            EXPECT_EQ(asked(), 0U);
                                            ++adapter;
                                            EXPECT_EQ(asked(), 0U);
                                        });
}

TEST_F(ReferencedAdapterTest, FirstInstanceIsToldOnceAndThenTheEnumerationIsAsked) {
    setInterfaces(1);
    with<CMPIDHCPComputerSystem>("QVXZR_ComputerSystem", [](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_TRUE(stands(adapter));
        EXPECT_FALSE(stands(adapter));
        EXPECT_NE(adapter.getCMPIInstance(nullptr), nullptr) << "it has not moved";
    });
}

TEST_F(ReferencedAdapterTest, PlacedAgainItStandsOnTheFirstOfTheNewEnumeration) {
    setInterfaces(2);
    with<CMPIIPProtocolEndpoint>("QVXZR_IPProtocolEndpoint", [](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_EQ(steps(adapter), 1U);
        adapter.setObjectPath(path);
        EXPECT_TRUE(stands(adapter));
        EXPECT_NE(adapter.getCMPIInstance(nullptr), nullptr);
    });
}

TEST_F(ReferencedAdapterTest, ElementThatTheBrokerDoesNotGiveIsNone) {
    setInterfaces(3);
    host_.counted().fail(Function::getNext, 1, Fault::status);
    with<CMPIIPProtocolEndpoint>("QVXZR_IPProtocolEndpoint", [](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_EQ(adapter.getCMPIInstance(nullptr), nullptr);
        EXPECT_EQ(adapter.getObjectPath(), nullptr);
    });
    host_.counted().fail(Function::getNext, 2, Fault::status);
    with<CMPIIPProtocolEndpoint>("QVXZR_IPProtocolEndpoint", [](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        EXPECT_NE(adapter.getCMPIInstance(nullptr), nullptr);
        ++adapter;
        EXPECT_EQ(adapter.getCMPIInstance(nullptr), nullptr);
    });
}

TEST_F(ReferencedAdapterTest, InstanceThatCannotTellItsPathHasNone) {
    setInterfaces(1);
    for (const Fault fault : {Fault::null, Fault::status}) {
        host_.counted().fail(Function::getObjectPath, 1, fault);
        with<CMPIDHCPComputerSystem>("QVXZR_ComputerSystem", [](auto& adapter, auto* path) {
            adapter.setObjectPath(path);
            EXPECT_NE(adapter.getCMPIInstance(nullptr), nullptr);
            EXPECT_EQ(adapter.getObjectPath(), nullptr);
        });
    }
}

TEST_F(ReferencedAdapterTest, PropertyListIsIgnoredAndNothingIsCopied) {
    setInterfaces(1);
    with<CMPIDHCPComputerSystem>("QVXZR_ComputerSystem", [](auto& adapter, auto* path) {
        adapter.setObjectPath(path);
        const char* properties[] = {"ElementName", nullptr};
        EXPECT_EQ(adapter.getCMPIInstance(properties), adapter.getCMPIInstance(nullptr));
    });
}

TEST_F(ReferencedAdapterTest, EveryOperationIsTracedFromTheClassesOwnFile) {
    setInterfaces(1);
    const ZR::Testing::LogCapture log;
    with<CMPIDHCPAssignmentSettingData>("QVXZR_IPAssignmentSettingData",
                                        [](auto& adapter, auto* path) {
                                            adapter.setObjectPath(path);
                                            EXPECT_TRUE(stands(adapter));
                                            EXPECT_NE(adapter.getObjectPath(), nullptr);
                                            adapter.getCMPIInstance(nullptr);
                                            ++adapter;
                                        });
    std::vector<std::string> functions;
    for (const auto& line : log.log()) {
        EXPECT_EQ(line.file, "CMPI/CMPIDHCPAssignmentSettingData");
        functions.push_back(line.function);
    }
    EXPECT_THAT(functions, ElementsAre("CMPIDHCPAssignmentSettingData", "setObjectPath",
                                       "setObjectPath", R"(operator\x20bool)", "getObjectPath",
                                       "getObjectPath", "getCMPIInstance", "getCMPIInstance",
                                       "operator++", "~CMPIDHCPAssignmentSettingData"));
}

}  // namespace
