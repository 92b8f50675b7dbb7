#include "tklogger/TKMessageBuffer.h"

#include <bit>
#include <climits>

namespace TKLog {

namespace {

/// The two digits of each byte.
constexpr std::array<char, 512> hexadecimal = [] {
    constexpr std::string_view digits = "0123456789abcdef";
    std::array<char, 512> all{};
    for (std::size_t byte = 0; byte < 256; ++byte) {
        all.at(2 * byte) = digits[byte >> 4U];
        all.at(2 * byte + 1) = digits[byte & 0x0FU];
    }
    return all;
}();

}  // namespace

TKMessageBuffer& TKMessageBuffer::writeAddress(std::uintptr_t address) {
    if (address == 0) {
        return *this << std::string_view("0");
    }
    constexpr std::size_t most = 2 * sizeof address;
    const auto unused = static_cast<std::size_t>(std::countl_zero(address)) / 4;
    std::array<char, 2 + most> text;  // NOLINT(cppcoreguidelines-pro-type-member-init)
    const bool fits = !heap_ && inlineSize - size_ >= text.size();
    // In place, if there is room for the longest: each of a provider's functions writes one, and
    // bytes that are read back as soon as they are written cost more than to write them.
    char* const begin = fits ? inline_.data() + size_ : text.data();
    begin[0] = '0';
    begin[1] = 'x';
    address <<= 4 * unused;
    for (std::size_t at = 0; at < most; at += 2) {
        const std::uintptr_t byte = address >> (sizeof address - 1) * CHAR_BIT;
        std::memcpy(begin + 2 + at, hexadecimal.data() + 2 * byte, 2);
        address <<= static_cast<unsigned>(CHAR_BIT);
    }
    const std::size_t size = 2 + most - unused;
    if (!fits) {
        return *this << std::string_view(begin, size);
    }
    size_ += size;
    return *this;
}

void TKMessageBuffer::spill(std::string_view text) {
    if (!heap_) {
        heap_ = std::make_unique<std::string>(inline_.data(), size_);
    }
    *heap_ += text;
}

}  // namespace TKLog
