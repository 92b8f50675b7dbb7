#include "operations/Spool.h"

#include <algorithm>
#include <system_error>

#include "cimom/TemporaryFile.h"
#include "cimxml/Errors.h"

namespace cimom::wbem {

namespace {

/// Most results never reach the disk.
constexpr std::size_t inMemory = 65536;

}  // namespace

Spool::Spool(std::size_t largest) : largest_(largest) {}

Spool::~Spool() = default;

void Spool::append(std::string_view text) {
    if (text.size() > largest_ - std::min(size(), largest_)) {
        throw CimError(CimStatus::serverLimitsExceeded,
                       "the result is longer than " + std::to_string(largest_) + " bytes");
    }
    rest_.append(text);
    if (rest_.size() < inMemory) {
        return;
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
