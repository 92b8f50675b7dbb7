#pragma once

#include <linux/netlink.h>
#include <linux/rtnetlink.h>
#include <sys/socket.h>
#include <sys/stat.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <ostream>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"
#include "kit/Files.h"
#include "zrclient/Snapshot.h"
#include "zrcommon/File.h"

namespace ZR::Live {

/// The time in tests that look at no clock.
inline constexpr std::int64_t now = 1'800'000'000;

/// An address or the name of an interface as a test writes it.
inline IpAddress ipAddress(std::string_view text) {
    return IpAddress::fromText(text.find(':') == std::string_view::npos ? AF_INET : AF_INET6, text)
        .value();
}
inline IpAddress operator""_ip(const char* text, std::size_t size) {
    return ipAddress({text, size});
}
inline InterfaceName interfaceName(std::string_view text) {
    return InterfaceName::from(text).value();
}
inline InterfaceName operator""_name(const char* text, std::size_t size) {
    return interfaceName({text, size});
}

/// What a failing comparison prints.
inline void PrintTo(const IpAddress& address, std::ostream* out) {
    *out << address.text();
}
inline void PrintTo(const InterfaceName& name, std::ostream* out) {
    *out << name.view();
}

/// An address in the kernel's tables of sockets: its bytes in memory, as this machine's number.
inline std::string asTheKernelPrints(const std::array<std::uint8_t, 4>& address) {
    std::uint32_t number = 0;
    std::memcpy(&number, address.data(), sizeof number);
    std::array<char, 9> text{};
    static_cast<void>(std::snprintf(text.data(), text.size(), "%08X", number));
    return text.data();
}

/// A captured file of a real client, by "MACHINE/FILE": a file of a directory, or what
/// stands under its name in MACHINE.txt, where tail(1) has put the files one after the other.
inline std::string sample(const std::string& name) {
    if (auto content = File::read(ZR_LIVE_SAMPLES "/" + name)) {
        return *std::move(content);
    }
    const std::size_t slash = name.find('/');
    const auto all = File::read(ZR_LIVE_SAMPLES "/" + name.substr(0, slash) + ".txt");
    const std::string heading = "==> " + name.substr(slash + 1) + " <==\n";
    const std::size_t begin = all ? all->find(heading) : std::string::npos;
    if (begin == std::string::npos) {
        throw std::runtime_error("no sample " + name);
    }
    const std::size_t end = all->find("\n\n==> ", begin);
    return all->substr(begin + heading.size(),
                       end == std::string::npos ? end : end + 1 - begin - heading.size());
}

using Testing::TemporaryDirectory;

/// What a reader adds to the facts, of the files laid out in a directory.
inline ClientFacts readWith(void (*reader)(const Roots& roots, ClientFacts& facts),
                            const TemporaryDirectory& root, ClientFacts facts = {}) {
    reader({.files = root.path(), .proc = root.path("/proc")}, facts);
    return facts;
}

/// Facts of a manager that runs.
inline ClientFacts running(Client client,
                           ManagerProcess::Where where = ManagerProcess::Where::Here) {
    ClientFacts facts;
    facts.managers = {{.client = client, .where = where, .pid = 7}};
    return facts;
}

/// Builds the bytes of one netlink message.
class Message {
  public:
    template <typename Header>
    Message(std::uint16_t type, std::uint16_t flags, const Header& header) {
        nlmsghdr start{};
        start.nlmsg_type = type;
        start.nlmsg_flags = flags;
        append(&start, sizeof start);
        append(&header, sizeof header);
        close();
    }

    Message& raw(const void* bytes, std::size_t size) {
        append(bytes, size);
        close();
        return *this;
    }
    Message& attribute(std::uint16_t type, std::span<const std::byte> payload) {
        nlattr header{};
        header.nla_len = static_cast<std::uint16_t>(sizeof header + payload.size());
        header.nla_type = type;
        append(&header, sizeof header);
        append(payload.data(), payload.size());
        bytes_.resize((bytes_.size() + 3) & ~std::size_t{3});
        close();
        return *this;
    }
    template <typename Number>
    Message& number(std::uint16_t type, Number value) {
        return attribute(type, std::as_bytes(std::span{&value, 1}));
    }
    Message& text(std::uint16_t type, const std::string& value) {
        return attribute(type, std::as_bytes(std::span{value.c_str(), value.size() + 1}));
    }
    /// Claims another length for the whole message than it has.
    Message& claimLength(std::uint32_t length) {
        std::memcpy(bytes_.data(), &length, sizeof length);
        return *this;
    }

    [[nodiscard]] const std::vector<std::byte>& bytes() const { return bytes_; }

  private:
    void append(const void* from, std::size_t size) {
        const auto* const first = static_cast<const std::byte*>(from);
        for (std::size_t i = 0; i < size; ++i) {
            bytes_.push_back(first[i]);
        }
    }
    void close() { claimLength(static_cast<std::uint32_t>(bytes_.size())); }

    std::vector<std::byte> bytes_;
};

inline Message linkMessage(int ifindex, const std::string& name, unsigned flags = 0x1043,
                           std::uint16_t messageFlags = NLM_F_MULTI) {
    ifinfomsg info{};
    info.ifi_type = 1;
    info.ifi_index = ifindex;
    info.ifi_flags = flags;
    Message message{RTM_NEWLINK, messageFlags, info};
    message.text(IFLA_IFNAME, name);
    return message;
}

inline Message addressMessage(unsigned ifindex, const std::array<std::uint8_t, 4>& address,
                              std::uint8_t flags = 0x80) {
    ifaddrmsg info{};
    info.ifa_family = 2;
    info.ifa_prefixlen = 24;
    info.ifa_flags = flags;
    info.ifa_index = ifindex;
    Message message{RTM_NEWADDR, NLM_F_MULTI, info};
    message.attribute(IFA_ADDRESS, std::as_bytes(std::span{address}));
    message.attribute(IFA_LOCAL, std::as_bytes(std::span{address}));
    return message;
}

/// The node of an interface, or none.
inline Snapshot::Index interfaceNode(const Snapshot& snapshot, std::string_view name) {
    for (Snapshot::Index node = snapshot.first(NodeLexicon::NodeType::NetworkInterface);
         node != Snapshot::none; node = snapshot.node(node).nextOfType) {
        const auto* const property = snapshot.find(node, NodeLexicon::Properties::Name);
        if (property != nullptr && property->value == PropertyValue{std::string{name}}) {
            return node;
        }
    }
    return Snapshot::none;
}

/// A property of an interface; unreadable when it or the interface is not there.
inline PropertyValue valueOf(const Snapshot& snapshot, std::string_view name,
                             NodeLexicon::Properties property) {
    const Snapshot::Index node = interfaceNode(snapshot, name);
    const auto* const found = node == Snapshot::none ? nullptr : snapshot.find(node, property);
    return found == nullptr ? PropertyValue{} : found->value;
}

inline std::vector<std::string> interfaceNames(const Snapshot& snapshot) {
    std::vector<std::string> names;
    for (Snapshot::Index node = snapshot.first(NodeLexicon::NodeType::NetworkInterface);
         node != Snapshot::none; node = snapshot.node(node).nextOfType) {
        names.push_back(
            std::get<std::string>(snapshot.find(node, NodeLexicon::Properties::Name)->value));
    }
    return names;
}

inline PropertyValue number(unsigned value) {
    return std::uint64_t{value};
}

}  // namespace ZR::Live
