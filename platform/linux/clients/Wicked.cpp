#include "clients/Wicked.h"

#include <sys/socket.h>

#include <algorithm>
#include <cstddef>
#include <utility>
#include <variant>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/Trust.h"
#include "formats/ValueFormats.h"
#include "zrcommon/Strings.h"

namespace ZR::Live {
namespace {

constexpr std::size_t deepest = 32;
constexpr std::string_view tornText = "the file ends within an element";

/// The name of an element without its name space prefix and attributes.
std::string_view localName(std::string_view tag) {
    const std::string_view name = tag.substr(0, tag.find_first_of(" \t\r\n/"));
    return name.substr(name.find(':') == std::string_view::npos ? 0 : name.find(':') + 1);
}

/// Walks the elements of an XML text: leaf(path of local names, text) at the end of
/// each. As much of XML as a program writes for itself; a reason for anything else.
template <typename Leaf>
std::string_view forEachElement(std::string_view xml, Leaf leaf) {
    std::vector<std::string_view> path;
    std::string_view text;
    for (;;) {
        const std::size_t open = xml.find('<');
        if (open == std::string_view::npos) {
            return path.empty() ? std::string_view{} : tornText;
        }
        text = xml.substr(0, open);
        xml.remove_prefix(open);
        const bool comment = xml.starts_with("<!--");
        const std::string_view closing = comment ? "-->" : ">";
        const std::size_t end = xml.find(closing);
        if (end == std::string_view::npos) {
            return tornText;
        }
        const std::string_view tag = xml.substr(1, end - 1);
        xml.remove_prefix(end + closing.size());
        if (comment || tag.starts_with('?') || tag.starts_with('!')) {
            continue;
        }
        if (tag.starts_with('/')) {
            if (path.empty() || path.back() != localName(tag.substr(1))) {
                return "an element ends that was not begun";
            }
            leaf(path, trim(text));
            path.pop_back();
        } else if (!tag.ends_with('/')) {
            if (path.size() == deepest) {
                return "elements lie too deep";
            }
            path.push_back(localName(tag));
        }
    }
}

/// The path of an element that matters, and the lease under construction.
class Builder {
  public:
    void take(const std::vector<std::string_view>& path, std::string_view text) {
        const std::string_view name = path.back();
        const bool association = std::any_of(path.begin(), path.end(), [](std::string_view part) {
            return part.starts_with("ia-");
        });
        if (path.size() == 2) {
            takeCommon(name, text);
        } else if (association) {
            takeAssociated(name, text);
        } else if (path.size() == 3 && path[1] == "dhcp") {
            takeDhcp(name, text);
        }
    }

    WickedLease finish() {
        for (WickedAddress& address : lease_.addresses) {
            if (!address.acquired) {
                address.acquired = acquired_;
            }
            if (lease_.family == AF_INET) {
                address.lifetime = leaseTime_;
                address.renewal = renewal_;
                address.rebinding = rebinding_;
            }
        }
        return std::move(lease_);
    }

  private:
    void takeCommon(std::string_view name, std::string_view text) {
        if (name == "family") {
            if (text == "ipv4") {
                lease_.family = AF_INET;
            } else if (text == "ipv6") {
                lease_.family = AF_INET6;
            }
        } else if (name == "type") {
            lease_.type = text;
        } else if (name == "state") {
            lease_.state = text;
        } else if (name == "acquired") {
            acquired_ = parseNumber<std::int64_t>(text);
        }
    }

    void takeDhcp(std::string_view name, std::string_view text) {
        if (name == "server-id" && lease_.family == AF_INET) {  // of DHCPv6 it is a DUID
            lease_.server = IpAddress::ipv4FromText(text);
        } else if (name == "server-address" && lease_.family == AF_INET6) {
            const std::string_view address = text.substr(0, text.find('%'));
            lease_.server = IpAddress::fromText(AF_INET6, address);
        } else if (name == "lease-time") {
            leaseTime_ = parseNumber<std::uint32_t>(text);
        } else if (name == "renewal-time") {
            renewal_ = parseNumber<std::uint32_t>(text);
        } else if (name == "rebind-time") {
            rebinding_ = parseNumber<std::uint32_t>(text);
        } else if (name == "client-id") {
            lease_.clientIdentifier = text;
        } else if (name == "address" && lease_.family == AF_INET) {
            if (const auto address = IpAddress::ipv4FromText(text)) {
                lease_.addresses = {{.address = *address, .acquired = {}, .lifetime = {}}};
            }
        }
    }

