#include "broker/Conversion.h"

#include <cmath>
#include <limits>
#include <string>
#include <utility>

#include "broker/BrokerTypes.h"
#include "broker/objects/BrokerRecords.h"
#include "cimom/Instance.h"

namespace cimom::broker {

namespace {

/// Makes the data the value of a scalar that has none.
void fillScalar(Scalar& scalar, const CMPIData& data) {
    if ((data.state & CMPI_nullValue) != 0) {
        return;
    }
    switch (data.type) {
        case CMPI_boolean:
            scalar = data.value.boolean != 0;
            break;
        case CMPI_char16:
            scalar = static_cast<char16_t>(data.value.char16);
            break;
        case CMPI_uint8:
            scalar = std::uint64_t{data.value.uint8};
            break;
        case CMPI_uint16:
            scalar = std::uint64_t{data.value.uint16};
            break;
        case CMPI_uint32:
            scalar = std::uint64_t{data.value.uint32};
            break;
        case CMPI_uint64:
            scalar = static_cast<std::uint64_t>(data.value.uint64);
            break;
        case CMPI_sint8:
            scalar = std::int64_t{data.value.sint8};
            break;
        case CMPI_sint16:
            scalar = std::int64_t{data.value.sint16};
            break;
        case CMPI_sint32:
            scalar = std::int64_t{data.value.sint32};
            break;
        case CMPI_sint64:
            scalar = static_cast<std::int64_t>(data.value.sint64);
            break;
        case CMPI_real32:
            scalar = static_cast<double>(data.value.real32);
            break;
        case CMPI_real64:
            scalar = data.value.real64;
            break;
        case CMPI_string:
            scalar.emplace<std::string>(textOf(data.value.string));
            break;
        case CMPI_dateTime:
            scalar.emplace<std::string>(dateTimeOf(data.value.dateTime)->text->view());
            break;
        case CMPI_ref:
            scalar = std::make_shared<const ObjectPath>(toModel(*pathOf(data.value.ref)));
            break;
        case CMPI_instance:
            scalar = std::make_shared<const Instance>(toModel(*instanceOf(data.value.inst)));
            break;
        default:
            break;
    }
}

[[noreturn]] void refuse(const std::string& what, Type type) {
    throw ConversionError(what + " is not of type " + std::string(typeName(type)));
}

template <typename Target>
Target integer(const Scalar& scalar, Type type) {
    if (const auto* positive = std::get_if<std::uint64_t>(&scalar)) {
        if (std::in_range<Target>(*positive)) {
            return static_cast<Target>(*positive);
        }
        refuse(std::to_string(*positive), type);
    }
    if (const auto* number = std::get_if<std::int64_t>(&scalar)) {
        if (std::in_range<Target>(*number)) {
            return static_cast<Target>(*number);
        }
        refuse(std::to_string(*number), type);
    }
    refuse("a value of another kind", type);
}

double real(const Scalar& scalar, Type type) {
    if (const auto* number = std::get_if<double>(&scalar)) {
        return *number;
    }
    if (const auto* positive = std::get_if<std::uint64_t>(&scalar)) {
        return static_cast<double>(*positive);
    }
    if (const auto* whole = std::get_if<std::int64_t>(&scalar)) {
        return static_cast<double>(*whole);
    }
    refuse("a value of another kind", type);
}

float narrowed(double number, Type type) {
    if (std::isfinite(number) && std::abs(number) > std::numeric_limits<float>::max()) {
        refuse(std::to_string(number), type);
    }
    return static_cast<float>(number);
}

template <typename Held>
const Held& held(const Scalar& scalar, Type type) {
    const auto* const value = std::get_if<Held>(&scalar);
    if (value == nullptr) {
        refuse("a value of another kind", type);
    }
    return *value;
}

CMPIDateTime* dateTime(Arena& arena, const std::string& text) {
    DateTimeRecord* const record = makeDateTime(arena, std::string_view(text));
    if (record == nullptr) {
        refuse('"' + text + '"', Type::datetime);
    }
    return record;
}

CMPIData scalarData(Arena& arena, const ClassRepository* classes, Type type, const Scalar& scalar) {
    CMPIData data = nullData(cmpiType(type));
    if (std::holds_alternative<std::monostate>(scalar)) {
        return data;
    }
    data.state = CMPI_goodValue;
    CMPIValue& value = data.value;
    switch (type) {
        case Type::boolean:
            value.boolean = held<bool>(scalar, type) ? 1 : 0;
            break;
        case Type::char16:
            value.char16 = static_cast<CMPIChar16>(held<char16_t>(scalar, type));
            break;
        case Type::uint8:
            value.uint8 = integer<CMPIUint8>(scalar, type);
            break;
        case Type::uint16:
            value.uint16 = integer<CMPIUint16>(scalar, type);
            break;
        case Type::uint32:
            value.uint32 = integer<CMPIUint32>(scalar, type);
            break;
        case Type::uint64:
            value.uint64 = integer<CMPIUint64>(scalar, type);
            break;
        case Type::sint8:
            value.sint8 = integer<CMPISint8>(scalar, type);
            break;
        case Type::sint16:
            value.sint16 = integer<CMPISint16>(scalar, type);
            break;
        case Type::sint32:
            value.sint32 = integer<CMPISint32>(scalar, type);
            break;
        case Type::sint64:
            value.sint64 = integer<CMPISint64>(scalar, type);
            break;
        case Type::real32:
            value.real32 = narrowed(real(scalar, type), type);
            break;
        case Type::real64:
            value.real64 = real(scalar, type);
            break;
        case Type::string:
            // An embedded instance may stand in a text property.
            if (const auto* instance = std::get_if<std::shared_ptr<const Instance>>(&scalar)) {
                data.type = CMPI_instance;
                value.inst = toRecord(arena, classes, **instance);
            } else {
                value.string = makeString(arena, held<std::string>(scalar, type));
            }
            break;
        case Type::datetime:
            value.dateTime = dateTime(arena, held<std::string>(scalar, type));
            break;
        case Type::reference:
            value.ref =
                toRecord(arena, classes, *held<std::shared_ptr<const ObjectPath>>(scalar, type));
            break;
        case Type::instance:
            value.inst =
                toRecord(arena, classes, *held<std::shared_ptr<const Instance>>(scalar, type));
            break;
    }
    return data;
}

CMPIData namedData(Arena& arena, const ClassRepository* classes, const NamedValue& named) {
    try {
        return toData(arena, classes, named.value);
    } catch (const ConversionError& error) {
        throw ConversionError(named.name + ": " + error.what());
    }
}

/// Makes the data a value that has none.
void fillValue(Value& value, const CMPIData& data) {
    value.isArray = isArrayType(data.type);
    // A null without a type, set on a property that no class declares.
    value.type = cimType(withoutArray(data.type)).value_or(Type::string);
    if ((data.state & CMPI_nullValue) != 0) {
        return;
    }
    if (!value.isArray) {
        fillScalar(value.content.emplace<Scalar>(), data);
        return;
    }
    const ArrayRecord& array = *arrayOf(data.value.array);
    Array& elements = value.content.emplace<Array>(array.size);
    for (CMPICount index = 0; index < array.size; ++index) {
        fillScalar(elements[index], array.elements[index]);
    }
}

std::vector<NamedValue> toModel(const EntryList& entries) {
    std::vector<NamedValue> values(entries.size());
    for (CMPICount index = 0; index < entries.size(); ++index) {
        values[index].name = entries[index].name->view();
        fillValue(values[index].value, entries[index].data);
    }
    return values;
}

}  // namespace

Value toModel(const CMPIData& data) {
    Value value;
    fillValue(value, data);
    return value;
}

ObjectPath toModel(const PathRecord& path) {
    return {std::string(path.host->view()), std::string(path.nameSpace->view()),
            std::string(path.className->view()), toModel(path.keys)};
}

Instance toModel(const InstanceRecord& instance) {
    return {toModel(*instance.path), toModel(instance.properties)};
}

CMPIData toData(Arena& arena, const ClassRepository* classes, const Value& value) {
    if (value.isNull()) {
        return nullData(cmpiType(value.type, value.isArray));
    }
    if (const Scalar* const scalar = value.scalar()) {
        return scalarData(arena, classes, value.type, *scalar);
    }
    const auto& elements = std::get<Array>(value.content);
    if (elements.size() > std::numeric_limits<CMPICount>::max()) {
        throw ConversionError("an array of that length");
    }
    CMPIData data{};
    data.type = cmpiType(value.type, true);
    ArrayRecord* const array =
        makeArray(arena, static_cast<CMPICount>(elements.size()), cmpiType(value.type));
    for (CMPICount index = 0; index < array->size; ++index) {
        array->elements[index] = scalarData(arena, classes, value.type, elements[index]);
    }
    data.value.array = array;
    return data;
}

PathRecord* toRecord(Arena& arena, const ClassRepository* classes, const ObjectPath& path) {
    PathRecord* const record = makePath(arena, classes, path.nameSpace, path.className);
    if (!path.host.empty()) {
        record->host = makeString(arena, path.host);
    }
    record->keys.reserve(arena, static_cast<CMPICount>(path.keys.size()));
    for (const NamedValue& key : path.keys) {
        // Keys cannot be null; a path with a null key is one without it.
        if (!key.value.isNull()) {
            record->keys.set(arena, key.name, namedData(arena, classes, key));
        }
    }
    return record;
}

InstanceRecord* toRecord(Arena& arena, const ClassRepository* classes, const Instance& instance) {
    InstanceRecord* const record = makeInstance(arena, *toRecord(arena, classes, instance.path));
    for (const NamedValue& property : instance.properties) {
        record->properties.set(arena, property.name, namedData(arena, classes, property));
    }
    return record;
}

}  // namespace cimom::broker
