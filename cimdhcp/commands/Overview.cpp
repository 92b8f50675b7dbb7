#include "commands/Overview.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

#include "client/Client.h"
#include "client/InterfaceState.h"
#include "client/Response.h"
#include "commands/DiagnosticText.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/JsonText.h"
#include "text/Times.h"
#include "text/ValueMeaning.h"
#include "zrclient/NodeLexicon.h"

namespace cimdhcp {

namespace {

using Row = InterfaceOverview;

constexpr const char* noCell = "-";
constexpr const char* unknown = "?";

/// The columns of what may be unknown, and their names in JSON.
struct Field {
    std::string_view heading;
    std::string_view key;
};
constexpr std::array<Field, 7> jsonFields{{{"DHCP", "dhcp"},
                                           {"STATE", "state"},
                                           {"CLIENT", "client"},
                                           {"ADDRESS", "address"},
                                           {"EXPIRES", "expires"},
                                           {"SERVERS", "servers"},
                                           {"CONFIGURATION NAME", "configurationName"}}};

std::string cell(const std::optional<std::string>& text) {
    return text ? cellOf(*text) : unknown;
}

std::string cell(const std::optional<std::vector<std::string>>& texts) {
    if (!texts) {
        return unknown;
    }
    std::string joined;
    for (const std::string& text : *texts) {
        joined += (joined.empty() ? "" : ", ") + cellOf(text);
    }
    return cellOf(joined);
}

std::string dhcpCell(const Row& row) {
    return !row.dhcp ? unknown : *row.dhcp ? "on" : "off";
}

/// The program that has the leading lease, or asks for one. Empty: there is none; none: it
/// is not known.
std::optional<std::string> clientOf(const Row& row) {
    if (const LeaseOverview* const lease = leadingLease(row)) {
        return lease->client.empty() ? std::nullopt : std::optional(lease->client);
    }
    return row.dhcp == false ? std::optional<std::string>("") : std::nullopt;
}

/// The interface's own address; without one, that of a DHCPv6 lease that has not ended.
std::optional<std::string> addressOf(const Row& row, std::int64_t now) {
    if (!row.address || !row.address->empty() || !row.leases) {
        return row.address;
    }
    for (const LeaseOverview& lease : *row.leases) {
        if (lease.family == ZR::NodeLexicon::familyIPv6 && !lease.address.empty() &&
            stateOf(lease, row, now) != InterfaceState::expired) {
            return lease.address;
        }
    }
    return row.address;
}

/// Whether the interface has a lease, or may have one, whose end could be told.
bool mayExpire(const Row& row, std::int64_t now) {
    const LeaseOverview* const lease = leadingLease(row);
    if (lease == nullptr) {
        return row.dhcp != false;
    }
    return !lease->address.empty() || stateOf(*lease, row, now) != InterfaceState::asking;
}

std::optional<std::int64_t> endOf(const Row& row) {
    const LeaseOverview* const lease = leadingLease(row);
    return lease == nullptr ? std::nullopt : lease->expires;
}

std::string expiresCell(const Row& row, std::int64_t now) {
    if (const auto end = endOf(row)) {
        return *end >= static_cast<std::int64_t>(ZR::NodeLexicon::never) ? "never"
                                                                         : relativeText(*end, now);
    }
    return mayExpire(row, now) ? unknown : noCell;
}

/// A moment that does not depend on when it is read.
std::string expiresValue(const Row& row, std::int64_t now) {
    const auto end = endOf(row);
    const bool never = end && *end >= static_cast<std::int64_t>(ZR::NodeLexicon::never);
    return end && !never ? isoText(*end) : never ? "never" : mayExpire(row, now) ? unknown : "";
}

std::string serversValue(const Row& row) {
    if (!row.servers) {
        return unknown;
    }
    std::string joined;
    for (const std::string& server : *row.servers) {
        joined += (joined.empty() ? "" : ",") + server;
    }
    return joined;
}

std::string expiresOrder(const Row& row, std::int64_t now) {
    const auto end = endOf(row);
    return end ? std::to_string(*end) : expiresCell(row, now);
}

/// The fields of a row that are not known.
std::vector<Field> unknownFields(const Row& row, std::int64_t now) {
    std::vector<Field> found;
    for (const Column<Row>& column : overviewColumns(now)) {
        const auto* const field =
            std::find_if(jsonFields.begin(), jsonFields.end(),
                         [&column](const Field& each) { return each.heading == column.heading; });
        if (field != jsonFields.end() && column.cell(row) == unknown) {
            found.push_back(*field);
        }
    }
    return found;
}

Json momentJson(std::optional<std::int64_t> moment) {
    return moment ? Json(JsonMembers{{"seconds", *moment}, {"time", isoText(*moment)}})
                  : Json(nullptr);
}

Json stateJson(InterfaceState state) {
    return state == InterfaceState::unknown ? Json(nullptr) : Json(std::string(wordOf(state)));
}

Json numberJson(std::optional<std::uint64_t> number) {
    return number ? Json(*number) : Json(nullptr);
}

Json leaseJson(const LeaseOverview& lease, const Row& row, std::int64_t now) {
    return JsonMembers{{"state", stateJson(stateOf(lease, row, now))},
                       {"family", textOrNull(lease.family)},
                       {"clientState", numberJson(lease.clientState)},
                       {"address", textOrNull(lease.address)},
                       {"serverAddress", textOrNull(lease.server)},
                       {"leaseObtained", momentJson(lease.obtained)},
                       {"renewalTime", momentJson(lease.renews)},
                       {"rebindingTime", momentJson(lease.rebinds)},
                       {"leaseExpires", momentJson(lease.expires)},
                       {"optionsReceived", JsonList(lease.options.begin(), lease.options.end())},
                       {"clientIdentifier", textOrNull(lease.clientIdentifier)},
                       {"client", textOrNull(lease.client)},
                       {"process", numberJson(lease.process)},
                       {"source", textOrNull(lease.source)}};
}

Json leasesJson(const Row& row, std::int64_t now) {
    if (!row.leases) {
        return nullptr;
    }
    JsonList list;
    for (const LeaseOverview& lease : *row.leases) {
        list.push_back(leaseJson(lease, row, now));
    }
    return list;
}

Json textJson(const std::optional<std::string>& text) {
    return text ? textOrNull(*text) : Json(nullptr);
}

Json boolJson(std::optional<bool> value) {
    return value ? Json(*value) : Json(nullptr);
}

/// A machine without the class has no service processor to tell of.
std::vector<std::string> namesOfProcessors(Client& client) {
    const Response systems = client.enumerateNames(client.classPath("QVXZR_SPComputerSystem"));
    std::vector<std::string> names;
    for (const auto& path : systems.paths) {
        names.push_back(path ? heldText(path->key("Name")) : std::string());
    }
    return names;
}

}  // namespace

ServedInstances askServed(Client& client) {
    return {client.instancesIn("QVXZR_DHCPProtocolEndpoint"),
            client.instancesIn("QVXZR_DHCPRemoteServiceAccessPoint"),
            client.instancesIn("QVXZR_DHCPSettingData")};
}

MachineInterfaces askMachine(Client& client, AskDiagnostics diagnostics) {
    return askMachine(client, diagnostics, askServed(client));
}

MachineInterfaces askMachine(Client& client, AskDiagnostics diagnostics,
                             const ServedInstances& served) {
    MachineInterfaces machine;
    using Instances = std::vector<cimom::Instance>;
    const auto interfaces = client.instancesIn("QVXZR_DHCPInterface");
    // A server that knows the class and has no provider of it gives none, too.
    const bool told =
        interfaces && (!interfaces->empty() || served.settings.value_or(Instances{}).empty());
    if (told) {
        machine.interfaces = interfacesOf(*interfaces, client.instancesIn("QVXZR_DHCPLease"));
        const auto troubles = diagnostics == AskDiagnostics::Yes
                                  ? client.instancesIn("QVXZR_DHCPDiagnostic")
                                  : std::nullopt;
        if (troubles) {
            machine.diagnostics = diagnosticsOf(*troubles);
        }
    } else if (served.settings) {
        machine.interfaces =
            interfacesOf(*served.settings, client.instancesIn("QVXZR_IPProtocolEndpoint"),
                         namesOfProcessors(client));
    } else {
        throw Failure(ExitStatus::notDone,
                      "nothing tells of interfaces: no provider serves QVXZR_DHCPInterface or "
                      "QVXZR_DHCPSettingData");
    }
    addServed(served, machine.interfaces);
    return machine;
}

std::vector<Column<InterfaceOverview>> overviewColumns(std::int64_t now) {
    return {{"SYSTEM", [](const Row& row) { return row.system; }, {}, {true, 0}},
            {"INTERFACE", [](const Row& row) { return cellOf(row.name); }, {}, {true, 0}},
            {"DHCP", dhcpCell, {}, {true, 1}},
            {"STATE",
             [now](const Row& row) { return std::string(wordOf(stateOf(row, now))); },
             {},
             {true, 0}},
            {"CLIENT", [](const Row& row) { return cell(clientOf(row)); }, {}, {true, 5}},
            {"ADDRESS", [now](const Row& row) { return cell(addressOf(row, now)); }, {}, {true, 0}},
            {"EXPIRES",
             [now](const Row& row) { return expiresCell(row, now); },
             [now](const Row& row) { return expiresOrder(row, now); },
             {true, 2},
             [now](const Row& row) { return expiresValue(row, now); }},
            {"SERVERS",
             [](const Row& row) { return cell(row.servers); },
             {},
             {false, 3},
             [](const Row& row) { return serversValue(row); }},
            {"CONFIGURATION NAME",
             [](const Row& row) { return cell(row.configurationName); },
             {},
             {false, 4}}};
}

std::string overviewTable(const std::vector<InterfaceOverview>& interfaces, std::int64_t now,
                          std::optional<std::size_t> width, const Style& style) {
    if (interfaces.empty()) {
        return style.header ? "This machine has no network interfaces.\n" : "";
    }
    const bool oneSystem =
        std::all_of(interfaces.begin(), interfaces.end(),
                    [](const InterfaceOverview& each) { return each.system == hostSystem; });
    auto columns = overviewColumns(now);
    if (oneSystem) {
        columns.erase(columns.begin());
    }
    const bool noneUsesDhcp =
        std::all_of(interfaces.begin(), interfaces.end(),
                    [](const InterfaceOverview& each) { return each.dhcp == false; });
    return tableOf(columns, interfaces).text(width, style) +
           (noneUsesDhcp && style.header ? "No interface of this machine uses DHCP.\n" : "");
}

JsonMembers interfaceJson(const InterfaceOverview& interface, std::int64_t now) {
    JsonList unknownKeys;
    for (const Field& field : unknownFields(interface, now)) {
        unknownKeys.push_back(std::string(field.key));
    }
    if (!interface.active) {
        unknownKeys.push_back("link");
    }
    if (!interface.leases) {
        unknownKeys.push_back("leases");
    }
    const auto& servers = interface.servers;
    return {{"interface", interface.name},
            {"system", interface.system},
            {"dhcp", boolJson(interface.dhcp)},
            {"state", stateJson(stateOf(interface, now))},
            {"link", boolJson(interface.active)},
            {"client", textJson(clientOf(interface))},
            {"address", textJson(addressOf(interface, now))},
            {"expires", momentJson(endOf(interface))},
            {"servers", servers ? Json(JsonList(servers->begin(), servers->end())) : Json(nullptr)},
            {"configurationName", textJson(interface.configurationName)},
            {"leases", leasesJson(interface, now)},
            {"unknown", std::move(unknownKeys)}};
}

std::string overviewJson(const std::vector<InterfaceOverview>& interfaces, std::int64_t now) {
    JsonList list;
    for (const InterfaceOverview& each : interfaces) {
        list.push_back(interfaceJson(each, now));
    }
    return jsonText(JsonMembers{{"interfaces", std::move(list)}});
}

std::string unknownText(const std::vector<InterfaceOverview>& interfaces, std::int64_t now) {
    // What no server tells is not a matter of the interface: without names, the notes of
    // many servers are one.
    std::vector<std::string> ofServer;
    std::vector<Said> ofMachine;
    for (const Field& field : jsonFields) {
        const bool lacking = std::any_of(
            interfaces.begin(), interfaces.end(), [&field, now](const InterfaceOverview& each) {
                const auto unknowns = unknownFields(each, now);
                return !each.leases &&
                       std::any_of(unknowns.begin(), unknowns.end(), [&field](const Field& other) {
                           return other.heading == field.heading;
                       });
            });
        if (lacking) {
            ofServer.emplace_back(field.heading);
        }
    }
    for (const InterfaceOverview& each : interfaces) {
        std::vector<std::string> headings;
        for (const Field& field : unknownFields(each, now)) {
            headings.emplace_back(field.heading);
        }
        if (each.leases && !headings.empty()) {
            say(": nothing tells " + enumeration(headings), nameOf(each), ofMachine);
        }
    }
    std::string text;
    if (!ofServer.empty()) {
        text = "cimdhcp: note: the server does not tell " + enumeration(ofServer) + '\n';
    }
    for (const Said& said : ofMachine) {
        text += "cimdhcp: note: " + shortList(said.subjects) + said.what + '\n';
    }
    return text;
}

}  // namespace cimdhcp
