#include "ObservedInstances.h"

#include <cstring>
#include <new>
#include <unordered_set>

namespace ZR::DHCPClientExtensions {

namespace {

std::string_view textOf(const CMPIString* text) {
    const char* const characters = text == nullptr ? nullptr : text->ft->getCharPtr(text, nullptr);
    return characters == nullptr ? std::string_view() : std::string_view(characters);
}

bool isNull(const CMPIData& data) noexcept {
    return (data.state & (CMPI_nullValue | CMPI_notFound | CMPI_badValue)) != 0;
}

bool sameTime(const CMPIDateTime* one, const CMPIDateTime* other) {
    constexpr CMPIUint64 second = 1'000'000;
    if (one->ft->isInterval(one, nullptr) != other->ft->isInterval(other, nullptr)) {
        return false;
    }
    const CMPIUint64 a = one->ft->getBinaryFormat(one, nullptr);
    const CMPIUint64 b = other->ft->getBinaryFormat(other, nullptr);
    return (a > b ? a - b : b - a) <= second;
}

bool sameValue(const CMPIData& one, const CMPIData& other);

bool sameArray(const CMPIArray* one, const CMPIArray* other) {
    const CMPICount size = one->ft->getSize(one, nullptr);
    if (size != other->ft->getSize(other, nullptr)) {
        return false;
    }
    for (CMPICount index = 0; index < size; ++index) {
        if (!sameValue(one->ft->getElementAt(one, index, nullptr),
                       other->ft->getElementAt(other, index, nullptr))) {
            return false;
        }
    }
    return true;
}

bool sameValue(const CMPIData& one, const CMPIData& other) {
    if (isNull(one) || isNull(other)) {
        return isNull(one) == isNull(other);
    }
    if (one.type != other.type) {
        return false;
    }
    if ((one.type & CMPI_ARRAY) != 0) {
        return sameArray(one.value.array, other.value.array);
    }
    switch (one.type) {
        case CMPI_string:
            return textOf(one.value.string) == textOf(other.value.string);
        case CMPI_dateTime:
            return sameTime(one.value.dateTime, other.value.dateTime);
        case CMPI_boolean:
            return (one.value.boolean != 0) == (other.value.boolean != 0);
        case CMPI_uint8:
        case CMPI_sint8:
            return one.value.uint8 == other.value.uint8;
        case CMPI_uint16:
        case CMPI_sint16:
        case CMPI_char16:
            return one.value.uint16 == other.value.uint16;
        case CMPI_uint32:
        case CMPI_sint32:
            return one.value.uint32 == other.value.uint32;
        case CMPI_uint64:
        case CMPI_sint64:
            return one.value.uint64 == other.value.uint64;
        default:
            // The classes that are watched have properties of no other type.
            return true;
    }
}

/// A key value as a path writes it.
void append(std::string& path, const CMPIData& key) {
    if (key.type == CMPI_string && !isNull(key)) {
        path += '"';
        for (const char character : textOf(key.value.string)) {
            if (character == '"' || character == '\\') {
                path += '\\';
            }
            path += character;
        }
        path += '"';
    }
}

}  // namespace

void ReleaseInstance::operator()(CMPIInstance* instance) const noexcept {
    instance->ft->release(instance);
}

std::string modelPath(const CMPIInstance* instance) {
    const CMPIObjectPath* const path = instance->ft->getObjectPath(instance, nullptr);
    if (path == nullptr) {
        return {};
    }
    std::string text(textOf(path->ft->getClassName(path, nullptr)));
    char separator = '.';
    const CMPICount keys = path->ft->getKeyCount(path, nullptr);
    for (CMPICount index = 0; index < keys; ++index) {
        CMPIString* name = nullptr;
        const CMPIData key = path->ft->getKeyAt(path, index, &name, nullptr);
        text += separator;
        text += textOf(name);
        text += '=';
        append(text, key);
        separator = ',';
    }
    return text;
}

bool sameState(const CMPIInstance* one, const CMPIInstance* other) {
    const CMPICount count = one->ft->getPropertyCount(one, nullptr);
    if (count != other->ft->getPropertyCount(other, nullptr)) {
        return false;
    }
    for (CMPICount index = 0; index < count; ++index) {
        CMPIString* name = nullptr;
        const CMPIData value = one->ft->getPropertyAt(one, index, &name, nullptr);
        const std::string text(textOf(name));
        if (!sameValue(value, other->ft->getProperty(other, text.c_str(), nullptr))) {
            return false;
        }
    }
    return true;
}

std::vector<std::pair<std::string, const CMPIInstance*>> ObservedInstances::named(
    const std::vector<const CMPIInstance*>& instances) {
    std::vector<std::pair<std::string, const CMPIInstance*>> all;
    all.reserve(instances.size());
    std::unordered_set<std::string> met;
    for (const CMPIInstance* const instance : instances) {
        std::string path = modelPath(instance);
        if (met.insert(path).second) {
            all.emplace_back(std::move(path), instance);
        }
    }
    return all;
}

InstanceCopy ObservedInstances::copyOf(const CMPIInstance* instance) {
    CMPIInstance* const copy = instance->ft->clone(instance, nullptr);
    if (copy == nullptr) {
        throw std::bad_alloc();
    }
    return InstanceCopy(copy);
}

}  // namespace ZR::DHCPClientExtensions
