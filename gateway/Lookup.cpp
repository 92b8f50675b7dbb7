#include "Lookup.h"

#include <algorithm>
#include <string>

#include "providerutilities/ProviderUtilities.h"
#include "providerutilities/Refusal.h"

namespace ZR::DHCPClientGateway {

namespace {

void requireOwnKeys(const ServedClass& served, const Keys& keys) {
    requireKeys(served.name, served.keys,
                served.server == Server::gateway ? KeyKind::reference : KeyKind::text, keys);
}

KeyTexts textsOf(const ServedClass& served, const Keys& keys) {
    KeyTexts texts;
    for (const char* name : served.keys) {
        texts.emplace_back(name, keys.text(name));
    }
    return texts;
}

std::optional<Object> lookUp(const Request& request, const ServedClass& served, const Keys& keys,
                             Form form) {
    const KeyTexts texts = textsOf(served, keys);
    if (served.server == Server::otherwise) {
        return askOthersFor(request, served, texts);
    }
    std::vector<Object> objects = ask(request, served, form, texts);
    const auto found = std::find_if(objects.begin(), objects.end(),
                                    [&keys](const Object& object) { return object.keys == keys; });
    if (found == objects.end()) {
        return std::nullopt;
    }
    return std::move(*found);
}

}  // namespace

const ServedClass& servedClassOf(const Request& request) {
    const std::string name = classNameOf(request.path);
    const ServedClass* served = findClass(name);
    if (served == nullptr || served->server == Server::otherwise) {
        throw Refusal(CMPI_RC_ERR_INVALID_CLASS, "this provider does not serve the class " + name);
    }
    return *served;
}

Object find(const Request& request, const ServedClass& served, Form form) {
    const Keys keys(request.path);
    requireOwnKeys(served, keys);
    std::optional<Object> found = lookUp(request, served, keys, form);
    if (!found) {
        refuseMissing(served.name, keys);
    }
    return *std::move(found);
}

Link findLink(const Request& request, const ServedClass& served) {
    const Association& association = *findAssociation(served);
    const Keys keys(request.path);
    requireOwnKeys(served, keys);
    const std::size_t near = association.listed;
    Request forEnd = request;
    forEnd.path = keys.find(association.ends.at(near).role)->reference;
    const CMPIObjectPath* farPath = keys.find(association.ends.at(1 - near).role)->reference;
    const ServedClass* nearClass = findClass(classNameOf(forEnd.path));
    if (nearClass == nullptr || !takes(association.ends.at(near), *nearClass)) {
        refuseMissing(served.name, keys);
    }
    const Object object = find(forEnd, *nearClass, Form::names);
    for (const Link& link : linksOf(request, association, near, object)) {
        if (sameObject(link.paths.at(near), forEnd.path) &&
            sameObject(link.paths.at(1 - near), farPath)) {
            return link;
        }
    }
    refuseMissing(served.name, keys);
}

}  // namespace ZR::DHCPClientGateway
