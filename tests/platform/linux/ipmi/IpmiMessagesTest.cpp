#include "ipmi/IpmiMessages.h"

#include <gtest/gtest.h>

#include <random>
#include <sstream>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using Bytes = std::vector<std::uint8_t>;

IpmiResponse lanResponse(Bytes data) {
    return {0x0d, 0x02, std::move(data)};
}

IpmiResponse channelResponse(Bytes data) {
    return {0x07, 0x42, std::move(data)};
}

/// The response in a captured table to the parameter of channel 1: the bytes behind
/// "=>", with the completion code that the table leaves out when it is 0.
IpmiResponse captured(int parameter) {
    std::istringstream lines{sample("ipmi/raw-get-lan-config.txt")};
    const std::string wanted = "raw 0x0c 0x02 0x01 " + std::to_string(parameter) + " 0 0 => ";
    for (std::string line; std::getline(lines, line);) {
        if (!line.starts_with(wanted)) {
            continue;
        }
        if (const auto refused = line.find("rsp=0x"); refused != std::string::npos) {
            return lanResponse(
                {static_cast<std::uint8_t>(std::stoul(line.substr(refused + 4), nullptr, 16))});
        }
        Bytes data{0};
        std::istringstream rest{line.substr(line.rfind("  ") + 2)};
        for (std::string byte; rest >> byte;) {
            data.push_back(static_cast<std::uint8_t>(std::stoul(byte, nullptr, 16)));
        }
        return lanResponse(data);
    }
    throw std::runtime_error("not captured");
}

template <typename Facts>
IpmiDecoded<Facts> refusal(std::string reason, std::optional<std::uint8_t> code = std::nullopt) {
    return IpmiRefusal{code, std::move(reason)};
}

TEST(IpmiMessages, RequestsAreThoseOfTheStandard) {
    EXPECT_EQ(getChannelInfo(0xe), (IpmiRequest{0x06, 0x42, {0x0e}}));
    EXPECT_EQ(getLanAddress(1), (IpmiRequest{0x0c, 0x02, {1, 3, 0, 0}}));
    EXPECT_EQ(getLanAddressSource(8), (IpmiRequest{0x0c, 0x02, {8, 4, 0, 0}}));
}

TEST(IpmiMessages, CapturedAddress) {
    EXPECT_EQ(decodeLanAddress(captured(3)),
              IpmiDecoded<std::optional<IpAddress>>{"198.51.100.77"_ip});
}

TEST(IpmiMessages, CapturedAddressSource) {
    EXPECT_EQ(decodeLanAddressSource(captured(4)), IpmiDecoded<std::uint8_t>{std::uint8_t{2}});
}

TEST(IpmiMessages, CapturedRefusal) {
    const auto address = decodeLanAddress(captured(50));
    EXPECT_EQ(address, refusal<std::optional<IpAddress>>("completion code 0x80", 0x80));
    EXPECT_TRUE(std::get<IpmiRefusal>(address).unsupported());
    EXPECT_FALSE(std::get<IpmiRefusal>(address).passing());
}

TEST(IpmiMessages, AllZeroIsNotAnAddress) {
    EXPECT_EQ(decodeLanAddress(lanResponse({0, 0x11, 0, 0, 0, 0})),
              IpmiDecoded<std::optional<IpAddress>>{std::nullopt});
    EXPECT_EQ(decodeLanAddress(lanResponse({0, 0x11, 0, 0, 0, 1})),
              IpmiDecoded<std::optional<IpAddress>>{"0.0.0.1"_ip});
}

TEST(IpmiMessages, OfTheAddressSourceTheLowHalfCounts) {
    EXPECT_EQ(decodeLanAddressSource(lanResponse({0, 0x11, 0xf3})),
              IpmiDecoded<std::uint8_t>{std::uint8_t{3}});
}

