#include "formats/DhcpPacket.h"

#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <string_view>
#include <tuple>
#include <utility>

#include "formats/ValueFormats.h"

namespace ZR::Live {
namespace {

using Bytes = std::span<const std::byte>;

// The fixed part of a BOOTP message (RFC 951) and the cookie before the options
// (RFC 2132, section 2).
constexpr std::size_t yourAddressAt = 16;
constexpr std::size_t serverNameAt = 44;
constexpr std::size_t serverNameSize = 64;
constexpr std::size_t fileAt = 108;
constexpr std::size_t fileSize = 128;
constexpr std::size_t cookieAt = 236;
constexpr std::size_t optionsAt = 240;
constexpr std::size_t addressSize = 4;
constexpr unsigned bootReply = 2;
constexpr std::array<unsigned, 4> cookie{0x63, 0x82, 0x53, 0x63};

// RFC 2132.
constexpr unsigned padOption = 0;
constexpr unsigned leaseTimeOption = 51;
constexpr unsigned overloadOption = 52;
constexpr unsigned messageTypeOption = 53;
constexpr unsigned serverOption = 54;
constexpr unsigned renewalOption = 58;
constexpr unsigned rebindingOption = 59;
constexpr unsigned clientOption = 61;
constexpr unsigned endOption = 255;
constexpr unsigned overloadsFile = 1;
constexpr unsigned overloadsServerName = 2;

// RFC 8415.
constexpr unsigned replyMessage = 7;
constexpr std::size_t messageHeaderSize = 4;
constexpr unsigned clientOption6 = 1;
constexpr unsigned associationOption = 3;           // IA_NA
constexpr unsigned temporaryAssociationOption = 4;  // IA_TA
constexpr unsigned addressOption = 5;
constexpr std::size_t associationHeaderSize = 12;
constexpr std::size_t renewalAt = 4;
constexpr std::size_t rebindingAt = 8;
constexpr std::size_t temporaryAssociationHeaderSize = 4;
constexpr std::size_t longAddressSize = 16;
constexpr std::size_t addressHeaderSize = 24;
constexpr std::size_t validLifetimeAt = 20;

constexpr std::string_view optionTooLong = "an option is longer than the message";

unsigned at(Bytes bytes, std::size_t position) {
    return std::to_integer<unsigned>(bytes[position]);
}

std::uint32_t number(Bytes bytes) {
    std::uint32_t value = 0;
    for (const std::byte byte : bytes) {
        value = value << 8U | std::to_integer<std::uint32_t>(byte);
    }
    return value;
}

void addOnce(unsigned code, std::vector<std::uint16_t>& codes) {
    const auto number = static_cast<std::uint16_t>(code);
    if (std::find(codes.begin(), codes.end(), number) == codes.end()) {
        codes.push_back(number);
    }
}

/// The options that matter here, each with all its parts.
struct Options {
    std::vector<std::uint16_t> codes;
    std::vector<std::byte> leaseTime;
    std::vector<std::byte> overload;
    std::vector<std::byte> messageType;
    std::vector<std::byte> server;
    std::vector<std::byte> renewal;
    std::vector<std::byte> rebinding;
    std::vector<std::byte> client;

