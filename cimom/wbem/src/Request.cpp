#include "Request.h"

#include <algorithm>

#include "wbem/ObjectWriter.h"
#include "wbem/PathLocation.h"

namespace cimom::wbem {

namespace {

void nameBareKey(NamedValue& key, const ClassDeclaration* declaration) {
    const PropertyDeclaration* only = nullptr;
    int count = 0;
    if (declaration != nullptr) {
        for (const PropertyDeclaration& property : declaration->properties) {
            if (property.isKey()) {
                only = &property;
                ++count;
            }
        }
    }
    if (count != 1) {
        throw CimError(CimStatus::invalidParameter,
                       "a key without a name is for classes with one key only");
    }
    key.name = only->name;
}

template <typename Object>
std::vector<Object> presentOf(std::vector<std::optional<Object>> objects) {
    std::vector<Object> result;
    result.reserve(objects.size());
    for (auto& object : objects) {
        if (object) {
            result.push_back(*std::move(object));
        }
    }
    return result;
}

}  // namespace

void requireNameSpace(const Request& request) {
    const auto& known = request.manager.nameSpaces();
    if (std::none_of(known.begin(), known.end(), [&request](const std::string& one) {
            return sameName(one, request.call.nameSpace);
        })) {
        throw CimError(CimStatus::invalidNamespace,
                       "no namespace \"" + request.call.nameSpace + "\"");
    }
}

const ClassDeclaration& requireClass(const Request& request, const std::string& className,
                                     CimStatus unknown) {
    requireNameSpace(request);
    const ClassDeclaration* const declaration = request.manager.repository().find(className);
    if (declaration == nullptr) {
        throw CimError(unknown, "no class \"" + className + "\"");
    }
    return *declaration;
}

ObjectPath located(const Request& request, ObjectPath path) {
    locate(path, request.call.nameSpace);
    for (NamedValue& key : path.keys) {
        if (key.name.empty()) {
            nameBareKey(key, request.manager.repository().find(path.className));
        }
    }
    return path;
}

ObjectPath classPath(const Request& request, const std::string& className) {
    return {"", request.call.nameSpace, className, {}};
}

unsigned cimCode(const Status& status) noexcept {
    const auto code = static_cast<unsigned>(status.code);
    const bool shared = code <= static_cast<unsigned>(CMPI_RC_ERR_METHOD_NOT_FOUND);
    return shared ? code : static_cast<unsigned>(CimStatus::failed);
}

void requireOk(const Status& status) {
    if (!status.ok()) {
        throw CimError(cimCode(status), status.message);
    }
}

std::vector<ObjectPath> present(std::vector<std::optional<ObjectPath>> paths) {
    return presentOf(std::move(paths));
}

std::vector<Instance> present(std::vector<std::optional<Instance>> instances) {
    return presentOf(std::move(instances));
}

void cutToClass(std::vector<Instance>& instances, const ClassDeclaration& declaration) {
    for (Instance& instance : instances) {
        std::erase_if(instance.properties, [&declaration](const NamedValue& property) {
            return declaration.property(property.name) == nullptr;
        });
    }
}

void writeInstanceOf(std::string& out, const Instance& instance,
                     const ClassRepository* originRepository) {
    writeInstance(
        out, instance,
        originRepository == nullptr ? nullptr : originRepository->find(instance.path.className));
}

Answer plainAnswer(const Call& call, const std::string& content) {
    return Answer(answerHead(call) + content + answerTail(call));
}

}  // namespace cimom::wbem
