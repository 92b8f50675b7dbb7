#pragma once

#include <array>
#include <compare>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace ZR::Live {

/// What the kernel takes for the name of a link: 1 to 15 bytes, no "/", neither "." nor
/// "..", no blank. Nothing else may become a part of a file name, so that every name of
/// an interface has passed this check.
class InterfaceName {
  public:
    static constexpr std::size_t maxLength = 15;  // IFNAMSIZ without the NUL

    /// The only way to make one; nullopt when the text is not a name.
    [[nodiscard]] static std::optional<InterfaceName> from(std::string_view text) noexcept;

    /// Borrows the name.
    [[nodiscard]] std::string_view view() const noexcept { return {bytes_.data(), length_}; }

    friend bool operator==(const InterfaceName&, const InterfaceName&) noexcept = default;
    friend std::strong_ordering operator<=>(const InterfaceName& a,
                                            const InterfaceName& b) noexcept {
        return a.view() <=> b.view();
    }

  private:
    explicit InterfaceName(std::string_view text) noexcept;

    std::array<char, maxLength> bytes_{};
    std::uint8_t length_;
};

/// Links that a program was told to take, and to leave alone, by patterns of their names, in
/// which "*" and "?" stand for any text and any character.
struct NamePatterns {
    std::vector<std::string> taken;  ///< empty: all
    std::vector<std::string> left;   ///< these not, whatever is taken

    /// Whether the program was told to take a link of this name.
    [[nodiscard]] bool take(const InterfaceName& name) const;

    bool operator==(const NamePatterns&) const = default;
};

}  // namespace ZR::Live
