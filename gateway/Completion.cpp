#include "Completion.h"

#include "Values.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientGateway {

namespace {

bool hasValue(const CMPIInstance* instance, const char* name) {
    return !isNull(propertyOf(instance, name));
}

/// A host that does not know the property, since its schema is another one, refuses: the
/// client then does without the null, too.
void setNull(const CMPIInstance* instance, const Property& property) {
    static_cast<void>(instance->ft->setProperty(instance, property.name, nullptr, property.type));
}

void copy(const CMPIInstance* from, const CMPIInstance* to, const char* name) {
    const CMPIData data = from->ft->getProperty(from, name, nullptr);
    static_cast<void>(to->ft->setProperty(to, name, &data.value, data.type));
}

/// The listed properties in an instance of their own.
const CMPIInstance* listed(const Request& request, const ServedClass& served, const Object& object,
                           const char** properties) {
    const CMPIInstance* instance = makeInstance(request, object.path);
    if (served.server == Server::otherwise) {
        const CMPICount count = object.instance->ft->getPropertyCount(object.instance, nullptr);
        for (CMPICount index = 0; index < count; ++index) {
            CMPIString* name = nullptr;
            object.instance->ft->getPropertyAt(object.instance, index, &name, nullptr);
            const char* text = name == nullptr ? nullptr : name->ft->getCharPtr(name, nullptr);
            if (text != nullptr && lists(properties, text) && hasValue(object.instance, text)) {
                copy(object.instance, instance, text);
            }
        }
    }
    for (const Property& property : served.properties) {
        // Some object managers fail on an instance that lacks a reference of its path.
        if (property.type != CMPI_ref && !lists(properties, property.name)) {
            continue;
        }
        if (property.presence != Presence::never && hasValue(object.instance, property.name)) {
            copy(object.instance, instance, property.name);
        } else {
            setNull(instance, property);
        }
    }
    return instance;
}

}  // namespace

bool lists(const char** properties, const char* name) noexcept {
    if (properties == nullptr) {
        return true;
    }
    for (const char** each = properties; *each != nullptr; ++each) {
        if (equalNames(*each, name)) {
            return true;
        }
    }
    return false;
}

const CMPIInstance* completed(const Request& request, const ServedClass& served,
                              const Object& object, const char** properties) {
    if (properties != nullptr) {
        return listed(request, served, object, properties);
    }
    for (const Property& property : served.properties) {
        if (property.presence == Presence::never || (property.presence == Presence::sometimes &&
                                                     !hasValue(object.instance, property.name))) {
            setNull(object.instance, property);
        }
    }
    return object.instance;
}

}  // namespace ZR::DHCPClientGateway
