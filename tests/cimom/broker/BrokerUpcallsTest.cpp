#include <map>

#include "cimom/Results.h"
#include "kit/TestManager.h"

namespace cimom::test {
namespace {

class BrokerUpcalls : public TestManager {
  protected:
    /// What the asking provider reports, by what it did.
    std::map<std::string, std::string> ask() {
        std::map<std::string, std::string> told;
        const InstancesResult result = manager.enumerateInstances(path("Test_Asks"));
        EXPECT_EQ(result.status, Status{});
        for (const auto& instance : result.instances) {
            told[textOf(instance->path.key("Id"))] = textOf(*instance, "Text");
        }
        return told;
    }
};

TEST_F(BrokerUpcalls, ReachOtherProvidersAndTheSameLibrary) {
    auto told = ask();
    EXPECT_EQ(told["enumerateInstanceNames"], "Test_Right=r1 Test_RightSpecial=s1 2");
    EXPECT_EQ(told["enumerateInstances"], "Test_Right=r1 Test_RightSpecial=s1 2");
    EXPECT_EQ(told["associatorNames"], "Test_Right=r1 1");
    EXPECT_EQ(told["clonedEnumeration"], "Test_Right=r1 1");
    EXPECT_EQ(told["associators"], "Test_Right=r1 Test_RightSpecial=s1 2");
    EXPECT_EQ(told["references"], "2");
    EXPECT_EQ(told["referenceNames"], "0");
    EXPECT_EQ(told["getInstance"], "l1");
    EXPECT_EQ(told["getProperty"], "l1");
}

TEST_F(BrokerUpcalls, ErrorsComeBackAsStatus) {
    auto told = ask();
    EXPECT_EQ(told["getMissingInstance"], "null 6");
    EXPECT_EQ(told["getMissingProperty"], "12");
    EXPECT_EQ(told["unknownNameSpace"], "status 3 no namespace \"root/nowhere\"");
    EXPECT_EQ(told["nullPath"], "status 4 ");
}

TEST_F(BrokerUpcalls, ModifyReachesTheProvider) {
    EXPECT_EQ(ask()["modifyInstance"], "0");
    EXPECT_EQ(textOf(*manager.getInstance(path("Test_Left.Id=\"l1\"")).instances.at(0), "Note"),
              "changed by a provider");
}

TEST_F(BrokerUpcalls, EndlessRecursionEndsWithAStatus) {
    const InstancesResult result = manager.enumerateInstances(path("Test_AsksItself"));
    EXPECT_EQ(result.status,
              (Status{CMPI_RC_ERR_FAILED,
                      "requests of providers to each other are nested more than 16 deep"}));
    std::string deeper;
    for (int count = 0; count < 16; ++count) {
        deeper += "deeper\n";
    }
    EXPECT_EQ(takeLog(), deeper);
}

TEST_F(BrokerUpcalls, ThreadsOfAProviderDeliverAtOnce) {
    const InstancesResult result = manager.enumerateInstances(path("Test_Threads"));
    EXPECT_EQ(result.status, Status{});
    EXPECT_EQ(result.instances.size(), 400U);
}

TEST_F(BrokerUpcalls, EveryFunctionOfTheBrokerWorksForAProviderInC) {
    const InstancesResult result =
        manager.enumerateInstances(path("Test_Check"), {std::nullopt, "someone"});
    EXPECT_EQ(result.status, Status{});
    EXPECT_GT(result.instances.size(), 80U);
    for (const auto& check : result.instances) {
        EXPECT_EQ(*check->property("Passed"), (Value{Type::boolean, false, Scalar(true)}))
            << textOf(*check, "Id");
    }
}

}  // namespace
}  // namespace cimom::test
