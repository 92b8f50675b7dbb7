#include "zrclient/InstrumentationService.h"

#include <poll.h>
#include <sys/eventfd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <system_error>
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
    ChangeSigns signs() override { return {}; }
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
    // Also after a failure: what another thread has made of the source's descriptors, who
    // waits for these would not see.
    struct Wake {
        InstrumentationService& service;
        ~Wake() { service.wakeWaiters(); }
    };
    const Wake wake{*this};
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
    {
        // The replaced source is closed after the lock is let go.
        const std::lock_guard lock(sourceMutex_);
        source_.swap(source);
    }
    wakeWaiters();
}

ChangeSigns InstrumentationService::signs() {
    const std::lock_guard lock(sourceMutex_);
    return openedSource().signs();
}

void InstrumentationService::wakeWaiters() noexcept {
    const std::lock_guard lock(waitersMutex_);
    for (const Waiter* const waiter : waiters_) {
        waiter->wake();
    }
}

InstrumentationService::Waiter::Waiter(InstrumentationService& service)
    : service_(service), event_(::eventfd(0, EFD_NONBLOCK | EFD_CLOEXEC)) {
    if (!event_) {
        throw std::system_error(errno, std::generic_category(), "eventfd");
    }
    const std::lock_guard lock(service_.waitersMutex_);
    service_.waiters_.push_back(this);
}

InstrumentationService::Waiter::~Waiter() {
    const std::lock_guard lock(service_.waitersMutex_);
    std::erase(service_.waiters_, this);
}

void InstrumentationService::Waiter::wake() const noexcept {
    // Fails only when it has been woken very often already.
    static_cast<void>(::eventfd_write(event_.get(), 1));
}

void InstrumentationService::Waiter::refresh() noexcept {
    refreshed_ = true;
    wake();
}

void InstrumentationService::Waiter::stop() noexcept {
    stopped_ = true;
    wake();
}

/// Waits for any of the signs; true when another thread has read, or stopped the wait.
bool InstrumentationService::Waiter::wait(const ChangeSigns& signs) const {
    using std::chrono::ceil;
    using std::chrono::milliseconds;
    std::array<pollfd, 2> asked{
        pollfd{.fd = event_.get(), .events = POLLIN, .revents = 0},
        pollfd{.fd = signs.descriptor.get(), .events = POLLIN, .revents = 0}};
    int timeout = -1;
    if (signs.askAt) {
        const auto rest = ceil<milliseconds>(*signs.askAt - std::chrono::steady_clock::now());
        timeout = static_cast<int>(std::clamp<std::int64_t>(rest.count(), 0, INT_MAX));
    }
    // Woken by a signal, the source is asked too early, which does no harm.
    static_cast<void>(::poll(asked.data(), asked.size(), timeout));
    if (asked[0].revents == 0) {
        return false;
    }
    eventfd_t ignored = 0;
    static_cast<void>(::eventfd_read(event_.get(), &ignored));
    return true;
}

std::shared_ptr<const Snapshot> InstrumentationService::Waiter::next(
    const std::shared_ptr<const Snapshot>& known) {
    // What follows one upon the other becomes one reading, so that many links which come at
    // once do not have the machine read for each.
    constexpr std::chrono::milliseconds pause(10);
    while (!stopped_) {
        if (refreshed_.exchange(false)) {
            return service_.current();
        }
        if (auto newest = service_.published(); newest && newest != known) {
            return newest;
        }
        if (known && wait(service_.signs())) {
            continue;
        }
        if (known) {
            std::this_thread::sleep_for(pause);
        }
        if (auto newest = service_.current(); newest != known) {
            return newest;
        }
    }
    return nullptr;
}

}  // namespace ZR
