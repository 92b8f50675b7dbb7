// Operations on qualifier types that only read (DSP0200, 5.4.2).
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimxml/ObjectWriter.h"
#include "operations/Request.h"

namespace cimom::wbem {

namespace {

ResponseBody enumerateQualifiers(Request& request) {
    request.parameters.finish();
    std::string content = "<IRETURNVALUE>";
    for (const QualifierType& type : request.manager.repository().qualifierTypes()) {
        writeQualifierType(content, type);
    }
    return plainResponse(request.call, content + "</IRETURNVALUE>");
}

ResponseBody getQualifier(Request& request) {
    const std::string name = request.parameters.requiredText("QualifierName");
    request.parameters.finish();
    const auto type = request.manager.repository().findQualifierType(name);
    if (!type) {
        throw CimError(CimStatus::notFound, "no qualifier \"" + name + '"');
    }
    std::string content = "<IRETURNVALUE>";
    writeQualifierType(content, *type);
    return plainResponse(request.call, content + "</IRETURNVALUE>");
}

}  // namespace

std::vector<NamedOperation> qualifierOperations() {
    return {{"EnumerateQualifiers", enumerateQualifiers}, {"GetQualifier", getQualifier}};
}

}  // namespace cimom::wbem
