#include "ipmi/IpmiMessages.h"

#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cstddef>

namespace ZR::Live {
namespace {

constexpr std::uint8_t appRequest = 0x06;
constexpr std::uint8_t transportRequest = 0x0C;
constexpr std::uint8_t channelInfoCommand = 0x42;
constexpr std::uint8_t lanParametersCommand = 0x02;
constexpr std::uint8_t addressParameter = 3;
constexpr std::uint8_t addressSourceParameter = 4;

// Node busy, time-out, update mode, initialization, destination unavailable, and
// "unspecified", which the kernel sends in place of a processor that it lost.
constexpr std::array<std::uint8_t, 6> passingCodes{0xC0, 0xC3, 0xD1, 0xD2, 0xD3, 0xFF};

IpmiRequest getLanParameter(std::uint8_t channel, std::uint8_t parameter) {
    // Neither parameter is a set of several: set and block selector are 0.
    return {transportRequest, lanParametersCommand, {channel, parameter, 0, 0}};
}

std::string hexadecimal(std::uint8_t number) {
    constexpr std::string_view digits = "0123456789abcdef";
    return {'0', 'x', digits[number >> 4U], digits[number & 0xFU]};
}

/// The bytes behind the completion code.
IpmiDecoded<std::span<const std::uint8_t>> payload(const IpmiResponse& response,
                                                   std::uint8_t request, std::uint8_t command,
                                                   std::size_t size) {
    if (response.netFn != request + 1 || response.command != command) {
        return IpmiRefusal{std::nullopt, "the response is to another command"};
    }
    if (response.data.empty()) {
        return IpmiRefusal{std::nullopt, "the response is empty"};
    }
    const std::uint8_t code = response.data.front();
    if (code != 0) {
        return IpmiRefusal{code, "completion code " + hexadecimal(code)};
    }
    const std::span<const std::uint8_t> rest = std::span{response.data}.subspan(1);
    if (rest.size() < size) {
        return IpmiRefusal{std::nullopt, "the response is too short"};
    }
    return rest;
}

/// The value of a parameter: what lies behind its revision, whose number does not
/// matter as every revision so far can be read as the first.
IpmiDecoded<std::span<const std::uint8_t>> parameter(const IpmiResponse& response,
                                                     std::size_t size) {
    auto found = payload(response, transportRequest, lanParametersCommand, 1 + size);
    if (auto* const bytes = std::get_if<std::span<const std::uint8_t>>(&found)) {
        *bytes = bytes->subspan(1, size);
    }
    return found;
}

}  // namespace

bool IpmiRefusal::passing() const noexcept {
    return code && std::find(passingCodes.begin(), passingCodes.end(), *code) != passingCodes.end();
}

IpmiRequest getChannelInfo(std::uint8_t channel) {
    return {appRequest, channelInfoCommand, {channel}};
}

IpmiRequest getLanAddress(std::uint8_t channel) {
    return getLanParameter(channel, addressParameter);
}

IpmiRequest getLanAddressSource(std::uint8_t channel) {
    return getLanParameter(channel, addressSourceParameter);
}

IpmiDecoded<ChannelInfo> decodeChannelInfo(const IpmiResponse& response) {
    auto found = payload(response, appRequest, channelInfoCommand, 2);
    if (auto* const refusal = std::get_if<IpmiRefusal>(&found)) {
        return std::move(*refusal);
    }
    const auto bytes = std::get<std::span<const std::uint8_t>>(found);
    return ChannelInfo{.channel = static_cast<std::uint8_t>(bytes[0] & 0x0FU),
                       .medium = static_cast<std::uint8_t>(bytes[1] & 0x7FU)};
}

IpmiDecoded<std::optional<IpAddress>> decodeLanAddress(const IpmiResponse& response) {
    auto found = parameter(response, 4);
    if (auto* const refusal = std::get_if<IpmiRefusal>(&found)) {
        return std::move(*refusal);
    }
    const auto bytes = std::get<std::span<const std::uint8_t>>(found);
    auto address = IpAddress::fromBytes(AF_INET, std::as_bytes(bytes));
    if (address && address->isUnspecified()) {
        address.reset();
    }
    return address;
}

IpmiDecoded<std::uint8_t> decodeLanAddressSource(const IpmiResponse& response) {
    auto found = parameter(response, 1);
    if (auto* const refusal = std::get_if<IpmiRefusal>(&found)) {
        return std::move(*refusal);
    }
    const auto bytes = std::get<std::span<const std::uint8_t>>(found);
    return static_cast<std::uint8_t>(bytes[0] & 0x0FU);
}

}  // namespace ZR::Live
