#include "client/Client.h"

#include "client/Response.h"

namespace cimdhcp {

namespace {

/// What the provider delivered as null is left out.
template <typename Object>
std::vector<Object> present(std::vector<std::optional<Object>> objects) {
    std::vector<Object> result;
    result.reserve(objects.size());
    for (std::optional<Object>& object : objects) {
        if (object) {
            result.push_back(*std::move(object));
        }
    }
    return result;
}

}  // namespace

void leaveOutNulls(cimom::Instance& instance) {
    std::erase_if(instance.properties,
                  [](const cimom::NamedValue& each) { return each.value.isNull(); });
}

cimom::ObjectPath Client::classPath(const std::string& className) const {
    return {"", nameSpace_, className, {}};
}

Response Client::enumerateWith(const cimom::ObjectPath& path,
                               const std::vector<std::string>& /*properties*/) {
    return enumerate(path);
}

Response Client::getWith(const cimom::ObjectPath& path,
                         const std::vector<std::string>& /*properties*/) {
    return get(path);
}

std::vector<cimom::ObjectPath> Client::pathsIn(const std::string& className) {
    const cimom::ObjectPath path = classPath(className);
    Response response = enumerateNames(path);
    if (!response.status.ok()) {
        throw failure(response, path);
    }
    return present(std::move(response.paths));
}

std::optional<std::vector<cimom::Instance>> Client::instancesIn(const std::string& className) {
    // An enumeration of a class that is known and not registered is empty.
    if (!mayServe(className)) {
        return std::nullopt;
    }
    const cimom::ObjectPath path = classPath(className);
    Response response = enumerate(path);
    if (response.status.code == CMPI_RC_ERR_INVALID_CLASS ||
        response.status.code == CMPI_RC_ERR_NOT_SUPPORTED) {
        return std::nullopt;
    }
    if (!response.status.ok()) {
        throw failure(response, path);
    }
    return present(std::move(response.instances));
}

}  // namespace cimdhcp
