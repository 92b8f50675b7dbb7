#include "Model.h"

#include <algorithm>
#include <cstdint>
#include <fstream>
#include <memory>
#include <optional>
#include <utility>

#include "cimom/Names.h"

namespace conformance {

namespace {

constexpr const char* computerSystem = "QVXZR_ComputerSystem";
constexpr const char* serviceProcessorSystem = "QVXZR_SPComputerSystem";
constexpr const char* serviceProcessorName = "BMC:-1";

cimom::NamedValue text(const std::string& name, const std::string& value) {
    return {name, cimom::Value::ofString(value)};
}

cimom::NamedValue number(const std::string& name, std::uint64_t value,
                         cimom::Type type = cimom::Type::uint16) {
    return {name, {type, false, cimom::Scalar(value)}};
}

cimom::NamedValue numbers(const std::string& name, const std::vector<std::uint64_t>& values) {
    return {name, {cimom::Type::uint16, true, cimom::Array(values.begin(), values.end())}};
}

cimom::NamedValue truth(const std::string& name, bool value) {
    return {name, {cimom::Type::boolean, false, cimom::Scalar(value)}};
}

cimom::NamedValue moment(const std::string& name, const std::string& value) {
    return {name, {cimom::Type::datetime, false, cimom::Scalar(value)}};
}

cimom::NamedValue reference(const std::string& name, const cimom::ObjectPath& path) {
    return {name,
            {cimom::Type::reference, false,
             cimom::Scalar(std::make_shared<const cimom::ObjectPath>(path))}};
}

bool isIn(const Texts& names, const std::string& name) {
    return std::any_of(names.begin(), names.end(),
                       [&name](const std::string& each) { return cimom::sameName(each, name); });
}

bool hasLease(const Interface& interface) {
    return interface.dhcp && !interface.address.empty();
}

bool accepts(const Name& wanted, const std::string& name) {
    return !wanted || cimom::sameName(*wanted, name);
}

}  // namespace

Model::Model(std::vector<Interface> interfaces, const std::string& hostName,
             const cimom::ClassRepository& repository)
    : interfaces_(std::move(interfaces)), hostName_(hostName), repository_(repository) {
    const auto addComputer = [this](const char* className, const std::string& name,
                                    std::uint64_t dedicated) {
        return add(
            className, {"CreationClassName", "Name"},
            {text("CreationClassName", className), text("Name", name), text("ElementName", name),
             text("NameFormat", "Other"), numbers("Dedicated", {dedicated})});
    };
    profile_ = add("QVXZR_RegisteredDHCPClientProfile", {"InstanceID"},
                   {text("InstanceID", "QVXZR:DHCP Client"),
                    text("ElementName", "DHCP Client Profile"), number("SpecificationType", 2),
                    number("RegisteredOrganization", 2), text("RegisteredName", "DHCP Client"),
                    text("RegisteredVersion", "1.0.4"), numbers("AdvertiseTypes", {2})});
    objects_.at(profile_).path.nameSpace = "root/interop";
    const std::size_t host = addComputer(computerSystem, hostName_, 0);
    const std::size_t serviceProcessor =
        addComputer(serviceProcessorSystem, serviceProcessorName, 28);
    for (const Interface& interface : interfaces_) {
        addInterface(interface, host, serviceProcessor);
    }
}

std::size_t Model::add(const std::string& className, const std::vector<std::string>& keys,
                       std::vector<cimom::NamedValue> properties) {
    cimom::Instance object{{"", nameSpace, className, {}}, std::move(properties)};
    for (const std::string& key : keys) {
        object.path.keys.push_back({key, *object.property(key)});
    }
    objects_.push_back(std::move(object));
    return objects_.size() - 1;
}

void Model::link(const std::string& className, const std::string& firstRole, std::size_t first,
                 const std::string& secondRole, std::size_t second,
                 std::vector<cimom::NamedValue> properties) {
    cimom::Instance association{{"", nameSpace, className, {}}, std::move(properties)};
    for (const auto& [role, end] : {std::pair{firstRole, first}, {secondRole, second}}) {
        const cimom::NamedValue value = reference(role, objects_.at(end).path);
        association.path.keys.push_back(value);
        association.properties.push_back(value);
    }
    links_.push_back({std::move(association), {firstRole, secondRole}, {first, second}});
}

void Model::addInterface(const Interface& interface, std::size_t host,
                         std::size_t serviceProcessor) {
    const std::string& name = interface.name;
    const bool ofServiceProcessor = interface.ofServiceProcessor;
    const std::string system = ofServiceProcessor ? serviceProcessorName : hostName_;
    const std::string systemClass = ofServiceProcessor ? serviceProcessorSystem : computerSystem;
    const Texts accessPointKeys{"SystemCreationClassName", "SystemName", "CreationClassName",
                                "Name"};
    // The settings and the configuration that they are part of: of every interface.
    const std::string settingId = (ofServiceProcessor ? "BMC%" : "Computer%") + name;
    std::vector<cimom::NamedValue> settingProperties{
        text("InstanceID", settingId), text("ElementName", name), number("AddressOrigin", 4)};
    if (!interface.address.empty()) {
        settingProperties.push_back(text("RequestedIPv4Address", interface.address));
    }
    if (!interface.configuration.empty()) {
        settingProperties.push_back(text("ConfigurationName", interface.configuration));
    }
    const std::size_t setting = add("QVXZR_DHCPSettingData", {"InstanceID"}, settingProperties);
    const std::size_t assignment = add("QVXZR_IPAssignmentSettingData", {"InstanceID"},
                                       {text("InstanceID", settingId + "%dhcp"),
                                        text("ElementName", name), number("AddressOrigin", 4)});
    link("QVXZR_DHCPOrderedComponent", "GroupComponent", assignment, "PartComponent", setting,
         {number("AssignedSequence", 1, cimom::Type::uint64)});
    std::vector<cimom::NamedValue> known{text("InstanceID", settingId), text("ElementName", name),
                                         truth("DHCPEnabled", interface.dhcp),
                                         truth("LinkUp", true),
                                         number("AddressOrigin", interface.dhcp ? 4 : 3)};
    if (!interface.address.empty()) {
        known.push_back(text("IPv4Address", interface.address));
    }
    add("QVXZR_DHCPInterface", {"InstanceID"}, known);
    // The IP side: of every interface with an address.
    std::optional<std::size_t> ipEndpoint;
    if (!interface.address.empty()) {
        ipEndpoint =
            add("QVXZR_IPProtocolEndpoint", accessPointKeys,
                {text("SystemCreationClassName", computerSystem), text("SystemName", system),
                 text("CreationClassName", "QVXZR_IPProtocolEndpoint"), text("Name", name),
                 text("ElementName", name), text("NameFormat", "NICName"),
                 number("ProtocolIFType", 4096), text("IPv4Address", interface.address),
                 number("AddressOrigin", interface.dhcp ? 4 : 3)});
    }
    // The client and what it can do: of an interface that uses DHCP.
    std::optional<std::size_t> endpoint;
    if (interface.dhcp) {
        endpoint = add(
            "QVXZR_DHCPProtocolEndpoint", accessPointKeys,
            {text("SystemCreationClassName", systemClass), text("SystemName", system),
             text("CreationClassName", "QVXZR_DHCPProtocolEndpoint"), text("Name", name),
             text("ElementName", name), text("Description", "Ethernet interface " + name),
             text("NameFormat", "NICName"), text("OtherTypeDescription", "DHCP"),
             number("ProtocolIFType", 1), number("RequestedState", 2), number("EnabledState", 2),
             number("ClientState", 8), numbers("OptionsReceived", {8, 14, 17})});
        const std::size_t capabilities =
            add("QVXZR_DHCPCapabilities", {"InstanceID"},
                {text("InstanceID", name), text("ElementName", name),
                 truth("ElementNameEditSupported", true), number("MaxElementNameLen", 15),
                 numbers("OptionsSupported", {8, 14, 17})});
        link("QVXZR_DHCPElementCapabilities", "ManagedElement", *endpoint, "Capabilities",
             capabilities);
        link("QVXZR_HostedDHCPPoint", "Antecedent", ofServiceProcessor ? serviceProcessor : host,
             "Dependent", *endpoint);
        link("QVXZR_DHCPElementSettingData", "ManagedElement", *endpoint, "SettingData", setting,
             {number("IsCurrent", 1)});
        link("QVXZR_DHCPClientConformsToProfile", "ConformantStandard", profile_, "ManagedElement",
             *endpoint);
        if (hasLease(interface)) {
            const std::size_t lease =
                add("QVXZR_DHCPLease", {"InstanceID"},
                    {text("InstanceID", settingId + "%IPv4%dhclient"), text("ElementName", name),
                     text("InterfaceID", settingId), text("Family", "IPv4"),
                     number("ClientState", 8), text("Address", interface.address),
                     moment("LeaseExpires", "99991231235959.000000+000"),
                     numbers("OptionsReceived", {1, 51}), text("ClientName", "dhclient"),
                     number("Process", 412, cimom::Type::uint32), truth("ClientRuns", true)});
            link("QVXZR_DHCPLeaseOfEndpoint", "Antecedent", *endpoint, "Dependent", lease);
        }
        if (ipEndpoint) {
            link("QVXZR_SAPSAPDependency", "Antecedent", *ipEndpoint, "Dependent", *endpoint);
        }
    }
    // The servers, which the host knows, whoever uses them. Which of several is asked first
    // is not known.
    const std::uint64_t order = interface.servers.size() == 1 ? 1 : 0;
    for (const std::string& server : interface.servers) {
        const bool isIPv6 = server.find(':') != std::string::npos;
        const std::size_t accessPoint =
            add("QVXZR_DHCPRemoteServiceAccessPoint", accessPointKeys,
                {text("SystemCreationClassName", systemClass), text("SystemName", hostName_),
                 text("CreationClassName", "QVXZR_DHCPRemoteServiceAccessPoint"),
                 text("Name", name + (isIPv6 ? "_IPv6" : "_IPv4")),
                 text("ElementName", "DHCP Server"), text("AccessInfo", server),
                 number("InfoFormat", isIPv6 ? 4 : 3), number("AccessContext", 7)});
        link("QVXZR_DHCPRemoteHostedAccessPoint", "Antecedent", host, "Dependent", accessPoint);
        if (endpoint) {
            link("QVXZR_DHCPRemoteAccessAvailableToElement", "Antecedent", accessPoint, "Dependent",
                 *endpoint, {number("OrderOfAccess", order)});
        }
    }
}

std::vector<test::Json> Model::tree() const {
    std::vector<test::Json> ofHost;
    std::vector<test::Json> ofServiceProcessor;
    for (const Interface& interface : interfaces_) {
        test::Json node = interface.dhcp ? test::dhcpInterface(interface.name, interface.servers)
                                         : test::staticInterface(interface.name);
        if (!interface.dhcp && !interface.servers.empty()) {
            node["properties"]["DHCPServerAddresses"] = interface.servers;
        }
        if (!interface.address.empty()) {
            node["properties"]["IPv4Address"] = interface.address;
        }
        if (hasLease(interface)) {
            node["children"] = {{{"type", "DHCPLease"},
                                 {"description", "DHCP lease"},
                                 {"properties",
                                  {{"Family", "IPv4"},
                                   {"ClientState", 8},
                                   {"Address", interface.address},
                                   {"LeaseExpires", 253402300799},
                                   {"OptionsReceived", {1, 51}},
                                   {"Client", "dhclient"},
                                   {"Process", 412},
                                   {"ClientRuns", true}}}}};
        }
        (interface.ofServiceProcessor ? ofServiceProcessor : ofHost).push_back(std::move(node));
    }
    return {test::host(ofHost), test::serviceProcessor(ofServiceProcessor)};
}

void Model::writeFiles(const std::string& directory) const {
    for (const Interface& interface : interfaces_) {
        if (!interface.configuration.empty()) {
            std::ofstream(directory + "ifcfg-" + interface.name)
                << "CONFIG_NAME=" << interface.configuration << '\n';
        }
    }
}

std::vector<cimom::Instance> Model::all() const {
    std::vector<cimom::Instance> all = objects_;
    for (const Link& each : links_) {
        all.push_back(each.association);
    }
    return all;
}

Response Model::responseTo(const Request& request) const {
    std::vector<cimom::Instance> found;
    const auto isA = [this](const cimom::Instance& instance, const Name& wanted) {
        return !wanted || repository_.isA(instance.path.className, *wanted);
    };
    switch (request.operation) {
        case Operation::enumerateNames:
        case Operation::enumerate:
            for (const cimom::Instance& each : all()) {
                if (each.path.nameSpace == request.path.nameSpace &&
                    isA(each, request.path.className)) {
                    found.push_back(each);
                }
            }
            break;
        case Operation::get:
            for (const cimom::Instance& each : all()) {
                if (each.path == request.path) {
                    found.push_back(each);
                }
            }
            break;
        case Operation::associatorNames:
        case Operation::associators:
        case Operation::referenceNames:
        case Operation::references:
            for (const Link& each : links_) {
                for (const std::size_t near : {std::size_t{0}, std::size_t{1}}) {
                    const cimom::Instance& source = objects_.at(each.ends.at(near));
                    const cimom::Instance& other = objects_.at(each.ends.at(1 - near));
                    if (!(source.path == request.path) ||
                        !isA(each.association, request.association) ||
                        !accepts(request.role, each.roles.at(near)) ||
                        !accepts(request.resultRole, each.roles.at(1 - near)) ||
                        !isA(other, request.resultClass)) {
                        continue;
                    }
                    const bool references = request.operation == Operation::referenceNames ||
                                            request.operation == Operation::references;
                    found.push_back(references ? each.association : other);
                    if (references) {
                        found.back().path.nameSpace = request.path.nameSpace;
                    }
                }
            }
            break;
    }
    Response response;
    for (cimom::Instance& each : found) {
        if (asksForNames(request.operation)) {
            response.paths.push_back(each.path);
            continue;
        }
        if (request.properties) {
            std::erase_if(each.properties, [&](const cimom::NamedValue& property) {
                return !isIn(*request.properties, property.name);
            });
        }
        response.instances.push_back(std::move(each));
    }
    return response;
}

}  // namespace conformance
