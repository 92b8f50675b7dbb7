#include "ExtensionRequests.h"

#include <algorithm>

#include "providerutilities/ProviderUtilities.h"
#include "providerutilities/Refusal.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientExtensions {

namespace {

bool agree(const Keys& keys, const KeyTexts& texts) {
    return keys.size() == texts.size() &&
           std::all_of(texts.begin(), texts.end(), [&keys](const auto& text) {
               const Key* key = keys.find(text.first);
               return key != nullptr && key->isText && key->text == text.second;
           });
}

/// Whether a path is the name; one that tells no namespace is of any.
bool isNameOf(const CMPIObjectPath* path, const ObjectName& name, const std::string& nameSpace) {
    const std::string there = ProviderUtilities::getNamespace(path);
    const std::string& here = name.nameSpace.empty() ? nameSpace : name.nameSpace;
    return equalNames(classNameOf(path), name.className) &&
           (there.empty() || equalNames(there, here)) && agree(Keys(path), name.keys);
}

// An object manager that has given up on the request refuses what it is given: the walks are
// short enough to end by themselves.

void give(const Request& request, const CMPIObjectPath* path) {
    static_cast<void>(request.result->ft->returnObjectPath(request.result, path));
}

void give(const Request& request, const CMPIInstance* instance) {
    static_cast<void>(request.result->ft->returnInstance(request.result, instance));
}

void giveObject(const Request& request, const ExtensionObject& object, const Wanted& wanted) {
    if (wanted.names) {
        give(request, makePath(request.broker, request.nameSpace, object.name()));
    } else {
        give(request, makeInstance(request.broker, request.nameSpace, object, wanted.properties));
    }
}

/// The references are always there, whatever the property list: some object managers fail
/// on an instance that lacks a reference of its path.
void giveLink(const Request& request, const AssociationClass& association, const Link& link,
              const Wanted& wanted) {
    CMPIObjectPath* path = makePath(request.broker, request.nameSpace, {association.name, {}, {}});
    std::array<CMPIObjectPath*, 2> ends{};
    bool complete = true;
    for (std::size_t end = 0; end < ends.size(); ++end) {
        ends.at(end) = makePath(request.broker, request.nameSpace, link.at(end));
        complete = complete &&
                   ProviderUtilities::setKeyProperty(path, association.roles.at(end), ends.at(end));
    }
    CMPIInstance* instance = nullptr;
    if (!wanted.names) {
        instance = ProviderUtilities::createInstance(request.broker, path);
        for (std::size_t end = 0; end < ends.size(); ++end) {
            complete = complete && ProviderUtilities::setProperty(
                                       instance, association.roles.at(end), ends.at(end));
        }
    }
    if (!complete) {
        throw Refusal(CMPI_RC_ERR_FAILED,
                      std::string("the object manager refuses a part of ") + association.name);
    }
    wanted.names ? give(request, path) : give(request, instance);
}

template <typename Class>
bool acceptsServed(const Request& request, const char* wanted, const Class& served) {
    return acceptsClass(request.broker, request.nameSpace, wanted, served.name, served.ancestors);
}

/// Whether the request's source is of a class that is known here. Throws Refusal when it is,
/// and does not exist, whatever the filter: some object managers ask once for each association
/// class, and a source that is not there is to have one response.
bool isKnown(const Request& request) {
    const ElementClass* served = findElement(classNameOf(request.path));
    if (served == nullptr) {
        return false;
    }
    const Keys keys(request.path);
    requireKeys(served->name, served->keys, KeyKind::text, keys);
    const auto names = namesOf(*served, *request.machine);
    if (std::none_of(names.begin(), names.end(),
                     [&keys](const ObjectName& name) { return agree(keys, name.keys); })) {
        refuseMissing(served->name, keys);
    }
    return true;
}

/// Hands over each association of the request's source with the place of its other end.
template <typename Take>
void forEachLink(const Request& request, const AssociationFilter& filter, const Take& take) {
    if (!isKnown(request)) {
        return;
    }
    for (const AssociationClass& association : associationClasses()) {
        if (!acceptsServed(request, filter.association, association)) {
            continue;
        }
        for (std::size_t near = 0; near < association.ends.size(); ++near) {
            const std::size_t far = 1 - near;
            if (!equalNames(association.ends.at(near), classNameOf(request.path)) ||
                !acceptsRole(filter.role, association.roles.at(near)) ||
                !acceptsRole(filter.resultRole, association.roles.at(far)) ||
                !acceptsServed(request, filter.resultClass,
                               *findElement(association.ends.at(far)))) {
                continue;
            }
            for (const Link& link : association.links(request)) {
                if (isNameOf(request.path, link.at(near), request.nameSpace)) {
                    take(association, link, far);
                }
            }
        }
    }
}

/// An object at an end of an association. One of another provider may have gone meanwhile,
/// and is then left out.
void giveEnd(const Request& request, const ObjectName& name, const Wanted& wanted) {
    const CMPIObjectPath* path = makePath(request.broker, request.nameSpace, name);
    if (wanted.names) {
        give(request, path);
        return;
    }
    const ElementClass& served = *findElement(name.className);
    if (served.objects == nullptr) {
        CMPIStatus status{CMPI_RC_OK, nullptr};
        const CMPIInstance* instance = request.broker->bft->getInstance(
            request.broker, request.context, path, wanted.properties, &status);
        if (status.rc == CMPI_RC_OK && instance != nullptr) {
            give(request, instance);
        }
        return;
    }
    for (const ExtensionObject& object : served.objects(*request.machine)) {
        if (object.id == name.keys.front().second) {
            give(request, makeInstance(request.broker,
                                       name.nameSpace.empty() ? request.nameSpace : name.nameSpace,
                                       object, wanted.properties));
        }
    }
}

[[noreturn]] void refuseClass(const std::string& name) {
    throw Refusal(CMPI_RC_ERR_INVALID_CLASS, "this provider does not serve the class " + name);
}

}  // namespace

