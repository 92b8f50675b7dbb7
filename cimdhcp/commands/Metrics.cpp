#include "commands/Metrics.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <limits>
#include <optional>
#include <string_view>
#include <unordered_set>
#include <utility>

#include "cimxml/HttpStatus.h"
#include "client/InterfaceState.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "zrclient/NodeLexicon.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

namespace {

using cimom::wbem::labelText;
using cimom::wbem::MetricFamily;
using cimom::wbem::Page;
using cimom::wbem::PageRequest;
namespace http = cimom::wbem::http;
using Labels = MetricFamily::Labels;

/// What a sample has for true and for false.
constexpr double holding = 1;
constexpr double notHolding = 0;

MetricFamily gaugeFamily(const char* name, const char* help, const char* unit = "") {
    return {name, MetricFamily::Kind::gauge, help, unit, {}};
}

/// The value of the label `state`: the words of "show", in the form of identifiers.
std::string stateLabel(const StateWord& word) {
    if (word.state == InterfaceState::unknown) {
        return "unknown";
    }
    std::string label(word.word);
    std::replace(label.begin(), label.end(), ' ', '_');
    return label;
}

struct FamilyLabel {
    std::string_view family;  ///< of a lease
    const char* label;
};
constexpr std::array<FamilyLabel, 2> familyLabels{
    {{ZR::NodeLexicon::familyIPv4, "ipv4"}, {ZR::NodeLexicon::familyIPv6, "ipv6"}}};

/// The kinds of diagnostics that are errors. Their names do not change: alerts name them.
struct ErrorKind {
    ZR::Diagnostic::Kind kind;
    const char* label;
};
constexpr std::array<ErrorKind, 7> errorKinds{{{ZR::Diagnostic::Kind::Unreadable, "unreadable"},
                                               {ZR::Diagnostic::Kind::Denied, "denied"},
                                               {ZR::Diagnostic::Kind::Damaged, "damaged"},
                                               {ZR::Diagnostic::Kind::Untrusted, "untrusted"},
                                               {ZR::Diagnostic::Kind::NotApplied, "not_applied"},
                                               {ZR::Diagnostic::Kind::LeaseEnded, "lease_ended"},
                                               {ZR::Diagnostic::Kind::ClientGone, "client_gone"}}};

/// The moments of a lease, each with the family that tells it.
struct LeaseMoment {
    std::optional<std::int64_t> LeaseOverview::*moment;
    MetricFamily family;
};

class MachineFamilies {
  public:
    explicit MachineFamilies(std::int64_t now) : now_(now) {}

    void add(const InterfaceOverview& interface) {
        const std::string name = labelText(interface.name);
        // The same labels twice would make the whole text wrong.
        if (!names_.insert(name).second) {
            return;
        }
        if (interface.dhcp) {
            enabled_.add({{"interface", name}}, *interface.dhcp ? holding : notHolding);
        }
        if (interface.active) {
            up_.add({{"interface", name}}, *interface.active ? holding : notHolding);
        }
        bool anyLease = false;
        for (const auto& [family, label] : familyLabels) {
            InterfaceOverview part = interface;
            if (part.leases) {
                std::erase_if(*part.leases, [&family = family](const LeaseOverview& lease) {
                    return lease.family != family;
                });
            }
            if (const LeaseOverview* const lease = leadingLease(part)) {
                anyLease = true;
                addState(name, label, stateOf(part, now_));
                addLease(name, label, *lease);
            }
        }
        if (!anyLease) {
            addState(name, familyLabels.front().label, stateOf(interface, now_));
        }
    }

    void add(const std::vector<ZR::Diagnostic>& diagnostics) {
        for (const auto& [kind, label] : errorKinds) {
            const auto count = std::count_if(
                diagnostics.begin(), diagnostics.end(),
                [&kind = kind](const ZR::Diagnostic& each) { return each.kind == kind; });
            errors_.add({{"kind", label}}, static_cast<double>(count));
        }
    }

    MetricFamilies take() {
        MetricFamilies families{std::move(enabled_), std::move(up_), std::move(state_)};
        for (LeaseMoment& each : moments_) {
            families.push_back(std::move(each.family));
        }
        families.push_back(std::move(info_));
        families.push_back(std::move(errors_));
        return families;
    }

  private:
    void addState(const std::string& name, const char* family, InterfaceState state) {
        for (const StateWord& word : stateWords) {
            state_.add({{"interface", name}, {"family", family}, {"state", stateLabel(word)}},
                       word.state == state ? holding : notHolding);
        }
    }

    void addLease(const std::string& name, const char* family, const LeaseOverview& lease) {
        for (LeaseMoment& each : moments_) {
            if (const auto moment = lease.*each.moment) {
                const bool never = *moment >= static_cast<std::int64_t>(ZR::NodeLexicon::never);
                each.family.add(
                    {{"interface", name}, {"family", family}},
                    never ? std::numeric_limits<double>::infinity() : static_cast<double>(*moment));
            }
        }
        info_.add({{"interface", name},
                   {"family", family},
                   {"client", labelText(lease.client)},
                   {"server", labelText(lease.server)}},
                  holding);
    }

