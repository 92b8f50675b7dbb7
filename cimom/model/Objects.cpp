#include "cimom/ObjectPath.h"

#include <algorithm>

#include "cimom/Instance.h"
#include "cimom/Names.h"

namespace cimom {

const Value* Instance::property(std::string_view name) const noexcept {
    return findValue(properties, name);
}

const Value* ObjectPath::key(std::string_view name) const noexcept {
    return findValue(keys, name);
}

bool ObjectPath::operator==(const ObjectPath& other) const {
    const bool sameHost = host.empty() || other.host.empty() || sameName(host, other.host);
    if (!sameHost || !sameName(nameSpace, other.nameSpace) ||
        !sameName(className, other.className) || keys.size() != other.keys.size()) {
        return false;
    }
    return std::is_permutation(keys.begin(), keys.end(), other.keys.begin(),
                               [](const NamedValue& a, const NamedValue& b) {
                                   return sameName(a.name, b.name) && a.value == b.value;
                               });
}

}  // namespace cimom