void enumerate(const Request& request, const Wanted& wanted) {
    const std::string name = classNameOf(request.path);
    if (const AssociationClass* association = findAssociation(name)) {
        for (const Link& link : association->links(request)) {
            giveLink(request, *association, link, wanted);
        }
        return;
    }
    const ElementClass* served = findElement(name);
    if (served == nullptr || served->objects == nullptr) {
        refuseClass(name);
    }
    for (const ExtensionObject& object : served->objects(*request.machine)) {
        giveObject(request, object, wanted);
    }
}

void get(const Request& request, const Wanted& wanted) {
    const std::string name = classNameOf(request.path);
    const Keys keys(request.path);
    if (const AssociationClass* association = findAssociation(name)) {
        requireKeys(association->name, association->roles, KeyKind::reference, keys);
        for (const Link& link : association->links(request)) {
            const auto isEnd = [&](std::size_t end) {
                return isNameOf(keys.find(association->roles.at(end))->reference, link.at(end),
                                request.nameSpace);
            };
            if (isEnd(0) && isEnd(1)) {
                giveLink(request, *association, link, wanted);
                return;
            }
        }
        refuseMissing(association->name, keys);
    }
    const ElementClass* served = findElement(name);
    if (served == nullptr || served->objects == nullptr) {
        refuseClass(name);
    }
    requireKeys(served->name, served->keys, KeyKind::text, keys);
    for (const ExtensionObject& object : served->objects(*request.machine)) {
        if (object.id == keys.text("InstanceID")) {
            giveObject(request, object, wanted);
            return;
        }
    }
    refuseMissing(served->name, keys);
}

void associators(const Request& request, const AssociationFilter& filter, const Wanted& wanted) {
    forEachLink(request, filter,
                [&](const AssociationClass& /*association*/, const Link& link, std::size_t far) {
                    giveEnd(request, link.at(far), wanted);
                });
}

void references(const Request& request, const AssociationFilter& filter, const Wanted& wanted) {
    forEachLink(request, filter,
                [&](const AssociationClass& association, const Link& link, std::size_t /*far*/) {
                    giveLink(request, association, link, wanted);
                });
}

}  // namespace ZR::DHCPClientExtensions
