#include "manager/RequestedObjects.h"

#include <algorithm>
#include <memory>
#include <utility>

#include "cimom/Instance.h"
#include "cimom/Names.h"

namespace cimom {

namespace {

/// References that a provider made without a namespace are in that of the request.
void completeReference(Value& value, const std::string& nameSpace) {
    const Scalar* const scalar = value.scalar();
    const auto* const reference =
        scalar == nullptr ? nullptr : std::get_if<std::shared_ptr<const ObjectPath>>(scalar);
    if (reference != nullptr && (*reference)->nameSpace.empty()) {
        ObjectPath full = **reference;
        full.nameSpace = nameSpace;
        value.content = Scalar(std::make_shared<const ObjectPath>(std::move(full)));
    }
}

}  // namespace

void complete(ObjectPath& path, const RequestSurroundings& surroundings) {
    if (path.host.empty()) {
        path.host = surroundings.host;
    }
    if (path.nameSpace.empty()) {
        path.nameSpace = surroundings.nameSpace;
    }
    for (NamedValue& key : path.keys) {
        completeReference(key.value, surroundings.nameSpace);
    }
}

void complete(Instance& instance, const RequestSurroundings& surroundings) {
    for (NamedValue& property : instance.properties) {
        completeReference(property.value, surroundings.nameSpace);
    }
    complete(instance.path, surroundings);
}

void applyPropertyList(Instance& instance,
                       const std::optional<std::vector<std::string>>& propertyList) {
    if (!propertyList) {
        return;
    }
    std::erase_if(instance.properties, [&](const NamedValue& property) {
        return std::none_of(propertyList->begin(), propertyList->end(),
                            [&](const std::string& name) { return sameName(name, property.name); });
    });
}

}  // namespace cimom
