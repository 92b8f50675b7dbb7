#include "commands/Detail.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <string_view>
#include <utility>
#include <variant>

#include "cimom/ClassDeclaration.h"
#include "client/InterfaceState.h"
#include "commands/DiagnosticText.h"
#include "commands/Overview.h"
#include "commands/classes/ResponseText.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/JsonText.h"
#include "text/Likeness.h"
#include "text/Times.h"
#include "zrclient/NodeLexicon.h"

namespace cimdhcp {

namespace {

/// What a fact is called, and the fact.
struct Fact {
    std::string name;
    std::string value;
};

constexpr const char* notKnown = "?";
constexpr const char* nothingThere = "-";

std::string orUnknown(const std::string& text) {
    return text.empty() ? notKnown : text;
}

std::string yesNo(std::optional<bool> value, const char* yes, const char* no) {
    return !value ? notKnown : *value ? yes : no;
}

std::string stateFact(InterfaceState state) {
    const auto* const found =
        std::find_if(stateWords.begin(), stateWords.end(),
                     [state](const StateWord& each) { return each.state == state; });
    return found == stateWords.end()
               ? std::string(notKnown)
               : std::string(found->word) + " (" + std::string(found->meaning) + ')';
}

std::string momentFact(std::optional<std::int64_t> moment, std::int64_t now) {
    if (!moment) {
        return notKnown;
    }
    if (*moment >= static_cast<std::int64_t>(ZR::NodeLexicon::never)) {
        return "never";
    }
    return isoText(*moment) + " (" + relativeText(*moment, now) + ')';
}

/// How an address came to its interface; empty: not known.
std::string_view sourceWord(std::optional<std::uint64_t> source) {
    using Source = ZR::NodeLexicon::AddressSource;
    if (!source) {
        return "";
    }
    switch (static_cast<Source>(*source)) {
        case Source::DHCP:
            return "by DHCP";
        case Source::Static:
            return "fixed";
        case Source::Other:
            return "of another origin";
        default:
            return "";
    }
}

std::string addressFact(const InterfaceOverview& interface) {
    if (!interface.address) {
        return notKnown;
    }
    if (interface.address->empty()) {
        return nothingThere;
    }
    const std::string_view source = sourceWord(interface.addressSource);
    return *interface.address + (source.empty() ? "" : " (" + std::string(source) + ')');
}

std::string serversFact(const InterfaceOverview& interface) {
    if (!interface.servers) {
        return notKnown;
    }
    std::string text;
    for (const std::string& server : *interface.servers) {
        text += (text.empty() ? "" : ", ") + server;
    }
    return text.empty() ? nothingThere : text;
}

std::string nameFact(const InterfaceOverview& interface) {
    if (!interface.configurationName) {
        return notKnown;
    }
    return interface.configurationName->empty() ? nothingThere : *interface.configurationName;
}

std::vector<Fact> factsOf(const InterfaceOverview& interface, std::int64_t now) {
    return {{"System", interface.system},
            {"DHCP", yesNo(interface.dhcp, "on", "off")},
            {"State", stateFact(stateOf(interface, now))},
            {"Link", yesNo(interface.active, "up", "down")},
            {"Address", addressFact(interface)},
            {"Servers", serversFact(interface)},
            {"Configuration name", nameFact(interface)}};
}

std::string clientFact(const LeaseOverview& lease) {
    std::string text = orUnknown(lease.client);
    if (lease.process) {
        text += ", process " + std::to_string(*lease.process);
    }
    if (lease.clientRuns) {
        text += *lease.clientRuns ? ", runs" : ", does not run";
    }
    return text;
}

std::string optionsFact(const LeaseOverview& lease) {
    std::string text;
    for (const std::uint64_t option : lease.options) {
        text += (text.empty() ? "" : ", ") + std::to_string(option);
    }
    return orUnknown(text);
}

std::vector<Fact> factsOf(const LeaseOverview& lease, const InterfaceOverview& interface,
                          std::int64_t now) {
    return {{"State", stateFact(stateOf(lease, interface, now))},
            {"Address", lease.address.empty() ? "- (asked for)" : lease.address},
            {"Server", orUnknown(lease.server)},
            {"Obtained", momentFact(lease.obtained, now)},
            {"Renewal", momentFact(lease.renews, now)},
            {"Rebinding", momentFact(lease.rebinds, now)},
            {"Expires", momentFact(lease.expires, now)},
            {"Options received", optionsFact(lease)},
            {"Client", clientFact(lease)},
            {"Client identifier", orUnknown(lease.clientIdentifier)},
            {"Source", orUnknown(lease.source)}};
}

/// The facts below each other, their values aligned.
std::string factLines(const std::vector<Fact>& facts, std::size_t indentation) {
    std::size_t longest = 0;
    for (const Fact& fact : facts) {
        longest = std::max(longest, fact.name.size());
    }
    std::string text;
    for (const Fact& fact : facts) {
        text += std::string(indentation, ' ') + fact.name + ':' +
                std::string(longest - fact.name.size() + 1, ' ') + printable(fact.value) + '\n';
    }
    return text;
}

constexpr std::size_t detailIndentation = 2;
constexpr std::size_t insideIndentation = 4;

/// Instances as blocks below a heading; nothing where there are none.
std::string instanceBlocks(const char* heading,
                           const std::optional<std::vector<cimom::Instance>>& instances,
                           const ClassLookup& classes, std::optional<std::size_t> width,
                           const Style& style) {
    std::string text;
    const std::vector<cimom::Instance> none;
    for (const cimom::Instance& instance : instances ? *instances : none) {
        text += '\n' + std::string(detailIndentation, ' ') + style.strong(heading) + '\n' +
                instanceText(instance, classes.find(instance.path.className), width, style,
                             insideIndentation);
    }
    return text;
}

/// The value that the class holds for a DHCP server means something else by the standard.
constexpr std::uint64_t contextOfServers = 7;

bool hasOddContext(const cimom::Instance& accessPoint) {
    const cimom::Value* const value = accessPoint.property("AccessContext");
    const cimom::Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const number = scalar == nullptr ? nullptr : std::get_if<std::uint64_t>(scalar);
    return number != nullptr && *number == contextOfServers;
}

std::string blockOf(const InterfaceDetail& detail, std::int64_t now, const ClassLookup& classes,
                    std::optional<std::size_t> width, const Style& style) {
    const InterfaceOverview& interface = detail.overview;
    std::string text = style.strong(printable(nameOf(interface))) + '\n' +
                       factLines(factsOf(interface, now), detailIndentation);
    for (const std::string& note : detail.notes) {
        text += std::string(detailIndentation, ' ') + "note: " + printable(note) + '\n';
    }
    const std::vector<LeaseOverview> none;
    for (const LeaseOverview& lease : interface.leases ? *interface.leases : none) {
        text += '\n' + std::string(detailIndentation, ' ') +
                style.strong("Lease, " + orUnknown(printable(lease.family))) + '\n' +
                factLines(factsOf(lease, interface, now), insideIndentation);
    }
    text += instanceBlocks("DHCP endpoint", detail.served.endpoints, classes, width, style);
    text += instanceBlocks("DHCP server", detail.served.accessPoints, classes, width, style);
    const auto& points = detail.served.accessPoints;
    if (points && std::any_of(points->begin(), points->end(), hasOddContext)) {
        text += std::string(insideIndentation, ' ') +
                "(a DHCP server: \"7 (SMTP Server)\" is what the class holds for one)\n";
    }
    return text + instanceBlocks("Setting", detail.served.settings, classes, width, style);
}

Json instancesJson(const std::optional<std::vector<cimom::Instance>>& instances) {
    if (!instances) {
        return nullptr;
    }
    JsonList list;
    for (const cimom::Instance& instance : *instances) {
        list.push_back(instanceJson(instance));
    }
    return list;
}

/// The only one of its kind, or null.
Json oneJson(const std::optional<std::vector<cimom::Instance>>& instances) {
    return instances && !instances->empty() ? instanceJson(instances->front()) : Json(nullptr);
}

std::string idOf(const InterfaceOverview& interface) {
    return interface.system + '%' + interface.name;
}

/// The words about the interface, if the diagnostic is about it; empty: it is not.
std::string wordsAbout(const InterfaceOverview& interface, const ZR::Diagnostic& diagnostic) {
    const std::string subject = nameOf(interface) + ": ";
    return diagnostic.text.starts_with(subject) ? diagnostic.text.substr(subject.size())
                                                : std::string();
}

}  // namespace

void refuseInterface(const std::string& name, const std::vector<std::string>& known) {
    std::string there = "this machine has none";
    if (known.size() > mostTold) {
        there = "this machine has " + std::to_string(known.size()) +
                " interfaces, \"cimdhcp show\" lists them" + didYouMean(name, known);
    } else if (!known.empty()) {
        there = "this machine has: " + printable(shortList(known));
    }
    throw Failure(ExitStatus::notDone,
                  "there is no interface \"" + printable(name) + "\"; " + there);
}

std::vector<InterfaceDetail> detailsOf(const std::vector<std::string>& names,
                                       const ServedInstances& served, MachineInterfaces& machine) {
    std::vector<InterfaceDetail> details;
    for (const std::string& name : names) {
        std::vector<std::string> known;
        bool found = false;
        for (const InterfaceOverview& interface : machine.interfaces) {
            known.push_back(interface.name);
            if (interface.name != name && idOf(interface) != name) {
                continue;
            }
            found = true;
            InterfaceDetail detail{interface, servedOf(interface, served), {}};
            for (const ZR::Diagnostic& diagnostic : machine.diagnostics) {
                if (std::string words = wordsAbout(interface, diagnostic); !words.empty()) {
                    detail.notes.push_back(std::move(words));
                }
            }
            details.push_back(std::move(detail));
        }
        if (!found) {
            refuseInterface(name, known);
        }
    }
    std::erase_if(machine.diagnostics, [&machine](const ZR::Diagnostic& diagnostic) {
        return std::any_of(machine.interfaces.begin(), machine.interfaces.end(),
                           [&diagnostic](const InterfaceOverview& each) {
                               return !wordsAbout(each, diagnostic).empty();
                           });
    });
    return details;
}

std::string detailText(const std::vector<InterfaceDetail>& details, std::int64_t now,
                       const ClassLookup& classes, std::optional<std::size_t> width,
                       const Style& style) {
    std::string text;
    for (const InterfaceDetail& detail : details) {
        text += (text.empty() ? "" : "\n") + blockOf(detail, now, classes, width, style);
    }
    return text;
}

std::string detailJson(const std::vector<InterfaceDetail>& details, std::int64_t now) {
    JsonList list;
    for (const InterfaceDetail& detail : details) {
        JsonMembers members = interfaceJson(detail.overview, now);
        members.emplace_back("endpoint", oneJson(detail.served.endpoints));
        members.emplace_back("accessPoints", instancesJson(detail.served.accessPoints));
        members.emplace_back("setting", oneJson(detail.served.settings));
        members.emplace_back("notes", JsonList(detail.notes.begin(), detail.notes.end()));
        list.push_back(std::move(members));
    }
    return jsonText(JsonMembers{{"interfaces", std::move(list)}});
}

}  // namespace cimdhcp
