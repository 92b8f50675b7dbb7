#include "text/ProgressBar.h"

#include <algorithm>
#include <chrono>
#include <system_error>
#include <utility>

#include "text/DisplayText.h"

namespace cimdhcp {

namespace {

constexpr const char* clearLine = "\r\x1B[K";
constexpr std::size_t longestBar = 40;
/// Brackets and a blank.
constexpr std::size_t aroundBar = 3;

}  // namespace

std::string progressText(std::size_t done, std::size_t total, std::size_t failed,
                         std::size_t width) {
    std::string numbers = std::to_string(done) + " of " + std::to_string(total);
    if (failed != 0) {
        numbers += ", " + std::to_string(failed) + " failed";
    }
    if (width < numbers.size() + aroundBar + 4) {
        return numbers.substr(0, width);
    }
    const std::size_t length = std::min(longestBar, width - numbers.size() - aroundBar);
    const std::size_t filled = total == 0 ? length : length * std::min(done, total) / total;
    std::string bar(filled, '=');
    if (filled < length) {
        bar += '>';
    }
    bar.resize(length, ' ');
    return '[' + bar + "] " + numbers;
}

ProgressBar::ProgressBar(std::ostream& terminal, std::optional<std::size_t> width,
                         std::size_t total)
    : terminal_(terminal), width_(width), total_(total) {}

ProgressBar::~ProgressBar() {
    hide();
}

void ProgressBar::show(std::size_t done, std::size_t failed) {
    if (width_) {
        // In the last column, some terminals would go on to the next line.
        const std::size_t room = std::max<std::size_t>(*width_, 2) - 1;
        terminal_ << clearLine << progressText(done, total_, failed, room) << std::flush;
        shown_ = true;
    }
}

void ProgressBar::hide() {
    if (shown_) {
        terminal_ << clearLine << std::flush;
        shown_ = false;
    }
}

WaitingLine::WaitingLine(std::ostream& terminal, std::optional<std::size_t> width,
                         std::string doing)
    : terminal_(terminal),
      room_(std::max<std::size_t>(width.value_or(2), 2) - 1),
      doing_(std::move(doing)) {
    if (width) {
        try {
            thread_ = std::thread([this] { run(); });
        } catch (const std::system_error&) {
            // The system has no more threads; it is done without the line, too.
        }
    }
}

WaitingLine::~WaitingLine() {
    {
        const std::lock_guard lock(mutex_);
        ended_ = true;
    }
    changed_.notify_one();
    if (thread_.joinable()) {
        thread_.join();
    }
}

TellStep WaitingLine::steps() {
    return [this](const std::string& doing, std::size_t number, std::size_t total) {
        const std::lock_guard lock(mutex_);
        doing_ = doing;
        if (total > 0) {
            doing_ += ", " + std::to_string(number) + " of " + std::to_string(total);
        }
        if (seconds_ > 0) {
            showLocked();
        }
    };
}

void WaitingLine::showLocked() {
    terminal_ << clearLine << cutToWidth(doing_ + ", " + std::to_string(seconds_) + " s", room_)
              << std::flush;
}

void WaitingLine::run() {
    std::unique_lock lock(mutex_);
    while (!changed_.wait_for(lock, std::chrono::seconds(1), [this] { return ended_; })) {
        ++seconds_;
        showLocked();
    }
    if (seconds_ > 0) {
        terminal_ << clearLine << std::flush;
    }
}

}  // namespace cimdhcp
