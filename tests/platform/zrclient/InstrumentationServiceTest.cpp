#include "zrclient/InstrumentationService.h"

#include <atomic>
#include <latch>
#include <thread>

#include "kit/ZrclientSupport.h"
#include "sources/JsonTreeSource.h"
#include "zrclient/Instrumentation.h"

namespace ZR::Testing {
namespace {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

std::shared_ptr<const Snapshot> tree(const std::string& description) {
    SnapshotBuilder builder;
    builder.add(Snapshot::none, "ComputerSystem", description);
    return builder.build();
}

TEST(InstrumentationService, ReadsNothingAheadOfTheFirstRequest) {
    const auto state = std::make_shared<HandSource::State>();
    const InstrumentationService service(std::make_unique<HandSource>(state));
    EXPECT_EQ(service.readings(), 0U);
    EXPECT_EQ(state->readings, 0);
    EXPECT_EQ(state->polls, 0);
}

// Before main, and so before the settings are read.
[[maybe_unused]] const int noTreeInTheSettings = ::setenv("ZR_INSTRUMENTATION_TREE", "", 1);

TEST(InstrumentationService, SeesNothingWithoutATreeAndWithoutAMachine) {
    InstrumentationService service;
    EXPECT_TRUE(service.current()->nodes().empty());
    EXPECT_TRUE(service.current()->nodes().empty());
    EXPECT_EQ(service.readings(), 1U) << "nothing does not change";
    EXPECT_FALSE(service.awaiting());
}

int machinesOpened = 0;

std::unique_ptr<SnapshotSource> openCounted() {
    ++machinesOpened;
    const auto state = std::make_shared<HandSource::State>();
    state->snapshot = tree("the machine");
    return std::make_unique<HandSource>(state);
}

TEST(InstrumentationService, OpensTheMachineOnceAtItsFirstUse) {
    InstrumentationService::setMachine(&openCounted);
    machinesOpened = 0;
    InstrumentationService service;
    EXPECT_EQ(machinesOpened, 0);
    EXPECT_FALSE(service.awaiting());
    EXPECT_EQ(machinesOpened, 1);
    EXPECT_EQ(service.latest()->node(0).description, "the machine");
    EXPECT_EQ(service.current()->node(0).description, "the machine");
    EXPECT_EQ(machinesOpened, 1);
    // What is told later is for sources that are opened later.
    InstrumentationService::setMachine(nullptr);
    EXPECT_EQ(service.current()->node(0).description, "the machine");
    InstrumentationService another;
    EXPECT_TRUE(another.current()->nodes().empty());
}

TEST(InstrumentationService, ReadsAgainOnlyWhenTheSourceChanged) {
    const auto state = std::make_shared<HandSource::State>();
    state->snapshot = tree("first");
    InstrumentationService service(std::make_unique<HandSource>(state));
    const auto first = service.current();
    EXPECT_EQ(first, state->snapshot);
    for (int round = 0; round < 100; ++round) {
        EXPECT_EQ(service.current(), first);
    }
    EXPECT_EQ(service.readings(), 1U);
    EXPECT_EQ(state->polls, 101);

    state->snapshot = tree("second");
    state->changed = true;
    EXPECT_EQ(service.current(), state->snapshot);
    EXPECT_EQ(service.readings(), 2U);
    EXPECT_EQ(first->node(0).description, "first") << "what was handed out stays";
}

TEST(InstrumentationService, TheLatestStateIsHandedOutWithoutPolling) {
    const auto state = std::make_shared<HandSource::State>();
    InstrumentationService service(std::make_unique<HandSource>(state));
    const auto first = service.latest();
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(service.readings(), 1U) << "there was none yet";
    state->snapshot = tree("second");
    state->changed = true;
    const int polls = state->polls;
    EXPECT_EQ(service.latest(), first);
    EXPECT_EQ(state->polls, polls);
    EXPECT_EQ(service.readings(), 1U);
}

TEST(InstrumentationService, AReplacedSourceIsReadByTheNextRequest) {
    const auto one = std::make_shared<HandSource::State>();
    const auto two = std::make_shared<HandSource::State>();
    one->snapshot = tree("one");
    two->snapshot = tree("two");
    InstrumentationService service(std::make_unique<HandSource>(one));
    EXPECT_EQ(service.current(), one->snapshot);
    service.useSource(std::make_unique<HandSource>(two));
    EXPECT_EQ(one.use_count(), 1) << "the replaced source is closed";
    EXPECT_EQ(service.latest(), one->snapshot) << "nothing newer was read yet";
    EXPECT_EQ(service.current(), two->snapshot);
    EXPECT_EQ(service.latest(), two->snapshot);
    EXPECT_EQ(service.readings(), 2U);
}

TEST(InstrumentationService, AReplacedSnapshotEndsWithItsLastCursor) {
    const auto state = std::make_shared<HandSource::State>();
    InstrumentationService service(std::make_unique<HandSource>(state));
    auto held = service.current();
    const std::weak_ptr<const Snapshot> watched = held;
    state->snapshot = tree("second");
    state->changed = true;
    static_cast<void>(service.current());
    EXPECT_FALSE(watched.expired());
    held.reset();
    EXPECT_TRUE(watched.expired());
}

/// Stands in for a slow source: a reading takes until the test lets it end.
/// Awaits a response until it was polled a number of times.
class AwaitingSource : public SnapshotSource {
  public:
    explicit AwaitingSource(int polls) : polls_(polls) {}
    bool changed() override {
        polls_ -= polls_ > 0 ? 1 : 0;
        return polls_ == 0;
    }
    [[nodiscard]] bool awaiting() override { return polls_ > 0; }
    std::shared_ptr<const Snapshot> read() override { return tree(awaiting() ? "asked" : "told"); }

