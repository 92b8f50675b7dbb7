#include "Requests.h"

#include "cimom/Instance.h"
#include "kit/AssociationMachine.h"

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

/// The end of an association on the first interface.
std::string end(const char* className) {
    return endPath(className, "eth0");
}

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

Host::Response run(Host& host, const Request& request) {
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
        {"QVXZR_HostedDHCPPoint", end("QVXZR_ComputerSystem"), end("QVXZR_DHCPProtocolEndpoint")},
        {"QVXZR_SAPSAPDependency", end("QVXZR_IPProtocolEndpoint"),
         end("QVXZR_DHCPProtocolEndpoint")},
        {"QVXZR_DHCPElementCapabilities", end("QVXZR_DHCPProtocolEndpoint"),
         end("QVXZR_DHCPCapabilities")},
        {"QVXZR_DHCPRemoteHostedAccessPoint", end("QVXZR_ComputerSystem"),
         end("QVXZR_DHCPRemoteServiceAccessPoint")},
        {"QVXZR_DHCPRemoteAccessAvailableToElement", end("QVXZR_DHCPRemoteServiceAccessPoint"),
         end("QVXZR_DHCPProtocolEndpoint")},
        {"QVXZR_DHCPElementSettingData", end("QVXZR_DHCPProtocolEndpoint"),
         end("QVXZR_DHCPSettingData")},
        {"QVXZR_DHCPOrderedComponent", end("QVXZR_IPAssignmentSettingData"),
         end("QVXZR_DHCPSettingData")},
    };
    return sources;
}

const std::vector<ElementSource>& elementSources() {
    static const std::vector<ElementSource> sources = [] {
        std::vector<ElementSource> all;
        for (const char* className :
             {"QVXZR_DHCPProtocolEndpoint", "QVXZR_DHCPCapabilities", "QVXZR_DHCPSettingData",
              "QVXZR_DHCPRemoteServiceAccessPoint"}) {
            all.push_back({className, end(className)});
        }
        return all;
    }();
    return sources;
}

std::vector<Request> allRequests() {
    std::vector<Request> requests;
    for (const auto& [className, path] : elementSources()) {
        requests.push_back({Operation::enumerateNames, className});
        requests.push_back({Operation::enumerate, className});
        requests.push_back({Operation::get, path});
    }
    requests.push_back({Operation::modify, end("QVXZR_DHCPSettingData")});
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
