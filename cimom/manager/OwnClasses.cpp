// Classes that the object manager serves itself.
#include <algorithm>
#include <memory>
#include <type_traits>

#include "cimom/ClassDeclaration.h"
#include "manager/AssociationFilter.h"
#include "manager/GuardedCall.h"
#include "manager/ObjectManagerImplementation.h"
#include "manager/PathMatch.h"

namespace cimom {

OwnClass::OwnClass(std::string className, std::vector<std::string> nameSpaces)
    : className_(std::move(className)), nameSpaces_(std::move(nameSpaces)) {}

OwnClass::~OwnClass() = default;

std::string_view OwnClass::declaration() const noexcept {
    return {};
}

std::optional<Instance> OwnClass::find(const ObjectPath& path) const {
    for (Instance& instance : instances(path.nameSpace)) {
        if (hasKeys(instance, path)) {
            return std::move(instance);
        }
    }
    return std::nullopt;
}

ObjectPath OwnClass::create(const Instance& /*instance*/, const std::string& /*principal*/) {
    throw RequestRefused(CMPI_RC_ERR_NOT_SUPPORTED,
                         "instances of " + className_ + " cannot be created");
}

void OwnClass::modify(const Instance& /*instance*/,
                      const std::optional<std::vector<std::string>>& /*propertyList*/,
                      const std::string& /*principal*/) {
    throw RequestRefused(CMPI_RC_ERR_NOT_SUPPORTED,
                         "instances of " + className_ + " cannot be modified");
}

void OwnClass::remove(const ObjectPath& /*path*/, const std::string& /*principal*/) {
    throw RequestRefused(CMPI_RC_ERR_NOT_SUPPORTED,
                         "instances of " + className_ + " cannot be deleted");
}

namespace {

/// An enumerated instance is equal to the one that a client gets by its path, which has all
/// properties of the class.
void addMissing(Instance& instance, const ClassDeclaration& declaration) {
    instance.path.className = declaration.name;
    for (const PropertyDeclaration& property : declaration.properties) {
        if (instance.property(property.name) == nullptr) {
            instance.properties.push_back(
                {property.name, Value::null(property.type, property.isArray)});
        }
    }
}

}  // namespace

CallOutcome ObjectManager::Implementation::readOwn(const ServedClass& target, Reading reading,
                                                   const ObjectPath& path,
                                                   const AnyReceiver& receiver) {
    std::vector<Instance> instances;
    Status status = guardedOwn(*target.own, [&] {
        if (reading != Reading::one) {
            instances = target.own->instances(path.nameSpace);
        } else if (auto found = target.own->find(path)) {
            instances.push_back(*std::move(found));
        } else {
            throw RequestRefused(CMPI_RC_ERR_NOT_FOUND, "");
        }
    });
    if (!status.ok()) {
        return {std::move(status)};
    }
    for (Instance& instance : instances) {
        addMissing(instance, *target.declaration);
    }
    // What the receiver throws is not a failure of the class.
    std::visit(
        [&instances]<typename Object>(ResultReceiver<Object>* taker) {
            taker->beginCall();
            for (Instance& instance : instances) {
                if constexpr (std::is_same_v<Object, ObjectPath>) {
                    taker->take(std::move(instance.path));
                } else {
                    taker->take(std::move(instance));
                }
            }
        },
        receiver);
    return {};
}

CallOutcome ObjectManager::Implementation::ownAssociations(
    const ServedClass& target, const ObjectPath& source, const std::optional<std::string>& role,
    std::vector<Instance>& associations) const {
    Status status =
        guardedOwn(*target.own, [&] { associations = target.own->instances(source.nameSpace); });
    std::erase_if(associations, [&](Instance& association) {
        addMissing(association, *target.declaration);
        complete(association, surroundings(source));
        return !playsRole(association, source, role, repository_);
    });
    return {std::move(status)};
}

}  // namespace cimom
