#include "Delivery.h"

#include <exception>
#include <utility>

#include "cimxml/Errors.h"
#include "cimxml/ExportMessage.h"
#include "cimxml/HttpStatus.h"

namespace cimom::wbem {

namespace {

constexpr std::size_t deepestResponse = 16;
constexpr std::size_t longestResponse = 64U << 10U;
constexpr std::size_t shownReason = 200;
constexpr std::chrono::minutes betweenDropLines(1);
/// For the response to what is on its way at the end: without it, it is sent twice.
constexpr std::chrono::seconds farewell(1);

/// A listener that says this of an indication would say it again.
bool isFinal(unsigned status) noexcept {
    return status == http::badRequest || status == http::methodNotAllowed ||
           status == http::contentTooLarge || status == http::notImplemented;
}

std::string counted(std::size_t count) {
    return count == 1 ? "1 indication" : std::to_string(count) + " indications";
}

}  // namespace

Delivery::Delivery(Listener listener, DeliverySettings settings, SubscriptionLog log,
                   std::function<void()> failing)
    : listener_(std::move(listener)),
      settings_(std::move(settings)),
      log_(std::move(log)),
      failing_(std::move(failing)),
      queue_(listener_.queue, {settings_.queued, settings_.queuedBytes}, log_),
      thread_([this] { run(); }) {}

Delivery::~Delivery() {
    endThread();
}

void Delivery::add(std::string indication) {
    {
        const std::lock_guard lock(mutex_);
        dropped_ += queue_.push(std::move(indication), sending_);
        if (dropped_ > 0 && Clock::now() >= tellAgain_) {
            tellDrops();
        }
    }
    wake_.notify_all();
}

void Delivery::stop() noexcept {
    {
        const std::lock_guard lock(mutex_);
        if (!stopping_.exchange(true)) {
            stopped_ = Clock::now();
        }
    }
    wake_.notify_all();
}

void Delivery::discard() {
    endThread();
    const std::lock_guard lock(mutex_);
    if (const std::size_t lost = queue_.discard(); lost > 0) {
        log_(who() + ": " + counted(lost) +
             " lost that waited, since it is not subscribed any more");
    }
}

void Delivery::endThread() {
    stop();
    {
        std::unique_lock lock(mutex_);
        wake_.wait_until(lock, stopped_ + farewell, [this] { return over_; });
    }
    interrupted_ = true;
    if (thread_.joinable()) {
        thread_.join();
    }
    const std::lock_guard lock(mutex_);
    if (dropped_ > 0) {
        tellDrops();
    }
}

void Delivery::run() {
    std::unique_lock lock(mutex_);
    while (true) {
        if (queue_.front() == nullptr) {
            // A listener that serves one connection at a time is not kept from others.
            connection_.reset();
        }
        wake_.wait(lock, [this] { return stopping_ || queue_.front() != nullptr; });
        if (stopping_) {
            over_ = true;
            wake_.notify_all();
            return;
        }
        deliverFirst(lock);
    }
}

void Delivery::deliverFirst(std::unique_lock<std::mutex>& lock) {
    const IndicationQueue::Entry entry = *queue_.front();
    sending_ = true;
    lock.unlock();
    const Attempt result = attempt(entry);
    const bool gaveUp = result.outcome == Outcome::failed && !stopping_ && failingSince_ &&
                        Clock::now() - *failingSince_ >= settings_.removalTime;
    if (gaveUp) {
        failingSince_ = Clock::now();
        failing_();
    }
    lock.lock();
    sending_ = false;
    if (result.outcome == Outcome::delivered) {
        queue_.pop();
        return;
    }
    if (stopping_) {
        return;  // what was cut off is tried again after the next start
    }
    failures_ = tried_ == entry.id ? failures_ + 1 : 1;
    tried_ = entry.id;
    const bool refused = result.outcome == Outcome::refused;
    if (refused || failures_ > settings_.retries) {
        log_(who() + ": indication " + std::to_string(entry.number) + " lost, " + result.reason);
        queue_.pop();
    }
    if (!refused) {
        // The next one would fail, too: a listener that is away for a while loses few.
        wake_.wait_for(lock, settings_.retryInterval, [this] { return stopping_.load(); });
    }
}

Delivery::Attempt Delivery::attempt(const IndicationQueue::Entry& entry) {
    Attempt result;
    try {
        result = post(entry);
    } catch (const ConnectionError& error) {
        result = {Outcome::failed, error.what()};
    } catch (const XmlError& error) {
        result = {Outcome::failed, std::string("the response is not XML: ") + error.what()};
    } catch (const NotValid& error) {
        result = {Outcome::failed,
                  std::string("the response is not that of a listener: ") + error.what()};
    } catch (const std::exception& error) {
        result = {Outcome::failed, error.what()};
    }
    if (result.reason.size() > shownReason) {
        result.reason.resize(shownReason);
    }
    if (result.outcome != Outcome::failed) {
        failingSince_.reset();
        if (std::exchange(failureTold_, false)) {
            log_(who() + ": responds again");
        }
        return result;
    }
    connection_.reset();
    if (!failingSince_) {
        failingSince_ = Clock::now();
    }
    if (!stopping_ && !std::exchange(failureTold_, true)) {
        log_(who() + ": " + result.reason);
    }
    return result;
}

Delivery::Attempt Delivery::post(const IndicationQueue::Entry& entry) {
    const Deadline deadline(settings_.patience);
    if (connection_) {
        connection_->extend(deadline);
    } else {
        HttpSettings settings;
        settings.caCertificates = settings_.caCertificates;
        settings.longestResponse = longestResponse;
        settings.interrupted = &interrupted_;
        connection_.emplace(listener_.url, settings, deadline);
    }
    const ReceivedResponse response = connection_->post(
        {"Content-Type: application/xml; charset=utf-8", "CIMExport: MethodRequest",
         "CIMExportMethod: ExportIndication"},
        exportMessage(std::to_string(entry.number), entry.text, {listener_.context, entry.number}));
    if (response.status != http::ok) {
        return {isFinal(response.status) ? Outcome::refused : Outcome::failed,
                "HTTP " + std::to_string(response.status)};
    }
    const ExportResponse result = readExportResponse(response.body, deepestResponse);
    if (result.code == 0) {
        return {};
    }
    // FAILED is what full listeners say; other statuses are about the indication.
    return {result.code == static_cast<unsigned>(CimStatus::failed) ? Outcome::failed
                                                                    : Outcome::refused,
            std::string(cimStatusName(result.code)) + ' ' + result.description};
}

void Delivery::tellDrops() {
    log_(who() + ": " + counted(dropped_) + " lost, the oldest that waited, since too many wait");
    dropped_ = 0;
    tellAgain_ = Clock::now() + betweenDropLines;
}

std::string Delivery::who() const {
    return "listener \"" + listener_.name + "\" at " + listener_.url.text();
}

}  // namespace cimom::wbem
