#pragma once

#include <array>
#include <charconv>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <string>
#include <string_view>
#include <type_traits>

namespace TKLog {

/// Copies the few bytes of a piece of a message, without the call or the string instruction that
/// compilers make of memcpy: either costs more than the copying. The texts must not overlap.
inline void copyPiece(char* out, const char* in, std::size_t size) noexcept {
    // A run of blocks, and a last one that overlaps the run.
    const auto inBlocks = [=]<std::size_t block>() {
        for (std::size_t done = 0; done + block < size; done += block) {
            std::memcpy(out + done, in + done, block);
        }
        std::memcpy(out + size - block, in + size - block, block);
    };
    if (size >= 32) {
        inBlocks.template operator()<32>();
    } else if (size >= 16) {
        inBlocks.template operator()<16>();
    } else if (size >= 8) {
        inBlocks.template operator()<8>();
    } else if (size >= 4) {
        inBlocks.template operator()<4>();
    } else {
        for (std::size_t done = 0; done < size; ++done) {
            out[done] = in[done];
        }
    }
}

/// Builds one message text piece by piece. Works in a buffer of its own up to
/// 512 bytes and on the heap beyond. Used by one thread at a time.
class TKMessageBuffer {
  public:
    static constexpr std::size_t inlineSize = 512;

    // Not initialised: only what was written is ever read.
    // NOLINTNEXTLINE(modernize-use-equals-default,cppcoreguidelines-pro-type-member-init)
    TKMessageBuffer() noexcept {}

    TKMessageBuffer& operator<<(std::string_view text) {
        if (!heap_ && text.size() <= inlineSize - size_) [[likely]] {
            copyPiece(inline_.data() + size_, text.data(), text.size());
            size_ += text.size();
        } else {
            spill(text);
        }
        return *this;
    }

    /// Null is written as nothing.
    TKMessageBuffer& operator<<(const char* text) {
        return text == nullptr ? *this : *this << std::string_view(text);
    }

    TKMessageBuffer& operator<<(const std::string& text) { return *this << std::string_view(text); }

    template <std::integral Number>
    requires(!std::same_as<Number, char> && !std::same_as<Number, bool>) TKMessageBuffer&
    operator<<(Number number) {
        std::array<char, 24> digits;  // NOLINT(cppcoreguidelines-pro-type-member-init)
        const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), number).ptr;
        return *this << std::string_view(digits.data(), end);
    }

    /// The address, as streams write it: 0x and hexadecimal digits, or 0 for null.
    template <typename Pointee>
    requires(!std::same_as<std::remove_cv_t<Pointee>, char>) TKMessageBuffer& operator<<(
        Pointee* pointer) {
        return writeAddress(reinterpret_cast<std::uintptr_t>(pointer));
    }

    /// What was written so far; valid until the next piece or the buffer's end.
    [[nodiscard]] std::string_view str() const noexcept {
        return heap_ ? std::string_view(*heap_) : std::string_view(inline_.data(), size_);
    }

  private:
    TKMessageBuffer& writeAddress(std::uintptr_t address);
    void spill(std::string_view text);

    std::array<char, inlineSize> inline_;
    std::size_t size_ = 0;
    std::unique_ptr<std::string> heap_;  ///< null while the text fits
};

}  // namespace TKLog
