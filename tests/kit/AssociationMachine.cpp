#include "kit/AssociationMachine.h"

#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"

namespace test {

namespace {

Json withAddress(Json node, const char* address) {
    node["properties"]["IPv4Address"] = address;
    return node;
}

}  // namespace

std::string brief(const std::optional<cimom::ObjectPath>& path) {
    if (!path) {
        return "null";
    }
    std::string text = path->className.substr(path->className.find('_') + 1);
    for (const char* role : {"Antecedent", "Dependent", "ManagedElement", "Capabilities",
                             "SettingData", "GroupComponent", "PartComponent"}) {
        const cimom::Value* reference = path->key(role);
        if (reference == nullptr) {
            continue;
        }
        const auto& target =
            std::get<std::shared_ptr<const cimom::ObjectPath>>(*reference->scalar());
        text += std::string(" ") + role + "[" + brief(*target) + "]";
    }
    for (const char* name : {"InstanceID", "SystemName", "Name"}) {
        if (const auto value = keyOf(*path, name)) {
            text += " " + *value;
        }
    }
    return text;
}

Texts briefs(const Host::Response& response) {
    Texts texts;
    for (const auto& path : response.paths) {
        texts.push_back(brief(path));
    }
    for (const auto& instance : response.instances) {
        texts.push_back(instance ? brief(instance->path) : "null");
    }
    return texts;
}

cimom::ObjectPath pathFrom(const std::string& text) {
    return cimom::parseObjectPath("root/cimv2:" + ofHost(text));
}

std::string endPath(const std::string& className, const std::string& interface) {
    if (className == "QVXZR_ComputerSystem") {
        return className + R"(.CreationClassName="QVXZR_ComputerSystem",Name="@")";
    }
    if (className == "QVXZR_DHCPCapabilities") {
        return className + ".InstanceID=\"" + interface + '"';
    }
    if (className == "QVXZR_DHCPSettingData") {
        return className + ".InstanceID=\"Computer%" + interface + '"';
    }
    if (className == "QVXZR_IPAssignmentSettingData") {
        return className + ".InstanceID=\"Computer%" + interface + "%dhcp\"";
    }
    const char* suffix = className == "QVXZR_DHCPRemoteServiceAccessPoint" ? "_IPv4" : "";
    return className + R"(.SystemCreationClassName="QVXZR_ComputerSystem",SystemName="@",)" +
           "CreationClassName=\"" + className + "\",Name=\"" + interface + suffix + '"';
}

std::string ofHost(const std::string& text) {
    std::string result = text;
    for (std::size_t at = result.find('@'); at != std::string::npos; at = result.find('@')) {
        result.replace(at, 1, TreeTest::hostName());
    }
    return result;
}

Texts ofHost(const Texts& texts) {
    Texts result;
    for (const std::string& text : texts) {
        result.push_back(ofHost(text));
    }
    return result;
}

void MachineTest::SetUp() {
    TreeTest::SetUp();
    setTree({host({withAddress(dhcpInterface("eth0", {"192.0.2.1"}), "192.0.2.10"),
                   withAddress(dhcpInterface("eth1", {"192.0.2.1", "2001:db8::1"}), "192.0.2.11"),
                   withAddress(dhcpInterface("eth2"), "192.0.2.12"),
                   withAddress(staticInterface("eth3"), "192.0.2.13")}),
             serviceProcessor({withAddress(dhcpInterface("bmc0"), "192.0.2.20")})});
}

cimom::ObjectPath MachineTest::endpoint(const std::string& name) {
    return pathOf("QVXZR_DHCPProtocolEndpoint",
                  {{"SystemCreationClassName", "QVXZR_ComputerSystem"},
                   {"SystemName", hostName()},
                   {"CreationClassName", "QVXZR_DHCPProtocolEndpoint"},
                   {"Name", name}});
}

cimom::ObjectPath MachineTest::computer(const std::string& name) {
    return pathOf("QVXZR_ComputerSystem",
                  {{"CreationClassName", "QVXZR_ComputerSystem"}, {"Name", name}});
}

}  // namespace test
