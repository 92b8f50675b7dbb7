#include "requests/Requests.h"

#include "associations/Machine.h"

namespace test {

namespace {

constexpr const char* nameOf(Operation operation) {
    switch (operation) {
        case Operation::enumerateNames:
            return "names";
        case Operation::enumerate:
            return "instances";
        case Operation::get:
            return "get";
        case Operation::modify:
            return "modify";
        case Operation::associatorNames:
            return "associator names";
        case Operation::associators:
            return "associators";
        case Operation::referenceNames:
            return "reference names";
        case Operation::references:
            return "references";
    }
    return "";
}

constexpr const char* computerPath =
    R"(QVXZR_ComputerSystem.CreationClassName="QVXZR_ComputerSystem",Name="@")";
constexpr const char* endpointPath =
    R"(QVXZR_DHCPProtocolEndpoint.SystemCreationClassName="QVXZR_ComputerSystem",)"
    R"(SystemName="@",CreationClassName="QVXZR_DHCPProtocolEndpoint",Name="eth0")";
constexpr const char* ipEndpointPath =
    R"(QVXZR_IPProtocolEndpoint.SystemCreationClassName="QVXZR_ComputerSystem",)"
    R"(SystemName="@",CreationClassName="QVXZR_IPProtocolEndpoint",Name="eth0")";
constexpr const char* serverPath =
    R"(QVXZR_DHCPRemoteServiceAccessPoint.SystemCreationClassName="QVXZR_ComputerSystem",)"
    R"(SystemName="@",CreationClassName="QVXZR_DHCPRemoteServiceAccessPoint",Name="eth0_IPv4")";
constexpr const char* capabilitiesPath = R"(QVXZR_DHCPCapabilities.InstanceID="eth0")";
constexpr const char* settingPath = R"(QVXZR_DHCPSettingData.InstanceID="Computer%eth0")";
constexpr const char* assignmentPath =
    R"(QVXZR_IPAssignmentSettingData.InstanceID="Computer%eth0%dhcp")";

}  // namespace

std::string Request::name() const {
    std::string text = nameOf(operation);
    text += " of " + path;
    if (!isOfInstances()) {
        text += std::string(" through ") + (association == nullptr ? "any" : association);
    }
    return text;
}

std::string Request::identifier() const {
    constexpr std::string_view prefix = "QVXZR_";
    const auto bare = [&](const std::string& text) {
        const std::string className = text.substr(0, text.find('.'));
        return className.starts_with(prefix) ? className.substr(prefix.size()) : className;
    };
    std::string text = nameOf(operation);
    std::erase(text, ' ');
    text += "Of" + bare(path);
    if (path.find('.') == std::string::npos && !isOfInstances()) {
        text += "WithoutKeys";
    }
    if (!isOfInstances()) {
        text += "Through" + (association == nullptr ? std::string("Any") : bare(association));
    }
    return text;
}

Host::Answer run(Host& host, const Request& request) {
    const cimom::ObjectPath path = pathFrom(request.path);
    switch (request.operation) {
        case Operation::enumerateNames:
            return host.enumerateNames(path);
        case Operation::enumerate:
            return host.enumerate(path);
        case Operation::get:
            return host.get(path);
        case Operation::modify: {
            const cimom::Instance changed{path,
                                          {{"ConfigurationName", cimom::Value::ofString("new")}}};
            return host.modify(path, &changed);
        }
        case Operation::associatorNames:
            return host.associatorNames(path, request.association);
        case Operation::associators:
            return host.associators(path, request.association);
        case Operation::referenceNames:
            return host.referenceNames(path, request.association);
        case Operation::references:
            return host.references(path, request.association);
    }
    return {};
}

const std::vector<AssociationSources>& associationSources() {
    static const std::vector<AssociationSources> sources{
        {"QVXZR_HostedDHCPPoint", computerPath, endpointPath},
        {"QVXZR_SAPSAPDependency", ipEndpointPath, endpointPath},
        {"QVXZR_DHCPElementCapabilities", endpointPath, capabilitiesPath},
        {"QVXZR_DHCPRemoteHostedAccessPoint", computerPath, serverPath},
        {"QVXZR_DHCPRemoteAccessAvailableToElement", serverPath, endpointPath},
        {"QVXZR_DHCPElementSettingData", endpointPath, settingPath},
        {"QVXZR_DHCPOrderedComponent", assignmentPath, settingPath},
    };
    return sources;
}

const std::vector<ElementSource>& elementSources() {
    static const std::vector<ElementSource> sources{
        {"QVXZR_DHCPProtocolEndpoint", endpointPath},
        {"QVXZR_DHCPCapabilities", capabilitiesPath},
        {"QVXZR_DHCPSettingData", settingPath},
        {"QVXZR_DHCPRemoteServiceAccessPoint", serverPath},
    };
    return sources;
}

std::vector<Request> allRequests() {
    std::vector<Request> requests;
    for (const auto& [className, path] : elementSources()) {
        requests.push_back({Operation::enumerateNames, className});
        requests.push_back({Operation::enumerate, className});
        requests.push_back({Operation::get, path});
    }
    requests.push_back({Operation::modify, settingPath});
    for (const auto& [association, first, second] : associationSources()) {
        requests.push_back({Operation::enumerateNames, association});
        requests.push_back({Operation::enumerate, association});
        requests.push_back({Operation::get, association});
        for (const std::string& source : {first, second}) {
            for (const Operation operation : {Operation::associatorNames, Operation::associators,
                                              Operation::referenceNames, Operation::references}) {
                requests.push_back({operation, source, association});
            }
        }
    }
    return requests;
}

}  // namespace test
