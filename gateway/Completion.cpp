#include "Completion.h"

#include "Values.h"
#include "providerutilities/ProviderUtilities.h"

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
    static_cast<void>(
        to->ft->setProperty(to, name, isNull(data) ? nullptr : &data.value, data.type));
}

/// The listed properties in an instance of their own.
const CMPIInstance* listed(const Request& request, const ServedClass& served,
                           const CMPIInstance* whole, const char** properties) {
    const CMPIInstance* instance = makeInstance(request, whole->ft->getObjectPath(whole, nullptr));
    if (served.server == Server::otherwise) {
        const CMPICount count = whole->ft->getPropertyCount(whole, nullptr);
        for (CMPICount index = 0; index < count; ++index) {
            CMPIString* name = nullptr;
            const CMPIData data = whole->ft->getPropertyAt(whole, index, &name, nullptr);
            const char* text = name == nullptr ? nullptr : name->ft->getCharPtr(name, nullptr);
            if (text == nullptr) {
                continue;
            }
            if (ProviderUtilities::isListed(properties, text)) {
                copy(whole, instance, text);
            } else {
                // A null, so that some object managers do not show the schema's default.
                static_cast<void>(instance->ft->setProperty(instance, text, nullptr, data.type));
            }
        }
    }
    for (const Property& property : served.properties) {
        // Some object managers fail on an instance that lacks a reference of its path.
        if (property.type != CMPI_ref && !ProviderUtilities::isListed(properties, property.name)) {
            if (property.standardDefault) {
                setNull(instance, property);
            }
            continue;
        }
        if (property.presence != Presence::never && hasValue(whole, property.name)) {
            copy(whole, instance, property.name);
        } else {
            setNull(instance, property);
        }
    }
    return instance;
}

}  // namespace

const CMPIInstance* completed(const Request& request, const ServedClass& served,
                              const CMPIInstance* instance, const char** properties) {
    if (properties != nullptr) {
        return listed(request, served, instance, properties);
    }
    for (const Property& property : served.properties) {
        const bool unset =
            property.standardDefault &&
            (property.presence == Presence::never ||
             (property.presence == Presence::sometimes && !hasValue(instance, property.name)));
        if (unset) {
            setNull(instance, property);
        }
    }
    return instance;
}

}  // namespace ZR::DHCPClientGateway