  private:
    int polls_;
};

TEST(InstrumentationService, SettlesWhenTheResponseIsThere) {
    InstrumentationService service(std::make_unique<AwaitingSource>(3));
    service.settle(std::chrono::hours(1));
    EXPECT_FALSE(service.awaiting());
    EXPECT_EQ(service.latest()->node(0).description, "told");
}

TEST(InstrumentationService, TellsWithoutAReadingThatAResponseIsAwaited) {
    InstrumentationService service(std::make_unique<AwaitingSource>(3));
    EXPECT_TRUE(service.awaiting());
    EXPECT_EQ(service.readings(), 0U);
}

TEST(InstrumentationService, SettlesForWhatThereIsInTheEnd) {
    InstrumentationService service(std::make_unique<AwaitingSource>(1'000'000));
    service.settle(std::chrono::milliseconds(20));
    EXPECT_TRUE(service.awaiting());
    EXPECT_EQ(service.latest()->node(0).description, "asked");
}

TEST(InstrumentationService, TheFirstRequestWaitsAsLongAsItIsTold) {
    InstrumentationService service(std::make_unique<AwaitingSource>(3), std::chrono::hours(1));
    EXPECT_EQ(service.current()->node(0).description, "told");
    service.useSource(std::make_unique<AwaitingSource>(1'000'000));
    EXPECT_EQ(service.current()->node(0).description, "told") << "no later one waits";
    InstrumentationService hurried(std::make_unique<AwaitingSource>(3));
    EXPECT_EQ(hurried.current()->node(0).description, "asked");
}

class SlowSource : public SnapshotSource {
  public:
    struct State {
        std::latch begun{1};
        std::latch mayEnd{1};
        std::atomic<bool> slow{false};
    };
    explicit SlowSource(std::shared_ptr<State> state) : state_(std::move(state)) {}
    bool changed() override { return true; }
    std::shared_ptr<const Snapshot> read() override {
        if (state_->slow) {
            state_->begun.count_down();
            state_->mayEnd.wait();
            return tree("new");
        }
        return tree("old");
    }

