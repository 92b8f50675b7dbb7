#include "broker/BrokerQualifiers.h"

#include "broker/Conversion.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerStatus.h"

namespace cimom::broker {

namespace {

CMPIData qualifierData(const PathRecord& path, const Qualifier* qualifier, CMPIrc& code) {
    if (qualifier == nullptr) {
        code = CMPI_RC_ERR_NOT_FOUND;
        return {};
    }
    return toData(RequestScope::current().arena(), path.schema, qualifier->value);
}

const ClassIndex* classOf(const PathRecord& path, CMPIrc& code) {
    const ClassIndex* const index =
        path.schema == nullptr ? nullptr : path.schema->find(path.className->view());
    if (index == nullptr) {
        code = CMPI_RC_ERR_INVALID_CLASS;
    }
    return index;
}

}  // namespace

CMPIData classQualifier(const PathRecord* path, const char* name, CMPIStatus* rc) {
    return guarded(rc, missingData(), [=](CMPIrc& code) -> CMPIData {
        if (path == nullptr || name == nullptr) {
            code = path == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_INVALID_PARAMETER;
            return {};
        }
        const ClassIndex* const index = classOf(*path, code);
        return index == nullptr ? CMPIData{}
                                : qualifierData(*path, index->declaration().qualifier(name), code);
    });
}

CMPIData propertyQualifier(const PathRecord* path, const char* property, const char* name,
                           CMPIStatus* rc) {
    return guarded(rc, missingData(), [=](CMPIrc& code) -> CMPIData {
        if (path == nullptr || property == nullptr || name == nullptr) {
            code = path == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_INVALID_PARAMETER;
            return {};
        }
        const ClassIndex* const index = classOf(*path, code);
        if (index == nullptr) {
            return {};
        }
        const PropertyDeclaration* const declared = index->property(property);
        if (declared == nullptr) {
            code = CMPI_RC_ERR_NO_SUCH_PROPERTY;
            return {};
        }
        return qualifierData(*path, declared->qualifier(name), code);
    });
}

}  // namespace cimom::broker
