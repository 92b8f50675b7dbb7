#include "ExpectedMachine.h"

#include <algorithm>
#include <filesystem>
#include <regex>

#include "kit/Files.h"

namespace test {

namespace {

/// What is not known of an element, and told as such: the standard schema has defaults.
const std::string unknownStates =
    ",EnabledState=,RequestedState=,EnabledDefault=,TransitioningToState=";

std::string quoted(const std::string& text) {
    return '"' + text + '"';
}

std::string key(const std::string& name, const std::string& value) {
    return name + '=' + quoted(value);
}

/// Without strings, comments and qualifiers, in which anything may stand.
std::string declarationsOf(const std::string& mof) {
    std::string text;
    int depth = 0;
    for (std::size_t at = 0; at < mof.size(); ++at) {
        if (mof.compare(at, 2, "//") == 0) {
            at = std::min(mof.find('\n', at), mof.size());
        } else if (mof[at] == '"') {
            for (++at; at < mof.size() && mof[at] != '"'; ++at) {
                at += mof[at] == '\\' ? 1U : 0U;
            }
        } else if (mof[at] == '[' && mof.compare(at, 2, "[]") != 0) {
            ++depth;
        } else if (mof[at] == ']' && depth > 0) {
            --depth;
        } else if (depth == 0) {
            text += mof[at];
        }
    }
    return text;
}

constexpr const char* system = "QVXZR_ComputerSystem";
constexpr const char* ipEndpoint = "QVXZR_IPProtocolEndpoint";
constexpr const char* assignment = "QVXZR_IPAssignmentSettingData";
constexpr const char* endpoint = "QVXZR_DHCPProtocolEndpoint";
constexpr const char* capabilities = "QVXZR_DHCPCapabilities";
constexpr const char* server = "QVXZR_DHCPRemoteServiceAccessPoint";
constexpr const char* setting = "QVXZR_DHCPSettingData";
constexpr const char* conforms = "QVXZR_DHCPClientConformsToProfile";
constexpr const char* serverOfElement = "QVXZR_DHCPRemoteAccessAvailableToElement";

}  // namespace

ExpectedClasses::ExpectedClasses(const std::string& directory) {
    std::vector<std::string> files;
    for (const auto& entry : std::filesystem::directory_iterator(directory)) {
        if (entry.path().extension() == ".mof") {
            files.push_back(entry.path());
        }
    }
    std::sort(files.begin(), files.end());
    static const std::regex declaration(R"(class\s+(\w+)\s*(?::\s*(\w+))?\s*\{([^}]*)\})");
    static const std::regex property(R"((\w+)(?:\[\])?\s*(?:=[^;]*)?;)");
    for (const std::string& file : files) {
        const std::string text = declarationsOf(ZR::Testing::readFile(file));
        for (std::sregex_iterator found(text.begin(), text.end(), declaration), end; found != end;
             ++found) {
            Class& made = classes_[(*found)[1]];
            made.parent = (*found)[2];
            order_.push_back((*found)[1]);
            const std::string body = (*found)[3];
            for (std::sregex_iterator each(body.begin(), body.end(), property); each != end;
                 ++each) {
                made.properties.push_back((*each)[1]);
            }
        }
    }
}

std::vector<std::string> ExpectedClasses::treeOf(const std::string& name) const {
    std::vector<std::string> tree;
    if (!name.empty()) {
        tree.push_back(name);
    }
    for (const std::string& each : order_) {
        if (parentOf(each) == name) {
            const std::vector<std::string> below = treeOf(each);
            tree.insert(tree.end(), below.begin(), below.end());
        }
    }
    return tree;
}

std::vector<std::string> ExpectedClasses::propertiesOf(const std::string& name) const {
    if (name.empty()) {
        return {};
    }
    const Class& found = classes_.at(name);
    std::vector<std::string> all = propertiesOf(found.parent);
    for (const std::string& own : found.properties) {
        if (std::find(all.begin(), all.end(), own) == all.end()) {
            all.push_back(own);
        }
    }
    return all;
}

bool ExpectedClasses::isA(const std::string& name, const std::string& ancestor) const {
    return name == ancestor || (!name.empty() && isA(parentOf(name), ancestor));
}

const std::vector<std::string>& ExpectedMachine::elementClasses() {
    static const std::vector<std::string> all{system,       ipEndpoint, assignment, endpoint,
                                              capabilities, server,     setting};
    return all;
}

const std::vector<std::string>& ExpectedMachine::associationClasses() {
    static const std::vector<std::string> all{"QVXZR_DHCPElementCapabilities",
                                              "QVXZR_HostedDHCPPoint",
                                              "QVXZR_DHCPRemoteHostedAccessPoint",
                                              "QVXZR_SAPSAPDependency",
                                              serverOfElement,
                                              "QVXZR_DHCPOrderedComponent",
                                              "QVXZR_DHCPElementSettingData",
                                              conforms};
    return all;
}

ExpectedMachine::ExpectedMachine(const ExpectedClasses& classes, const std::string& host,
                                 const std::vector<Interface>& interfaces)
    : classes_(classes), host_(host) {
    if (interfaces.empty()) {
        return;
    }
    const std::string keys = key("CreationClassName", system) + ',' + key("Name", host);
    add(system, keys,
        keys + ',' + key("ElementName", host) + R"(,NameFormat="Other",Dedicated=0)" +
            unknownStates);
    // In another namespace than everything else.
    const std::string profileKeys = key("InstanceID", "QVXZR:DHCP Client");
    const Object profile{"QVXZR_RegisteredDHCPClientProfile",
                         "QVXZR_RegisteredDHCPClientProfile." + profileKeys,
                         profileKeys + R"(,ElementName="DHCP Client Profile",SpecificationType=2,)"
                                       R"(RegisteredOrganization=2,RegisteredName="DHCP Client",)"
                                       R"(RegisteredVersion="1.0.4",AdvertiseTypes=2)",
                         "root/interop"};
    byPath_[profile.path] = profile;
    for (const Interface& interface : interfaces) {
        addInterface(interface);
        const Object& client = objects_[endpoint].back();
        const std::string ends = "ConformantStandard=root/interop:" + profile.path +
                                 ",ManagedElement=root/cimv2:" + client.path;
        add(conforms, ends, ends, profile.path, client.path);
    }
}

void ExpectedMachine::add(const std::string& className, const std::string& keys,
                          const std::string& properties) {
    const Object object{className, className + '.' + keys, properties};
    objects_[className].push_back(object);
    byPath_[object.path] = object;
}

void ExpectedMachine::add(const std::string& className, const std::string& keys,
                          const std::string& properties, const std::string& one,
                          const std::string& other) {
    associations_[className].push_back(
        {{className, className + '.' + keys, properties}, one, other});
}

void ExpectedMachine::addInterface(const Interface& interface) {
    const std::string& name = interface.name;
    const std::string ofSystem =
        key("SystemCreationClassName", system) + ',' + key("SystemName", host_);
    const auto accessPoint = [&](const std::string& className, const std::string& called) {
        return ofSystem + ',' + key("CreationClassName", className) + ',' + key("Name", called);
    };

    const std::string ipKeys = accessPoint(ipEndpoint, name);
    add(ipEndpoint, ipKeys,
        ipKeys + ',' + key("ElementName", name) + R"(,NameFormat="NICName",ProtocolIFType=4096,)" +
            key("IPv4Address", interface.address) + ",AddressOrigin=4" + unknownStates);
    const std::string assignmentKeys = key("InstanceID", "Computer%" + name + "%dhcp");
    add(assignment, assignmentKeys,
        assignmentKeys + ',' + key("ElementName", name) + ",AddressOrigin=4");
    const std::string endpointKeys = accessPoint(endpoint, name);
    add(endpoint, endpointKeys,
        key("ElementName", name) + ",RequestedState=2," + ofSystem + ',' +
            key("CreationClassName", endpoint) +
            R"(,Description="Ethernet interface",EnabledState=2,)" + key("Name", name) +
            R"(,NameFormat="NICName",ProtocolIFType=1,OtherTypeDescription="DHCP",)"
            "ClientState=8,OptionsReceived=8,14,17,EnabledDefault=,TransitioningToState=");
    const std::string capabilityKeys = key("InstanceID", name);
    add(capabilities, capabilityKeys,
        capabilityKeys + ',' + key("ElementName", name) +
            ",ElementNameEditSupported=TRUE,OptionsSupported=8,14,17");
    const std::string serverKeys = accessPoint(server, name + "_IPv4");
    add(server, serverKeys,
        R"(ElementName="DHCP Server",)" + key("AccessInfo", interface.server) +
            ",InfoFormat=3,AccessContext=7," + serverKeys + unknownStates);
    const std::string settingKeys = key("InstanceID", "Computer%" + name);
    add(setting, settingKeys,
        settingKeys + ',' + key("ElementName", name) + ",AddressOrigin=4," +
            key("RequestedIPv4Address", interface.address));

    const auto path = [](const char* className, const std::string& keys) {
        return className + ('.' + keys);
    };
    const auto reference = [](const std::string& role, const std::string& object) {
        return role + "=root/cimv2:" + object;
    };
    const std::string systemPath = objects_[system].front().path;
    const std::string ofHost = reference("Antecedent", systemPath);
    const std::string endpointPath = path(endpoint, endpointKeys);
    const std::string serverPath = path(server, serverKeys);
    const std::string settingPath = path(setting, settingKeys);

    const std::string served = reference("ManagedElement", endpointPath) + ',' +
                               reference("Capabilities", path(capabilities, capabilityKeys));
    add("QVXZR_DHCPElementCapabilities", served, served, endpointPath,
        path(capabilities, capabilityKeys));
    const std::string dependent = reference("Dependent", endpointPath);
    add("QVXZR_HostedDHCPPoint", dependent + ',' + ofHost, ofHost + ',' + dependent, systemPath,
        endpointPath);
    const std::string hostedServer = reference("Dependent", serverPath);
    add("QVXZR_DHCPRemoteHostedAccessPoint", hostedServer + ',' + ofHost,
        ofHost + ',' + hostedServer, systemPath, serverPath);
    const std::string ip = reference("Antecedent", path(ipEndpoint, ipKeys));
    add("QVXZR_SAPSAPDependency", dependent + ',' + ip, ip + ',' + dependent,
        path(ipEndpoint, ipKeys), endpointPath);
    const std::string available = reference("Antecedent", serverPath) + ',' + dependent;
    add(serverOfElement, available, available + ",OrderOfAccess=1", serverPath, endpointPath);
    const std::string part = reference("PartComponent", settingPath);
    const std::string group = reference("GroupComponent", path(assignment, assignmentKeys));
    add("QVXZR_DHCPOrderedComponent", part + ',' + group,
        group + ',' + part + ",AssignedSequence=1", path(assignment, assignmentKeys), settingPath);
    const std::string data = reference("SettingData", settingPath);
    const std::string element = reference("ManagedElement", endpointPath);
    add("QVXZR_DHCPElementSettingData", data + ',' + element, element + ',' + data + ",IsCurrent=1",
        endpointPath, settingPath);
}

const ExpectedMachine::Object& ExpectedMachine::objectAt(const std::string& path) const {
    return byPath_.at(path);
}

std::vector<ExpectedMachine::Object> ExpectedMachine::instancesOf(
    const std::string& className) const {
    std::vector<Object> all;
    for (const std::string& each : classes_.treeOf(className)) {
        if (const auto objects = objects_.find(each); objects != objects_.end()) {
            all.insert(all.end(), objects->second.begin(), objects->second.end());
        }
        if (const auto found = associations_.find(each); found != associations_.end()) {
            for (const Association& association : found->second) {
                all.push_back(association.object);
            }
        }
    }
    return all;
}

ExpectedMachine::Object ExpectedMachine::fetched(Object object) const {
    const std::string before = ',' + object.properties;
    for (const std::string& property : classes_.propertiesOf(object.className)) {
        if (before.find(',' + property + '=') == std::string::npos) {
            object.properties += ',' + property + '=';
        }
    }
    return object;
}

std::vector<ExpectedMachine::Object> ExpectedMachine::associators(
    const Object& of, const std::string& associationClass) const {
    std::vector<Object> far;
    for (const std::string& each : associationClasses()) {
        const auto found = associations_.find(each);
        if (found == associations_.end() ||
            (!associationClass.empty() && !classes_.isA(each, associationClass))) {
            continue;
        }
        for (const Association& association : found->second) {
            if (association.one == of.path) {
                far.push_back(objectAt(association.other));
            } else if (association.other == of.path) {
                far.push_back(objectAt(association.one));
            }
        }
    }
    return far;
}

std::vector<ExpectedMachine::Object> ExpectedMachine::references(
    const Object& of, const std::string& associationClass) const {
    // Without a class, they come in the order of the schema's levels.
    static const std::vector<std::string> inSchema{"QVXZR_HostedDHCPPoint",
                                                   "QVXZR_DHCPRemoteHostedAccessPoint",
                                                   "QVXZR_SAPSAPDependency",
                                                   "QVXZR_DHCPElementCapabilities",
                                                   serverOfElement,
                                                   "QVXZR_DHCPElementSettingData",
                                                   "QVXZR_DHCPOrderedComponent",
                                                   conforms};
    std::vector<Object> all;
    for (const std::string& each :
         associationClass.empty() ? inSchema : classes_.treeOf(associationClass)) {
        const auto found = associations_.find(each);
        if (found == associations_.end()) {
            continue;
        }
        for (const Association& association : found->second) {
            if (association.one == of.path || association.other == of.path) {
                all.push_back(association.object);
            }
        }
    }
    return all;
}

}  // namespace test
