// What a kernel responses only in rare moments cannot be had from a real one at will:
// here a transport of prepared responses, made of real message bytes, stands in its
// place. The responses of a real kernel are tested in KernelTest.cpp.

#include "kernel/RtnetlinkReader.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <deque>
#include <memory>
#include <utility>

#include "LinuxSupport.h"
#include "ScriptedTransport.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using std::chrono::milliseconds;
using std::chrono::steady_clock;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr std::array<std::uint8_t, 4> ownAddress{198, 51, 100, 7};

Step parts(const std::vector<Message>& messages) {
    return Step{messages};
}
Message done(std::int32_t code = 0) {
    return {NLMSG_DONE, NLM_F_MULTI, code};
}
Message refusal(std::int32_t code) {
    nlmsgerr error{};
    error.error = -code;
    return {NLMSG_ERROR, 0, error};
}
std::vector<Step> someLinks() {
    return {parts({linkMessage(1, "lo"), linkMessage(2, "eth0"), done()})};
}
std::vector<Step> someAddresses() {
    return {parts({addressMessage(2, ownAddress), done()})};
}

class RtnetlinkReaderTest : public testing::Test {
  protected:
    NetworkState read(std::deque<std::vector<Step>> responses,
                      milliseconds time = milliseconds{2000}) {
        auto transport = std::make_unique<ScriptedTransport>(std::move(responses));
        transport_ = transport.get();
        reader_ = std::make_unique<RtnetlinkReader>(std::move(transport));
        return reader_->read(steady_clock::now() + time);
    }
    static std::vector<std::string> names(const NetworkState& state) {
        std::vector<std::string> names;
        for (const Link& link : state.links) {
            names.emplace_back(link.name.view());
        }
        return names;
    }

    std::unique_ptr<RtnetlinkReader> reader_;
    ScriptedTransport* transport_ = nullptr;
};

TEST_F(RtnetlinkReaderTest, LinksAndAddressesOfOneMoment) {
    const NetworkState state = read({someLinks(), someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
    ASSERT_EQ(state.addresses.size(), 1U);
    EXPECT_EQ(state.addresses[0].ip, "198.51.100.7"_ip);
    EXPECT_TRUE(state.certain);
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics), IsEmpty());
    EXPECT_EQ(transport_->opened(), 1);
}

