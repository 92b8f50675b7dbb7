#include <atomic>
#include <thread>

#include "cimom/Results.h"
#include "kit/TestManager.h"

namespace cimom::test {
namespace {

using ManagerConcurrency = TestManager;

TEST_F(ManagerConcurrency, SixteenThreadsGetTheirResults) {
    std::atomic<int> wrong{0};
    const auto work = [&](int number) {
        for (int round = 0; round < 50; ++round) {
            const auto check = [&wrong](bool right) { wrong += right ? 0 : 1; };
            switch ((number + round) % 5) {
                case 0:
                    check(manager.enumerateInstances(path("Test_Base")).instances.size() == 5);
                    break;
                case 1:
                    check(manager.getInstance(path("Test_Left.Id=\"l2\"")).status.ok());
                    break;
                case 2:
                    check(manager.associatorNames(path("Test_Left.Id=\"l1\"")).paths.size() == 2);
                    break;
                case 3:
                    check(manager.references(path("Test_Left.Id=\"l1\"")).instances.size() == 2);
                    break;
                default:
                    check(manager
                              .modifyInstance(
                                  {path("Test_Left.Id=\"l1\""), {{"Note", Value::ofString("x")}}})
                              .status.ok());
            }
        }
    };
    std::vector<std::thread> threads;
    for (int number = 0; number < 16; ++number) {
        threads.emplace_back(work, number);
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(wrong, 0);
}

TEST_F(ManagerConcurrency, FirstRequestsAtOnceCreateTheProviderOnce) {
    std::vector<std::thread> threads;
    for (int number = 0; number < 16; ++number) {
        threads.emplace_back(
            [&] { EXPECT_EQ(manager.enumerateInstanceNames(path("Test_Left")).paths.size(), 2U); });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    const Library library = openTestLibrary(RTLD_NOW | RTLD_NOLOAD);
    ASSERT_NE(library, nullptr);
    EXPECT_EQ(test::ask<int>(library, "testFactories"), 1);
}

}  // namespace
}  // namespace cimom::test
