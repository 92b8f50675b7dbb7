#include "cimdhcp/Overview.h"

#include <algorithm>
#include <nlohmann/json.hpp>

#include "cimdhcp/DisplayText.h"
#include "cimdhcp/JsonFormat.h"
#include "cimdhcp/Table.h"

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

std::string overviewTable(const std::vector<InterfaceOverview>& interfaces,
                          std::optional<std::size_t> width) {
    if (interfaces.empty()) {
        return "This machine has no network interfaces.\n";
    }
    const bool oneSystem =
        std::all_of(interfaces.begin(), interfaces.end(),
                    [](const InterfaceOverview& each) { return each.system == "Computer"; });
    std::vector<std::string> headings;
    if (!oneSystem) {
        headings.emplace_back("SYSTEM");
    }
    for (const char* heading :
         {"INTERFACE", "DHCP", "STATE", "ADDRESS", "SERVERS", "CONFIGURATION NAME"}) {
        headings.emplace_back(heading);
    }
    Table table(std::move(headings));
    for (const InterfaceOverview& each : interfaces) {
        std::vector<std::string> row;
        if (!oneSystem) {
            row.push_back(each.system);
        }
        for (std::string text :
             {cell(each.name), cell(each.dhcp), cell(each.state), cell(each.address),
              cell(each.servers), cell(each.configurationName)}) {
            row.push_back(std::move(text));
        }
        table.add(row);
    }
    const bool noneUsesDhcp =
        std::all_of(interfaces.begin(), interfaces.end(),
                    [](const InterfaceOverview& each) { return each.dhcp == false; });
    return table.text(width) + (noneUsesDhcp ? "No interface of this machine uses DHCP.\n" : "");
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
