#include "commands/check/Findings.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <string>
#include <system_error>
#include <utility>

#include "client/InterfaceState.h"
#include "commands/DiagnosticText.h"
#include "text/DisplayText.h"
#include "text/Times.h"

namespace cimdhcp {

namespace {

using Kind = ZR::Diagnostic::Kind;
using Verdict = Finding::Verdict;

/// How a kind of diagnostics is told. A lease that no client extends is wrong whatever was
/// meant; of the rest, a person has to judge.
struct Trouble {
    Kind kind;
    Verdict verdict;
    const char* what;
    const char* remedy;
};
constexpr std::array<Trouble, 8> toldTroubles{{
    {Kind::Denied, Verdict::notable, "rights",
     "run as root, or with CAP_SYS_PTRACE and CAP_DAC_READ_SEARCH; for the service see "
     "docs/server.md"},
    {Kind::Unreadable, Verdict::notable, "live source",
     "the reason stands behind the name; docs/sources.md tells what is read"},
    {Kind::Damaged, Verdict::notable, "damaged",
     "correct it at that place, or let the client write it again by renewing its lease"},
    {Kind::Untrusted, Verdict::notable, "not believed",
     "let no one but root and the client's user write the file and its directories (chown, "
     "chmod); end a program that is none of yours"},
    {Kind::NotApplied, Verdict::notable, "not applied",
     "bring the interface up with what it is configured for (ifup, networkctl reload, nmcli "
     "connection up), or remove that configuration"},
    {Kind::LeaseEnded, Verdict::bad, "lease",
     "start the client of the interface again, or remove the address (ip address del)"},
    {Kind::ClientGone, Verdict::bad, "client", "start the client again before the lease ends"},
    {Kind::Note, Verdict::notable, "note", ""},
}};

/// The text of a path that leads back to itself, as the readers end it.
bool isLoop(const ZR::Diagnostic& diagnostic) {
    static const std::string reason = std::generic_category().message(ELOOP);
    return diagnostic.text.ends_with(reason);
}

/// "eth0 (dhclient, IPv4)"
std::string nameOf(const LeaseOverview& lease, const InterfaceOverview& interface) {
    const std::string client = lease.client.empty() ? "unknown client" : printable(lease.client);
    return nameOf(interface) + " (" + client +
           (lease.family.empty() ? "" : ", " + printable(lease.family)) + ')';
}

class MachineExamination {
  public:
    MachineExamination(const MachineInterfaces& machine, std::int64_t now)
        : machine_(machine), now_(now) {}

    std::vector<Finding> examine() {
        for (const InterfaceOverview& interface : machine_.interfaces) {
            sort(interface);
        }
        add(Verdict::notable, "DHCP", untold_, "whether DHCP is on is not known",
            "run as root; \"cimdhcp tree --explain\" shows what is known");
        add(Verdict::notable, "link", withoutLink_, "DHCP is on, and there is no link",
            "plug the cable in, or switch the interface on: ip link set INTERFACE up");
        add(Verdict::notable, "DHCP server", asking_,
            "asks for a lease, and no server has given one; since when is not known",
            "see whether a DHCP server can be reached on that network: tcpdump -ni INTERFACE port "
            "67 or port 68 (for IPv6, 546 and 547) shows who responds");
        add(Verdict::notable, "DHCP server", rebinding_,
            "the server of the lease does not respond, and any other is asked",
            "see whether a DHCP server can be reached on that network before the lease ends");
        add(Verdict::bad, "lease", ended_, "has ended, and there is no other",
            "see whether the client still runs and a DHCP server responds; start the client "
            "again");
        for (const Trouble& trouble : toldTroubles) {
            lookAt(trouble);
        }
        return std::move(findings_);
    }

  private:
    void sort(const InterfaceOverview& interface) {
        if (!interface.dhcp) {
            untold_.push_back(nameOf(interface));
            return;
        }
        if (*interface.dhcp && interface.active == false) {
            withoutLink_.push_back(nameOf(interface));
            return;
        }
        if (!interface.leases) {
            return;
        }
        for (const LeaseOverview& lease : *interface.leases) {
            const InterfaceState state = stateOf(lease, interface, now_);
            const std::string name = nameOf(lease, interface);
            if (state == InterfaceState::asking) {
                asking_.push_back(name);
            } else if (state == InterfaceState::rebinding) {
                rebinding_.push_back(name);
            } else if (state == InterfaceState::expired) {
                ended_.push_back(name + " of " + printable(lease.address) + ", " +
                                 relativeText(*lease.expires, now_));
            }
        }
    }

    void add(Verdict verdict, const char* what, const std::vector<std::string>& subjects,
             const std::string& detail, const char* remedy) {
        if (!subjects.empty()) {
            findings_.push_back({verdict, what, shortList(subjects) + ": " + detail, remedy});
        }
    }

    void lookAt(const Trouble& trouble) {
        std::vector<ZR::Diagnostic> rest;
        std::vector<ZR::Diagnostic> loops;
        for (const ZR::Diagnostic& each : machine_.diagnostics) {
            if (each.kind == trouble.kind) {
                (isLoop(each) ? loops : rest).push_back(each);
            }
        }
        tell(trouble, rest);
        Trouble loop = trouble;
        loop.remedy = "remove the link that leads to itself, and make what belongs there";
        tell(loop, loops);
    }

    void tell(const Trouble& trouble, const std::vector<ZR::Diagnostic>& diagnostics) {
        for (std::string& line : linesOf(trouble.kind, diagnostics, machine_.interfaces)) {
            findings_.push_back({trouble.verdict, trouble.what, std::move(line), trouble.remedy});
        }
    }

    const MachineInterfaces& machine_;
    std::int64_t now_;
    std::vector<std::string> untold_;
    std::vector<std::string> withoutLink_;
    std::vector<std::string> asking_;
    std::vector<std::string> rebinding_;
    std::vector<std::string> ended_;
    std::vector<Finding> findings_;
};

}  // namespace

std::vector<Finding> machineFindings(const MachineInterfaces& machine, std::int64_t now) {
    return MachineExamination(machine, now).examine();
}

}  // namespace cimdhcp
