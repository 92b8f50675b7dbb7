#include "cimxml/ObjectReader.h"

#include <memory>
#include <utility>
#include <variant>
#include <vector>

#include "cimom/Instance.h"

namespace cimom::wbem {

namespace {

using Reference = std::shared_ptr<const ObjectPath>;

void locateReferences(std::vector<NamedValue>& values, const std::string& nameSpace) {
    for (NamedValue& value : values) {
        const Scalar* const scalar = value.value.scalar();
        const auto* const reference = scalar == nullptr ? nullptr : std::get_if<Reference>(scalar);
        if (reference != nullptr) {
            ObjectPath path = **reference;
            locate(path, nameSpace);
            value.value.content = Scalar(std::make_shared<const ObjectPath>(std::move(path)));
        }
    }
}

}  // namespace

void locate(ObjectPath& path, const std::string& nameSpace) {
    if (path.nameSpace.empty()) {
        path.nameSpace = nameSpace;
    }
    locateReferences(path.keys, path.nameSpace);
}

void locate(Instance& instance, const std::string& nameSpace) {
    locate(instance.path, nameSpace);
    locateReferences(instance.properties, instance.path.nameSpace);
}

}  // namespace cimom::wbem
