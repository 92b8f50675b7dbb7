#pragma once

#include <linux/netlink.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <deque>
#include <optional>
#include <thread>
#include <utility>
#include <vector>

#include "LinuxSupport.h"
#include "kernel/NetlinkTransport.h"

namespace ZR::Live {

/// One prepared datagram, or a prepared failure to receive one.
struct Step {
    std::vector<Message> messages;
    int error = 0;
    bool truncated = false;
    bool forEver = false;
    std::uint32_t sender = 0;
    std::optional<std::uint32_t> sequence = std::nullopt;  // else that of the request

    static Step failing(int error) {
        Step step{{}};
        step.error = error;
        return step;
    }
    static Step cut(std::vector<Message> messages) {
        Step step{std::move(messages)};
        step.truncated = true;
        return step;
    }
    static Step endless(std::vector<Message> messages) {
        Step step{std::move(messages)};
        step.forEver = true;
        return step;
    }
    static Step from(std::uint32_t sender, std::vector<Message> messages) {
        Step step{std::move(messages)};
        step.sender = sender;
        return step;
    }
    static Step withSequence(std::uint32_t sequence, std::vector<Message> messages) {
        Step step{std::move(messages)};
        step.sequence = sequence;
        return step;
    }
};

/// Responds to each request with the next of its prepared responses, then is silent.
class ScriptedTransport final : public NetlinkTransport {
  public:
    explicit ScriptedTransport(std::deque<std::vector<Step>> responses)
        : responses_(std::move(responses)) {}

    void refuseToOpen(int error) { openError_ = error; }
    /// Keeps the caller in the request for so long, as a kernel does whose links are
    /// being changed by others.
    void holdRequests(std::chrono::milliseconds time) { held_ = time; }
    [[nodiscard]] int opened() const { return opened_; }
    [[nodiscard]] int asked() const { return asked_; }
    [[nodiscard]] std::size_t largestBuffer() const { return largestBuffer_; }

    int open() override {
        ++opened_;
        pending_.clear();
        return openError_;
    }

    int send(std::span<const std::byte> message) override {
        ++asked_;
        std::this_thread::sleep_for(held_);
        nlmsghdr request{};
        std::memcpy(&request, message.data(), sizeof request);
        sequence_ = request.nlmsg_seq;
        pending_.clear();
        if (!responses_.empty()) {
            pending_.assign(responses_.front().begin(), responses_.front().end());
            responses_.pop_front();
        }
        return 0;
    }

    Datagram receive(std::span<std::byte> buffer, Deadline deadline) override {
        largestBuffer_ = std::max(largestBuffer_, buffer.size());
        if (pending_.empty()) {
            std::this_thread::sleep_until(deadline);
            return {.error = ETIMEDOUT};
        }
        const Step step = pending_.front();
        if (!step.forEver) {
            pending_.pop_front();
        }
        if (step.error != 0) {
            return {.error = step.error};
        }
        std::size_t size = 0;
        for (const Message& message : step.messages) {
            std::vector<std::byte> bytes = message.bytes();
            const std::uint32_t sequence = step.sequence.value_or(sequence_);
            std::memcpy(bytes.data() + offsetof(nlmsghdr, nlmsg_seq), &sequence, sizeof sequence);
            std::copy(bytes.begin(), bytes.end(),
                      buffer.begin() + static_cast<std::ptrdiff_t>(size));
            size += (bytes.size() + 3) & ~std::size_t{3};
        }
        return {.error = 0, .size = size, .truncated = step.truncated, .sender = step.sender};
    }

  private:
    std::deque<std::vector<Step>> responses_;
    std::deque<Step> pending_;
    int openError_ = 0;
    std::chrono::milliseconds held_{0};
    int opened_ = 0;
    int asked_ = 0;
    std::uint32_t sequence_ = 0;
    std::size_t largestBuffer_ = 0;
};

}  // namespace ZR::Live
