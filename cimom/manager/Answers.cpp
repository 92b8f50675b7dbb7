// From what providers delivered to what clients get.
#include <algorithm>

#include "manager/ObjectManagerImplementation.h"

namespace cimom {

namespace {

/// The status of the whole. A call that stands for one of several classes adds
/// nothing when the provider does not know the class or the operation.
Status overall(const std::vector<CallOutcome>& calls, bool exact) {
    for (const CallOutcome& call : calls) {
        const bool nothingToAdd = !exact && (call.status.code == CMPI_RC_ERR_INVALID_CLASS ||
                                             call.status.code == CMPI_RC_ERR_NOT_SUPPORTED ||
                                             call.status.code == CMPI_RC_ERR_NOT_FOUND);
        if (!call.status.ok() && !nothingToAdd) {
            return call.status;
        }
    }
    return {};
}

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

void ObjectManager::Implementation::complete(ObjectPath& path, const std::string& nameSpace) const {
    if (path.host.empty()) {
        path.host = configuration_.host;
    }
    if (path.nameSpace.empty()) {
        path.nameSpace = nameSpace;
    }
    for (NamedValue& key : path.keys) {
        completeReference(key.value, nameSpace);
    }
}

void ObjectManager::Implementation::complete(Instance& instance,
                                             const std::string& nameSpace) const {
    for (NamedValue& property : instance.properties) {
        completeReference(property.value, nameSpace);
    }
    // Some providers set key properties only, and leave the path without them.
    if (const broker::ClassIndex* const index = schema_->find(instance.path.className)) {
        for (const PropertyDeclaration* const key : index->keys()) {
            const Value* const value =
                instance.path.key(key->name) == nullptr ? instance.property(key->name) : nullptr;
            if (value != nullptr && !value->isNull()) {
                instance.path.keys.push_back({key->name, *value});
            }
        }
    }
    complete(instance.path, nameSpace);
}

RequestEnd endOf(const std::vector<CallOutcome>& calls, bool exact) {
    RequestEnd end{overall(calls, exact)};
    for (const CallOutcome& call : calls) {
        end.returnDoneCalls += call.returnDoneCalls;
    }
    return end;
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
