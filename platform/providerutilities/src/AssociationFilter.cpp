#include "providerutilities/AssociationFilter.h"

#include <algorithm>

#include "providerutilities/ProviderUtilities.h"
#include "zrcommon/Strings.h"

namespace ZR {

namespace {

bool isAnything(const char* wanted) noexcept {
    return wanted == nullptr || *wanted == '\0';
}

}  // namespace

bool acceptsRole(const char* wanted, const char* role) noexcept {
    return isAnything(wanted) || equalNames(wanted, role);
}

bool acceptsClass(const CMPIBroker* broker, const std::string& nameSpace, const char* wanted,
                  const char* className, std::span<const char* const> ancestors) {
    if (isAnything(wanted) || equalNames(className, wanted) ||
        std::any_of(ancestors.begin(), ancestors.end(),
                    [wanted](const char* each) { return equalNames(each, wanted); })) {
        return true;
    }
    const CMPIObjectPath* path = ProviderUtilities::createObjectPath(broker, className, nameSpace);
    if (path == nullptr) {
        return false;
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPIBoolean derived = broker->eft->classPathIsA(broker, path, wanted, &status);
    return status.rc == CMPI_RC_OK && derived != 0;
}

}  // namespace ZR
