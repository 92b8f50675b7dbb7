#include "CMPI/ReferencedAdapter.h"

#include "include/Exceptions.h"

namespace ZR::DHCPClientProvider {

CMPIEnumeration* enumerateReferenced(const CMPIBroker* mb, const CMPIContext* context,
                                     const CMPIObjectPath* path, const char* message) {
    if (mb == nullptr || path == nullptr) {
        throw ProviderException(message);
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIEnumeration* enumeration = mb->bft->enumerateInstances(mb, context, path, nullptr, &status);
    if (status.rc != CMPI_RC_OK) {
        throw ProviderException(message);
    }
    return enumeration;
}

CMPIInstance* getReferenced(const CMPIBroker* mb, const CMPIContext* context,
                            const CMPIObjectPath* path) {
    if (mb == nullptr || path == nullptr) {
        throw ProviderException(noComputerSystem);
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIInstance* instance = mb->bft->getInstance(mb, context, path, nullptr, &status);
    if (status.rc != CMPI_RC_OK) {
        throw ProviderException(noComputerSystem);
    }
    return instance;
}

bool hasNext(const CMPIEnumeration* enumeration) {
    return enumeration != nullptr && enumeration->ft->hasNext(enumeration, nullptr) != 0;
}

bool takeNext(const CMPIEnumeration* enumeration, CMPIInstance*& instance) {
    if (enumeration == nullptr) {
        return false;
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPIData data = enumeration->ft->getNext(enumeration, &status);
    if (status.rc != CMPI_RC_OK) {
        return false;
    }
    instance = data.value.inst;
    return true;
}

CMPIObjectPath* pathOf(const CMPIInstance* instance) {
    if (instance == nullptr) {
        return nullptr;
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIObjectPath* path = instance->ft->getObjectPath(instance, &status);
    return status.rc == CMPI_RC_OK ? path : nullptr;
}

}  // namespace ZR::DHCPClientProvider