TEST_F(RtnetlinkReaderTest, ADumpMayComeInManyDatagrams) {
    const NetworkState state = read({{parts({linkMessage(1, "lo")}), parts({linkMessage(2, "a")}),
                                      parts({linkMessage(3, "b"), done()})},
                                     someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("lo", "a", "b"));
}

TEST_F(RtnetlinkReaderTest, AnInterruptedDumpIsRepeated) {
    const Message interrupted = linkMessage(2, "old", 0, NLM_F_MULTI | NLM_F_DUMP_INTR);
    const NetworkState state = read({{parts({interrupted, done()})}, someLinks(), someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
    EXPECT_TRUE(state.certain);
    EXPECT_EQ(transport_->opened(), 1);
}

TEST_F(RtnetlinkReaderTest, AnInterruptionShownAtTheEndOnlyCountsToo) {
    const Message end{NLMSG_DONE, NLM_F_MULTI | NLM_F_DUMP_INTR, std::int32_t{0}};
    const NetworkState state =
        read({{parts({linkMessage(2, "old"), end})}, someLinks(), someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
}

TEST_F(RtnetlinkReaderTest, ADumpThatIsInterruptedAgainAndAgainIsKeptAsUncertain) {
    const std::vector<Step> interrupted{
        parts({linkMessage(2, "busy", 0, NLM_F_MULTI | NLM_F_DUMP_INTR), done()})};
    const NetworkState state = read({interrupted, interrupted, interrupted, someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("busy"));
    EXPECT_EQ(state.addresses.size(), 1U);
    EXPECT_FALSE(state.certain);
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics),
                ElementsAre(HasSubstr("changed while they were read")));
}

TEST_F(RtnetlinkReaderTest, ResponsesThatWereLostAreAskedForAgainOnANewSocket) {
    const NetworkState state = read(
        {{parts({linkMessage(2, "half")}), Step::failing(ENOBUFS)}, someLinks(), someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
    EXPECT_TRUE(state.certain);
    EXPECT_EQ(transport_->opened(), 2);
}

TEST_F(RtnetlinkReaderTest, ResponsesThatAreLostAgainAndAgainGiveNoLinks) {
    const std::vector<Step> lost{parts({linkMessage(2, "half")}), Step::failing(ENOBUFS)};
    const NetworkState state = read({lost, lost, lost});
    EXPECT_THAT(state.links, IsEmpty());
    EXPECT_THAT(state.addresses, IsEmpty());
    EXPECT_FALSE(state.certain);
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics), ElementsAre(HasSubstr("lost")));
    EXPECT_EQ(transport_->asked(), 3);
}

TEST_F(RtnetlinkReaderTest, TheKernelsOwnWordForLostPartsCountsToo) {
    const Message overrun{NLMSG_OVERRUN, NLM_F_MULTI, std::int32_t{0}};
    const NetworkState state =
        read({{parts({linkMessage(2, "half"), overrun})}, someLinks(), someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
}

TEST_F(RtnetlinkReaderTest, ATruncatedDatagramIsAskedForAgainWithALargerBuffer) {
    const NetworkState state =
        read({{Step::cut({linkMessage(2, "half")})}, someLinks(), someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
    EXPECT_EQ(transport_->largestBuffer(), 65536U);
}

TEST_F(RtnetlinkReaderTest, DatagramsThatNoBufferHoldsEndAfterABoundedNumberOfTries) {
    const std::vector<Step> cut{Step::cut({linkMessage(2, "half")})};
    const NetworkState state = read({cut, cut, cut, cut, cut, cut});
    EXPECT_THAT(state.links, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics),
                ElementsAre(HasSubstr("longer than the buffer")));
    EXPECT_EQ(transport_->asked(), 3);
}

TEST_F(RtnetlinkReaderTest, ARefusalIsFinalAndNamesItsReason) {
    const NetworkState state = read({{parts({refusal(EPERM)})}});
    EXPECT_THAT(state.links, IsEmpty());
    EXPECT_FALSE(state.certain);
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics),
                ElementsAre("network links: refused: Operation not permitted"));
    EXPECT_EQ(transport_->asked(), 1);
}

TEST_F(RtnetlinkReaderTest, AnAcknowledgementIsNotARefusal) {
    const NetworkState state =
        read({{parts({refusal(0), linkMessage(2, "eth0"), done()})}, someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("eth0"));
}

TEST_F(RtnetlinkReaderTest, ARefusalWithoutItsCodeIsARefusal) {
    const Message bare{NLMSG_ERROR, 0, std::array<std::byte, 0>{}};
    const NetworkState state = read({{parts({bare})}});
    EXPECT_THAT(state.links, IsEmpty());
    EXPECT_EQ(state.diagnostics.size(), 1U);
}

TEST_F(RtnetlinkReaderTest, ADumpThatEndsWithAnErrorIsNone) {
    const NetworkState state = read({{parts({linkMessage(2, "eth0"), done(-ENOMEM)})}});
    EXPECT_THAT(state.links, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics), ElementsAre(HasSubstr("broken off: ")));
}

TEST_F(RtnetlinkReaderTest, OtherProcessesAreNotListenedTo) {
    const NetworkState state = read({{Step::from(4711, {linkMessage(66, "forged"), done()}),
                                      parts({linkMessage(2, "eth0"), done()})},
                                     someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("eth0"));
}

TEST_F(RtnetlinkReaderTest, AForeignTruncatedDatagramIsNotListenedToEither) {
    Step forged = Step::cut({linkMessage(66, "forged")});
    forged.sender = 4711;
    const NetworkState state =
        read({{forged, parts({linkMessage(2, "eth0"), done()})}, someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("eth0"));
    EXPECT_EQ(transport_->asked(), 2);
}

TEST_F(RtnetlinkReaderTest, ResponsesToAnotherRequestAreSkipped) {
    Message stray = linkMessage(66, "stray");
    const NetworkState state =
        read({{Step::withSequence(999, {stray, done()}), parts({linkMessage(2, "eth0"), done()})},
              someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("eth0"));
}

TEST_F(RtnetlinkReaderTest, EventsBetweenTheResponsesAreSkipped) {
    ifinfomsg info{};
    info.ifi_index = 2;
    Message event{RTM_DELLINK, NLM_F_MULTI, info};
    const NetworkState state =
        read({{parts({event, linkMessage(2, "eth0"), done()})}, someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("eth0"));
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics), IsEmpty());
}

TEST_F(RtnetlinkReaderTest, AMalformedMessageIsLeftOutAndReported) {
    constexpr nlattr empty{};
    Message malformed = linkMessage(2, "bad");
    malformed.raw(&empty, sizeof empty);
    const NetworkState state =
        read({{parts({malformed, linkMessage(3, "good"), done()})}, someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("good"));
    EXPECT_FALSE(state.certain);
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics),
                ElementsAre("network links: 1 malformed messages left out"));
}

TEST_F(RtnetlinkReaderTest, AMessageLongerThanItsDatagramIsLeftOutAndReported) {
    Message tooLong = linkMessage(2, "bad");
    tooLong.claimLength(4000);
    const NetworkState state =
        read({{parts({tooLong}), parts({linkMessage(3, "good"), done()})}, someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("good"));
    EXPECT_FALSE(state.certain);
}

TEST_F(RtnetlinkReaderTest, AMessageOfALengthWithTheHighestBitIsLeftOutAndReported) {
    Message tooLong = linkMessage(2, "bad");
    tooLong.claimLength(0xFFFFFFF0U);
    const NetworkState state =
        read({{parts({tooLong}), parts({linkMessage(3, "good"), done()})}, someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("good"));
    EXPECT_FALSE(state.certain);
}

TEST_F(RtnetlinkReaderTest, SilenceEndsAtTheDeadline) {
    const NetworkState state = read({{}}, milliseconds{60});
    EXPECT_THAT(state.links, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics), ElementsAre(HasSubstr("no response: ")));
}

TEST_F(RtnetlinkReaderTest, ADumpThatNeverEndsEndsAtTheDeadline) {
    const NetworkState state = read({{Step::endless({linkMessage(2, "again")})}}, milliseconds{60});
    EXPECT_THAT(state.links, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics),
                ElementsAre(HasSubstr("no complete response in time")));
}

// No real kernel can be made to keep a request at will; so this one does.
TEST_F(RtnetlinkReaderTest, TimeForWhichTheKernelKeepsTheRequestIsNotTheResponses) {
    auto transport = std::make_unique<ScriptedTransport>(std::deque<std::vector<Step>>{
        {parts({linkMessage(1, "lo")}), parts({linkMessage(2, "eth0"), done()})}, someAddresses()});
    transport->holdRequests(milliseconds{30});
    RtnetlinkReader reader{std::move(transport)};
    const NetworkState state = reader.read(steady_clock::now() + milliseconds{20});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
    EXPECT_EQ(state.addresses.size(), 1U);
    EXPECT_TRUE(state.certain);
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics), IsEmpty());
}

TEST_F(RtnetlinkReaderTest, AfterTheDeadlineNothingIsAskedForAgain) {
    const Message interrupted = linkMessage(2, "busy", 0, NLM_F_MULTI | NLM_F_DUMP_INTR);
    auto transport = std::make_unique<ScriptedTransport>(std::deque<std::vector<Step>>{
        {parts({interrupted, done()})}, someAddresses(), someLinks()});
    transport->holdRequests(milliseconds{30});
    const ScriptedTransport& held = *transport;
    RtnetlinkReader reader{std::move(transport)};
    const NetworkState state = reader.read(steady_clock::now() + milliseconds{20});
    EXPECT_EQ(held.asked(), 2);
    EXPECT_THAT(names(state), ElementsAre("busy"));
    EXPECT_EQ(state.addresses.size(), 1U);
    EXPECT_FALSE(state.certain) << "to be read again";
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics),
                ElementsAre("network links: changed while they were read"));
}

TEST_F(RtnetlinkReaderTest, AfterAFailureTheNextReadingBeginsAnew) {
    EXPECT_THAT(read({{parts({refusal(EBUSY)})}, someLinks(), someAddresses()}).links, IsEmpty());
    const NetworkState state = reader_->read(steady_clock::now() + milliseconds{2000});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
    EXPECT_EQ(transport_->opened(), 2);
}

TEST_F(RtnetlinkReaderTest, UnreadableAddressesLeaveTheLinks) {
    const NetworkState state = read({someLinks(), {parts({refusal(EACCES)})}});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
    EXPECT_THAT(state.addresses, IsEmpty());
    EXPECT_FALSE(state.certain);
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics),
                ElementsAre("network addresses: refused: Permission denied"));
}