  private:
    std::shared_ptr<State> state_;
};

TEST(InstrumentationService, TheLatestStateDoesNotWaitForAReadingUnderWay) {
    const auto state = std::make_shared<SlowSource::State>();
    InstrumentationService service(std::make_unique<SlowSource>(state));
    const auto old = service.current();
    state->slow = true;
    std::shared_ptr<const Snapshot> read;
    std::thread reader([&] { read = service.current(); });
    state->begun.wait();
    EXPECT_EQ(service.latest(), old);
    state->mayEnd.count_down();
    reader.join();
    EXPECT_EQ(read->node(0).description, "new");
    EXPECT_EQ(service.latest(), read);
}

TEST(InstrumentationService, ManyFirstRequestsReadOnce) {
    const auto state = std::make_shared<HandSource::State>();
    InstrumentationService service(std::make_unique<HandSource>(state));
    constexpr int threads = 16;
    std::latch start(threads);
    std::vector<std::thread> pool;
    pool.reserve(threads);
    for (int number = 0; number < threads; ++number) {
        pool.emplace_back([&, number] {
            start.arrive_and_wait();
            EXPECT_NE(number % 2 == 0 ? service.current() : service.latest(), nullptr);
        });
    }
    for (std::thread& each : pool) {
        each.join();
    }
    EXPECT_EQ(service.readings(), 1U);
}

/// A tree in which everything tells the version: as many interfaces as its
/// number, each with that number for its state.
std::string versionTree(unsigned version) {
    const std::string number = std::to_string(version);
    std::string text = R"({"nodes": [{"type": "ComputerSystem", "description": "c)" + number +
                       R"(", "children": [)";
    for (unsigned each = 0; each < version; ++each) {
        text += (each == 0 ? "" : ",");
        text += R"({"type": "NetworkInterface", "properties": {"Name": "eth)" +
                std::to_string(each) + R"(", "InterfaceState": )" + number + "}}";
    }
    return text + "]}]}";
}

/// One walk over whatever version is there; returns whether all of it fitted.
bool walkIsConsistent() {
    Instrumentation cursor;
    if (!cursor.selectNode(NodeType::NetworkInterface)) {
        return false;
    }
    unsigned version = 0;
    if (!cursor.getProperty(Properties::InterfaceState, version)) {
        return false;
    }
    const std::string parent = cursor.getPathToParentNode();
    Instrumentation above;
    // The machine may have gone on to another version since; both is right.
    if (above.selectNode(parent) && !above.getPathToParentNode().empty()) {
        return false;
    }
    unsigned count = 0;
    for (; cursor; ++cursor) {
        unsigned state = 0;
        std::string name;
        if (!cursor.getProperty(Properties::InterfaceState, state) || state != version ||
            !cursor.getProperty(Properties::Name, name) || name != "eth" + std::to_string(count)) {
            return false;
        }
        ++count;
    }
    return count == version && parent == "/c" + std::to_string(version);
}

TEST(InstrumentationService, SixtyFourThreadsWalkWhileTheTreeChanges) {
    const TemporaryDirectory directory;
    const std::string path = directory / "tree.json";
    renameOver(path, versionTree(1));
    InstrumentationService& service = InstrumentationService::process();
    service.useSource(std::make_unique<JsonTreeSource>(path));
    static_cast<void>(service.current());

    constexpr int threads = 64;
    constexpr unsigned versions = 40;
    std::atomic<bool> stop{false};
    std::atomic<int> inconsistent{0};
    std::atomic<int> walks{0};
    std::latch start(threads + 1);
    std::vector<std::thread> pool;
    pool.reserve(threads);
    for (int number = 0; number < threads; ++number) {
        pool.emplace_back([&] {
            start.arrive_and_wait();
            do {
                inconsistent += walkIsConsistent() ? 0 : 1;
                ++walks;
            } while (!stop);
        });
    }
    start.arrive_and_wait();
    for (unsigned version = 2; version <= versions; ++version) {
        renameOver(path, versionTree(version));
        const auto snapshot = service.current();
        // The change just made is never missed, whichever thread read it.
        EXPECT_EQ(snapshot->node(0).description, "c" + std::to_string(version));
    }
    stop = true;
    for (std::thread& each : pool) {
        each.join();
    }
    EXPECT_EQ(inconsistent, 0);
    EXPECT_GE(walks, threads);
    service.useSource(std::make_unique<HandSource>(std::make_shared<HandSource::State>()));
}

}  // namespace
}  // namespace ZR::Testing
