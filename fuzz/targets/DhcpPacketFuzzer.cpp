// The server's messages that dhcpcd keeps.
#include "formats/DhcpPacket.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "Input.h"
#include "support/Texts.h"

namespace {

using Message = std::vector<std::uint8_t>;

void append(Message& message, const Message& bytes) {
    message.insert(message.end(), bytes.begin(), bytes.end());
}

void appendNumber(Message& message, std::uint64_t number, unsigned size) {
    for (unsigned i = 0; i < size; ++i) {
        message.push_back(static_cast<std::uint8_t>(number >> (8 * (size - 1 - i))));
    }
}

/// The least message that says this (RFC 2131). A server that is split in two options
/// is put together again (RFC 3396).
Message written(const ZR::Live::DhcpReply& reply, bool split) {
    Message message(236);
    message[0] = 2;
    if (reply.address) {
        const Message address = fuzz::addressBytes(*reply.address);
        std::copy(address.begin(), address.end(), message.begin() + 16);
    }
    append(message, {0x63, 0x82, 0x53, 0x63});
    if (!reply.bootp) {
        append(message, {53, 1, 5});
    }
    if (reply.leaseTime) {
        append(message, {51, 4});
        appendNumber(message, *reply.leaseTime, 4);
    }
    for (const auto& [code, time] : {std::pair{58, reply.renewal}, {59, reply.rebinding}}) {
        if (time) {
            append(message, {static_cast<std::uint8_t>(code), 4});
            appendNumber(message, *time, 4);
        }
    }
    if (reply.server) {
        const Message server = fuzz::addressBytes(*reply.server);
        if (split) {
            append(message, {54, 1, server[0], 0, 54, 3, server[1], server[2], server[3]});
        } else {
            append(message, {54, 4});
            append(message, server);
        }
    }
    message.push_back(255);
    return message;
}

Message written(const ZR::Live::Dhcp6Reply& reply) {
    Message message{7, 0, 0, 1};
    for (const auto& address : reply.addresses) {
        append(message, {0, 3, 0, 40});  // IA_NA with one IAADDR (RFC 8415, 21.4 and 21.6)
        appendNumber(message, 0, 4);
        appendNumber(message, address.renewal.value_or(0), 4);
        appendNumber(message, address.rebinding.value_or(0), 4);
        append(message, {0, 5, 0, 24});
        append(message, fuzz::addressBytes(address.address));
        appendNumber(message, 0, 4);
        appendNumber(message, address.validLifetime, 4);
    }
    return message;
}

/// What the least message says: others have more options, and options with other content.
template <typename Reply>
std::optional<Reply> leastOf(const ZR::Live::Parsed<Reply>& parsed) {
    const Reply* const reply = std::get_if<Reply>(&parsed);
    if (reply == nullptr) {
        return std::nullopt;
    }
    Reply least = *reply;
    least.options.clear();
    least.clientIdentifier.clear();
    return least;
}

template <typename Reply>
const Reply* replyOf(const ZR::Live::Parsed<Reply>& parsed) {
    if (const auto* const reason = std::get_if<std::string_view>(&parsed)) {
        fuzz::require(!reason->empty(), "a refusal has a reason");
    }
    return std::get_if<Reply>(&parsed);
}

void check4(const std::uint8_t* data, std::size_t size) {
    const auto parsed = ZR::Live::parseDhcpReply(fuzz::bytes(data, size));
    const auto* const reply = replyOf(parsed);
    if (reply == nullptr) {
        return;
    }
    for (const bool split : {false, true}) {
        Message message = written(*reply, split);
        append(message, {1, 2, 3});  // behind the end nothing counts
        fuzz::require(leastOf(ZR::Live::parseDhcpReply(
                          fuzz::bytes(message.data(), message.size()))) == leastOf(parsed),
                      "a reply survives being written");
    }
}

void check6(const std::uint8_t* data, std::size_t size) {
    const auto parsed = ZR::Live::parseDhcp6Reply(fuzz::bytes(data, size));
    const auto* const reply = replyOf(parsed);
    if (reply == nullptr) {
        return;
    }
    const Message message = written(*reply);
    fuzz::require(leastOf(ZR::Live::parseDhcp6Reply(fuzz::bytes(message.data(), message.size()))) ==
                      leastOf(parsed),
                  "a DHCPv6 reply survives being written");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    check4(data, size);
    check6(data, size);
    return 0;
}
