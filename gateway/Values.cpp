#include "Values.h"

#include <cstdint>

namespace ZR::DHCPClientGateway {

namespace {

constexpr unsigned absent = CMPI_nullValue | CMPI_notFound | CMPI_badValue;

std::string charactersOf(const CMPIString* text) {
    const char* characters = text == nullptr ? nullptr : text->ft->getCharPtr(text, nullptr);
    return characters == nullptr ? "" : characters;
}

/// A whole number as its bits and whether it is negative; none for other types.
struct Whole {
    std::uint64_t bits;
    bool negative;

    bool operator==(const Whole&) const = default;
};

Whole signedNumber(std::int64_t number) {
    return {static_cast<std::uint64_t>(number), number < 0};
}

std::optional<Whole> wholeOf(const CMPIData& data) {
    switch (data.type) {
        case CMPI_uint8:
            return Whole{data.value.uint8, false};
        case CMPI_uint16:
            return Whole{data.value.uint16, false};
        case CMPI_uint32:
            return Whole{data.value.uint32, false};
        case CMPI_uint64:
            return Whole{data.value.uint64, false};
        case CMPI_sint8:
            return signedNumber(data.value.sint8);
        case CMPI_sint16:
            return signedNumber(data.value.sint16);
        case CMPI_sint32:
            return signedNumber(data.value.sint32);
        case CMPI_sint64:
            return signedNumber(data.value.sint64);
        default:
            return std::nullopt;
    }
}

std::string dateTimeOf(const CMPIData& data) {
    const CMPIDateTime* moment = data.value.dateTime;
    return moment == nullptr ? "" : charactersOf(moment->ft->getStringFormat(moment, nullptr));
}

bool sameArray(const CMPIArray* one, const CMPIArray* other) {
    if (one == nullptr || other == nullptr) {
        return one == other;
    }
    const CMPICount count = one->ft->getSize(one, nullptr);
    if (count != other->ft->getSize(other, nullptr)) {
        return false;
    }
    for (CMPICount index = 0; index < count; ++index) {
        if (!sameValue(one->ft->getElementAt(one, index, nullptr),
                       other->ft->getElementAt(other, index, nullptr))) {
            return false;
        }
    }
    return true;
}

}  // namespace

CMPIData propertyOf(const CMPIInstance* instance, const char* name) {
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIData data = instance->ft->getProperty(instance, name, &status);
    if (status.rc != CMPI_RC_OK) {
        data = {};
        data.state = CMPI_nullValue;
    }
    return data;
}

bool isNull(const CMPIData& data) noexcept {
    return (data.state & absent) != 0;
}

std::optional<std::string> textOf(const CMPIData& data) {
    if (isNull(data)) {
        return std::nullopt;
    }
    if (data.type == CMPI_string) {
        return charactersOf(data.value.string);
    }
    if (data.type == CMPI_chars) {
        return data.value.chars == nullptr ? "" : data.value.chars;
    }
    return std::nullopt;
}

std::optional<std::uint64_t> numberOf(const CMPIData& data) {
    const std::optional<Whole> number = isNull(data) ? std::nullopt : wholeOf(data);
    return number && !number->negative ? std::optional(number->bits) : std::nullopt;
}

bool sameValue(const CMPIData& one, const CMPIData& other) {
    if (isNull(one) || isNull(other)) {
        return isNull(one) && isNull(other);
    }
    if ((one.type & CMPI_ARRAY) != 0 || (other.type & CMPI_ARRAY) != 0) {
        return (one.type & CMPI_ARRAY) != 0 && (other.type & CMPI_ARRAY) != 0 &&
               sameArray(one.value.array, other.value.array);
    }
    if (one.type == CMPI_boolean || other.type == CMPI_boolean) {
        return one.type == other.type && (one.value.boolean != 0) == (other.value.boolean != 0);
    }
    if (one.type == CMPI_dateTime || other.type == CMPI_dateTime) {
        return one.type == other.type && dateTimeOf(one) == dateTimeOf(other);
    }
    const std::optional<Whole> number = wholeOf(one);
    if (number) {
        return number == wholeOf(other);
    }
    const std::optional<std::string> text = textOf(one);
    return text && text == textOf(other);
}

}  // namespace ZR::DHCPClientGateway
