#include "formats/AddressText.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include <array>

namespace ZR::Live {
namespace {

std::size_t addressLength(int family) {
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

std::optional<std::string> addressText(int family, std::span<const std::byte> bytes) {
    const std::size_t length = addressLength(family);
    if (length == 0 || bytes.size() != length) {
        return std::nullopt;
    }
    std::array<char, INET6_ADDRSTRLEN> text{};
    if (::inet_ntop(family, bytes.data(), text.data(), text.size()) == nullptr) {
        return std::nullopt;
    }
    return std::string{text.data()};
}

std::optional<std::string> canonicalAddress(int family, std::string_view text) {
    std::array<std::byte, sizeof(in6_addr)> bytes{};
    // A zero byte inside would end the text early for inet_pton.
    if (addressLength(family) == 0 || text.find('\0') != std::string_view::npos ||
        ::inet_pton(family, std::string{text}.c_str(), bytes.data()) != 1) {
        return std::nullopt;
    }
    return addressText(family, std::span{bytes}.first(addressLength(family)));
}

std::string canonicalIPv4(std::string_view text) {
    return canonicalAddress(AF_INET, text.substr(0, text.find('/'))).value_or("");
}

}  // namespace ZR::Live
