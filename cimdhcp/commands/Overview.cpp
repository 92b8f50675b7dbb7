#include "commands/Overview.h"

#include <algorithm>
#include <nlohmann/json.hpp>

#include "text/DisplayText.h"
#include "text/JsonText.h"

namespace cimdhcp {

namespace {

std::string cell(const std::string& text) {
    return text.empty() ? "-" : text;
}

std::string cell(std::optional<bool> on) {
    if (!on) {
        return "-";
    }
    return *on ? "on" : "off";
}

std::string cell(const std::vector<std::string>& texts) {
    std::string joined;
    for (const std::string& text : texts) {
        joined += (joined.empty() ? "" : ", ") + cell(text);
    }
    return cell(joined);
}

nlohmann::ordered_json json(const std::string& text) {
    return text.empty() ? nlohmann::ordered_json(nullptr) : nlohmann::ordered_json(text);
}

}  // namespace

const std::vector<Column<InterfaceOverview>>& overviewColumns() {
    using Row = InterfaceOverview;
    static const std::vector<Column<Row>> columns{
        {"SYSTEM", [](const Row& row) { return row.system; }},
        {"INTERFACE", [](const Row& row) { return cell(row.name); }},
        {"DHCP", [](const Row& row) { return cell(row.dhcp); }},
        {"STATE", [](const Row& row) { return cell(row.state); }},
        {"ADDRESS", [](const Row& row) { return cell(row.address); }},
        {"SERVERS", [](const Row& row) { return cell(row.servers); }},
        {"CONFIGURATION NAME", [](const Row& row) { return cell(row.configurationName); }}};
    return columns;
}

std::string overviewTable(const std::vector<InterfaceOverview>& interfaces,
                          std::optional<std::size_t> width, const Style& style) {
    if (interfaces.empty()) {
        return style.header ? "This machine has no network interfaces.\n" : "";
    }
    const bool oneSystem =
        std::all_of(interfaces.begin(), interfaces.end(),
                    [](const InterfaceOverview& each) { return each.system == "Computer"; });
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

std::string remarkLine(std::span<const std::string> remarks) {
    if (remarks.empty()) {
        return {};
    }
    constexpr std::size_t mostTold = 4;
    std::string line = "cimdhcp: not everything could be read: ";
    for (const std::string& remark : remarks.first(std::min(remarks.size(), mostTold))) {
        line += (&remark == &remarks.front() ? "" : "; ") + printable(remark);
    }
    if (remarks.size() > mostTold) {
        line += "; and " + std::to_string(remarks.size() - mostTold) + " more, told in the log";
    }
    return line + '\n';
}

std::string overviewJson(const std::vector<InterfaceOverview>& interfaces) {
    auto list = nlohmann::ordered_json::array();
    for (const InterfaceOverview& each : interfaces) {
        nlohmann::ordered_json dhcp;
        if (each.dhcp) {
            dhcp = *each.dhcp;
        }
        list.push_back({{"interface", each.name},
                        {"system", each.system},
                        {"dhcp", std::move(dhcp)},
                        {"state", json(each.state)},
                        {"address", json(each.address)},
                        {"servers", each.servers},
                        {"configurationName", json(each.configurationName)}});
    }
    return jsonText({{"interfaces", std::move(list)}});
}

}  // namespace cimdhcp
