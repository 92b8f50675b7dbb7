#include "operations/Request.h"

#include <algorithm>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/ObjectWriter.h"

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

}  // namespace

void requireNameSpace(const Request& request) {
    if (request.manager.findNameSpace(request.call.nameSpace) == nullptr) {
        throw CimError(CimStatus::invalidNamespace,
                       "no namespace \"" + request.call.nameSpace + "\"");
    }
}

const ClassDeclaration& requireClass(const Request& request, const std::string& className,
                                     CimStatus unknown) {
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

void cutToClass(Instance& instance, const ClassDeclaration* declaration) {
    if (declaration != nullptr) {
        std::erase_if(instance.properties, [declaration](const NamedValue& property) {
            return declaration->property(property.name) == nullptr;
        });
    }
}

template <typename Object>
void SpoolingReceiver<Object>::beginCall() {
    sizeBefore_ = result_.spool->size();
    countBefore_ = result_.count;
}

template <typename Object>
void SpoolingReceiver<Object>::take(std::optional<Object> object) {
    if (caller_.gone && caller_.gone()) {
        throw CimError(CimStatus::failed, "the client does not wait for the result any more");
    }
    if (object) {
        text_.clear();
        write_(text_, *object);
        result_.spool->append(text_);
        ++result_.count;
    }
}

template <typename Object>
void SpoolingReceiver<Object>::dropCall() {
    result_.spool->cut(sizeBefore_);
    result_.count = countBefore_;
}

template class SpoolingReceiver<ObjectPath>;
template class SpoolingReceiver<Instance>;

void writeInstanceOf(std::string& out, const Instance& instance,
                     const ClassRepository* originRepository) {
    writeInstance(
        out, instance,
        originRepository == nullptr ? nullptr : originRepository->find(instance.path.className));
}

ResponseBody spooledResponse(const Call& call, const SpooledResult& result) {
    return {responseHead(call) + "<IRETURNVALUE>",
            [spool = std::shared_ptr<const Spool>(result.spool),
             position = std::size_t{0}](std::string& out) mutable {
                constexpr std::size_t piece = 32768;
                const std::size_t size = std::min(piece, spool->size() - position);
                spool->read(position, size, out);
                position += size;
                return size > 0;
            },
            "</IRETURNVALUE>" + responseTail(call)};
}

ResponseBody plainResponse(const Call& call, const std::string& content) {
    return ResponseBody(responseHead(call) + content + responseTail(call));
}

}  // namespace cimom::wbem
