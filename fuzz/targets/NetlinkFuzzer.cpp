// What the kernel, or a process in its place, responds to the requests for links and
// addresses. The whole input is one message; then, in pieces whose first two bytes are
// their length, it is the datagrams of dumps.
#include <linux/if_addr.h>
#include <linux/if_link.h>
#include <linux/rtnetlink.h>

#include <algorithm>
#include <cerrno>
#include <memory>

#include "Input.h"
#include "kernel/Address.h"
#include "kernel/Link.h"
#include "kernel/RtnetlinkReader.h"

namespace {

using ZR::Live::Address;
using ZR::Live::Link;
using Message = std::vector<std::byte>;

template <typename Value>
void append(Message& message, const Value& value) {
    const auto bytes = std::as_bytes(std::span(&value, 1));
    message.insert(message.end(), bytes.begin(), bytes.end());
}

void appendAttribute(Message& message, std::uint16_t type, std::span<const std::byte> payload) {
    nlattr header{};
    header.nla_len = static_cast<std::uint16_t>(sizeof header + payload.size());
    header.nla_type = type;
    append(message, header);
    message.insert(message.end(), payload.begin(), payload.end());
    message.resize((message.size() + 3) / 4 * 4);
}

void appendText(Message& message, std::uint16_t type, const std::string& text) {
    appendAttribute(message, type, std::as_bytes(std::span(text.c_str(), text.size() + 1)));
}

template <typename Number>
void appendNumber(Message& message, std::uint16_t type, Number number) {
    appendAttribute(message, type, std::as_bytes(std::span(&number, 1)));
}

template <typename Body>
Message begun(std::uint16_t type, const Body& body) {
    nlmsghdr header{};
    header.nlmsg_type = type;
    Message message;
    append(message, header);
    append(message, body);
    return message;
}

Message ended(Message message) {
    const auto length = static_cast<std::uint32_t>(message.size());
    std::memcpy(message.data(), &length, sizeof length);
    return message;
}

Message written(const Link& link) {
    ifinfomsg body{};
    body.ifi_index = static_cast<int>(link.ifindex);
    body.ifi_flags = link.flags;
    body.ifi_type = link.arphrdType;
    Message message = begun(RTM_NEWLINK, body);
    appendText(message, IFLA_IFNAME, std::string(link.name.view()));
    appendNumber(message, IFLA_OPERSTATE, link.operstate);
    appendNumber(message, IFLA_MASTER, link.master);
    if (link.carrier) {
        appendNumber(message, IFLA_CARRIER, static_cast<std::uint8_t>(*link.carrier ? 1 : 0));
    }
    if (link.farNamespace) {
        appendNumber(message, IFLA_LINK_NETNSID, *link.farNamespace);
    }
    if (link.hasParentDevice) {
        appendText(message, IFLA_PARENT_DEV_NAME, "virtio0");
    }
    Message info;
    appendText(info, IFLA_INFO_KIND, link.kind);
    appendText(info, IFLA_INFO_SLAVE_KIND, link.slaveKind);
    // Too long a text for one attribute would need another length than it has room for.
    if (info.size() <= UINT16_MAX - sizeof(nlattr)) {
        appendAttribute(message, IFLA_LINKINFO | NLA_F_NESTED, info);
    }
    return ended(std::move(message));
}

Message written(const Address& address) {
    ifaddrmsg body{};
    body.ifa_family = static_cast<unsigned char>(address.ip.family());
    body.ifa_scope = address.scope;
    body.ifa_index = address.ifindex;
    Message message = begun(RTM_NEWADDR, body);
    appendAttribute(message, IFA_LOCAL, address.ip.bytes());
    appendNumber(message, IFA_FLAGS, address.flags);
    ifa_cacheinfo cache{};
    cache.ifa_valid = address.validLifetime;
    appendNumber(message, IFA_CACHEINFO, cache);
    return ended(std::move(message));
}

/// The same bytes elsewhere, where no structure could lie.
Message shifted(std::span<const std::byte> bytes) {
    Message message(1);
    message.insert(message.end(), bytes.begin(), bytes.end());
    return message;
}

void checkMessage(std::span<const std::byte> bytes) {
    const Message moved = shifted(bytes);
    const auto link = ZR::Live::parseLink(bytes);
    fuzz::require(ZR::Live::parseLink(std::span(moved).subspan(1)) == link,
                  "it does not matter where a message lies");
    if (link) {
        fuzz::require(link->ifindex != 0, "a link has a number");
        fuzz::require(ZR::Live::parseLink(written(*link)) == link, "a link survives being written");
    }
    const auto address = ZR::Live::parseAddress(bytes);
    fuzz::require(ZR::Live::parseAddress(std::span(moved).subspan(1)) == address,
                  "it does not matter where a message lies");
    if (address) {
        fuzz::require(address->ifindex != 0, "an address is of a link");
        fuzz::require(ZR::Live::parseAddress(written(*address)) == address,
                      "an address survives being written");
    }
}

/// Gives every receive the next piece of the input, and says that there is
/// nothing more at its end. Never waits.
class Responses final : public ZR::Live::NetlinkTransport {
  public:
    explicit Responses(fuzz::Bytes input) : input_(input) {}

    int open() override { return 0; }

    int send(std::span<const std::byte> message) override {
        nlmsghdr request{};
        std::memcpy(&request, message.data(), sizeof request);
        sequence_ = request.nlmsg_seq;
        return 0;
    }

    ZR::Live::Datagram receive(std::span<std::byte> buffer, ZR::Live::Deadline) override {
        if (input_.empty()) {
            return {.error = ETIMEDOUT};
        }
        const auto head = input_.number<std::uint16_t>();
        if ((head & 0x8000U) != 0) {
            return {.error = (head & 1U) != 0 ? ENOBUFS : ECONNREFUSED};
        }
        const auto piece = std::as_bytes(input_.take(head & 0x0FFFU));
        const std::size_t size = std::min(piece.size(), buffer.size());
        std::copy_n(piece.begin(), size, buffer.begin());
        // The number of the request, which an input cannot know, is put into the first
        // message of its response.
        constexpr std::size_t place = offsetof(nlmsghdr, nlmsg_seq);
        if (size >= place + sizeof sequence_) {
            std::memcpy(buffer.subspan(place).data(), &sequence_, sizeof sequence_);
        }
        return {.error = 0,
                .size = size,
                .truncated = (head & 0x4000U) != 0,
                .sender = (head & 0x2000U) != 0 ? 7U : 0U};
    }

  private:
    fuzz::Bytes input_;
    std::uint32_t sequence_ = 0;
};

void checkDump(const std::uint8_t* data, std::size_t size) {
    ZR::Live::RtnetlinkReader reader(std::make_unique<Responses>(fuzz::Bytes(data, size)));
    const auto state = reader.read(ZR::Live::Deadline::max());
    fuzz::require(state.certain == state.diagnostics.empty(), "what is not certain is told");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    checkMessage(fuzz::bytes(data, size));
    checkDump(data, size);
    return 0;
}
