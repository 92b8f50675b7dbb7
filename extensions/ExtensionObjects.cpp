#include "ExtensionObjects.h"

#include "providerutilities/ProviderUtilities.h"
#include "providerutilities/Refusal.h"

namespace ZR::DHCPClientExtensions {

namespace {

/// Sets one property; false when the broker refuses.
struct PropertySetter {
    const CMPIBroker* broker;
    CMPIInstance* instance;
    const char* name;
    CMPIType type;

    bool operator()(std::monostate /*unknown*/) const {
        return ProviderUtilities::setNull(instance, name, type);
    }
    bool operator()(bool truth) const {
        return ProviderUtilities::setProperty(instance, name, truth);
    }
    bool operator()(std::uint64_t number) const {
        return type == CMPI_uint16 ? ProviderUtilities::setProperty(
                                         instance, name, static_cast<unsigned short>(number))
                                   : ProviderUtilities::setProperty(
                                         instance, name, static_cast<unsigned int>(number));
    }
    bool operator()(const std::string& text) const {
        return ProviderUtilities::setProperty(broker, instance, name, text, type == CMPI_dateTime);
    }
    bool operator()(const std::vector<unsigned short>& numbers) const {
        return ProviderUtilities::setProperty(broker, instance, name, numbers);
    }
};

void requireMade(bool made, const char* className) {
    if (!made) {
        throw Refusal(CMPI_RC_ERR_FAILED,
                      std::string("the object manager refuses a part of ") + className);
    }
}

}  // namespace

CMPIObjectPath* makePath(const CMPIBroker* broker, const std::string& nameSpace,
                         const ObjectName& name) {
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(
        broker, name.className, name.nameSpace.empty() ? nameSpace : name.nameSpace);
    requireMade(path != nullptr, name.className);
    for (const auto& [key, value] : name.keys) {
        requireMade(ProviderUtilities::setKeyProperty(path, key, value), name.className);
    }
    return path;
}

CMPIInstance* makeInstance(const CMPIBroker* broker, const std::string& nameSpace,
                           const ExtensionObject& object, const char** properties) {
    CMPIInstance* instance =
        ProviderUtilities::createInstance(broker, makePath(broker, nameSpace, object.name()));
    bool complete = instance != nullptr;
    if (ProviderUtilities::isListed(properties, "InstanceID")) {
        complete = complete && ProviderUtilities::setProperty(instance, "InstanceID", object.id);
    }
    for (const ObjectProperty& property : object.properties) {
        const bool known = !std::holds_alternative<std::monostate>(property.value);
        const bool wanted =
            ProviderUtilities::isListed(properties, property.name) && (known || properties);
        if (wanted) {
            complete = complete &&
                       std::visit(PropertySetter{broker, instance, property.name, property.type},
                                  property.value);
        }
    }
    requireMade(complete, object.className);
    return instance;
}

}  // namespace ZR::DHCPClientExtensions
