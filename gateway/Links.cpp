#include "Links.h"

#include <algorithm>
#include <string>
#include <unordered_map>

#include "providerutilities/ProviderUtilities.h"
#include "providerutilities/Refusal.h"

namespace ZR::DHCPClientGateway {

namespace {

void append(std::vector<Object>& all, std::vector<Object> some) {
    all.insert(all.end(), std::make_move_iterator(some.begin()),
               std::make_move_iterator(some.end()));
}

/// What there is of an end's classes; with keys at least what they name.
std::vector<Object> objectsAt(const Request& request, const End& end, Form form,
                              const std::optional<KeyTexts>& keys) {
    std::vector<Object> objects;
    for (const char* name : end.classes) {
        const ServedClass& served = *findClass(name);
        if (served.server == Server::exact) {
            append(objects, ask(request, served, form, keys.value_or(KeyTexts{})));
        } else if (!keys) {
            append(objects, askOthers(request, served, form));
        } else if (auto found = askOthersFor(request, served, *keys)) {
            objects.push_back(*std::move(found));
        }
    }
    return objects;
}

/// The table of CMPI takes references that it does not change as if it might.
CMPIObjectPath* asArgument(const CMPIObjectPath* path) {
    return const_cast<CMPIObjectPath*>(path);  // NOLINT(cppcoreguidelines-pro-type-const-cast)
}

void setReference(const CMPIObjectPath* reference, const char* role, CMPIObjectPath* path) {
    if (!ProviderUtilities::setKeyProperty(path, role, asArgument(reference))) {
        throw Refusal(CMPI_RC_ERR_FAILED,
                      std::string("the object manager takes no reference as ") + role);
    }
}

}  // namespace

std::vector<Object> linked(const Request& request, const Association& association, std::size_t far,
                           const Keys& near, Form form) {
    const End& end = association.ends.at(far);
    std::optional<KeyTexts> keys;
    if (end.keysBy != nullptr) {
        keys = end.keysBy(near);
    }
    std::vector<Object> objects = objectsAt(request, end, form, keys);
    const std::string link = association.ends.at(1 - far).link(near);
    std::erase_if(objects, [&](const Object& object) { return end.link(object.keys) != link; });
    return objects;
}

std::vector<Link> allLinks(const Request& request, const Association& association) {
    const std::size_t other = 1 - association.listed;
    const End& listedEnd = association.ends.at(association.listed);
    const std::vector<Object> listed = objectsAt(request, listedEnd, Form::names, std::nullopt);
    const std::vector<Object> others =
        objectsAt(request, association.ends.at(other), Form::names, std::nullopt);
    std::unordered_map<std::string, std::vector<const Object*>> byLink;
    for (const Object& object : others) {
        byLink[association.ends.at(other).link(object.keys)].push_back(&object);
    }
    std::unordered_map<std::string, std::size_t> counts;
    if (association.own.zeroOfSeveral) {
        for (const Object& object : listed) {
            ++counts[listedEnd.link(object.keys)];
        }
    }
    std::vector<Link> links;
    links.reserve(listed.size());
    for (const Object& object : listed) {
        const std::string text = listedEnd.link(object.keys);
        const auto found = byLink.find(text);
        if (found == byLink.end()) {
            continue;
        }
        for (const Object* match : found->second) {
            Link& link = links.emplace_back();
            link.association = &association;
            link.paths.at(association.listed) = object.path;
            link.paths.at(other) = match->path;
            link.oneOfSeveral = association.own.zeroOfSeveral && counts[text] > 1;
        }
    }
    return links;
}

std::vector<Link> linksOf(const Request& request, const Association& association, std::size_t near,
                          const Object& object) {
    const std::size_t far = 1 - near;
    const std::vector<Object> objects = linked(request, association, far, object.keys, Form::names);
    std::vector<Link> links;
    for (const Object& each : objects) {
        Link& link = links.emplace_back();
        link.association = &association;
        link.paths.at(near) = object.path;
        link.paths.at(far) = each.path;
        if (association.own.zeroOfSeveral) {
            link.oneOfSeveral =
                far == association.listed
                    ? objects.size() > 1
                    : linked(request, association, near, each.keys, Form::names).size() > 1;
        }
    }
    return links;
}

Object objectOf(const Request& request, const Link& link, Form form) {
    const Association& association = *link.association;
    CMPIObjectPath* path = makePath(request, association.name);
    for (const std::size_t end : {association.listed, 1 - association.listed}) {
        setReference(link.paths.at(end), association.ends.at(end).role, path);
    }
    Object object{path, nullptr, {}};
    if (form == Form::names) {
        return object;
    }
    const CMPIInstance* instance = makeInstance(request, path);
    bool complete = true;
    for (std::size_t end = 0; end < association.ends.size(); ++end) {
        CMPIValue value{};
        value.ref = asArgument(link.paths.at(end));
        complete =
            complete &&
            instance->ft->setProperty(instance, association.ends.at(end).role, &value, CMPI_ref)
                    .rc == CMPI_RC_OK;
    }
    if (association.own.name != nullptr) {
        CMPIValue value{};
        const std::uint64_t number = link.oneOfSeveral ? 0 : association.own.value;
        if (association.own.type == CMPI_uint16) {
            value.uint16 = static_cast<CMPIUint16>(number);
        } else {
            value.uint64 = number;
        }
        complete =
            complete &&
            instance->ft->setProperty(instance, association.own.name, &value, association.own.type)
                    .rc == CMPI_RC_OK;
    }
    if (!complete) {
        throw Refusal(CMPI_RC_ERR_FAILED,
                      std::string("the object manager makes no instance of ") + association.name);
    }
    object.instance = instance;
    return object;
}

}  // namespace ZR::DHCPClientGateway
