#include "manager/Providers.h"

#include <malloc.h>

#include <fstream>

#include "cimom/ClassRepository.h"
#include "cimom/Results.h"
#include "kit/TestManager.h"

namespace cimom::test {
namespace {

using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;

class BadProviders : public testing::Test {
  protected:
    ObjectManager manager{configuration("bad.reg")};

    PathsResult ask(const std::string& className) {
        return manager.enumerateInstanceNames(parseObjectPath("root/test:" + className));
    }
    InstancesResult askInstances(const std::string& className) {
        return manager.enumerateInstances(parseObjectPath("root/test:" + className));
    }
    void expectFailure(const std::string& className, CMPIrc code,
                       const testing::Matcher<const std::string&>& message) {
        for (int round = 0; round < 2; ++round) {
            const PathsResult result = ask(className);
            EXPECT_EQ(result.status.code, code) << className;
            EXPECT_THAT(result.status.message, message) << className;
            EXPECT_TRUE(result.paths.empty()) << className;
        }
    }
};

TEST_F(BadProviders, MissingLibraryIsNamedWithTheDirectories) {
    expectFailure("Test_NoLibrary", CMPI_RC_ERR_FAILED,
                  AllOf(HasSubstr("libNowhereToBeFound.so"), HasSubstr(BROKER_PROVIDER_DIR)));
}

TEST_F(BadProviders, LibraryThatCannotBeBoundIsNamedWithTheReason) {
    expectFailure("Test_Unbound", CMPI_RC_ERR_FAILED,
                  AllOf(HasSubstr("libUnboundProvider.so"), HasSubstr("functionThatNobodyHas")));
}

TEST_F(BadProviders, MissingFactoryIsNamed) {
    expectFailure("Test_NoFactory", CMPI_RC_ERR_NOT_SUPPORTED,
                  AllOf(HasSubstr("libBadProvider.so"), HasSubstr("NoFactory_Create_InstanceMI")));
    EXPECT_THAT(
        manager.associators(parseObjectPath("root/test:Test_Unserved.Id=\"1\"")).status.message,
        HasSubstr("NoFactory_Create_AssociationMI"));
}

TEST_F(BadProviders, FactoryWithoutRecordFails) {
    expectFailure("Test_NullRecord", CMPI_RC_ERR_FAILED, HasSubstr("gave nothing"));
    expectFailure("Test_RefusedRecord", CMPI_RC_ERR_ACCESS_DENIED, testing::StrEq("no licence"));
}

TEST_F(BadProviders, MissingTableOrSlotCostsTheRequestAlone) {
    expectFailure("Test_NullTable", CMPI_RC_ERR_FAILED, HasSubstr("has no function table"));
    expectFailure("Test_NullSlots", CMPI_RC_ERR_NOT_SUPPORTED,
                  HasSubstr("does not offer enumerateInstanceNames"));
    EXPECT_EQ(askInstances("Test_NullSlots").status.code, CMPI_RC_ERR_NOT_SUPPORTED);
    const ObjectPath path = parseObjectPath("root/test:Test_NullSlots.Id=\"1\"");
    EXPECT_EQ(manager.getInstance(path).status.code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(manager.modifyInstance({path, {}}).status.code, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(BadProviders, ExceptionsCostTheRequestAlone) {
    expectFailure("Test_ThrowingFactory", CMPI_RC_ERR_FAILED,
                  HasSubstr("ThrowingFactory_Create_InstanceMI threw"));
    expectFailure("Test_Throws", CMPI_RC_ERR_FAILED,
                  testing::StrEq("provider Bad: enumerateInstanceNames threw an exception: "
                                 "lost my way"));
    expectFailure("Test_ThrowsNumber", CMPI_RC_ERR_FAILED, HasSubstr("of an unknown kind"));
    EXPECT_EQ(ask("Test_Done").status, Status{});
}

TEST_F(BadProviders, NullResultsAreAbsentEntries) {
    const PathsResult paths = ask("Test_NullResults");
    EXPECT_EQ(paths.status, Status{});
    EXPECT_THAT(names(paths.paths), ElementsAre("Test_NullResults.Id=\"first\"", "absent",
                                                "Test_NullResults.Id=\"last\""));
    const InstancesResult instances = askInstances("Test_NullResults");
    EXPECT_EQ(instances.status, Status{});
    EXPECT_EQ(names(instances.instances), names(paths.paths));
    const InstancesResult one =
        manager.getInstance(parseObjectPath("root/test:Test_NullResults.Id=\"last\""));
    EXPECT_THAT(names(one.instances), ElementsAre("Test_NullResults.Id=\"last\""));
}

TEST_F(BadProviders, ResultEndsWhenTheSlotReturns) {
    const PathsResult result = ask("Test_Done");
    EXPECT_EQ(result.returnDoneCalls, 100U);
    EXPECT_EQ(result.paths.size(), 1U);
    EXPECT_EQ(ask("Test_WrongClass").returnDoneCalls, 0U);
}

/// Counts what comes, and throws at the object of a number.
template <typename Object>
class Counter : public ResultReceiver<Object> {
  public:
    explicit Counter(std::size_t last) : last_(last) {}
    void take(std::optional<Object> /*object*/) override {
        if (count == last_) {
            throw std::runtime_error("enough");
        }
        ++count;
    }
    void beginCall() override { before_ = count; }
    void dropCall() override { count = before_; }

    std::size_t count = 0;

  private:
    std::size_t last_;
    std::size_t before_ = 0;
};

TEST_F(BadProviders, AMillionObjectsAreNotHeldAtOnce) {
    const ObjectPath million = parseObjectPath("root/test:Test_Million");
    Counter<ObjectPath> paths(2'000'000);
    EXPECT_EQ(manager.enumerateInstanceNames(million, {}, paths).status, Status{});
    EXPECT_EQ(paths.count, 1'000'000U);
    // The provider does not listen when it is told to stop, and gets an end all the same.
    Counter<Instance> some(10);
    EXPECT_THROW(manager.enumerateInstances(million, {}, some), std::runtime_error);
    EXPECT_EQ(some.count, 10U);
    EXPECT_EQ(ask("Test_Done").status, Status{});
}

TEST_F(BadProviders, WhatCameBeforeAnErrorIsTakenBack) {
    Counter<ObjectPath> paths(10);
    const RequestEnd end =
        manager.enumerateInstanceNames(parseObjectPath("root/test:Test_PartialError"), {}, paths);
    EXPECT_EQ(end.status, (Status{CMPI_RC_ERR_ACCESS_DENIED, "not you"}));
    EXPECT_EQ(paths.count, 0U);
}

TEST_F(BadProviders, ObjectsOfOtherClassesArePassedOn) {
    EXPECT_THAT(names(askInstances("Test_WrongClass").instances),
                ElementsAre("Test_Unserved.Id=\"1\"", "Nobody_Knows.Id=\"2\""));
}

TEST_F(BadProviders, ErrorDiscardsWhatWasDeliveredBefore) {
    expectFailure("Test_PartialError", CMPI_RC_ERR_ACCESS_DENIED, testing::StrEq("not you"));
}

TEST_F(BadProviders, UnknownStatusIsAFailure) {
    expectFailure("Test_OddStatus", CMPI_RC_ERR_FAILED, HasSubstr("4711"));
}

TEST_F(BadProviders, MessageOfAnErrorObjectIsUsed) {
    expectFailure("Test_ErrorObject", CMPI_RC_ERR_FAILED,
                  testing::StrEq("told by an error object"));
}

TEST_F(BadProviders, StatusOfTheProviderPassesThrough) {
    expectFailure("Test_NotHere", CMPI_RC_ERR_NOT_FOUND, testing::StrEq(""));
    EXPECT_EQ(manager.getInstance(parseObjectPath("root/test:Test_PartialError.Id=\"1\"")).status,
              (Status{CMPI_RC_ERR_ACCESS_DENIED, "not you"}));
}

TEST_F(BadProviders, OneBadSubclassFailsTheWholeOfTheParent) {
    EXPECT_EQ(ask("Test_Bad").status.code, CMPI_RC_ERR_FAILED);
}

using ProviderLibraries = TestManager;

TEST_F(ProviderLibraries, FactoryRunsOncePerKind) {
    for (int round = 0; round < 3; ++round) {
        manager.enumerateInstanceNames(path("Test_Left"));
        manager.enumerateInstanceNames(path("Test_Right"));
        manager.associators(path("Test_Left.Id=\"l1\""));
    }
    const Library library = openTestLibrary(RTLD_NOW | RTLD_NOLOAD);
    ASSERT_NE(library, nullptr);
    EXPECT_EQ(test::ask<int>(library, "testFactories"), 2);
}

TEST_F(ProviderLibraries, SymbolsStayInTheLibrary) {
    manager.enumerateInstanceNames(path("Test_Left"));
    EXPECT_EQ(dlsym(RTLD_DEFAULT, "Test_Create_InstanceMI"), nullptr);
}

TEST(ProviderUnloading, EndCleansUpEachRecordOnceAndUnloads) {
    // Held open, so that its counters can be read afterwards.
    const Library library = openTestLibrary(RTLD_NOW);
    ASSERT_NE(library, nullptr);
    const auto cleanups = [&library] { return test::ask<int>(library, "testCleanups"); };
    const int before = cleanups();
    {
        ObjectManager manager(configuration("test.reg"));
        manager.enumerateInstances(parseObjectPath("root/test:Test_Left"));
        manager.associators(parseObjectPath("root/test:Test_Left.Id=\"l1\""));
        manager.enumerateInstances(parseObjectPath("root/test:Test_Asks"));
    }
    EXPECT_EQ(cleanups() - before, 3);
}

TEST(ProviderUnloading, NothingIsLoadedBeforeItIsAsked) {
    const ObjectManager manager(configuration("test.reg"));
    EXPECT_EQ(dlopen(testLibrary, RTLD_NOW | RTLD_NOLOAD), nullptr);
}

TEST(ProviderUnloading, ThousandLoadsAndUnloadsLeaveNothingBehind) {
    const auto descriptors = [] {
        const std::filesystem::directory_iterator all("/proc/self/fd");
        return std::distance(begin(all), end(all));
    };
    ClassRepository repository;
    repository.load(BROKER_TEST_DIR "/schema/Test.mof");
    const auto once = [&] {
        Providers providers({BROKER_PROVIDER_DIR}, repository, nullptr);
        Status status;
        EXPECT_NE(providers.provider("TestProvider", "Test").instance("root/test", status),
                  nullptr);
        EXPECT_NE(providers.provider("TestProvider", "Test").association("root/test", status),
                  nullptr);
        EXPECT_EQ(status, Status{});
    };
    for (int round = 0; round < 20; ++round) {
        once();
    }
    EXPECT_EQ(dlopen(testLibrary, RTLD_NOW | RTLD_NOLOAD), nullptr) << "still loaded";
    const auto openBefore = descriptors();
    const std::size_t usedBefore = mallinfo2().uordblks;
    for (int round = 0; round < 1000; ++round) {
        once();
    }
    EXPECT_EQ(descriptors(), openBefore);
    // One lost object per round would be more than this.
    EXPECT_LT(mallinfo2().uordblks, usedBefore + 16'000);
}

TEST(ObjectManagerConfiguration, UnknownClassOfARegistrationIsAnError) {
    Configuration configuration = test::configuration("test.reg");
    configuration.schemaDirectories.clear();
    try {
        const ObjectManager manager(configuration);
        FAIL();
    } catch (const LoadError& error) {
        EXPECT_STREQ(error.what(),
                     "class Test_Types of provider Test is in none of the schema's files");
    }
}

TEST(ObjectManagerConfiguration, ClassRegisteredTwiceIsAnError) {
    Configuration configuration = test::configuration("test.reg");
    configuration.registrationFiles.push_back(configuration.registrationFiles.front());
    EXPECT_THROW(const ObjectManager manager(configuration), LoadError);
}

TEST(ObjectManagerConfiguration, HostDefaultsToTheMachinesName) {
    Configuration configuration = test::configuration("test.reg");
    configuration.host.clear();
    ObjectManager manager(configuration);
    const PathsResult result =
        manager.enumerateInstanceNames(parseObjectPath("root/test:Test_Left"));
    ASSERT_FALSE(result.paths.empty());
    EXPECT_FALSE(result.paths.front()->host.empty());
    EXPECT_EQ(manager.registrations().size(), 11U);
    EXPECT_NE(manager.repository().find("Test_Left"), nullptr);
}

}  // namespace
}  // namespace cimom::test
