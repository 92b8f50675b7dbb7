#include "broker/objects/BrokerRecords.h"

#include "broker/BrokerTypes.h"
#include "broker/objects/BrokerStatus.h"
#include "broker/objects/BrokerValues.h"

namespace cimom::broker {

namespace {

CMPIStatus release(CMPIArray* self) {
    ArrayRecord* const array = arrayOf(self);
    if (array == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (array->arena->isRoot(array)) {
        const std::unique_ptr<Arena> ended(array->arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPIArray* clone(const CMPIArray* self, CMPIStatus* rc) {
    return guarded<CMPIArray*>(rc, nullptr, [self](CMPIrc& code) -> CMPIArray* {
        const ArrayRecord* const array = arrayOf(self);
        if (array == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        ArrayRecord* const copy = copyArray(*arena, *array);
        arena.release()->setRoot(copy);
        return copy;
    });
}

CMPICount getSize(const CMPIArray* self, CMPIStatus* rc) {
    const ArrayRecord* const array = arrayOf(self);
    setStatus(rc, array == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return array == nullptr ? 0 : array->size;
}

CMPIType getSimpleType(const CMPIArray* self, CMPIStatus* rc) {
    const ArrayRecord* const array = arrayOf(self);
    setStatus(rc, array == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return array == nullptr ? CMPI_null : array->elementType;
}

CMPIData getElementAt(const CMPIArray* self, CMPICount index, CMPIStatus* rc) {
    const ArrayRecord* const array = arrayOf(self);
    if (array == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    if (index >= array->size) {
        setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return missingData();
    }
    setStatus(rc, CMPI_RC_OK);
    return array->elements[index];
}

CMPIStatus setElementAt(const CMPIArray* self, CMPICount index, const CMPIValue* value,
                        CMPIType type) {
    return guarded([=] {
        ArrayRecord* const array = arrayOf(self);
        if (array == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        if (index >= array->size) {
            return CMPI_RC_ERR_NO_SUCH_PROPERTY;
        }
        CMPIData data{};
        if (const CMPIrc code = copyValue(*array->arena, value, type, data); code != CMPI_RC_OK) {
            return code;
        }
        if (type != CMPI_null && data.type != array->elementType) {
            return CMPI_RC_ERR_TYPE_MISMATCH;
        }
        data.type = array->elementType;
        array->elements[index] = data;
        return CMPI_RC_OK;
    });
}

}  // namespace

const CMPIArrayFT arrayTable{CMPIVersion200, release,      clone,       getSize,
                             getSimpleType,  getElementAt, setElementAt};

ArrayRecord* arrayOf(const CMPIArray* array) noexcept {
    return array != nullptr && array->ft == &arrayTable ? static_cast<ArrayRecord*>(array->hdl)
                                                        : nullptr;
}

ArrayRecord* makeArray(Arena& arena, CMPICount size, CMPIType elementType) {
    auto* const elements = arena.makeMany<CMPIData>(size);
    for (CMPIData* element = elements; element != elements + size; ++element) {
        *element = nullData(elementType);
    }
    auto* const array = arena.make<ArrayRecord>();
    *array = ArrayRecord{{array, &arrayTable}, &arena, elementType, size, elements};
    return array;
}

ArrayRecord* copyArray(Arena& arena, const ArrayRecord& array) {
    ArrayRecord* const copy = makeArray(arena, array.size, array.elementType);
    for (CMPICount index = 0; index < array.size; ++index) {
        copy->elements[index] = copyData(arena, array.elements[index]);
    }
    return copy;
}

}  // namespace cimom::broker
