#include "http/TaskPool.h"

#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <memory>
#include <thread>

namespace cimom::wbem {

TEST(TaskPool, RunsTasksOnItsThreads) {
    // Declared before the pool, as what its tasks use has to outlive it.
    std::promise<void> both;
    std::atomic<int> arrived{0};
    std::promise<void> go;
    const std::shared_future<void> gone = go.get_future().share();
    TaskPool pool(2, 10);
    for (int count = 0; count < 2; ++count) {
        pool.run([&, gone] {
            if (++arrived == 2) {
                both.set_value();
            }
            gone.wait();
        });
    }
    both.get_future().wait();  // would hang if one thread did both
    go.set_value();
}

TEST(TaskPool, LetsOnlySoManyWait) {
    std::promise<void> running;
    std::promise<void> go;
    TaskPool pool(1, 2);
    EXPECT_TRUE(pool.run([&] {
        running.set_value();
        go.get_future().wait();
    }));
    running.get_future().wait();
    EXPECT_TRUE(pool.run([] {}));
    EXPECT_TRUE(pool.run([] {}));
    EXPECT_FALSE(pool.run([] {}));
    go.set_value();
}

TEST(TaskPool, ReplacesThreadsWhoseTaskDoesNotComeBackSoOften) {
    std::promise<void> release;
    const std::shared_future<void> released = release.get_future().share();
    TaskPool pool(1, 10, 1);
    const auto runOne = [&](bool comesBack) {
        auto begun = std::make_shared<std::promise<void>>();
        EXPECT_TRUE(pool.run([begun, comesBack, released] {
            begun->set_value();
            if (!comesBack) {
                released.wait();
            }
        }));
        begun->get_future().wait();
    };
    using std::chrono::nanoseconds;
    runOne(false);
    EXPECT_EQ(pool.replaceStuck(std::chrono::hours(1)), 0U);
    EXPECT_EQ(pool.replaceStuck(nanoseconds(0)), 1U);
    EXPECT_EQ(pool.replaceStuck(nanoseconds(0)), 0U);  // once is enough
    runOne(true);
    runOne(false);
    EXPECT_EQ(pool.replaceStuck(nanoseconds(0)), 0U);
    EXPECT_FALSE(pool.run([] {}));
    release.set_value();
    while (!pool.run([] {})) {
        std::this_thread::yield();
    }
    // The place of the one that was replaced is free again.
    runOne(true);
}

TEST(TaskPool, RunsTasksNoEarlierThanTheyShould) {
    const auto start = TaskPool::Clock::now();
    std::promise<TaskPool::Clock::time_point> run;
    TaskPool pool(1, 2);
    pool.runAfter(std::chrono::hours(1), [] { FAIL() << "an hour early"; });
    pool.runAfter(std::chrono::milliseconds(20), [&] { run.set_value(TaskPool::Clock::now()); });
    EXPECT_GE(run.get_future().get() - start, std::chrono::milliseconds(20));
}

TEST(TaskPool, ForgetsWhatWaitsWhenItStops) {
    auto held = std::make_shared<int>(1);
    const std::weak_ptr<int> watched = held;
    TaskPool pool(1, 2);
    pool.runAfter(std::chrono::hours(1), [held = std::move(held)] { FAIL() << *held; });
    pool.stop();
    EXPECT_TRUE(watched.expired());
    EXPECT_FALSE(pool.run([] { FAIL(); }));
    EXPECT_FALSE(pool.runAfter(std::chrono::seconds(0), [] { FAIL(); }));
}

}  // namespace cimom::wbem
