#pragma once

#include <gtest/gtest.h>

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <string>
#include <vector>

#include "cimom/Instance.h"
#include "cimxml/ExportMessage.h"
#include "listener/Listener.h"

namespace cimom::test {

/// Of what a test waits for: as long as a busy machine may need.
inline constexpr std::chrono::seconds longEnough(30);

inline std::string textIn(const Instance& instance, const char* property) {
    const Value* const value = instance.property(property);
    const Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const text = scalar == nullptr ? nullptr : std::get_if<std::string>(scalar);
    return text == nullptr ? "" : *text;
}

inline std::int64_t numberIn(const Instance& instance) {
    const Value* const value = instance.property("SequenceNumber");
    const Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const number = scalar == nullptr ? nullptr : std::get_if<std::int64_t>(scalar);
    return number == nullptr ? -1 : *number;
}

/// An indication that is told from others by a text.
inline Instance indication(const std::string& identifier) {
    Instance instance;
    instance.path = {"", "root/interop", "CIM_InstCreation", {}};
    instance.properties = {{"IndicationIdentifier", Value::ofString(identifier)}};
    return instance;
}

/// A good listener that keeps what it gets.
class KeptIndications {
  public:
    KeptIndications()
        : listener_({}, [this](const wbem::ReceivedIndication& got) { return take(got); }) {}

    [[nodiscard]] std::string url() const {
        return "http://127.0.0.1:" + std::to_string(listener_.port());
    }

    /// Responds to none from now on; what comes waits.
    void close() {
        const std::lock_guard lock(mutex_);
        closed_ = true;
    }
    /// Waits for one that waits for a response.
    void awaitWaiting() {
        std::unique_lock lock(mutex_);
        EXPECT_TRUE(came_.wait_for(lock, longEnough, [&] { return waiting_; }));
    }
    /// Responds again, also to the one that waits.
    void open() {
        {
            const std::lock_guard lock(mutex_);
            closed_ = false;
        }
        came_.notify_all();
    }

    /// Waits for so many, and gives all.
    std::vector<wbem::ReceivedIndication> await(std::size_t count) {
        std::unique_lock lock(mutex_);
        EXPECT_TRUE(came_.wait_for(lock, longEnough, [&] { return all_.size() >= count; }))
            << all_.size() << " of " << count;
        return all_;
    }
    /// Those that have come, as NUMBER:IDENTIFIER.
    std::vector<std::string> awaitTexts(std::size_t count) {
        std::vector<std::string> texts;
        for (const wbem::ReceivedIndication& each : await(count)) {
            texts.push_back(std::to_string(numberIn(each.instance)) + ':' +
                            textIn(each.instance, "IndicationIdentifier"));
        }
        return texts;
    }

  private:
    bool take(const wbem::ReceivedIndication& got) {
        {
            std::unique_lock lock(mutex_);
            waiting_ = closed_;
            came_.notify_all();
            came_.wait(lock, [&] { return !closed_; });
            all_.push_back(got);
        }
        came_.notify_all();
        return true;
    }

    std::mutex mutex_;
    std::condition_variable came_;
    std::vector<wbem::ReceivedIndication> all_;
    bool closed_ = false;
    bool waiting_ = false;
    wbem::Listener listener_;
};

/// What servers log, for tests that wait for it.
class KeptLog {
  public:
    auto log() {
        return [this](const std::string& line) {
            {
                const std::lock_guard lock(mutex_);
                lines_.push_back(line);
            }
            came_.notify_all();
        };
    }
    /// Waits for a line with that in it; how many lines have it then.
    std::size_t await(const std::string& part) {
        std::unique_lock lock(mutex_);
        const auto count = [&] {
            return static_cast<std::size_t>(std::count_if(
                lines_.begin(), lines_.end(),
                [&part](const std::string& line) { return line.find(part) != std::string::npos; }));
        };
        EXPECT_TRUE(came_.wait_for(lock, longEnough, [&] { return count() > 0; }))
            << "no line \"" << part << "\" but: " << testing::PrintToString(lines_);
        return count();
    }
    std::vector<std::string> lines() {
        const std::lock_guard lock(mutex_);
        return lines_;
    }

  private:
    std::mutex mutex_;
    std::condition_variable came_;
    std::vector<std::string> lines_;
};

}  // namespace cimom::test