    const std::int64_t now_;
    std::unordered_set<std::string> names_;
    MetricFamily enabled_ = gaugeFamily("dhcp_client_enabled", "Whether the interface uses DHCP.");
    MetricFamily up_ = gaugeFamily("dhcp_client_interface_up",
                                   "Whether the link of the interface is up and has a cable.");
    MetricFamily state_ = gaugeFamily(
        "dhcp_client_state", "The state of the DHCP client: 1 for the one that holds, else 0.");
    std::array<LeaseMoment, 4> moments_{
        {{&LeaseOverview::obtained,
          gaugeFamily("dhcp_client_lease_obtained_timestamp_seconds",
                      "When the lease was obtained or last extended.", "seconds")},
         {&LeaseOverview::renews,
          gaugeFamily("dhcp_client_lease_renewal_timestamp_seconds",
                      "When the client asks its server to extend the lease.", "seconds")},
         {&LeaseOverview::rebinds,
          gaugeFamily("dhcp_client_lease_rebinding_timestamp_seconds",
                      "When the client asks any server to extend the lease.", "seconds")},
         {&LeaseOverview::expires,
          gaugeFamily("dhcp_client_lease_expires_timestamp_seconds",
                      "When the lease ends; +Inf for one without an end.", "seconds")}}};
    MetricFamily info_{"dhcp_client",
                       MetricFamily::Kind::info,
                       "The program that has the lease or asks for one, and the server that gave "
                       "it; empty where that is not known.",
                       "",
                       {}};
    MetricFamily errors_ =
        gaugeFamily("dhcp_client_source_errors",
                    "What of the machine could not be read, or is not as it looks.");
};

MetricFamily machineUp(bool up) {
    MetricFamily family =
        gaugeFamily("dhcp_client_up", "Whether the machine could be asked for its DHCP clients.");
    family.add({}, up ? holding : notHolding);
    return family;
}

[[noreturn]] void cannotReplace(const std::string& file) {
    throw Failure(ExitStatus::notLoaded, printable(file) + ": " + std::strerror(errno));
}

/// A file that is removed unless it was put in the place of another one.
class Replacement {
  public:
    explicit Replacement(const std::filesystem::path& target)
        // The name does not end like the target's: readers of a directory pass it over.
        : name_((target.parent_path() / ('.' + target.filename().string() + ".XXXXXX")).string()),
          fd_(::mkostemp(name_.data(), O_CLOEXEC)) {
        if (!fd_) {
            cannotReplace(name_);
        }
    }
    ~Replacement() {
        if (!name_.empty()) {
            ::unlink(name_.c_str());
        }
    }
    Replacement(const Replacement&) = delete;
    Replacement& operator=(const Replacement&) = delete;

    void write(std::string_view content) {
        while (!content.empty()) {
            const ssize_t written = ::write(fd_.get(), content.data(), content.size());
            if (written < 0 && errno == EINTR) {
                continue;
            }
            if (written < 0) {
                cannotReplace(name_);
            }
            content.remove_prefix(static_cast<std::size_t>(written));
        }
    }

    void put(const std::string& target) {
        constexpr mode_t readableByAll = 0644;
        if (::fchmod(fd_.get(), readableByAll) != 0 ||
            ::rename(name_.c_str(), target.c_str()) != 0) {
            cannotReplace(target);
        }
        name_.clear();
    }

  private:
    std::string name_;
    ZR::UniqueFd fd_;
};

}  // namespace

MetricFamilies machineMetrics(const MachineInterfaces& machine, std::int64_t now) {
    MachineFamilies families(now);
    for (const InterfaceOverview& interface : machine.interfaces) {
        families.add(interface);
    }
    // Where leases are not told, diagnostics are not, either: their number is not known.
    const bool told = std::any_of(machine.interfaces.begin(), machine.interfaces.end(),
                                  [](const auto& each) { return each.leases.has_value(); });
    if (told || machine.interfaces.empty()) {
        families.add(machine.diagnostics);
    }
    MetricFamilies all = families.take();
    all.insert(all.begin(), machineUp(true));
    return all;
}

MetricFamily buildInfo(const std::string& prefix) {
    return {prefix + "_build",
            MetricFamily::Kind::info,
            "The version of the program that tells this.",
            "",
            {{{{"version", CIMDHCP_VERSION}}, holding, ""}}};
}

Page metricsPage(const MetricFamilies& families, const PageRequest& request) {
    const auto format = cimom::wbem::metricsFormat(request.header("Accept"));
    return {http::ok, metricsText(families, format), std::string(contentType(format))};
}

void replaceFile(const std::string& file, const std::string& content) {
    std::error_code none;
    if (std::filesystem::exists(file, none) && !std::filesystem::is_regular_file(file, none)) {
        throw Failure(ExitStatus::usage, printable(file) + ": is not a regular file");
    }
    Replacement replacement(file);
    replacement.write(content);
    replacement.put(file);
}

std::unique_ptr<cimom::wbem::Server> serveMetrics(cimom::wbem::ServerSettings settings,
                                                  AskMetrics ask,
                                                  std::function<MetricFamilies()> further,
                                                  const cimom::wbem::ServerLog& log) {
    const auto page = [ask = std::move(ask), further = std::move(further),
                       log](const PageRequest& request) -> Page {
        if (request.path != "/metrics") {
            return {http::notFound, "The metrics are at /metrics.\n"};
        }
        MetricFamilies families;
        try {
            families = ask();
        } catch (const Failure& failure) {
            log(cimom::wbem::LogKind::failure, failure.what());
            families = {machineUp(false)};
        }
        for (MetricFamily& family : further()) {
            families.push_back(std::move(family));
        }
        return metricsPage(families, request);
    };
    return std::make_unique<cimom::wbem::Server>(page, std::move(settings), log);
}

}  // namespace cimdhcp
