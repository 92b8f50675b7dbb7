#include "kit/StrictObjects.h"

#include <algorithm>
#include <memory>

#include "broker/BrokerTypes.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/ObjectPathText.h"

namespace strict {

namespace {

using cimom::broker::cimType;
using cimom::broker::cmpiType;
using cimom::broker::isArrayType;
using cimom::broker::withoutArray;

/// A scalar of the model as CMPI data.
CMPIValue toCmpi(const cimom::ClassRepository& repository, const cimom::Scalar& scalar,
                 cimom::Type type) {
    CMPIValue value{};
    const auto* text = std::get_if<std::string>(&scalar);
    if (text != nullptr && type == cimom::Type::datetime) {
        value.dateTime = RequestObjects::make<DateTimeObject>(*text);
    } else if (text != nullptr) {
        value.string = RequestObjects::make<StringObject>(*text);
    } else if (const auto* path = std::get_if<std::shared_ptr<const cimom::ObjectPath>>(&scalar)) {
        value.ref = RequestObjects::make<PathObject>(repository, **path);
    } else if (const auto* truth = std::get_if<bool>(&scalar)) {
        value.boolean = *truth ? 1 : 0;
    } else if (const auto* number = std::get_if<std::uint64_t>(&scalar)) {
        const CMPIUint64 wide = *number;
        // The member that the type names is the first bytes of the union.
        value = cimom::broker::plainValue(
            static_cast<const CMPIValue*>(static_cast<const void*>(&wide)), type);
    } else if (const auto* signedNumber = std::get_if<std::int64_t>(&scalar)) {
        value.sint64 = *signedNumber;
    }
    return value;
}

}  // namespace

cimom::Scalar scalarFrom(const CMPIValue& value, CMPIType type, const char* function) {
    switch (type) {
        case CMPI_boolean:
            return value.boolean != 0;
        case CMPI_uint8:
            return std::uint64_t{value.uint8};
        case CMPI_uint16:
            return std::uint64_t{value.uint16};
        case CMPI_uint32:
            return std::uint64_t{value.uint32};
        case CMPI_uint64:
            return std::uint64_t{value.uint64};
        case CMPI_string:
            if (const auto* text = RequestObjects::get<StringObject>(value.string, function)) {
                return text->text;
            }
            return std::monostate{};
        case CMPI_dateTime:
            if (const auto* moment =
                    RequestObjects::get<DateTimeObject>(value.dateTime, function)) {
                return moment->text;
            }
            return std::monostate{};
        case CMPI_ref:
            if (const auto* path = RequestObjects::get<PathObject>(value.ref, function)) {
                return std::make_shared<const cimom::ObjectPath>(path->model);
            }
            return std::monostate{};
        default:
            violations().add(std::string(function) + " was given a value of a type that no " +
                             "served class has: " + std::to_string(type));
            return std::monostate{};
    }
}

cimom::Value nullOf(CMPIType type) {
    return cimom::Value::null(cimType(withoutArray(type)).value_or(cimom::Type::string),
                              isArrayType(type));
}

cimom::Value valueFrom(const CMPIValue& value, CMPIType type, const char* function) {
    cimom::Value result = nullOf(type);
    if (result.isArray) {
        if (const auto* array = RequestObjects::get<ArrayObject>(value.array, function)) {
            result.content = array->elements;
        }
    } else {
        result.content = scalarFrom(value, type, function);
    }
    return result;
}

CMPIData dataFrom(const cimom::ClassRepository& repository, const cimom::Value& value,
                  CMPIValueState state) {
    CMPIData data{};
    data.type = cmpiType(value.type, value.isArray);
    data.state = state;
    const cimom::Scalar* scalar = value.scalar();
    if (const cimom::Array* elements = value.array()) {
        auto* array = RequestObjects::make<ArrayObject>(
            repository, static_cast<CMPICount>(elements->size()), cmpiType(value.type));
        array->elements = *elements;
        data.value.array = array;
    } else if (scalar == nullptr || std::holds_alternative<std::monostate>(*scalar)) {
        data.state = static_cast<CMPIValueState>(state | CMPI_nullValue);
    } else {
        data.value = toCmpi(repository, *scalar, value.type);
    }
    return data;
}

CMPIData missing() {
    CMPIData data{};
    data.state = CMPI_badValue;
    return data;
}

void put(std::vector<cimom::NamedValue>& values, const std::string& name, cimom::Value value) {
    const auto found = std::find_if(values.begin(), values.end(), [&](const auto& entry) {
        return cimom::sameName(entry.name, name);
    });
    if (found == values.end()) {
        values.push_back({name, std::move(value)});
    } else {
        found->value = std::move(value);
    }
}

bool hasType(const cimom::ClassRepository& repository, const std::string& className,
             const std::string& property, CMPIType type, const char* function) {
    const cimom::ClassDeclaration* declaration = repository.find(className);
    const cimom::PropertyDeclaration* declared =
        declaration == nullptr ? nullptr : declaration->property(property);
    if (declared == nullptr) {
        violations().add(std::string(function) + ": no class declares " + className + "." +
                         property);
        return false;
    }
    if (cmpiType(declared->type, declared->isArray) != type) {
        violations().add(std::string(function) + ": " + className + "." + property +
                         " has another type");
        return false;
    }
    return true;
}

void checkDelivered(const cimom::ClassRepository& repository, const cimom::ObjectPath& path) {
    const cimom::ClassDeclaration* declaration = repository.find(path.className);
    if (declaration == nullptr) {
        violations().add("A path of an unknown class is delivered: " + cimom::toText(path));
        return;
    }
    std::size_t keys = 0;
    for (const cimom::PropertyDeclaration& property : declaration->properties) {
        if (!property.isKey()) {
            continue;
        }
        ++keys;
        const cimom::Value* key = path.key(property.name);
        if (key == nullptr || key->isNull()) {
            violations().add("A path without " + property.name +
                             " is delivered: " + cimom::toText(path));
        }
    }
    if (path.keys.size() > keys) {
        violations().add("A path with other keys is delivered: " + cimom::toText(path));
    }
    if (path.nameSpace.empty()) {
        violations().add("A path without namespace is delivered: " + cimom::toText(path));
    }
}

void checkDelivered(const cimom::ClassRepository& repository, const cimom::Instance& instance) {
    checkDelivered(repository, instance.path);
    const cimom::ClassDeclaration* declaration = repository.find(instance.path.className);
    if (declaration == nullptr) {
        return;
    }
    for (const cimom::PropertyDeclaration& property : declaration->properties) {
        if (property.type == cimom::Type::reference &&
            instance.property(property.name) == nullptr) {
            violations().add("An instance without " + property.name +
                             " is delivered: " + cimom::toText(instance.path));
        }
    }
}

namespace {

/// Null when there is none.
const cimom::Value* defaultOf(const cimom::ClassRepository& repository,
                              const cimom::ClassDeclaration& declaration, const std::string& name,
                              Defaults defaults) {
    if (defaults == Defaults::inherited && !declaration.superclass.empty()) {
        const cimom::ClassDeclaration* parent = repository.find(declaration.superclass);
        const cimom::Value* above =
            parent == nullptr ? nullptr : defaultOf(repository, *parent, name, defaults);
        if (above != nullptr) {
            return above;
        }
    }
    const cimom::PropertyDeclaration* property = declaration.property(name);
    return property == nullptr || property->defaultValue.isNull() ? nullptr
                                                                  : &property->defaultValue;
}

}  // namespace

cimom::Instance withDefaults(const cimom::ClassRepository& repository, cimom::Instance instance,
                             Defaults defaults) {
    const cimom::ClassDeclaration* declaration = repository.find(instance.path.className);
    if (declaration != nullptr) {
        for (const cimom::PropertyDeclaration& property : declaration->properties) {
            const cimom::Value* shown =
                defaultOf(repository, *declaration, property.name, defaults);
            if (shown != nullptr && instance.property(property.name) == nullptr) {
                instance.properties.push_back({property.name, *shown});
            }
        }
    }
    return instance;
}

}  // namespace strict
