#include "broker/Broker.h"

#include <thread>

#include "broker/objects/BrokerContext.h"
#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

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

}  // namespace
}  // namespace cimom::test
