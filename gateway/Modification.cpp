#include "Modification.h"

#include <algorithm>
#include <string>
#include <vector>

#include "Completion.h"
#include "Lookup.h"
#include "Values.h"
#include "providerutilities/ProviderUtilities.h"
#include "providerutilities/Refusal.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientGateway {

namespace {

const Property* findProperty(const ServedClass& served, std::string_view name) {
    const auto found =
        std::find_if(served.properties.begin(), served.properties.end(),
                     [name](const Property& each) { return equalNames(each.name, name); });
    return found == served.properties.end() ? nullptr : &*found;
}

/// The properties that a request is about: those of the list, or else those that the
/// client's instance has.
std::vector<std::string> namedProperties(const CMPIInstance* wanted, const char** properties) {
    std::vector<std::string> names;
    if (properties != nullptr) {
        for (const char** each = properties; *each != nullptr; ++each) {
            names.emplace_back(*each);
        }
        return names;
    }
    const CMPICount count = wanted->ft->getPropertyCount(wanted, nullptr);
    for (CMPICount index = 0; index < count; ++index) {
        CMPIString* name = nullptr;
        CMPIStatus status{CMPI_RC_OK, nullptr};
        const CMPIData data = wanted->ft->getPropertyAt(wanted, index, &name, &status);
        const char* text = name == nullptr ? nullptr : name->ft->getCharPtr(name, nullptr);
        // Some object managers show all that the class declares, with nulls or defaults for
        // what the client did not send. A null is a value that a client can send, too: it
        // is one for the property that can be changed alone if it is listed.
        if (status.rc == CMPI_RC_OK && text != nullptr && !isNull(data)) {
            names.emplace_back(text);
        }
    }
    return names;
}

/// The name that a configuration has with a value: no name is the empty one.
std::string configurationName(const CMPIData& data) {
    return textOf(data).value_or("");
}

std::string interfaceOf(const CMPIInstance* instance) {
    return textOf(propertyOf(instance, "ElementName")).value_or("");
}

/// Whether a value may be one that the object manager has put where the client sent none.
bool isFilledIn(const Property& property, const CMPIData& data) {
    return property.standardDefault && numberOf(data) == std::uint64_t{*property.standardDefault};
}

/// Whether the writable property is among those that would change. Throws Refusal when
/// another one would.
bool changes(const ServedClass& served, const CMPIInstance* present, const CMPIInstance* wanted,
             const char** properties) {
    bool change = false;
    for (const std::string& name : namedProperties(wanted, properties)) {
        const Property* property = findProperty(served, name);
        if (property == nullptr) {
            throw Refusal(CMPI_RC_ERR_NO_SUCH_PROPERTY,
                          std::string(served.name) + " has no property " + name);
        }
        const CMPIData before = propertyOf(present, property->name);
        const CMPIData after = propertyOf(wanted, property->name);
        const bool writable =
            served.writable != nullptr && equalNames(served.writable, property->name);
        if (!writable && !sameValue(before, after) &&
            (properties != nullptr || !isFilledIn(*property, after))) {
            throw Refusal(CMPI_RC_ERR_NOT_SUPPORTED, std::string("the property ") + property->name +
                                                         " of " + served.name +
                                                         " cannot be changed");
        }
        if (writable && !isNull(after) && !textOf(after)) {
            throw Refusal(CMPI_RC_ERR_INVALID_PARAMETER,
                          std::string("the property ") + property->name + " is a text");
        }
        change = change || (writable && configurationName(before) != configurationName(after));
    }
    return change;
}

}  // namespace

void modifyInstance(const Request& request, const CMPIInstance* wanted, const char** properties) {
    const ServedClass& served = servedClassOf(request);
    const bool association = served.server == Server::gateway;
    const Object before = association
                              ? objectOf(request, findLink(request, served), Form::instances)
                              : find(request, served, Form::instances);
    if (wanted == nullptr) {
        throw Refusal(CMPI_RC_ERR_INVALID_PARAMETER, "there is no instance to take values from");
    }
    if (!changes(served, before.instance, wanted, properties)) {
        return;
    }
    const std::string name = configurationName(propertyOf(wanted, served.writable));
    CMPIInstance* const changed = makeInstance(request, before.path);
    if (!ProviderUtilities::setProperty(changed, served.writable, name)) {
        throw Refusal(CMPI_RC_ERR_FAILED,
                      std::string("the object manager takes no value for ") + served.writable);
    }
    modify(request, before.path, changed);
    // The provider behind the gateway says OK to whatever became of it.
    const Object after = find(request, served, Form::instances);
    const std::string now = configurationName(propertyOf(after.instance, served.writable));
    if (now != name) {
        throw whyNameUnchanged(interfaceOf(before.instance), name, now);
    }
}

}  // namespace ZR::DHCPClientGateway
