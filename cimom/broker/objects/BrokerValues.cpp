#include "broker/objects/BrokerValues.h"

#include <algorithm>

#include "broker/BrokerTypes.h"
#include "broker/objects/BrokerRecords.h"
#include "broker/objects/BrokerStatus.h"

namespace cimom::broker {

namespace {

/// Stores a copy of an object; a null pointer stays one. INVALID_HANDLE for an
/// object that is not ours.
template <typename Object, typename Record, typename Copy>
CMPIrc copyObject(Object* object, Object*& target, const Record* ours, Copy&& copy) {
    if (object == nullptr) {
        return CMPI_RC_OK;
    }
    if (ours == nullptr) {
        return CMPI_RC_ERR_INVALID_HANDLE;
    }
    target = copy(*ours);
    return CMPI_RC_OK;
}

CMPIrc copyArrayValue(Arena& arena, const CMPIValue* value, Type type, CMPIData& copy) {
    auto* const given = memberOf<CMPIArray*>(value);
    const ArrayRecord* const array = arrayOf(given);
    if (array != nullptr && array->elementType != cmpiType(type)) {
        return CMPI_RC_ERR_TYPE_MISMATCH;
    }
    return copyObject(given, copy.value.array, array,
                      [&arena](const ArrayRecord& one) { return copyArray(arena, one); });
}

CMPIrc copyScalarValue(Arena& arena, const CMPIValue* value, Type type, CMPIData& copy) {
    switch (type) {
        case Type::string: {
            const auto* const text = memberOf<CMPIString*>(value);
            if (text != nullptr && text->hdl != nullptr) {
                copy.value.string = stringIn(arena, *text);
            }
            return CMPI_RC_OK;
        }
        case Type::reference: {
            auto* const path = memberOf<CMPIObjectPath*>(value);
            return copyObject(path, copy.value.ref, pathOf(path),
                              [&arena](const PathRecord& one) { return copyPath(arena, one); });
        }
        case Type::instance: {
            auto* const instance = memberOf<CMPIInstance*>(value);
            return copyObject(
                instance, copy.value.inst, instanceOf(instance),
                [&arena](const InstanceRecord& one) { return copyInstance(arena, one); });
        }
        case Type::datetime: {
            auto* const dateTime = memberOf<CMPIDateTime*>(value);
            return copyObject(
                dateTime, copy.value.dateTime, dateTimeOf(dateTime),
                [&arena](const DateTimeRecord& one) { return copyDateTime(arena, one); });
        }
        default:
            copy.value = plainValue(value, type);
            return CMPI_RC_OK;
    }
}

/// Whether the type is stored as a pointer, of which null is the null value.
bool isPointer(CMPIType type) noexcept {
    return (type & (CMPI_ENC | CMPI_ARRAY)) != 0;
}

}  // namespace

CMPIrc copyValue(Arena& arena, const CMPIValue* value, CMPIType type, CMPIData& copy) {
    copy = CMPIData{};
    if (type == CMPI_null) {
        copy.state = CMPI_nullValue;
        return CMPI_RC_OK;
    }
    const auto cim = cimType(withoutArray(type));
    if (!cim) {
        return CMPI_RC_ERR_INVALID_DATA_TYPE;
    }
    copy.type = cmpiType(*cim, isArrayType(type));
    if (value == nullptr) {
        copy.state = CMPI_nullValue;
        return CMPI_RC_OK;
    }
    CMPIrc code = CMPI_RC_OK;
    if (type == CMPI_chars) {
        copy.value.string = makeString(arena, reinterpret_cast<const char*>(value));
    } else {
        code = isArrayType(type) ? copyArrayValue(arena, value, *cim, copy)
                                 : copyScalarValue(arena, value, *cim, copy);
    }
    if (isPointer(type) && copy.value.string == nullptr) {
        copy.state = CMPI_nullValue;
    }
    return code;
}

CMPIData copyData(Arena& arena, const CMPIData& data) {
    if ((data.state & CMPI_nullValue) != 0) {
        return data;
    }
    CMPIData copy{};
    // Stored values are ours and of a known type, so that this cannot fail.
    static_cast<void>(copyValue(arena, &data.value, data.type, copy));
    copy.state = data.state;
    return copy;
}

CMPIData nullData(CMPIType type) noexcept {
    CMPIData data{};
    data.type = type;
    data.state = CMPI_nullValue;
    return data;
}

Entry* EntryList::locate(const NameKey& name) const noexcept {
    for (Entry* entry = entries_; entry != entries_ + size_; ++entry) {
        if (name.is(entry->name->view(), entry->hash)) {
            return entry;
        }
    }
    return nullptr;
}

const Entry* EntryList::find(std::string_view name) const noexcept {
    return locate(NameKey(name));
}

CMPICount EntryList::position(const NameKey& name) const noexcept {
    const Entry* const entry = locate(name);
    return entry == nullptr ? size_ : static_cast<CMPICount>(entry - entries_);
}

void EntryList::reserve(Arena& arena, CMPICount capacity) {
    if (capacity <= capacity_) {
        return;
    }
    auto* const larger = arena.makeMany<Entry>(capacity);
    std::copy_n(entries_, size_, larger);
    entries_ = larger;
    capacity_ = capacity;
}

void EntryList::append(Arena& arena, const Entry& entry) {
    if (size_ == capacity_) {
        reserve(arena, std::max<CMPICount>(4, capacity_ * 2));
    }
    entries_[size_] = entry;
    ++size_;
}

void EntryList::set(Arena& arena, const NameKey& name, const CMPIData& data) {
    if (Entry* const entry = locate(name)) {
        entry->data = data;
        return;
    }
    append(arena, {nameIn(arena, name), name.hash(), data});
}

void EntryList::remove(CMPICount index) noexcept {
    std::copy(entries_ + index + 1, entries_ + size_, entries_ + index);
    --size_;
}

EntryList EntryList::copyInto(Arena& arena) const {
    EntryList copy;
    copy.reserve(arena, size_);
    for (const Entry& entry : *this) {
        copy.append(arena, {stringIn(arena, *entry.name), entry.hash, copyData(arena, entry.data)});
    }
    return copy;
}

CMPIData dataByName(const EntryList& entries, const char* name, CMPIValueState extraState,
                    CMPIStatus* rc) noexcept {
    const Entry* const entry = name == nullptr ? nullptr : entries.find(name);
    if (entry == nullptr) {
        setStatus(rc,
                  name == nullptr ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return missingData();
    }
    setStatus(rc, CMPI_RC_OK);
    CMPIData data = entry->data;
    data.state = static_cast<CMPIValueState>(data.state | extraState);
    return data;
}

CMPIData dataAt(const EntryList& entries, CMPICount index, CMPIValueState extraState,
                CMPIString** name, CMPIStatus* rc) noexcept {
    if (index >= entries.size()) {
        if (name != nullptr) {
            *name = nullptr;
        }
        setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return missingData();
    }
    const Entry& entry = entries[index];
    if (name != nullptr) {
        *name = entry.name;
    }
    setStatus(rc, CMPI_RC_OK);
    CMPIData data = entry.data;
    data.state = static_cast<CMPIValueState>(data.state | extraState);
    return data;
}

}  // namespace cimom::broker
