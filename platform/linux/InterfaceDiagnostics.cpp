#include "InterfaceDiagnostics.h"

#include <algorithm>
#include <string>
#include <string_view>
#include <utility>

#include "LeaseRules.h"
#include "zrclient/NodeLexicon.h"
#include "zrcommon/BuiltSources.h"

namespace ZR::Live {
namespace {

using Kind = Diagnostic::Kind;
using NodeLexicon::Properties;

/// Why a manager could not be asked.
constexpr std::string_view silence =
    Built::has("bus") ? " does not respond" : " is not asked by this build";

/// The diagnostics of one interface, each of which begins with its name.
class Teller {
  public:
    Teller(const Machine& machine, const InterfaceView& view,
           const std::vector<Decision>& decisions, std::vector<Diagnostic>& diagnostics)
        : machine_(machine), view_(view), decisions_(decisions), diagnostics_(diagnostics) {}

    void tellOfPort() {
        for (const ClientProcess* process : view_.processes) {
            const Link* const master = machine_.linkOf(view_.link->master);
            tell(Kind::Note,
                 describe({.client = process->client, .file = {}, .pid = process->pid}) +
                     " runs on a port of " +
                     (master == nullptr ? "another link" : std::string{master->name.view()}) +
                     ", which owns the port's addresses");
        }
    }

    void tellOfStrayed(const ClientProcess& process) {
        tell(Kind::Note, describe({.client = process.client, .file = {}, .pid = process.pid}) +
                             " was started for " + std::string{process.interfaces.front().view()} +
                             ", a name that no link has: whether it has this link cannot be told");
    }

    /// The reason why it could not be asked, where there is one, is told once for all links.
    void tellOfUnheard() {
        if (decidedOn(Properties::DHCPEnabled) == PropertyValue{}) {
            tell(Kind::Note,
                 std::string{nameOf(*(view_.unheard ? view_.unheard : view_.unheard6))} +
                     std::string{silence} + ": whether it uses DHCP here cannot be told");
        } else if (decidedOn(Properties::AddressSource) == PropertyValue{}) {
            tell(Kind::Note, std::string{nameOf(*view_.unheard6)} + std::string{silence} +
                                 ": whether it has a lease cannot be told");
        }
    }

    /// Where all clients are seen.
    void tellOfClientsThatAreMissing() {
        if (decidedOn(Properties::DHCPEnabled) == PropertyValue{false}) {
            tellOfIntent();
        }
        for (const Lease* lease : view_.ended) {
            if (!isAskedFor(*lease) && !isLeasedAnew(*lease)) {
                tell(Kind::LeaseEnded, "the lease of " + lease->address.text() + " (" +
                                           describe(originOf(*lease)) +
                                           ") has ended, and no client asks for another one");
            }
        }
        for (const auto* leases : {&view_.leases, &view_.leases6}) {
            for (const Lease* lease : *leases) {
                const bool first =
                    std::find_if(leases->begin(), leases->end(), [&](const Lease* each) {
                        return each->address == lease->address;
                    }) == std::find(leases->begin(), leases->end(), lease);
                if (first && !lease->clientAlive && lease->expires &&
                    !isEndless(*lease, machine_.now())) {
                    tell(Kind::ClientGone, "the client that leased " + lease->address.text() +
                                               " (" + describe(originOf(*lease)) +
                                               ") does not run: nothing renews the lease");
                }
            }
        }
        if (decidedOn(Properties::DHCPEnabled) == PropertyValue{}) {
            const PropertyValue address = decidedOn(Properties::IPv4Address);
            const auto* const text = std::get_if<std::string>(&address);
            tell(Kind::Note, (text == nullptr ? "an address" : *text) +
                                 " has an end as a lease has, and no client is known that got "
                                 "it: whether DHCP is used cannot be told");
        }
    }

  private:
    static Origin originOf(const Lease& lease) {
        return {.client = lease.client, .file = lease.origin};
    }

    [[nodiscard]] PropertyValue decidedOn(Properties property) const {
        const Decision* const decision = decisionOn(property, decisions_);
        return decision == nullptr ? PropertyValue{} : decision->value;
    }

    /// A manager that has the link knows better which of its own files it uses.
    void tellOfIntent() {
        for (const LinkConfiguration* configuration : view_.configurations) {
            const bool asks = configuration->dhcp4.value_or(false) ||
                              configuration->dhcp6.value_or(false) || configuration->bootp4;
            const bool managed = std::any_of(view_.managements.begin(), view_.managements.end(),
                                             [&](const LinkConfiguration* management) {
                                                 return management->client == configuration->client;
                                             });
            if (asks && !managed) {
                const std::string who = configuration->origin.empty()
                                            ? std::string{nameOf(configuration->client)}
                                            : configuration->origin;
                tell(Kind::NotApplied, who + " asks for DHCP, and no client runs");
            }
        }
    }

    [[nodiscard]] bool isAskedFor(const Lease& lease) const {
        const bool ipv6 = !lease.address.isIPv4();
        return view_.process(ipv6) != nullptr || view_.dhcpManagement(ipv6) != nullptr ||
               (!ipv6 && (view_.socket != nullptr || view_.openSocket != nullptr));
    }

    [[nodiscard]] bool isLeasedAnew(const Lease& lease) const {
        const auto& leases = lease.address.isIPv4() ? view_.leases : view_.leases6;
        return std::any_of(leases.begin(), leases.end(),
                           [&](const Lease* other) { return other->address == lease.address; });
    }

    void tell(Kind kind, const std::string& sentence) {
        diagnostics_.emplace_back(std::string{view_.link->name.view()} + ": " + sentence, kind);
    }

    const Machine& machine_;
    const InterfaceView& view_;
    const std::vector<Decision>& decisions_;
    std::vector<Diagnostic>& diagnostics_;
};

}  // namespace

void addDiagnostics(const Machine& machine, const InterfaceView& view,
                    const std::vector<Decision>& decisions, std::vector<Diagnostic>& diagnostics) {
    Teller teller{machine, view, decisions, diagnostics};
    if (view.enslaved) {
        teller.tellOfPort();
    } else if (view.strayed != nullptr) {
        teller.tellOfStrayed(*view.strayed);
    } else if (view.unheard || view.unheard6) {
        teller.tellOfUnheard();
    } else if (!view.hidden) {
        teller.tellOfClientsThatAreMissing();
    }
}

}  // namespace ZR::Live
