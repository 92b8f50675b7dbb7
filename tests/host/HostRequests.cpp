#include "HostRequests.h"

#include <algorithm>
#include <memory>

#include "cimom/ObjectPathText.h"
#include "cimom/Results.h"
#include "manager/PathMatch.h"

namespace strict {

namespace {

/// A value as the text of paths has it, element by element.
std::string textOf(const std::string& name, const cimom::Value& value) {
    const auto scalarText = [&](const cimom::Scalar& scalar) {
        cimom::Value one;
        one.type = value.type;
        one.content = scalar;
        return cimom::toText(cimom::ObjectPath{"", "", "", {{name, one}}});
    };
    std::string text(cimom::typeName(value.type));
    if (const cimom::Array* array = value.array()) {
        text += "[]";
        for (const cimom::Scalar& element : *array) {
            text += scalarText(element);
        }
    } else if (const cimom::Scalar* scalar = value.scalar()) {
        text += scalarText(*scalar);
    } else {
        text += name + " null";
    }
    return text;
}

std::string textOf(const cimom::Instance& instance) {
    Texts properties;
    for (const cimom::NamedValue& property : instance.properties) {
        properties.push_back("  " + textOf(property.name, property.value));
    }
    std::sort(properties.begin(), properties.end());
    std::string text = cimom::toText(instance.path);
    for (const std::string& property : properties) {
        text += "\n" + property;
    }
    return text;
}

std::string textOf(const cimom::ObjectPath& path) {
    return cimom::toText(path);
}

template <typename Objects>
Texts textsOf(Operation operation, CMPIrc code, const Objects& objects) {
    Texts texts;
    for (const auto& object : objects) {
        texts.push_back(textOf(object));
    }
    std::sort(texts.begin(), texts.end());
    if (operation == Operation::get && code == CMPI_RC_OK && texts.empty()) {
        code = CMPI_RC_ERR_NOT_FOUND;
    }
    texts.insert(texts.begin(), std::string(cimom::statusName(code)));
    return texts;
}

template <typename Object>
std::vector<Object> present(const std::vector<std::optional<Object>>& objects) {
    std::vector<Object> all;
    for (const auto& object : objects) {
        all.push_back(object.value());
    }
    return all;
}

Texts textsOf(Operation operation, const cimom::PathsResult& result) {
    return textsOf(operation, result.status.code, present(result.paths));
}

Texts textsOf(Operation operation, const cimom::InstancesResult& result) {
    return textsOf(operation, result.status.code, present(result.instances));
}

Texts textsOf(Operation operation, const StrictHost::Response& response) {
    return response.instances.empty() ? textsOf(operation, response.code, response.paths)
                                      : textsOf(operation, response.code, response.instances);
}

/// The instance that the path names, of all that a get delivers: the provider's filters
/// are loose, and what an object manager makes of several is its own affair.
StrictHost::Response ofPath(const cimom::ObjectPath& path, StrictHost::Response response) {
    std::erase_if(response.instances,
                  [&](const cimom::Instance& instance) { return !(instance.path == path); });
    return response;
}

/// Whether a reference in the keys of an association names the object.
bool isEnd(const cimom::ObjectPath& object, const cimom::ObjectPath& association,
           const cimom::ClassRepository& repository) {
    return std::any_of(
        association.keys.begin(), association.keys.end(), [&](const cimom::NamedValue& key) {
            const cimom::Scalar* scalar = key.value.scalar();
            const auto* end = scalar == nullptr
                                  ? nullptr
                                  : std::get_if<std::shared_ptr<const cimom::ObjectPath>>(scalar);
            return end != nullptr && cimom::sameObject(**end, object, repository);
        });
}

/// The associations of which the source is an end, of all that references deliver: the
/// provider gives more, and the embedded object manager leaves the others out.
StrictHost::Response ofSource(const cimom::ObjectPath& source, StrictHost::Response response,
                              const cimom::ClassRepository& repository) {
    std::erase_if(response.paths,
                  [&](const cimom::ObjectPath& path) { return !isEnd(source, path, repository); });
    std::erase_if(response.instances, [&](const cimom::Instance& instance) {
        return !isEnd(source, instance.path, repository);
    });
    return response;
}

}  // namespace

std::string HostRequest::name() const {
    return nameOf(operation) + cimom::toText(path) +
           (association.empty() ? "" : " through " + association);
}

Texts ask(cimom::ObjectManager& manager, const HostRequest& request) {
    const auto& [operation, path, association] = request;
    cimom::AssociationRequest filter;
    if (!association.empty()) {
        const bool names = operation == Operation::referenceNames;
        (names || operation == Operation::references ? filter.resultClass : filter.assocClass) =
            association;
    }
    switch (operation) {
        case Operation::enumerateNames:
            return textsOf(operation, manager.enumerateInstanceNames(path));
        case Operation::enumerate:
            return textsOf(operation, manager.enumerateInstances(path));
        case Operation::get:
            return textsOf(operation, manager.getInstance(path));
        case Operation::associatorNames:
            return textsOf(operation, manager.associatorNames(path, filter));
        case Operation::associators:
            return textsOf(operation, manager.associators(path, filter));
        case Operation::referenceNames:
            return textsOf(operation, manager.referenceNames(path, filter));
        case Operation::references:
            return textsOf(operation, manager.references(path, filter));
    }
    return {};
}

Texts ask(StrictHost& host, const HostRequest& request, const char** properties) {
    const auto& [operation, path, association] = request;
    StrictHost::Filter filter;
    filter.association = association.empty() ? nullptr : association.c_str();
    switch (operation) {
        case Operation::enumerateNames:
            return textsOf(operation, host.enumerateNames(path));
        case Operation::enumerate:
            return textsOf(operation, host.enumerate(path, properties));
        case Operation::get:
            return textsOf(operation, ofPath(path, host.get(path, properties)));
        case Operation::associatorNames:
            return textsOf(operation, host.associatorNames(path, filter));
        case Operation::associators:
            return textsOf(operation, host.associators(path, filter, properties));
        case Operation::referenceNames:
            return textsOf(operation,
                           ofSource(path, host.referenceNames(path, filter), host.repository()));
        case Operation::references:
            return textsOf(operation, ofSource(path, host.references(path, filter, properties),
                                               host.repository()));
    }
    return {};
}

std::vector<HostRequest> allRequests(cimom::ObjectManager& manager) {
    std::vector<HostRequest> requests;
    Texts associations;
    std::vector<cimom::ObjectPath> paths;
    for (const cimom::Registration& registration : manager.registrations()) {
        if (!registration.instance) {
            continue;  // of indications, which no request asks for
        }
        const cimom::ObjectPath ofClass{"", "root/cimv2", registration.className, {}};
        requests.push_back({Operation::enumerateNames, ofClass, ""});
        requests.push_back({Operation::enumerate, ofClass, ""});
        for (const auto& path : manager.enumerateInstanceNames(ofClass).paths) {
            paths.push_back(path.value());
        }
        if (registration.association) {
            associations.push_back(registration.className);
        }
    }
    // Superclasses are one call per served class below them.
    for (const char* parent : {"CIM_ComputerSystem", "CIM_ProtocolEndpoint", "CIM_Dependency",
                               "CIM_SettingData", "CIM_ManagedElement"}) {
        requests.push_back(
            {Operation::enumerateNames, cimom::ObjectPath{"", "root/cimv2", parent, {}}, ""});
        requests.push_back(
            {Operation::enumerate, cimom::ObjectPath{"", "root/cimv2", parent, {}}, ""});
    }
    Texts named = associations;
    for (const char* parent :
         {"", "CIM_Dependency", "CIM_HostedDependency", "CIM_HostedAccessPoint",
          "CIM_SAPSAPDependency", "CIM_RemoteAccessAvailableToElement", "CIM_ElementCapabilities",
          "CIM_ElementSettingData", "CIM_Component", "CIM_OrderedComponent"}) {
        named.emplace_back(parent);
    }
    for (const cimom::ObjectPath& path : paths) {
        requests.push_back({Operation::get, path, ""});
        for (const std::string& association : named) {
            requests.push_back({Operation::associatorNames, path, association});
            requests.push_back({Operation::associators, path, association});
        }
        for (const std::string& association : associations) {
            requests.push_back({Operation::referenceNames, path, association});
            requests.push_back({Operation::references, path, association});
        }
    }
    return requests;
}

}  // namespace strict
