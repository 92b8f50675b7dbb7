#pragma once

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "Input.h"
#include "formats/AddressText.h"

namespace fuzz {

/// Whether a text is an address in the one form in which addresses are compared.
inline bool isAddress(int family, const std::string& text) {
    return ZR::Live::canonicalAddress(family, text) == text;
}

inline bool isAddress(const std::string& text) {
    return isAddress(text.find(':') == std::string::npos ? AF_INET : AF_INET6, text);
}

/// The bytes of a canonical address.
inline std::vector<std::uint8_t> addressBytes(const std::string& text) {
    const bool six = text.find(':') != std::string::npos;
    std::vector<std::uint8_t> bytes(six ? sizeof(in6_addr) : sizeof(in_addr));
    require(::inet_pton(six ? AF_INET6 : AF_INET, text.c_str(), bytes.data()) == 1,
            "an address is one");
    return bytes;
}

}  // namespace fuzz
