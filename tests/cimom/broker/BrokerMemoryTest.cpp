#include "broker/BrokerMemory.h"

#include <cstring>

#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

using broker::MemoryPool;
using BrokerMemory = TestBroker;

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
