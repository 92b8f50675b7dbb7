#pragma once

#include <cstdint>
#include <cstring>
#include <string_view>

#include "cimom/Names.h"

namespace cimom {

/// A name with its hash, both without regard to case: computed once for all the
/// look-ups that setting one property needs.
class NameKey {
  public:
    explicit NameKey(std::string_view text) noexcept : text_(text), hash_(hashOf(text)) {}

    [[nodiscard]] std::string_view text() const noexcept { return text_; }
    [[nodiscard]] std::uint64_t hash() const noexcept { return hash_; }

    /// Whether the name, whose hash is known too, is the same.
    [[nodiscard]] bool is(std::string_view name, std::uint64_t itsHash) const noexcept {
        return hash_ == itsHash && (text_ == name || sameName(text_, name));
    }

  private:
    /// Eight bytes at a time. Setting the bit that tells the cases of a letter
    /// apart may make other characters equal too, which a hash may do.
    static std::uint64_t hashOf(std::string_view text) noexcept {
        constexpr std::uint64_t lowerCase = 0x2020202020202020U;
        constexpr std::uint64_t factor = 0x9e3779b97f4a7c15U;
        std::uint64_t hash = text.size() * factor;
        std::size_t at = 0;
        while (at < text.size()) {
            const std::size_t rest = text.size() - at;
            const std::size_t length = rest < sizeof(std::uint64_t) ? rest : sizeof(std::uint64_t);
            std::uint64_t word = 0;
            std::memcpy(&word, text.data() + at, length);
            hash = (hash ^ (word | lowerCase)) * factor;
            hash ^= hash >> 32U;
            at += length;
        }
        return hash;
    }

    std::string_view text_;
    std::uint64_t hash_;
};

}  // namespace cimom
