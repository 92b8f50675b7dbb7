#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

namespace cimom {

/// The pattern behind LIKE, for whole texts. To match takes time in proportion to the
/// lengths of pattern and text, whatever the two hold.
class LikePattern {
  public:
    /// "%" stands for any text and "_" for any character.
    [[nodiscard]] static LikePattern ofWql(std::string_view pattern);
    /// "." stands for any character, "*" for any number of what stands before it, "|"
    /// separates alternatives, "\" takes the meaning from the next character. Absent when the
    /// pattern uses another sign of regular expressions, which would have to be escaped.
    [[nodiscard]] static std::optional<LikePattern> ofCql(std::string_view pattern);

    [[nodiscard]] bool matches(std::string_view text) const;

  private:
    struct Item {
        char32_t character = 0;
        bool any = false;     ///< any character, not the one above
        bool repeat = false;  ///< any number of times
    };
    using Sequence = std::vector<Item>;

    [[nodiscard]] static bool matches(const Sequence& sequence,
                                      const std::vector<char32_t>& characters);

    std::vector<Sequence> alternatives_;
};

}  // namespace cimom