TEST_F(RtnetlinkReaderTest, AnInterruptedDumpOfAddressesIsRepeatedAlone) {
    const Message end{NLMSG_DONE, NLM_F_MULTI | NLM_F_DUMP_INTR, std::int32_t{0}};
    const NetworkState state =
        read({someLinks(), {parts({addressMessage(2, {192, 0, 2, 1}), end})}, someAddresses()});
    ASSERT_EQ(state.addresses.size(), 1U);
    EXPECT_EQ(state.addresses[0].ip, "198.51.100.7"_ip);
    EXPECT_TRUE(state.certain);
    EXPECT_EQ(transport_->asked(), 3);
}

TEST_F(RtnetlinkReaderTest, AddressesThatWereLostAreAskedForAgain) {
    const NetworkState state =
        read({someLinks(),
              {parts({addressMessage(2, {192, 0, 2, 1})}), Step::failing(ENOBUFS)},
              someAddresses()});
    ASSERT_EQ(state.addresses.size(), 1U);
    EXPECT_EQ(state.addresses[0].ip, "198.51.100.7"_ip);
    EXPECT_TRUE(state.certain);
}

TEST_F(RtnetlinkReaderTest, EveryRefusalLeavesNoLinksAndIsUncertain) {
    for (const int code : {EBUSY, ENODEV, ENOMEM, EOPNOTSUPP, EINVAL}) {
        const NetworkState state = read({{parts({refusal(code)})}});
        EXPECT_THAT(state.links, IsEmpty()) << code;
        EXPECT_FALSE(state.certain) << code;
        EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics),
                    ElementsAre(HasSubstr("network links: ")))
            << code;
    }
}

