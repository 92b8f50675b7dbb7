#pragma once

#include <cmpift.h>

#include "broker/objects/BrokerRecords.h"

namespace cimom::broker {

/// A qualifier of the path's class or of one of its properties, from the class
/// repository. CMPI_RC_ERR_INVALID_CLASS for an unknown class,
/// CMPI_RC_ERR_NO_SUCH_PROPERTY for an unknown property,
/// CMPI_RC_ERR_NOT_FOUND when it does not have the qualifier.
CMPIData classQualifier(const PathRecord* path, const char* name, CMPIStatus* rc);
CMPIData propertyQualifier(const PathRecord* path, const char* property, const char* name,
                           CMPIStatus* rc);

}  // namespace cimom::broker
