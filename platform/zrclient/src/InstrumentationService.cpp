#include "zrclient/InstrumentationService.h"

#include <thread>
#include <utility>

#include "sources/JsonTreeSource.h"
#include "zrcommon/PlatformSettings.h"

namespace ZR {

namespace {

std::atomic<InstrumentationService::OpenMachine> openMachine = nullptr;

/// The source of a process that was not told how its machine is opened.
class NoMachine : public SnapshotSource {
  public:
    bool changed() override { return false; }
    std::shared_ptr<const Snapshot> read() override { return SnapshotBuilder().build(); }
};

std::unique_ptr<SnapshotSource> openSourceOfSettings() {
    const std::string& tree = PlatformSettings::process().instrumentationTree;
    if (!tree.empty()) {
        return std::make_unique<JsonTreeSource>(tree);
    }
    const auto open = openMachine.load();
    return open == nullptr ? std::make_unique<NoMachine>() : open();
}

}  // namespace

InstrumentationService& InstrumentationService::process() {
    // Destroyed when the library is unloaded, and its descriptors with it.
    static InstrumentationService service(nullptr,
                                          PlatformSettings::process().serviceProcessorWait);
    return service;
}

void InstrumentationService::setMachine(OpenMachine open) noexcept {
    openMachine = open;
}

InstrumentationService::InstrumentationService(std::unique_ptr<SnapshotSource> source,
                                               std::chrono::milliseconds firstWait)
    : source_(std::move(source)), firstWait_(firstWait) {}

std::shared_ptr<const Snapshot> InstrumentationService::published() {
    const std::lock_guard lock(snapshotMutex_);
    return snapshot_;
}

/// The source, opened now if this is its first use. Call with the source locked.
SnapshotSource& InstrumentationService::openedSource() {
    if (!source_) {
        source_ = openSourceOfSettings();
    }
    return *source_;
}

/// Reads the source and publishes what it read. Call with the source locked.
std::shared_ptr<const Snapshot> InstrumentationService::readSource() {
    std::shared_ptr<const Snapshot> newest = openedSource().read();
    ++readings_;
    std::shared_ptr<const Snapshot> replaced = newest;
    {
        const std::lock_guard lock(snapshotMutex_);
        snapshot_.swap(replaced);
    }
    // What was replaced ends here, outside the lock, if no cursor holds it.
    return newest;
}

std::shared_ptr<const Snapshot> InstrumentationService::current() {
    using std::chrono::milliseconds;
    if (firstWait_.load() > milliseconds(0)) {
        if (const milliseconds wait = firstWait_.exchange(milliseconds(0)); wait.count() > 0) {
            settle(wait);
        }
    }
    // Two requests never ask the source at once: the second one waits for a
    // reading under way and then polls for itself, so that what it gets is at
    // least as new as its call.
    const std::lock_guard lock(sourceMutex_);
    if (source_ && !source_->changed()) {
        if (auto snapshot = published()) {
            return snapshot;
        }
    }
    return readSource();
}

bool InstrumentationService::awaiting() {
    const std::lock_guard lock(sourceMutex_);
    return openedSource().awaiting();
}

void InstrumentationService::settle(std::chrono::milliseconds limit) {
    constexpr std::chrono::milliseconds pause(5);
    const auto end = std::chrono::steady_clock::now() + limit;
    static_cast<void>(current());
    while (awaiting() && std::chrono::steady_clock::now() < end) {
        std::this_thread::sleep_for(pause);
        static_cast<void>(current());
    }
}

std::shared_ptr<const Snapshot> InstrumentationService::latest() {
    if (auto snapshot = published()) {
        return snapshot;
    }
    const std::lock_guard lock(sourceMutex_);
    // Another thread may have read while this one waited.
    if (auto snapshot = published()) {
        return snapshot;
    }
    return readSource();
}

void InstrumentationService::useSource(std::unique_ptr<SnapshotSource> source) {
    // The replaced source is closed after the lock is let go.
    const std::lock_guard lock(sourceMutex_);
    source_.swap(source);
}

}  // namespace ZR