    std::vector<std::byte>* find(unsigned code) {
        switch (code) {
            case leaseTimeOption:
                return &leaseTime;
            case overloadOption:
                return &overload;
            case messageTypeOption:
                return &messageType;
            case serverOption:
                return &server;
            case renewalOption:
                return &renewal;
            case rebindingOption:
                return &rebinding;
            case clientOption:
                return &client;
            default:
                return nullptr;
        }
    }
};

/// Gathers options up to the end option. Returns a reason when one cannot be true;
/// `ended` tells whether there was an end option.
std::string_view gather(Bytes area, Options& options, bool& ended) {
    ended = false;
    while (!area.empty()) {
        const unsigned code = at(area, 0);
        if (code == endOption) {
            ended = true;
            return {};
        }
        if (code == padOption) {
            area = area.subspan(1);
            continue;
        }
        if (area.size() < 2 || area.size() - 2 < at(area, 1)) {
            return optionTooLong;
        }
        const Bytes value = area.subspan(2, at(area, 1));
        addOnce(code, options.codes);
        if (auto* const kept = options.find(code)) {
            kept->insert(kept->end(), value.begin(), value.end());
        }
        area = area.subspan(2 + value.size());
    }
    return {};
}

/// Calls the action with the code and the value of each option of an area; false when
/// one is longer than the area, or the action says so.
template <typename Action>
bool forEachOption6(Bytes area, Action action) {
    while (!area.empty()) {
        if (area.size() < 4) {
            return false;
        }
        const unsigned code = number(area.first(2));
        const std::size_t length = number(area.subspan(2, 2));
        if (area.size() - 4 < length || !action(code, area.subspan(4, length))) {
            return false;
        }
        area = area.subspan(4 + length);
    }
    return true;
}

/// The time at a place of an association; nullopt for 0, which leaves it to the client.
std::optional<std::uint32_t> timeAt(Bytes association, std::size_t position) {
    const std::uint32_t time = number(association.subspan(position, sizeof(std::uint32_t)));
    return time == 0 ? std::nullopt : std::optional{time};
}

bool gatherAddresses(Bytes association, std::size_t header, Dhcp6Reply& reply) {
    if (association.size() < header) {
        return false;
    }
    const bool timed = header == associationHeaderSize;
    const auto renewal = timed ? timeAt(association, renewalAt) : std::nullopt;
    const auto rebinding = timed ? timeAt(association, rebindingAt) : std::nullopt;
    return forEachOption6(association.subspan(header), [&](unsigned code, Bytes value) {
        if (code != addressOption) {
            return true;
        }
        if (value.size() < addressHeaderSize) {
            return false;
        }
        const std::uint32_t lifetime = number(value.subspan(validLifetimeAt, 4));
        const auto address = IpAddress::fromBytes(AF_INET6, value.first(longAddressSize));
        if (address && lifetime != 0) {  // 0 takes the address back
            reply.addresses.push_back({.address = *address,
                                       .validLifetime = lifetime,
                                       .renewal = renewal,
                                       .rebinding = rebinding});
        }
        return true;
    });
}

}  // namespace

Parsed<DhcpReply> parseDhcpReply(Bytes message) {
    if (message.size() < optionsAt) {
        return std::string_view{"shorter than a DHCP message"};
    }
    if (at(message, 0) != bootReply) {
        return std::string_view{"not a reply of a server"};
    }
    for (std::size_t i = 0; i < cookie.size(); ++i) {
        if (at(message, cookieAt + i) != cookie.at(i)) {
            return std::string_view{"no DHCP magic cookie"};
        }
    }
    Options options;
    bool ended = false;
    if (const auto reason = gather(message.subspan(optionsAt), options, ended); !reason.empty()) {
        return reason;
    }
    if (!ended) {
        return std::string_view{"no end option"};
    }
    // In this order (RFC 3396, section 5). A field is full without an end option, too.
    const unsigned overload =
        options.overload.empty() ? 0 : number(Bytes{options.overload}.last(1));
    for (const auto& [bit, start, size] :
         {std::tuple{overloadsFile, fileAt, fileSize},
          std::tuple{overloadsServerName, serverNameAt, serverNameSize}}) {
        if ((overload & bit) != 0) {
            if (const auto reason = gather(message.subspan(start, size), options, ended);
                !reason.empty()) {
                return reason;
            }
        }
    }
    DhcpReply reply;
    const auto yours = IpAddress::fromBytes(AF_INET, message.subspan(yourAddressAt, addressSize));
    if (yours && !yours->isUnspecified()) {
        reply.address = yours;
    }
    reply.server = IpAddress::fromBytes(AF_INET, options.server);
    reply.bootp = options.messageType.empty();
    const auto seconds = [](const std::vector<std::byte>& value) {
        return value.size() == sizeof(std::uint32_t) ? std::optional{number(value)} : std::nullopt;
    };
    reply.leaseTime = seconds(options.leaseTime);
    reply.renewal = seconds(options.renewal);
    reply.rebinding = seconds(options.rebinding);
    reply.options = std::move(options.codes);
    reply.clientIdentifier = hexadecimal(options.client);
    return reply;
}

Parsed<Dhcp6Reply> parseDhcp6Reply(Bytes message) {
    if (message.size() < messageHeaderSize) {
        return std::string_view{"shorter than a DHCPv6 message"};
    }
    if (at(message, 0) != replyMessage) {
        return std::string_view{"not a reply of a server"};
    }
    Dhcp6Reply reply;
    const bool whole =
        forEachOption6(message.subspan(messageHeaderSize), [&](unsigned code, Bytes value) {
            addOnce(code, reply.options);
            if (code == clientOption6) {
                reply.clientIdentifier = hexadecimal(value);
            }
            if (code == associationOption) {
                return gatherAddresses(value, associationHeaderSize, reply);
            }
            return code != temporaryAssociationOption ||
                   gatherAddresses(value, temporaryAssociationHeaderSize, reply);
        });
    if (!whole) {
        return optionTooLong;
    }
    return reply;
}

}  // namespace ZR::Live
