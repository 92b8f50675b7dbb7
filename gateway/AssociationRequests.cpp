#include "Requests.h"

#include <algorithm>
#include <optional>
#include <string>
#include <vector>

#include "Links.h"
#include "Lookup.h"
#include "providerutilities/Refusal.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientGateway {

namespace {

bool acceptsServed(const Request& request, const char* wanted, const ServedClass& served) {
    return acceptsClass(request.broker, request.nameSpace, wanted, served.name, served.ancestors);
}

/// An association in which the object can take part, and where.
struct Part {
    const Association* association;
    std::size_t near;
};

std::vector<Part> partsOf(const Request& request, const ServedClass& source,
                          const AssociationFilter& filter) {
    std::vector<Part> parts;
    for (const Association& association : allAssociations()) {
        if (!acceptsServed(request, filter.association, *findClass(association.name))) {
            continue;
        }
        for (std::size_t near = 0; near < association.ends.size(); ++near) {
            if (takes(association.ends.at(near), source) &&
                acceptsRole(filter.role, association.ends.at(near).role) &&
                acceptsRole(filter.resultRole, association.ends.at(1 - near).role)) {
                parts.push_back({&association, near});
            }
        }
    }
    return parts;
}

/// The classes at an end of which a client may want to see objects.
bool mayGive(const Request& request, const End& end, const char* resultClass) {
    return std::any_of(end.classes.begin(), end.classes.end(), [&](const char* name) {
        return acceptsServed(request, resultClass, *findClass(name));
    });
}

/// What the request is about; nothing for an object of a class that is at no end. It is
/// looked for whatever the filter: some object managers ask once for each association
/// class, and a source that is not there is to have one response.
struct Source {
    const ServedClass* served;
    Object object;
};

std::optional<Source> sourceOf(const Request& request) {
    const ServedClass* served = findClass(classNameOf(request.path));
    if (served == nullptr || served->server == Server::gateway) {
        return std::nullopt;
    }
    return Source{served, find(request, *served, Form::names)};
}

}  // namespace

void associators(const Request& request, const AssociationFilter& filter,
                 const Delivery& delivery) {
    const std::optional<Source> source = sourceOf(request);
    if (!source) {
        return;
    }
    for (const Part& part : partsOf(request, *source->served, filter)) {
        const End& end = part.association->ends.at(1 - part.near);
        if (!mayGive(request, end, filter.resultClass)) {
            continue;
        }
        for (const Object& object : linked(request, *part.association, 1 - part.near,
                                           source->object.keys, delivery.form())) {
            const ServedClass* far = findClass(classNameOf(object.path));
            // Another provider may give objects of a class of its own.
            if (far == nullptr) {
                far = findClass(end.classes.front());
            }
            if (acceptsServed(request, filter.resultClass, *far)) {
                delivery.give(*far, object);
            }
        }
    }
}

void references(const Request& request, const AssociationFilter& filter, const Delivery& delivery) {
    const std::optional<Source> source = sourceOf(request);
    if (!source) {
        return;
    }
    for (const Part& part : partsOf(request, *source->served, filter)) {
        for (const Link& link : linksOf(request, *part.association, part.near, source->object)) {
            delivery.give(*findClass(part.association->name),
                          objectOf(request, link, delivery.form()));
        }
    }
}

}  // namespace ZR::DHCPClientGateway
