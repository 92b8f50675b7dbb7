#pragma once

#include <linux/netlink.h>

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <optional>
#include <span>
#include <string_view>
#include <type_traits>

namespace ZR::Live {

/// One attribute of a netlink message. Borrows the message.
struct Attribute {
    std::uint16_t type = 0;  ///< without the flag bits
    std::span<const std::byte> payload;
};

/// Copies a structure out of bytes, wherever they lie; nullopt when they are too few.
template <typename Value>
[[nodiscard]] std::optional<Value> valueAt(std::span<const std::byte> bytes) noexcept {
    static_assert(std::is_trivially_copyable_v<Value>);
    if (bytes.size() < sizeof(Value)) {
        return std::nullopt;
    }
    Value value{};
    std::memcpy(&value, bytes.data(), sizeof value);
    return value;
}

/// The text of a payload up to its NUL, or its end where it has none.
[[nodiscard]] inline std::string_view textOf(std::span<const std::byte> payload) noexcept {
    const std::string_view bytes{static_cast<const char*>(static_cast<const void*>(payload.data())),
                                 payload.size()};
    return bytes.substr(0, bytes.find('\0'));
}

/// Walks the attributes of a message or of a nested attribute. Total: any bytes
/// are walked up to the first attribute whose length cannot be true. libmnl's
/// own walk reads in place and so wants aligned bytes; this one takes any.
class AttributeWalk {
  public:
    explicit AttributeWalk(std::span<const std::byte> bytes) noexcept : rest_(bytes) {}

    /// Takes the next attribute; false behind the last one.
    bool next(Attribute& attribute) noexcept {
        const auto header = valueAt<nlattr>(rest_);
        if (!header) {
            // Up to three bytes may be padding.
            malformed_ = rest_.size() >= NLA_ALIGNTO;
            return false;
        }
        if (header->nla_len < sizeof(nlattr) || header->nla_len > rest_.size()) {
            malformed_ = true;
            return false;
        }
        attribute.type = header->nla_type & static_cast<std::uint16_t>(NLA_TYPE_MASK);
        attribute.payload = rest_.subspan(sizeof(nlattr), header->nla_len - sizeof(nlattr));
        const std::size_t step =
            (header->nla_len + std::size_t{NLA_ALIGNTO} - 1) & ~(std::size_t{NLA_ALIGNTO} - 1);
        rest_ = rest_.subspan(step < rest_.size() ? step : rest_.size());
        return true;
    }

    /// Whether the walk ended at bytes that are not an attribute.
    [[nodiscard]] bool malformed() const noexcept { return malformed_; }

  private:
    std::span<const std::byte> rest_;
    bool malformed_ = false;
};

}  // namespace ZR::Live
