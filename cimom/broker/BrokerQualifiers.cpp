#include "broker/objects/BrokerRecords.h"

#include "broker/Conversion.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerStatus.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"

namespace cimom::broker {

namespace {

CMPIData qualifierData(const PathRecord& path, const Qualifier* qualifier, CMPIrc& code) {
    if (qualifier == nullptr) {
        code = CMPI_RC_ERR_NOT_FOUND;
        return {};
    }
    return toData(RequestScope::current().arena(), path.classes, qualifier->value);
}

const ClassDeclaration* classOf(const PathRecord& path, CMPIrc& code) {
    const ClassDeclaration* const declaration =
        path.classes == nullptr ? nullptr : path.classes->find(path.className->view());
    if (declaration == nullptr) {
        code = CMPI_RC_ERR_INVALID_CLASS;
    }
    return declaration;
}

}  // namespace

CMPIData classQualifier(const PathRecord* path, const char* name, CMPIStatus* rc) {
    return guarded(rc, missingData(), [=](CMPIrc& code) -> CMPIData {
        if (path == nullptr || name == nullptr) {
            code = path == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_INVALID_PARAMETER;
            return {};
        }
        const ClassDeclaration* const declaration = classOf(*path, code);
        return declaration == nullptr ? CMPIData{}
                                      : qualifierData(*path, declaration->qualifier(name), code);
    });
}

CMPIData propertyQualifier(const PathRecord* path, const char* property, const char* name,
                           CMPIStatus* rc) {
    return guarded(rc, missingData(), [=](CMPIrc& code) -> CMPIData {
        if (path == nullptr || property == nullptr || name == nullptr) {
            code = path == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_INVALID_PARAMETER;
            return {};
        }
        const ClassDeclaration* const declaration = classOf(*path, code);
        if (declaration == nullptr) {
            return {};
        }
        const PropertyDeclaration* const declared = declaration->property(property);
        if (declared == nullptr) {
            code = CMPI_RC_ERR_NO_SUCH_PROPERTY;
            return {};
        }
        return qualifierData(*path, declared->qualifier(name), code);
    });
}

}  // namespace cimom::broker