TEST(IpmiMessages, ChannelNumberAndMediumWithoutTheirReservedBits) {
    const auto info = decodeChannelInfo(channelResponse({0, 0xf1, 0x84, 1, 0x80, 0xf2, 0x1b, 0}));
    EXPECT_EQ(info, (IpmiDecoded<ChannelInfo>{ChannelInfo{.channel = 1, .medium = 4}}));
    EXPECT_TRUE(std::get<ChannelInfo>(info).isLan());
    EXPECT_FALSE((ChannelInfo{.channel = 0, .medium = 1}).isLan()) << "IPMB";
    EXPECT_FALSE((ChannelInfo{.channel = 2, .medium = 5}).isLan()) << "serial";
}

TEST(IpmiMessages, MoreBytesThanExpectedDoNotMatter) {
    EXPECT_EQ(decodeLanAddress(lanResponse({0, 0x11, 192, 0, 2, 1, 9, 9})),
              IpmiDecoded<std::optional<IpAddress>>{"192.0.2.1"_ip});
}

TEST(IpmiMessages, ShortResponsesAreToldAsSuch) {
    EXPECT_EQ(decodeLanAddress(lanResponse({})),
              refusal<std::optional<IpAddress>>("the response is empty"));
    for (const Bytes& data : {Bytes{0}, Bytes{0, 0x11}, Bytes{0, 0x11, 192, 0, 2}}) {
        EXPECT_EQ(decodeLanAddress(lanResponse(data)),
                  refusal<std::optional<IpAddress>>("the response is too short"));
    }
    EXPECT_EQ(decodeLanAddressSource(lanResponse({0, 0x11})),
              refusal<std::uint8_t>("the response is too short"));
    EXPECT_EQ(decodeChannelInfo(channelResponse({0, 1})),
              refusal<ChannelInfo>("the response is too short"));
}

TEST(IpmiMessages, ResponsesToOtherCommandsAreNotBelieved) {
    const Bytes good{0, 0x11, 192, 0, 2, 1};
    for (const IpmiResponse& response :
         {IpmiResponse{0x0c, 0x02, good}, IpmiResponse{0x0d, 0x01, good},
          IpmiResponse{0x07, 0x42, good}}) {
        EXPECT_EQ(decodeLanAddress(response),
                  refusal<std::optional<IpAddress>>("the response is to another command"));
    }
}

TEST(IpmiMessages, CodesOfABusyProcessorPass) {
    for (const std::uint8_t code : Bytes{0xc0, 0xc3, 0xd1, 0xd2, 0xd3, 0xff}) {
        EXPECT_TRUE((IpmiRefusal{code, ""}).passing()) << +code;
    }
    for (const std::uint8_t code : Bytes{0x80, 0xc1, 0xcb, 0xcc, 0xd4}) {
        EXPECT_FALSE((IpmiRefusal{code, ""}).passing()) << +code;
    }
    EXPECT_FALSE((IpmiRefusal{std::nullopt, ""}).passing());
}

TEST(IpmiMessages, AnyBytesGiveFactsOrAReason) {
    std::mt19937 random{20261120};
    std::uniform_int_distribution<unsigned> byte{0, 255};
    std::uniform_int_distribution<std::size_t> length{0, 12};
    int facts = 0;
    for (int i = 0; i < 20'000; ++i) {
        Bytes data(length(random));
        for (auto& value : data) {
            value = static_cast<std::uint8_t>(byte(random));
        }
        if (!data.empty() && i % 2 == 0) {
            data[0] = 0;
        }
        for (const auto& response : {lanResponse(data), channelResponse(data),
                                     IpmiResponse{static_cast<std::uint8_t>(byte(random)),
                                                  static_cast<std::uint8_t>(byte(random)), data}}) {
            const auto check = [&](const auto& decoded) {
                if (const auto* const refused = std::get_if<IpmiRefusal>(&decoded)) {
                    EXPECT_FALSE(refused->reason.empty());
                } else {
                    EXPECT_EQ(data.at(0), 0);
                    ++facts;
                }
            };
            check(decodeChannelInfo(response));
            check(decodeLanAddress(response));
            check(decodeLanAddressSource(response));
        }
    }
    EXPECT_GT(facts, 10'000) << "else the bytes were none that matter";
}

}  // namespace
}  // namespace ZR::Live
