#include "Associations.h"

#include <algorithm>
#include <string_view>

#include "zrcommon/Strings.h"

namespace ZR::DHCPClientGateway {

namespace {

constexpr const char* serviceProcessorSystem = "QVXZR_SPComputerSystem";
constexpr std::string_view assignmentSuffix = "%dhcp";

constexpr std::array computers{"QVXZR_ComputerSystem", "QVXZR_SPComputerSystem"};
constexpr std::array endpoints{"QVXZR_DHCPProtocolEndpoint"};
constexpr std::array ipEndpoints{"QVXZR_IPProtocolEndpoint"};
constexpr std::array capabilities{"QVXZR_DHCPCapabilities"};
constexpr std::array accessPoints{"QVXZR_DHCPRemoteServiceAccessPoint"};
constexpr std::array settings{"QVXZR_DHCPSettingData"};
constexpr std::array assignments{"QVXZR_IPAssignmentSettingData"};

std::string keyText(const Keys& keys, std::string_view name) {
    return std::string(keys.text(name));
}

/// Two texts as one that no two others make.
std::string joined(std::string_view one, std::string_view other) {
    std::string text(one);
    text += '\0';
    text += other;
    return text;
}

std::string name(const Keys& keys) {
    return keyText(keys, "Name");
}

std::string systemName(const Keys& keys) {
    return keyText(keys, "SystemName");
}

std::string instanceId(const Keys& keys) {
    return keyText(keys, "InstanceID");
}

std::string nameOnSystem(const Keys& keys) {
    return joined(keys.text("SystemName"), keys.text("Name"));
}

std::string nameOnKindOfSystem(const Keys& keys) {
    return joined(keys.text("SystemCreationClassName"), keys.text("Name"));
}

/// The interface of an access point, whose name is that of the interface with "_" and the
/// kind of its server behind it.
std::string interfaceOfAccessPoint(const Keys& keys) {
    const std::string_view whole = keys.text("Name");
    return std::string(whole.substr(0, whole.rfind('_')));
}

std::string accessedOnKindOfSystem(const Keys& keys) {
    // Not the system's name: that of an access point is always the host's.
    return joined(keys.text("SystemCreationClassName"), interfaceOfAccessPoint(keys));
}

std::string settingIdOfEndpoint(const Keys& keys) {
    const bool ofServiceProcessor = keys.text("SystemCreationClassName") == serviceProcessorSystem;
    return (ofServiceProcessor ? "BMC%" : "Computer%") + name(keys);
}

std::string interfaceOfSetting(const Keys& keys) {
    const std::string_view whole = keys.text("InstanceID");
    return std::string(whole.substr(whole.find('%') + 1));
}

std::string assignmentIdOfSetting(const Keys& keys) {
    return instanceId(keys).append(assignmentSuffix);
}

std::string settingIdOfAssignment(const Keys& keys) {
    std::string_view whole = keys.text("InstanceID");
    if (whole.ends_with(assignmentSuffix)) {
        whole.remove_suffix(assignmentSuffix.size());
    }
    return std::string(whole);
}

constexpr std::array<Association, 7> associations{{
    {.name = "QVXZR_DHCPElementCapabilities",
     .ends = {{{"ManagedElement", endpoints, &name,
                [](const Keys& other) {
                    return KeyTexts{{"Name", instanceId(other)}};
                }},
               {"Capabilities", capabilities, &instanceId,
                [](const Keys& other) {
                    return KeyTexts{{"InstanceID", name(other)}};
                }}}},
     .listed = 0},
    {.name = "QVXZR_HostedDHCPPoint",
     .ends = {{{"Antecedent", computers, &name},
               {"Dependent", endpoints, &systemName,
                [](const Keys& other) {
                    return KeyTexts{{"SystemName", name(other)}};
                }}}},
     .listed = 1},
    {.name = "QVXZR_DHCPRemoteHostedAccessPoint",
     .ends = {{{"Antecedent", computers, &name}, {"Dependent", accessPoints, &systemName}}},
     .listed = 1},
    {.name = "QVXZR_SAPSAPDependency",
     .ends = {{{"Antecedent", ipEndpoints, &nameOnSystem,
                [](const Keys& other) {
                    return KeyTexts{{"SystemCreationClassName", computers.front()},
                                    {"SystemName", systemName(other)},
                                    {"CreationClassName", ipEndpoints.front()},
                                    {"Name", name(other)}};
                }},
               {"Dependent", endpoints, &nameOnSystem,
                [](const Keys& other) {
                    return KeyTexts{{"SystemName", systemName(other)}, {"Name", name(other)}};
                }}}},
     .listed = 1},
    {.name = "QVXZR_DHCPOrderedComponent",
     .ends = {{{"GroupComponent", assignments, &instanceId,
                [](const Keys& other) {
                    return KeyTexts{{"InstanceID", assignmentIdOfSetting(other)}};
                }},
               {"PartComponent", settings, &assignmentIdOfSetting,
                [](const Keys& other) {
                    return KeyTexts{{"InstanceID", settingIdOfAssignment(other)}};
                }}}},
     .listed = 1,
     .own = {"AssignedSequence", CMPI_uint64, 1}},
    {.name = "QVXZR_DHCPRemoteAccessAvailableToElement",
     .ends = {{{"Antecedent", accessPoints, &accessedOnKindOfSystem},
               {"Dependent", endpoints, &nameOnKindOfSystem,
                [](const Keys& other) {
                    return KeyTexts{{"Name", interfaceOfAccessPoint(other)}};
                }}}},
     .listed = 0,
     // The order of several servers is not known.
     .own = {"OrderOfAccess", CMPI_uint16, 1, true}},
    {.name = "QVXZR_DHCPElementSettingData",
     .ends = {{{"ManagedElement", endpoints, &settingIdOfEndpoint,
                [](const Keys& other) {
                    return KeyTexts{{"Name", interfaceOfSetting(other)}};
                }},
               {"SettingData", settings, &instanceId,
                [](const Keys& other) {
                    return KeyTexts{{"InstanceID", settingIdOfEndpoint(other)}};
                }}}},
     .listed = 1,
     .own = {"IsCurrent", CMPI_uint16, 1}},
}};

}  // namespace

std::span<const Association> allAssociations() noexcept {
    return associations;
}

const Association* findAssociation(const ServedClass& served) noexcept {
    const auto* found = std::find_if(
        associations.begin(), associations.end(),
        [&served](const Association& each) { return equalNames(each.name, served.name); });
    return found == associations.end() ? nullptr : found;
}

bool takes(const End& end, const ServedClass& served) noexcept {
    return std::any_of(end.classes.begin(), end.classes.end(),
                       [&served](const char* each) { return equalNames(each, served.name); });
}

}  // namespace ZR::DHCPClientGateway