TEST_F(RtnetlinkReaderTest, ARefusalWithinADumpEndsIt) {
    const NetworkState state =
        read({{parts({linkMessage(2, "half")}), parts({refusal(ENOMEM)})}, someAddresses()});
    EXPECT_THAT(state.links, IsEmpty());
    EXPECT_FALSE(state.certain);
}

TEST_F(RtnetlinkReaderTest, AddressesOfALinkThatVanishedMeanwhileStay) {
    // Whoever joins the two leaves them out.
    const NetworkState state =
        read({someLinks(),
              {parts({addressMessage(9, {192, 0, 2, 9}), addressMessage(2, ownAddress), done()})}});
    EXPECT_THAT(names(state), ElementsAre("lo", "eth0"));
    EXPECT_EQ(state.addresses.size(), 2U);
    EXPECT_TRUE(state.certain);
}

TEST_F(RtnetlinkReaderTest, AttributesWithoutAPayloadTellNothing) {
    Message bare = linkMessage(3, "bare");
    for (const std::uint16_t type :
         {IFLA_OPERSTATE, IFLA_CARRIER, IFLA_MASTER, IFLA_LINKINFO, IFLA_LINK_NETNSID}) {
        bare.attribute(type, {});
    }
    Message nameless = linkMessage(4, "nameless");
    nameless.attribute(IFLA_IFNAME, {});
    const NetworkState state = read({{parts({bare, nameless, done()})}, someAddresses()});
    ASSERT_THAT(names(state), ElementsAre("bare"));
    EXPECT_EQ(state.links[0].operstate, 0);
    EXPECT_EQ(state.links[0].carrier, std::nullopt);
    EXPECT_EQ(state.links[0].master, 0U);
    EXPECT_EQ(state.links[0].kind, "");
    EXPECT_FALSE(state.certain) << "a link without a name is none";
}

TEST_F(RtnetlinkReaderTest, WhatSaysNothingIsSkipped) {
    const Message nothing{NLMSG_NOOP, NLM_F_MULTI, std::int32_t{0}};
    const NetworkState state =
        read({{parts({nothing, linkMessage(2, "eth0"), nothing, done()})}, someAddresses()});
    EXPECT_THAT(names(state), ElementsAre("eth0"));
    EXPECT_TRUE(state.certain);
}

TEST_F(RtnetlinkReaderTest, ASocketThatCannotBeOpenedIsAReason) {
    auto transport = std::make_unique<ScriptedTransport>(std::deque<std::vector<Step>>{});
    transport->refuseToOpen(EMFILE);
    RtnetlinkReader reader{std::move(transport)};
    const NetworkState state = reader.read(steady_clock::now() + milliseconds{2000});
    EXPECT_THAT(state.links, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(state.diagnostics),
                ElementsAre(HasSubstr("cannot be asked for: ")));
}

}  // namespace
}  // namespace ZR::Live
