#include "http/AddressShares.h"

#include <netinet/in.h>

#include <algorithm>
#include <cstring>

namespace cimom::wbem {

namespace {

constexpr std::chrono::minutes knownTime{10};
/// So much in large pieces is a reason to look whether the allocator holds free memory. What
/// every request has for its response is not: it is soon used again.
constexpr std::size_t muchMemory = std::size_t{4} << 20U;
constexpr std::size_t largePiece = std::size_t{256} << 10U;

}  // namespace

AddressKey addressKey(const sockaddr* address) {
    constexpr std::size_t network = 8;  // bytes of an IPv6 address
    AddressKey key{};
    // Whoever hands out an address has aligned it for its family.
    const void* const bytes = address;
    if (address != nullptr && address->sa_family == AF_INET) {
        const auto& number = static_cast<const sockaddr_in*>(bytes)->sin_addr;
        // As in an IPv4-mapped IPv6 address, which has no such network.
        key[10] = key[11] = 0xFF;
        std::memcpy(&key[12], &number, sizeof number);
    } else if (address != nullptr && address->sa_family == AF_INET6) {
        const auto& number = static_cast<const sockaddr_in6*>(bytes)->sin6_addr;
        const bool isFour = IN6_IS_ADDR_V4MAPPED(&number) != 0;
        std::memcpy(key.data(), &number, isFour ? key.size() : network);
    }
    return key;
}

AddressShares::AddressShares(const Limits& limits, std::function<Clock::time_point()> now)
    : connectionsEach_(limits.connectionsEach),
      checksEach_(limits.checksEach),
      memory_(limits.memory),
      connectionInterval_(Clock::duration(std::chrono::seconds(1)) / limits.connectionRate),
      connectionBurst_(connectionInterval_ * limits.connectionsEach + std::chrono::seconds(1)),
      refusalInterval_(Clock::duration(std::chrono::minutes(1)) / limits.refusalsEach),
      refusalBurst_(std::chrono::minutes(1)),
      now_(std::move(now)) {}

bool AddressShares::isKnownLocked(const Share& share) const {
    return share.knownUntil > now_();
}

const AddressShares::Share* AddressShares::findLocked(const AddressKey& key) const {
    const auto found = shares_.find(key);
    return found == shares_.end() ? nullptr : &found->second;
}

void AddressShares::admitted(const AddressKey& key) {
    const std::lock_guard lock(mutex_);
    shares_[key].knownUntil = now_() + knownTime;
}

bool AddressShares::isKnown(const AddressKey& key) const {
    const std::lock_guard lock(mutex_);
    const Share* const share = findLocked(key);
    return share != nullptr && isKnownLocked(*share);
}

bool AddressShares::addConnection(const AddressKey& key) {
    const std::lock_guard lock(mutex_);
    Share& share = shares_[key];
    if (!isKnownLocked(share)) {
        const auto now = now_();
        const auto paid = std::max(share.connectionsPaid, now) + connectionInterval_;
        if (share.connections >= connectionsEach_ || paid - now > connectionBurst_) {
            return false;
        }
        share.connectionsPaid = paid;
    }
    ++share.connections;
    return true;
}

void AddressShares::removeConnection(const AddressKey& key) {
    const std::lock_guard lock(mutex_);
    --shares_[key].connections;
}

std::size_t AddressShares::connections(const AddressKey& key) const {
    const std::lock_guard lock(mutex_);
    const Share* const share = findLocked(key);
    return share == nullptr ? 0 : share->connections;
}

bool AddressShares::beginCheck(const AddressKey& key) {
    const std::lock_guard lock(mutex_);
    Share& share = shares_[key];
    if (share.checks >= checksEach_ || share.refusalsPaid - now_() > refusalBurst_) {
        return false;
    }
    ++share.checks;
    return true;
}

void AddressShares::endCheck(const AddressKey& key) {
    const std::lock_guard lock(mutex_);
    --shares_[key].checks;
}

void AddressShares::refused(const AddressKey& key) {
    const std::lock_guard lock(mutex_);
    Share& share = shares_[key];
    share.refusalsPaid = std::max(share.refusalsPaid, now_()) + refusalInterval_;
}

bool AddressShares::hasMemoryLocked(const Share* share, std::size_t bytes) const {
    const std::size_t taken = share == nullptr ? 0 : share->memory;
    return bytes <= memory_ - memoryTaken_ && bytes <= memory_ / 2 - std::min(taken, memory_ / 2);
}

bool AddressShares::hasMemory(const AddressKey& key, std::size_t bytes) const {
    const std::lock_guard lock(mutex_);
    return hasMemoryLocked(findLocked(key), bytes);
}

bool AddressShares::takeMemory(const AddressKey& key, std::size_t bytes) {
    const std::lock_guard lock(mutex_);
    Share& share = shares_[key];
    if (!hasMemoryLocked(&share, bytes)) {
        return false;
    }
    share.memory += bytes;
    memoryTaken_ += bytes;
    return true;
}

void AddressShares::giveMemory(const AddressKey& key, std::size_t bytes) {
    const std::lock_guard lock(mutex_);
    shares_[key].memory -= bytes;
    memoryTaken_ -= bytes;
    memoryGiven_ += bytes >= largePiece ? bytes : 0;
}

bool AddressShares::gaveMuch() {
    const std::lock_guard lock(mutex_);
    if (memoryGiven_ < muchMemory) {
        return false;
    }
    memoryGiven_ = 0;
    return true;
}

void AddressShares::tidy() {
    const std::lock_guard lock(mutex_);
    const auto now = now_();
    std::erase_if(shares_, [this, now](const auto& entry) {
        const Share& share = entry.second;
        return share.connections == 0 && share.checks == 0 && share.memory == 0 &&
               !isKnownLocked(share) && share.connectionsPaid <= now && share.refusalsPaid <= now;
    });
}

bool RequestMemory::growTo(std::size_t size) {
    if (size > size_) {
        if (!shares_.takeMemory(key_, size - size_)) {
            return false;
        }
        size_ = size;
    }
    return true;
}

void RequestMemory::shrinkTo(std::size_t size) {
    if (size < size_) {
        shares_.giveMemory(key_, size_ - size);
        size_ = size;
    }
}

}  // namespace cimom::wbem
