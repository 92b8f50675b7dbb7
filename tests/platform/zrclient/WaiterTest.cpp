// Waiting for the next snapshot, without a thread of the service's own.

#include <gtest/gtest.h>
#include <sys/eventfd.h>

#include <atomic>
#include <chrono>
#include <latch>
#include <memory>
#include <optional>
#include <thread>
#include <vector>

#include "kit/Files.h"
#include "kit/ZrclientSupport.h"
#include "sources/JsonTreeSource.h"
#include "zrclient/InstrumentationService.h"

namespace ZR {
namespace {

using Testing::HandSource;
using Testing::parsed;
using Waiter = InstrumentationService::Waiter;
using namespace std::chrono_literals;

std::shared_ptr<const Snapshot> machineCalled(const std::string& description) {
    return parsed(R"({"nodes": [{"type": "ComputerSystem", "description": ")" + description +
                  R"("}]})");
}

/// Tells of its changes by a descriptor, which changed() takes back, and by nothing else.
class SignalledSource : public SnapshotSource {
  public:
    struct State {
        UniqueFd event{::eventfd(0, EFD_NONBLOCK | EFD_CLOEXEC)};
        std::atomic<int> polls{0};
        std::atomic<int> readings{0};

        void happen() const { ASSERT_EQ(::eventfd_write(event.get(), 1), 0); }
    };
    explicit SignalledSource(std::shared_ptr<State> state) : state_(std::move(state)) {}

    bool changed() override {
        ++state_->polls;
        eventfd_t ignored = 0;
        return ::eventfd_read(state_->event.get(), &ignored) == 0;
    }
    ChangeSigns signs() override {
        return {.descriptor = UniqueFd(::dup(state_->event.get())), .askAt = std::nullopt};
    }
    std::shared_ptr<const Snapshot> read() override {
        return machineCalled(std::to_string(++state_->readings));
    }

  private:
    std::shared_ptr<State> state_;
};

TEST(Waiter, TheFirstSnapshotNeedsNoWait) {
    InstrumentationService service(
        std::make_unique<SignalledSource>(std::make_shared<SignalledSource::State>()));
    Waiter waiter(service);
    const auto first = waiter.next(nullptr);
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(first, service.latest());
}

TEST(Waiter, SleepsUntilTheSourceTellsOfAChange) {
    const auto state = std::make_shared<SignalledSource::State>();
    InstrumentationService service(std::make_unique<SignalledSource>(state));
    Waiter waiter(service);
    const auto first = waiter.next(nullptr);
    std::atomic<bool> told = false;
    std::thread source([&] {
        std::this_thread::sleep_for(100ms);
        told = true;
        state->happen();
    });
    const int polls = state->polls;
    const auto second = waiter.next(first);
    EXPECT_TRUE(told);
    EXPECT_NE(second, first);
    EXPECT_EQ(state->polls, polls + 1) << "nothing was asked while nothing happened";
    source.join();
}

TEST(Waiter, AChangeThatAnotherThreadHasTakenIsNotLost) {
    const auto state = std::make_shared<SignalledSource::State>();
    InstrumentationService service(std::make_unique<SignalledSource>(state));
    Waiter waiter(service);
    auto known = waiter.next(nullptr);
    std::atomic<bool> over = false;
    std::thread requests([&] {
        while (!over) {
            static_cast<void>(service.current());
        }
    });
    // Each is taken by that thread's poll sooner or later than by the wait for it.
    for (int change = 0; change < 200; ++change) {
        state->happen();
        const auto next = waiter.next(known);
        ASSERT_NE(next, known);
        known = next;
    }
    over = true;
    requests.join();
}

TEST(Waiter, SnapshotsOfOtherRequestsWakeEveryWaiter) {
    const auto state = std::make_shared<SignalledSource::State>();
    InstrumentationService service(std::make_unique<SignalledSource>(state));
    const auto first = service.current();
    std::latch ready(5);
    std::vector<std::thread> threads;
    threads.reserve(4);
    std::atomic<int> woken = 0;
    for (int number = 0; number < 4; ++number) {
        threads.emplace_back([&] {
            Waiter waiter(service);
            ready.arrive_and_wait();
            EXPECT_NE(waiter.next(first), first);
            ++woken;
        });
    }
    ready.arrive_and_wait();
    state->happen();
    static_cast<void>(service.current());
    for (std::thread& each : threads) {
        each.join();
    }
    EXPECT_EQ(woken, 4);
    EXPECT_EQ(state->readings, 2) << "one reading is enough for all";
}

TEST(Waiter, EndsAtOnceWhenStopped) {
    InstrumentationService service(
        std::make_unique<SignalledSource>(std::make_shared<SignalledSource::State>()));
    Waiter waiter(service);
    const auto first = waiter.next(nullptr);
    std::thread stopping([&] {
        std::this_thread::sleep_for(50ms);
        waiter.stop();
    });
    EXPECT_EQ(waiter.next(first), nullptr);
    EXPECT_EQ(waiter.next(nullptr), nullptr) << "and waits never again";
    stopping.join();
}

TEST(Waiter, ASourceThatCannotTellIsAskedOnceASecond) {
    const auto state = std::make_shared<HandSource::State>();
    InstrumentationService service(std::make_unique<HandSource>(state));
    Waiter waiter(service);
    const auto first = waiter.next(nullptr);
    const int polls = state->polls;
    std::thread stopping([&] {
        std::this_thread::sleep_for(2500ms);
        waiter.stop();
    });
    EXPECT_EQ(waiter.next(first), nullptr);
    stopping.join();
    EXPECT_GE(state->polls, polls + 1);
    EXPECT_LE(state->polls, polls + 3);
}

TEST(Waiter, AReplacedSourceIsRead) {
    InstrumentationService service(
        std::make_unique<SignalledSource>(std::make_shared<SignalledSource::State>()));
    Waiter waiter(service);
    const auto first = waiter.next(nullptr);
    const auto other = std::make_shared<HandSource::State>();
    other->snapshot = machineCalled("other");
    std::thread replacing([&] { service.useSource(std::make_unique<HandSource>(other)); });
    EXPECT_EQ(waiter.next(first), other->snapshot);
    replacing.join();
}

TEST(Waiter, ATreeInAFileWakesWhenItIsReplaced) {
    const Testing::TemporaryDirectory directory;
    const std::string file = (directory.path() / "tree.json").string();
    Testing::renameOver(file, R"({"nodes": [{"type": "ComputerSystem", "description": "a"}]})");
    InstrumentationService service(std::make_unique<JsonTreeSource>(file));
    Waiter waiter(service);
    const auto first = waiter.next(nullptr);
    std::thread author([&] {
        std::this_thread::sleep_for(50ms);
        Testing::renameOver(file, R"({"nodes": [{"type": "ComputerSystem", "description": "b"}]})");
    });
    const auto second = waiter.next(first);
    author.join();
    ASSERT_NE(second, nullptr);
    EXPECT_EQ(second->node(0).description, "b");
}

}  // namespace
}  // namespace ZR