    void takeAssociated(std::string_view name, std::string_view text) {
        if (name == "acquired") {
            associationAcquired_ = parseNumber<std::int64_t>(text);
        } else if (name == "renewal-time") {
            associationRenewal_ = parseNumber<std::uint32_t>(text);
        } else if (name == "rebind-time") {
            associationRebinding_ = parseNumber<std::uint32_t>(text);
        } else if (name == "address") {
            const std::string_view plain = text.substr(0, text.find('/'));
            if (const auto address = IpAddress::fromText(AF_INET6, plain)) {
                lease_.addresses.push_back({.address = *address,
                                            .acquired = associationAcquired_,
                                            .lifetime = {},
                                            .renewal = associationRenewal_,
                                            .rebinding = associationRebinding_});
            }
        } else if (name.starts_with("valid-") && !lease_.addresses.empty()) {
            lease_.addresses.back().lifetime = parseNumber<std::uint32_t>(text);
        }
    }

    WickedLease lease_;
    std::optional<std::int64_t> acquired_;
    std::optional<std::int64_t> associationAcquired_;
    std::optional<std::uint32_t> associationRenewal_;
    std::optional<std::uint32_t> associationRebinding_;
    std::optional<std::uint32_t> leaseTime_;
    std::optional<std::uint32_t> renewal_;
    std::optional<std::uint32_t> rebinding_;
};

/// lease-INTERFACE-dhcp-ipv4.xml, or -ipv6.xml.
std::optional<InterfaceName> interfaceOf(std::string_view name) {
    constexpr std::string_view suffix = "-dhcp-ipv4.xml";
    if (!name.starts_with(wickedLeasePrefix) ||
        (!name.ends_with(suffix) && !name.ends_with("-dhcp-ipv6.xml")) ||
        name.size() < wickedLeasePrefix.size() + suffix.size()) {
        return std::nullopt;
    }
    name.remove_prefix(wickedLeasePrefix.size());
    name.remove_suffix(suffix.size());
    return InterfaceName::from(name);
}

/// A time that lies some seconds behind the one at which an address was acquired.
std::optional<std::int64_t> after(const WickedAddress& address,
                                  const std::optional<std::uint32_t>& seconds) {
    if (seconds == UINT32_MAX) {
        return Lease::never;
    }
    if (!address.acquired || !seconds || *address.acquired < 0 ||
        *address.acquired > Lease::never - UINT32_MAX) {
        return std::nullopt;
    }
    return *address.acquired + *seconds;
}

void addLeases(const WickedLease& lease, const InterfaceName& interface, const std::string& path,
               ClientFacts& facts) {
    if (lease.type != "dhcp" || lease.state != "granted" || lease.family == 0) {
        return;
    }
    for (const WickedAddress& address : lease.addresses) {
        const auto expires = after(address, address.lifetime);
        if (expires && address.address.family() == lease.family) {
            facts.leases.push_back({.client = Client::Wicked,
                                    .interfaceName = interface,
                                    .address = address.address,
                                    .server = lease.server,
                                    .clientAlive = facts.runs(Client::Wicked),
                                    .expires = expires,
                                    .obtained = address.acquired,
                                    .renews = after(address, address.renewal),
                                    .rebinds = after(address, address.rebinding),
                                    .clientIdentifier = lease.clientIdentifier,
                                    .pid = pidOfManager(facts, Client::Wicked),
                                    .origin = path});
        }
    }
}

}  // namespace

Parsed<WickedLease> parseWickedLease(std::string_view xml) {
    Builder builder;
    const std::string_view reason =
        forEachElement(xml, [&](const std::vector<std::string_view>& path, std::string_view text) {
            builder.take(path, text);
        });
    if (!reason.empty()) {
        return reason;
    }
    return builder.finish();
}

void readWicked(const Roots& roots, ClientFacts& facts) {
    for (const std::string_view place : wickedDirectories) {
        const std::string directory = roots.path(place);
        for (const std::string& name : listOptionalDirectory(directory, facts.diagnostics)) {
            const auto interface = interfaceOf(name);
            const std::string path = pathIn(directory, name);
            const auto text =
                interface ? readTrustedFile(path, {}, facts.diagnostics) : std::nullopt;
            if (!text) {
                continue;
            }
            auto parsed = parseWickedLease(*text);
            if (const auto* const reason = std::get_if<std::string_view>(&parsed)) {
                facts.diagnostics.emplace_back("cannot use " + path + ": " + std::string{*reason},
                                               Diagnostic::Kind::Damaged);
            } else {
                addLeases(std::get<WickedLease>(parsed), *interface, path, facts);
            }
        }
    }
}

}  // namespace ZR::Live
