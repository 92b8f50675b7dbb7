#include "commands/Overview.h"

#include <algorithm>
#include <utility>

#include "client/Client.h"
#include "text/DisplayText.h"
#include "text/JsonText.h"

namespace cimdhcp {

namespace {

std::string cell(std::optional<bool> on) {
    if (!on) {
        return "-";
    }
    return *on ? "on" : "off";
}

std::string cell(const std::vector<std::string>& texts) {
    std::string joined;
    for (const std::string& text : texts) {
        joined += (joined.empty() ? "" : ", ") + cellOf(text);
    }
    return cellOf(joined);
}

}  // namespace

ServedInstances askProvider(Client& client) {
    return {client.instancesIn("QVXZR_DHCPProtocolEndpoint"),
            client.instancesIn("QVXZR_DHCPRemoteServiceAccessPoint"),
            client.instancesIn("QVXZR_DHCPSettingData")};
}

const std::vector<Column<InterfaceOverview>>& overviewColumns() {
    using Row = InterfaceOverview;
    static const std::vector<Column<Row>> columns{
        {"SYSTEM", [](const Row& row) { return row.system; }},
        {"INTERFACE", [](const Row& row) { return cellOf(row.name); }},
        {"DHCP", [](const Row& row) { return cell(row.dhcp); }},
        {"STATE", [](const Row& row) { return cellOf(row.state); }},
        {"ADDRESS", [](const Row& row) { return cellOf(row.address); }},
        {"SERVERS", [](const Row& row) { return cell(row.servers); }},
        {"CONFIGURATION NAME", [](const Row& row) { return cellOf(row.configurationName); }}};
    return columns;
}

std::string overviewTable(const std::vector<InterfaceOverview>& interfaces,
                          std::optional<std::size_t> width, const Style& style) {
    if (interfaces.empty()) {
        return style.header ? "This machine has no network interfaces.\n" : "";
    }
    const bool oneSystem =
        std::all_of(interfaces.begin(), interfaces.end(),
                    [](const InterfaceOverview& each) { return each.system == hostSystem; });
    auto columns = overviewColumns();
    if (oneSystem) {
        columns.erase(columns.begin());
    }
    const bool noneUsesDhcp =
        std::all_of(interfaces.begin(), interfaces.end(),
                    [](const InterfaceOverview& each) { return each.dhcp == false; });
    return tableOf(columns, interfaces).text(width, style) +
           (noneUsesDhcp && style.header ? "No interface of this machine uses DHCP.\n" : "");
}

std::string diagnosticLine(std::span<const ZR::Diagnostic> diagnostics) {
    if (diagnostics.empty()) {
        return {};
    }
    constexpr std::size_t mostTold = 4;
    std::string line = "cimdhcp: not everything could be read: ";
    for (const ZR::Diagnostic& each : diagnostics.first(std::min(diagnostics.size(), mostTold))) {
        line += (&each == &diagnostics.front() ? "" : "; ") + printable(each.text);
    }
    if (diagnostics.size() > mostTold) {
        line += "; and " + std::to_string(diagnostics.size() - mostTold) +
                " more, which are in the log";
    }
    return line + '\n';
}

std::string overviewJson(const std::vector<InterfaceOverview>& interfaces) {
    JsonList list;
    for (const InterfaceOverview& each : interfaces) {
        list.push_back(JsonMembers{{"interface", each.name},
                                   {"system", each.system},
                                   {"dhcp", each.dhcp ? Json(*each.dhcp) : Json(nullptr)},
                                   {"state", textOrNull(each.state)},
                                   {"address", textOrNull(each.address)},
                                   {"servers", JsonList(each.servers.begin(), each.servers.end())},
                                   {"configurationName", textOrNull(each.configurationName)}});
    }
    return jsonText(JsonMembers{{"interfaces", std::move(list)}});
}

}  // namespace cimdhcp
