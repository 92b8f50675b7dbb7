#pragma once

#include <cstddef>
#include <iterator>
#include <string_view>

namespace ZR {

/// Where something stands in a text: lines and columns count from 1, columns in bytes.
struct TextPlace {
    std::size_t line = 1;
    std::size_t column = 1;

    bool operator==(const TextPlace&) const = default;
};

/// The place of the byte at an offset; of the end, for an offset beyond it.
[[nodiscard]] TextPlace placeOf(std::size_t offset, std::string_view text);

/// Hands a JSON text to the parser one character after the other, and knows from
/// that where each token begins, which the parser itself does not tell. Borrows
/// the text, and is borrowed by its iterators.
class TokenTracker {
  public:
    explicit TokenTracker(std::string_view text) noexcept;

    class Iterator {
      public:
        using iterator_category = std::input_iterator_tag;
        using value_type = char;
        using difference_type = std::ptrdiff_t;
        using pointer = const char*;
        using reference = const char&;

        Iterator(const char* at, const char*& reached) noexcept : at_(at), reached_(&reached) {}

        reference operator*() const noexcept { return *at_; }
        Iterator& operator++() noexcept {
            *reached_ = ++at_;
            return *this;
        }
        bool operator==(const Iterator& other) const noexcept { return at_ == other.at_; }
        bool operator!=(const Iterator& other) const noexcept { return at_ != other.at_; }

      private:
        const char* at_;
        const char** reached_;
    };

    [[nodiscard]] Iterator begin() noexcept { return {text_.data(), reached_}; }
    [[nodiscard]] Iterator end() noexcept { return {text_.data() + text_.size(), reached_}; }

    /// Goes past the token that the parser has just handed over. `lookAhead` is
    /// how far the parser is ahead of its end: 1 after a number, whose end it
    /// cannot see otherwise, else 0.
    void pass(std::size_t lookAhead) noexcept;

    /// Offset of the token that the parser has just handed over and that was not
    /// passed yet.
    [[nodiscard]] std::size_t start() const noexcept;

  private:
    std::string_view text_;
    const char* reached_;
    std::size_t lastEnd_ = 0;
};

}  // namespace ZR
