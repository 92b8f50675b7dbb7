#include "operations/Spool.h"

#include <algorithm>
#include <array>
#include <mutex>
#include <new>
#include <system_error>
#include <utility>

#include "cimom/TemporaryFile.h"
#include "cimxml/Errors.h"

namespace cimom::wbem {

namespace {

/// Most results never reach the disk.
constexpr std::size_t inMemory = 65536;
/// Nor do, as long as there is a spare text, those of a thousand instances.
constexpr std::size_t inSpareMemory = std::size_t{2} * 1024 * 1024;

}  // namespace

/// Texts with much memory. Safe for concurrent use.
class Spool::Spares {
  public:
    static std::shared_ptr<Spares> ofProcess() {
        static const auto all = std::make_shared<Spares>();
        return all;
    }

    /// Exchanges the text for a spare one that begins with it. False when others have all, or
    /// there is no memory.
    bool exchange(std::string& text) {
        const std::lock_guard lock(mutex_);
        if (free_ == 0) {
            return false;
        }
        std::string& spare = texts_.at(free_ - 1);
        try {
            spare.reserve(inSpareMemory + inMemory);
        } catch (const std::bad_alloc&) {
            return false;
        }
        spare = text;
        text = std::move(spare);
        --free_;
        return true;
    }
    void giveBack(std::string text) noexcept {
        text.clear();
        if (text.capacity() > 2 * inSpareMemory) {
            text = std::string();
        }
        const std::lock_guard lock(mutex_);
        texts_[free_++].swap(text);
    }

  private:
    std::mutex mutex_;
    std::array<std::string, 2> texts_;  ///< without memory until they are used first
    std::size_t free_ = texts_.size();
};

Spool::Spool(std::size_t largest) : largest_(largest) {}

Spool::~Spool() {
    if (spares_) {
        spares_->giveBack(std::move(rest_));
    }
}

void Spool::append(std::string_view text) {
    if (text.size() > largest_ - std::min(size(), largest_)) {
        throw CimError(CimStatus::serverLimitsExceeded,
                       "the result is longer than " + std::to_string(largest_) + " bytes");
    }
    rest_.append(text);
    if (rest_.size() < (spares_ ? inSpareMemory : inMemory)) {
        return;
    }
    if (!std::exchange(hadRoom_, true)) {
        auto spares = Spares::ofProcess();
        if (spares->exchange(rest_)) {
            spares_ = std::move(spares);
            return;
        }
    }
    try {
        if (!file_) {
            file_ = std::make_unique<TemporaryFile>();
        }
        file_->write(written_, rest_.data(), rest_.size());
    } catch (const std::system_error& error) {
        throw CimError(CimStatus::serverLimitsExceeded, error.what());
    }
    written_ += rest_.size();
    rest_.clear();
}

void Spool::cut(std::size_t size) noexcept {
    if (size >= written_) {
        rest_.resize(std::min(rest_.size(), size - written_));
    } else {
        written_ = size;
        rest_.clear();
    }
}

void Spool::read(std::size_t position, std::size_t size, std::string& out) const {
    const std::size_t fromFile =
        position < written_ ? std::min(size, written_ - position) : std::size_t{0};
    if (fromFile > 0) {
        file_->read(position, fromFile, out);
    }
    if (size > fromFile) {
        out.append(rest_, position + fromFile - written_, size - fromFile);
    }
}

}  // namespace cimom::wbem
