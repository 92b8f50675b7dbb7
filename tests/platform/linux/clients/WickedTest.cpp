// wicked does not exist for Debian, so its files here are written after its own
// description of them and not captured.

#include "clients/Wicked.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include "LinuxSupport.h"
#include "Untrusted.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr const char* wickedLease4 = R"(<?xml version="1.0"?>
<!-- <state>released</state> -->
<lease>
  <family>ipv4</family>
  <type>dhcp</type>
  <owner>dhcp4</owner>
  <uuid>11111111-2222-4333-8444-555555555555</uuid>
  <state>granted</state>
  <acquired>1000000</acquired>
  <empty/>
  <addresses>
    <address><local>198.51.100.7/24</local></address>
  </addresses>
  <ipv4:dhcp>
    <server-id>198.51.100.1</server-id>
    <relay-address>198.51.100.2</relay-address>
    <lease-time>600</lease-time>
    <renewal-time>300</renewal-time>
    <rebind-time>525</rebind-time>
    <client-id>01:52:54:00:00:00:04</client-id>
    <address>198.51.100.7</address>
    <netmask>255.255.255.0</netmask>
  </ipv4:dhcp>
</lease>
)";

constexpr const char* wickedLease6 = R"(<lease>
  <family>ipv6</family>
  <type>dhcp</type>
  <state>granted</state>
  <acquired>1000000</acquired>
  <ipv6:dhcp>
    <server-id>00:01:00:01:32:93</server-id>
    <server-address>fe80::1%eth1</server-address>
    <ia-na>
      <interface-id>1</interface-id>
      <acquired>1000050</acquired>
      <renewal-time>200</renewal-time>
      <rebind-time>400</rebind-time>
      <ia-addr>
        <address>2001:db8::7</address>
        <preferred-lft>300</preferred-lft>
        <valid-lft>600</valid-lft>
      </ia-addr>
    </ia-na>
  </ipv6:dhcp>
</lease>
)";

std::string with(std::string text, const std::string& from, const std::string& to) {
    return text.replace(text.find(from), from.size(), to);
}

WickedLease parsedWicked(const std::string& xml) {
    const auto parsed = parseWickedLease(xml);
    return std::get<WickedLease>(parsed);
}

TEST(WickedLease, OfIPv4) {
    EXPECT_EQ(parsedWicked(wickedLease4),
              (WickedLease{.family = AF_INET,
                           .type = "dhcp",
                           .state = "granted",
                           .server = "198.51.100.1"_ip,
                           .addresses = {{.address = "198.51.100.7"_ip,
                                          .acquired = 1'000'000,
                                          .lifetime = 600,
                                          .renewal = 300,
                                          .rebinding = 525}},
                           .clientIdentifier = "01:52:54:00:00:00:04"}));
}

TEST(WickedLease, OfIPv6NamesTheSenderOfTheServersMessages) {
    EXPECT_EQ(parsedWicked(wickedLease6), (WickedLease{.family = AF_INET6,
                                                       .type = "dhcp",
                                                       .state = "granted",
                                                       .server = "fe80::1"_ip,
                                                       .addresses = {{.address = "2001:db8::7"_ip,
                                                                      .acquired = 1'000'050,
                                                                      .lifetime = 600,
                                                                      .renewal = 200,
                                                                      .rebinding = 400}}}));
}

TEST(WickedLease, EveryBeginningIsTornOrEmpty) {
    const std::string whole = wickedLease4;
    const std::size_t end = whole.rfind("</lease>") + 8;
    for (std::size_t size = 0; size < end; ++size) {
        const auto parsed = parseWickedLease(whole.substr(0, size));
        if (const auto* const facts = std::get_if<WickedLease>(&parsed)) {
            EXPECT_THAT(facts->addresses, IsEmpty()) << size;
        }
    }
}

