#include "kit/Script.h"

namespace test {
namespace {

std::string onHost(const std::string& className, const std::string& name) {
    return className + R"(.SystemCreationClassName="QVXZR_ComputerSystem",SystemName="@",)" +
           "CreationClassName=\"" + className + "\",Name=\"" + name + '"';
}

std::vector<ScriptRequest> makeScript() {
    using enum Operation;
    const std::string computer =
        R"(QVXZR_ComputerSystem.CreationClassName="QVXZR_ComputerSystem",Name="@")";
    const std::string endpoint = onHost("QVXZR_DHCPProtocolEndpoint", "eth0");
    const std::string ip = onHost("QVXZR_IPProtocolEndpoint", "eth0");
    const std::string server = onHost("QVXZR_DHCPRemoteServiceAccessPoint", "eth0_IPv4");
    const std::string capabilities = R"(QVXZR_DHCPCapabilities.InstanceID="eth0")";
    const std::string setting = R"(QVXZR_DHCPSettingData.InstanceID="Computer%eth0")";
    return {
        {"NamesOfEndpoints", enumerateNames, "QVXZR_DHCPProtocolEndpoint", ""},
        {"NamesOfCapabilities", enumerateNames, "QVXZR_DHCPCapabilities", ""},
        {"NamesOfSettings", enumerateNames, "QVXZR_DHCPSettingData", ""},
        {"NamesOfServers", enumerateNames, "QVXZR_DHCPRemoteServiceAccessPoint", ""},
        {"Endpoints", enumerate, "QVXZR_DHCPProtocolEndpoint", ""},
        {"Capabilities", enumerate, "QVXZR_DHCPCapabilities", ""},
        {"Settings", enumerate, "QVXZR_DHCPSettingData", ""},
        {"Servers", enumerate, "QVXZR_DHCPRemoteServiceAccessPoint", ""},
        {"AnEndpoint", get, endpoint, ""},
        {"ACapability", get, capabilities, ""},
        {"ASetting", get, setting, ""},
        {"AServer", get, server, ""},
        {"ElementCapabilities", enumerate, "QVXZR_DHCPElementCapabilities", ""},
        {"Dependencies", enumerateNames, "QVXZR_SAPSAPDependency", ""},
        {"HostedPoints", enumerate, "QVXZR_HostedDHCPPoint", ""},
        {"AvailableServers", enumerate, "QVXZR_DHCPRemoteAccessAvailableToElement", ""},
        {"HostedServers", enumerateNames, "QVXZR_DHCPRemoteHostedAccessPoint", ""},
        {"ElementSettings", enumerate, "QVXZR_DHCPElementSettingData", ""},
        {"OrderedComponents", enumerateNames, "QVXZR_DHCPOrderedComponent", ""},
        {"Modify", modify, setting, ""},
        {"Create", create, setting, "", true},
        {"Delete", remove, setting, "", true},
        {"Query", query, "QVXZR_DHCPSettingData", "", true},
        {"AssociatorsOfAComputer", associators, computer, "CIM_HostedAccessPoint"},
        {"AssociatorNamesOfAnIPEndpoint", associatorNames, ip, "QVXZR_SAPSAPDependency"},
        {"AssociatorsOfAnEndpoint", associators, endpoint, ""},
        {"ReferenceNamesOfAnEndpoint", referenceNames, endpoint,
         "QVXZR_DHCPRemoteAccessAvailableToElement"},
        {"ReferencesOfASetting", references, setting, "QVXZR_DHCPElementSettingData"},
        {"NoSuchEndpoint", get, onHost("QVXZR_DHCPProtocolEndpoint", "no-such"), ""},
        {"NoSuchClass", enumerate, "QVXZR_ComputerSystem", "", true},
    };
}

}  // namespace

const std::vector<ScriptRequest>& script() {
    static const std::vector<ScriptRequest> requests = makeScript();
    return requests;
}

bool isSilent(const ScriptRequest& request) {
    return request.operation == Operation::associatorNames ||
           request.operation == Operation::referenceNames;
}

}  // namespace test
