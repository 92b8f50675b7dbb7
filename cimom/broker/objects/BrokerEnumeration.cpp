#include "broker/objects/BrokerRecords.h"

#include "broker/objects/BrokerStatus.h"
#include "cimom/Status.h"

namespace cimom::broker {

namespace {

CMPIStatus release(CMPIEnumeration* self) {
    EnumerationRecord* const enumeration = enumerationOf(self);
    if (enumeration == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (enumeration->arena->isRoot(enumeration)) {
        const std::unique_ptr<Arena> ended(enumeration->arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPIEnumeration* clone(const CMPIEnumeration* self, CMPIStatus* rc) {
    return guarded<CMPIEnumeration*>(rc, nullptr, [self](CMPIrc& code) -> CMPIEnumeration* {
        const EnumerationRecord* const enumeration = enumerationOf(self);
        if (enumeration == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        EnumerationRecord* const copy =
            makeEnumeration(*arena, copyArray(*arena, *enumeration->elements));
        copy->next = enumeration->next;
        arena.release()->setRoot(copy);
        return copy;
    });
}

CMPIData getNext(const CMPIEnumeration* self, CMPIStatus* rc) {
    EnumerationRecord* const enumeration = enumerationOf(self);
    if (enumeration == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    if (enumeration->next >= enumeration->elements->size) {
        // CMPI 2.0 has no status code for the end.
        setStatus(rc, CMPI_RC_ERR_NOT_FOUND);
        return missingData();
    }
    setStatus(rc, CMPI_RC_OK);
    return enumeration->elements->elements[enumeration->next++];
}

CMPIBoolean hasNext(const CMPIEnumeration* self, CMPIStatus* rc) {
    const EnumerationRecord* const enumeration = enumerationOf(self);
    setStatus(rc, enumeration == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return enumeration != nullptr && enumeration->next < enumeration->elements->size ? 1 : 0;
}

/// All elements, wherever the cursor stands.
CMPIArray* toArray(const CMPIEnumeration* self, CMPIStatus* rc) {
    const EnumerationRecord* const enumeration = enumerationOf(self);
    setStatus(rc, enumeration == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return enumeration == nullptr ? nullptr : enumeration->elements;
}

}  // namespace

const CMPIEnumerationFT enumerationTable{CMPIVersion200, release, clone, getNext, hasNext, toArray};

EnumerationRecord* enumerationOf(const CMPIEnumeration* enumeration) noexcept {
    return enumeration != nullptr && enumeration->ft == &enumerationTable
               ? static_cast<EnumerationRecord*>(enumeration->hdl)
               : nullptr;
}

EnumerationRecord* makeEnumeration(Arena& arena, ArrayRecord* elements) {
    auto* const enumeration = arena.make<EnumerationRecord>();
    *enumeration = EnumerationRecord{{enumeration, &enumerationTable}, &arena, elements, 0};
    return enumeration;
}

}  // namespace cimom::broker