TEST(WickedLease, OtherTextsGiveAReasonOrNothing) {
    EXPECT_EQ(parsedWicked(""),
              (WickedLease{.type = "", .state = "", .server = {}, .addresses = {}}));
    EXPECT_EQ(parsedWicked("text").addresses.size(), 0U);
    for (const char* text : {"<lease>", "<lease", "</lease>", "<a></b>", "<!-- <a>"}) {
        EXPECT_TRUE(std::holds_alternative<std::string_view>(parseWickedLease(text))) << text;
    }
    std::string deep;
    for (int i = 0; i < 100'000; ++i) {
        deep += "<a>";
    }
    EXPECT_EQ(std::get<std::string_view>(parseWickedLease(deep)), "elements lie too deep");
}

class WickedTest : public testing::Test {
  protected:
    static constexpr const char* file = "/var/lib/wicked/lease-eth1-dhcp-ipv4.xml";

    [[nodiscard]] ClientFacts read(ClientFacts facts = {}) const {
        return readWith(readWicked, root_, std::move(facts));
    }

    TemporaryDirectory root_;
};

TEST_F(WickedTest, ALeaseIsTheFilesInterfacesOwn) {
    root_.write(file, wickedLease4);
    Lease expected{.client = Client::Wicked,
                   .interfaceName = "eth1"_name,
                   .address = "198.51.100.7"_ip,
                   .server = "198.51.100.1"_ip,
                   .expires = 1'000'600,
                   .obtained = 1'000'000,
                   .renews = 1'000'300,
                   .rebinds = 1'000'525,
                   .clientIdentifier = "01:52:54:00:00:00:04",
                   .origin = root_.path(file)};
    EXPECT_THAT(read().leases, ElementsAre(expected));
    expected.clientAlive = true;
    expected.pid = 7;
    EXPECT_THAT(read(running(Client::Wicked)).leases, ElementsAre(expected));
}

TEST_F(WickedTest, BothPlacesAndProtocolsAreRead) {
    root_.write("/run/wicked/lease-a-b-dhcp-ipv6.xml", wickedLease6);
    EXPECT_THAT(read().leases,
                ElementsAre(Lease{.client = Client::Wicked,
                                  .interfaceName = "a-b"_name,
                                  .address = "2001:db8::7"_ip,
                                  .server = "fe80::1"_ip,
                                  .expires = 1'000'650,
                                  .obtained = 1'000'050,
                                  .renews = 1'000'250,
                                  .rebinds = 1'000'450,
                                  .origin = root_.path("/run/wicked/lease-a-b-dhcp-ipv6.xml")}));
}

TEST_F(WickedTest, OnlyWhatIsGrantedByDhcpWithATimeIsALease) {
    for (const std::string& content :
         {with(wickedLease4, ">granted<", ">released<"), with(wickedLease4, ">dhcp<", ">static<"),
          with(wickedLease4, "<lease-time>600</lease-time>", ""),
          with(wickedLease4, ">ipv4<", ">ipx<"), with(wickedLease4, ">1000000<", ">soon<")}) {
        root_.write(file, content);
        EXPECT_THAT(read().leases, IsEmpty()) << content;
    }
    root_.write(file, with(wickedLease4, ">600<", ">4294967295<"));
    EXPECT_EQ(read().leases.at(0).expires, Lease::never);
}

TEST_F(WickedTest, ATornFileIsReportedAndOthersAreNotLookedAt) {
    root_.write(file, "<lease>");
    root_.write("/var/lib/wicked/lease-eth1-auto-ipv6.xml", wickedLease6);
    root_.write("/var/lib/wicked/lease--dhcp-ipv4.xml", wickedLease4);
    root_.write("/var/lib/wicked/duid.xml", wickedLease4);
    EXPECT_THAT(read().leases, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(read().diagnostics),
                ElementsAre(HasSubstr("the file ends within an element")));
}

TEST_F(WickedTest, AFileThatOthersCouldHaveWrittenIsNotBelieved) {
    root_.write(file, wickedLease4);
    ZR::Testing::letOthersWrite(root_, "/var/lib/wicked/lease-eth1-dhcp-ipv4.xml");
    ZR::Testing::expectNoLeaseButADiagnostic(read());
}

}  // namespace
}  // namespace ZR::Live
