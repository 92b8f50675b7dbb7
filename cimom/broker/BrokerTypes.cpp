#include "broker/BrokerTypes.h"

namespace cimom::broker {

std::optional<Type> cimType(CMPIType scalarType) noexcept {
    switch (scalarType) {
        case CMPI_boolean:
            return Type::boolean;
        case CMPI_char16:
            return Type::char16;
        case CMPI_uint8:
            return Type::uint8;
        case CMPI_uint16:
            return Type::uint16;
        case CMPI_uint32:
            return Type::uint32;
        case CMPI_uint64:
            return Type::uint64;
        case CMPI_sint8:
            return Type::sint8;
        case CMPI_sint16:
            return Type::sint16;
        case CMPI_sint32:
            return Type::sint32;
        case CMPI_sint64:
            return Type::sint64;
        case CMPI_real32:
            return Type::real32;
        case CMPI_real64:
            return Type::real64;
        case CMPI_string:
        case CMPI_chars:
            return Type::string;
        case CMPI_dateTime:
            return Type::datetime;
        case CMPI_ref:
            return Type::reference;
        case CMPI_instance:
            return Type::instance;
        default:
            return std::nullopt;
    }
}

CMPIType cmpiType(Type type) noexcept {
    switch (type) {
        case Type::boolean:
            return CMPI_boolean;
        case Type::char16:
            return CMPI_char16;
        case Type::uint8:
            return CMPI_uint8;
        case Type::uint16:
            return CMPI_uint16;
        case Type::uint32:
            return CMPI_uint32;
        case Type::uint64:
            return CMPI_uint64;
        case Type::sint8:
            return CMPI_sint8;
        case Type::sint16:
            return CMPI_sint16;
        case Type::sint32:
            return CMPI_sint32;
        case Type::sint64:
            return CMPI_sint64;
        case Type::real32:
            return CMPI_real32;
        case Type::real64:
            return CMPI_real64;
        case Type::string:
            return CMPI_string;
        case Type::datetime:
            return CMPI_dateTime;
        case Type::reference:
            return CMPI_ref;
        case Type::instance:
            return CMPI_instance;
    }
    return CMPI_null;
}

CMPIType cmpiType(Type type, bool isArray) noexcept {
    const CMPIType scalar = cmpiType(type);
    return isArray ? static_cast<CMPIType>(scalar | CMPI_ARRAY) : scalar;
}

CMPIValue plainValue(const CMPIValue* value, Type type) noexcept {
    CMPIValue copy{};
    switch (type) {
        case Type::boolean:
            copy.boolean = memberOf<CMPIBoolean>(value) != 0 ? 1 : 0;
            break;
        case Type::uint8:
        case Type::sint8:
            copy.uint8 = memberOf<CMPIUint8>(value);
            break;
        case Type::char16:
        case Type::uint16:
        case Type::sint16:
            copy.uint16 = memberOf<CMPIUint16>(value);
            break;
        case Type::uint32:
        case Type::sint32:
            copy.uint32 = memberOf<CMPIUint32>(value);
            break;
        case Type::real32:
            copy.real32 = memberOf<CMPIReal32>(value);
            break;
        case Type::real64:
            copy.real64 = memberOf<CMPIReal64>(value);
            break;
        case Type::uint64:
        case Type::sint64:
            copy.uint64 = memberOf<CMPIUint64>(value);
            break;
        case Type::string:
        case Type::datetime:
        case Type::reference:
        case Type::instance:
            break;
    }
    return copy;
}

}  // namespace cimom::broker
