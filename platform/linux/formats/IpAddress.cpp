#include "formats/IpAddress.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include <algorithm>

namespace ZR::Live {
namespace {

std::size_t lengthOf(int family) {
    switch (family) {
        case AF_INET:
            return sizeof(in_addr);
        case AF_INET6:
            return sizeof(in6_addr);
        default:
            return 0;
    }
}

}  // namespace

IpAddress::IpAddress(int family, std::span<const std::byte> bytes) noexcept
    : family_(static_cast<std::uint8_t>(family)) {
    std::copy(bytes.begin(), bytes.end(), bytes_.begin());
}

std::optional<IpAddress> IpAddress::fromBytes(int family,
                                              std::span<const std::byte> bytes) noexcept {
    const std::size_t length = lengthOf(family);
    if (length == 0 || bytes.size() != length) {
        return std::nullopt;
    }
    return IpAddress{family, bytes};
}

std::optional<IpAddress> IpAddress::fromText(int family, std::string_view text) {
    std::array<std::byte, sizeof(in6_addr)> bytes{};
    // A zero byte inside would end the text early for inet_pton.
    if (lengthOf(family) == 0 || text.find('\0') != std::string_view::npos ||
        ::inet_pton(family, std::string{text}.c_str(), bytes.data()) != 1) {
        return std::nullopt;
    }
    return IpAddress{family, std::span{bytes}.first(lengthOf(family))};
}

std::optional<IpAddress> IpAddress::ipv4FromText(std::string_view text) {
    return fromText(AF_INET, text.substr(0, text.find('/')));
}

bool IpAddress::isIPv4() const noexcept {
    return family_ == AF_INET;
}

std::span<const std::byte> IpAddress::bytes() const noexcept {
    return std::span{bytes_}.first(lengthOf(family_));
}

bool IpAddress::isUnspecified() const noexcept {
    return bytes_ == std::array<std::byte, 16>{};
}

std::string IpAddress::text() const {
    std::array<char, INET6_ADDRSTRLEN> text{};
    // Cannot fail: the family is one of the two, and the room is that of the longest text.
    static_cast<void>(::inet_ntop(family_, bytes_.data(), text.data(), text.size()));
    return text.data();
}

}  // namespace ZR::Live
