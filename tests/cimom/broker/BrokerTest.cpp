// The tables of functions that a provider is given.
#include <cstring>
#include <map>
#include <thread>

#include "broker/Broker.h"
#include "broker/BrokerMemory.h"
#include "broker/BrokerText.h"
#include "broker/objects/BrokerRecords.h"
#include "cimom/Results.h"
#include "kit/BrokerFixture.h"
#include "kit/TestManager.h"

namespace cimom::test {
namespace {

using BrokerMemory = TestBroker;
using broker::MemoryPool;

class BrokerThreads : public TestBroker {
  protected:
    const CMPIContext* const context =
        broker::makeContext(scope.arena(), "root/test", "someone", 0, 3);
};

TEST_F(BrokerThreads, AttachedThreadHasMemoryUntilItDetaches) {
    CMPIContext* const prepared = mb->bft->prepareAttachThread(mb, context);
    ASSERT_NE(prepared, nullptr);
    std::thread([&] {
        EXPECT_EQ(mb->bft->attachThread(mb, prepared).rc, CMPI_RC_OK);
        EXPECT_EQ(broker::RequestScope::depthOfThread(), 3U);
        EXPECT_EQ(text(newString("mine")), "mine");
        EXPECT_EQ(broker::principalOf(prepared), "someone");
        EXPECT_EQ(mb->bft->detachThread(mb, prepared).rc, CMPI_RC_OK);
        EXPECT_EQ(mb->bft->detachThread(mb, prepared).rc, CMPI_RC_ERR_INVALID_HANDLE);
    }).join();
}

TEST_F(BrokerThreads, UnusedPreparedContextEndsWithTheBroker) {
    EXPECT_NE(mb->bft->prepareAttachThread(mb, context), nullptr);
}

TEST_F(BrokerThreads, OneContextMayServeTwoThreads) {
    CMPIContext* const prepared = mb->bft->prepareAttachThread(mb, context);
    std::thread([&] {
        ASSERT_EQ(mb->bft->attachThread(mb, prepared).rc, CMPI_RC_OK);
        std::thread([&] {
            EXPECT_EQ(mb->bft->attachThread(mb, prepared).rc, CMPI_RC_OK);
            EXPECT_EQ(mb->bft->detachThread(mb, prepared).rc, CMPI_RC_OK);
        }).join();
        EXPECT_EQ(broker::principalOf(prepared), "someone");
        EXPECT_EQ(mb->bft->detachThread(mb, prepared).rc, CMPI_RC_OK);
    }).join();
}

TEST_F(BrokerThreads, ThreadOfARequestCannotAttach) {
    CMPIContext* const prepared = mb->bft->prepareAttachThread(mb, context);
    EXPECT_EQ(mb->bft->attachThread(mb, prepared).rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(mb->bft->attachThread(mb, context).rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(mb->bft->prepareAttachThread(mb, nullptr), nullptr);
}

TEST_F(BrokerThreads, ThreadThatNeverAttachedIsServedAllTheSame) {
    std::thread([&] { EXPECT_EQ(text(newString("strange")), "strange"); }).join();
}

TEST_F(BrokerThreads, WithoutManagerOtherProvidersCannotBeAsked) {
    CMPIStatus rc{};
    EXPECT_EQ(mb->bft->enumerateInstances(mb, context, newPath("Test_Left"), nullptr, &rc),
              nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

using BrokerTables = TestBroker;

TEST_F(BrokerTables, NoSlotIsEmpty) {
    const auto slotsOf = [](const auto& table, std::size_t first) {
        const auto* const words = reinterpret_cast<void* const*>(&table);
        return std::vector<void*>(words + first, words + sizeof(table) / sizeof(void*));
    };
    EXPECT_THAT(slotsOf(*mb->bft, 1), testing::Each(testing::Ne(nullptr)));
    EXPECT_THAT(slotsOf(*mb->eft, 1), testing::Each(testing::Ne(nullptr)));
    EXPECT_THAT(slotsOf(*mb->xft, 1), testing::Each(testing::Ne(nullptr)));
    EXPECT_THAT(slotsOf(*mb->mft, 1), testing::Each(testing::Ne(nullptr)));
    EXPECT_EQ(mb->eft->ftVersion, 200);
    EXPECT_EQ(mb->xft->ftVersion, 200);
    EXPECT_EQ(mb->mft->ftVersion, 200);
}

class BrokerText : public TestBroker {
  protected:
    [[nodiscard]] std::string toString(const void* object) const {
        return text(mb->eft->toString(mb, object, nullptr));
    }
};

TEST_F(BrokerText, DescribesInstancesWithTheirValues) {
    const CMPIInstance* const instance = mb->eft->newInstance(mb, newPath("Test_Types"), nullptr);
    CMPIValue value{};
    value.sint8 = -3;
    instance->ft->setProperty(instance, "Sint8", &value, CMPI_sint8);
    value.boolean = 1;
    instance->ft->setProperty(instance, "Boolean", &value, CMPI_boolean);
    instance->ft->setProperty(instance, "Note", nullptr, CMPI_string);
    value.array = mb->eft->newArray(mb, 2, CMPI_string, nullptr);
    const CMPIValue word = valueOf(newString("word"));
    value.array->ft->setElementAt(value.array, 0, &word, CMPI_string);
    instance->ft->setProperty(instance, "StringA", &value, CMPI_stringA);
    EXPECT_EQ(toString(instance),
              "instance of Test_Types { Sint8 = -3; Boolean = TRUE; Note = NULL; "
              "StringA = {\"word\", NULL}; }");
}

TEST_F(BrokerText, DescribesTheOtherObjects) {
    EXPECT_EQ(toString(newString("plain")), "plain");
    EXPECT_EQ(toString(newPath("Test_Left")), "root/test:Test_Left");
    EXPECT_EQ(toString(mb->eft->newDateTimeFromBinary(mb, 0, 1, nullptr)),
              "00000000000000.000000:000");
    EXPECT_EQ(toString(mb->eft->newArgs(mb, nullptr)), "CMPIArgs { }");
}

TEST_F(BrokerText, KnowsTheKindOfItsObjectsByTheirTables) {
    EXPECT_EQ(broker::kindOf(newString("x")), "CMPIString");
    EXPECT_EQ(broker::kindOf(mb), "CMPIBroker");
    const CMPIString foreign{nullptr, nullptr};
    EXPECT_EQ(broker::kindOf(&foreign), "");
    EXPECT_EQ(broker::kindOf(nullptr), "");
}

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
    auto told = ask();
    EXPECT_EQ(told["modifyInstance"], "0");
    EXPECT_EQ(told["modified"], "changed by a provider");
}

TEST_F(BrokerUpcalls, SetPropertyChangesThatOneAlone) {
    EXPECT_EQ(ask()["setProperty"], "0");
    EXPECT_EQ(textOf(*manager.getInstance(path("Test_Left.Id=\"l1\"")).instances.at(0), "Note"),
              "set");
    EXPECT_THAT(takeLog(), testing::HasSubstr("modifyInstance Test_Left 1 note\n"));
}

TEST_F(BrokerUpcalls, CreateAndDeleteReachTheProvider) {
    auto told = ask();
    EXPECT_EQ(told["createInstance"], "Test_Left=l3");
    EXPECT_EQ(told["createTwice"], "status " + std::to_string(CMPI_RC_ERR_ALREADY_EXISTS));
    EXPECT_EQ(told["deleteInstance"], "0");
    EXPECT_EQ(told["deleteMissingInstance"], std::to_string(CMPI_RC_ERR_NOT_FOUND));
    const std::string log = takeLog();
    const std::string id = ".Id:" + std::to_string(CMPI_string) + "\n";
    EXPECT_THAT(log, testing::HasSubstr("createInstance Test_Left" + id));
    EXPECT_THAT(log, testing::HasSubstr("deleteInstance Test_Left" + id));
}

TEST_F(BrokerUpcalls, QueriesSelectInTheNamespaceOfThePath) {
    auto told = ask();
    EXPECT_EQ(told["execQuery"], "Test_Left=l1 Test_Right=r1 Test_RightSpecial=s1 3");
    EXPECT_THAT(told["badQuery"],
                testing::StartsWith("status " + std::to_string(CMPI_RC_ERR_INVALID_QUERY) + " "));
    EXPECT_THAT(told["queryOfUnknownClass"],
                testing::StartsWith("status " + std::to_string(CMPI_RC_ERR_INVALID_CLASS)));
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

TEST(MemoryPool, FreesWhatIsLeft) {
    MemoryPool pool;
    std::memset(pool.allocate(100), 1, 100);
    EXPECT_NE(pool.allocate(0), nullptr);
    EXPECT_EQ(pool.blocks(), 2U);  // the leak checker sees whether they go
}

TEST(MemoryPool, IgnoresBlocksThatAreNotItsOwn) {
    MemoryPool pool;
    int foreign = 0;
    pool.free(&foreign);
    EXPECT_EQ(pool.resize(&foreign, 10), nullptr);
    void* const block = pool.allocate(1);
    pool.free(block);
    EXPECT_EQ(pool.blocks(), 0U);
}

TEST(MemoryPool, ResizeKeepsTheContent) {
    MemoryPool pool;
    char* const small = static_cast<char*>(pool.resize(nullptr, 4));
    std::memcpy(small, "abc", 4);
    char* const large = static_cast<char*>(pool.resize(small, 100'000));
    EXPECT_STREQ(large, "abc");
    EXPECT_EQ(pool.blocks(), 1U);
}

TEST(MemoryPool, RefusesAProductThatOverflows) {
    MemoryPool pool;
    EXPECT_EQ(pool.allocateCleared(static_cast<std::size_t>(-1), 16), nullptr);
}

TEST_F(BrokerMemory, OlderObjectKeepsWhatIsSetInALevel) {
    const CMPIInstance* const instance = mb->eft->newInstance(mb, newPath("Test_Types"), nullptr);
    for (int round = 0; round < 100; ++round) {
        const CMPIGcStat* const level = mb->mft->mark(mb, nullptr);
        const std::string name = "Property" + std::to_string(round);
        const CMPIValue value = valueOf(newString(name.c_str()));
        instance->ft->setProperty(instance, name.c_str(), &value, CMPI_string);
        EXPECT_EQ(mb->mft->release(mb, level).rc, CMPI_RC_OK);
    }
    EXPECT_EQ(text(instance->ft->getProperty(instance, "Property7", nullptr).value.string),
              "Property7");
}

TEST_F(BrokerMemory, NullBrokerIsAnInvalidHandle) {
    CMPIStatus rc{};
    EXPECT_EQ(mb->mft->mark(nullptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(mb->mft->cmpiMalloc(nullptr, 1), nullptr);
    EXPECT_EQ(mb->eft->newString(nullptr, "x", &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
}

}  // namespace
}  // namespace cimom::test
