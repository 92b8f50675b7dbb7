#include "providerutilities/ProviderUtilities.h"

#include <algorithm>
#include <array>

#include "zrcommon/Strings.h"

namespace ZR {

namespace {

/// The broker with which this thread last made a path or an instance.
thread_local const CMPIBroker* lastBroker = nullptr;

std::string_view textOf(const CMPIString* string) {
    if (string == nullptr || string->ft == nullptr) {
        return {};
    }
    const char* text = string->ft->getCharPtr(string, nullptr);
    return text == nullptr ? std::string_view{} : std::string_view(text);
}

CMPIString* makeString(const CMPIBroker* broker, const std::string& text) {
    if (broker == nullptr) {
        return nullptr;
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIString* string = broker->eft->newString(broker, text.c_str(), &status);
    return status.rc == CMPI_RC_OK ? string : nullptr;
}

bool isOk(const CMPIStatus& status) {
    return status.rc == CMPI_RC_OK;
}

bool holdsValue(const CMPIData& data) {
    constexpr unsigned int unusable = CMPI_nullValue | CMPI_notFound | CMPI_badValue;
    return (data.state & unusable) == 0U;
}

/// Takes a text out of data of either text type.
bool readText(const CMPIData& data, std::string& value) {
    if (!holdsValue(data)) {
        return false;
    }
    if (data.type == CMPI_string && data.value.string != nullptr) {
        value = textOf(data.value.string);
        return true;
    }
    if (data.type == CMPI_chars && data.value.chars != nullptr) {
        value = data.value.chars;
        return true;
    }
    return false;
}

/// The key at a position with its name; false when it has no value. Some hosts count
/// the keys that the class declares, and show those that the path lacks as null.
bool readKeyAt(const CMPIObjectPath* path, CMPICount index, CMPIString*& name, CMPIData& data) {
    CMPIStatus status{CMPI_RC_OK, nullptr};
    name = nullptr;
    data = path->ft->getKeyAt(path, index, &name, &status);
    return isOk(status) && name != nullptr && holdsValue(data);
}

/// The key of a name, in any case. The path is never asked by name: the same hosts read
/// out of bounds when it lacks the key.
bool readKey(const CMPIObjectPath* path, std::string_view name, CMPIData& data) {
    const CMPICount count = path->ft->getKeyCount(path, nullptr);
    for (CMPICount i = 0; i < count; ++i) {
        CMPIString* found = nullptr;
        if (readKeyAt(path, i, found, data) && equalNames(textOf(found), name)) {
            return true;
        }
    }
    return false;
}

bool put(CMPIInstance* instance, const char* name, const CMPIValue& value, CMPIType type) {
    return instance != nullptr && name != nullptr &&
           isOk(instance->ft->setProperty(instance, name, &value, type));
}

bool put(CMPIObjectPath* path, const char* name, const CMPIValue& value, CMPIType type) {
    return path != nullptr && name != nullptr && isOk(path->ft->addKey(path, name, &value, type));
}

/// Sets a text as the value of a property or a key, whichever `holder` has.
template <typename Holder>
bool putText(const CMPIBroker* broker, Holder* holder, const char* name, const std::string& text) {
    if (holder == nullptr || name == nullptr) {
        return false;
    }
    CMPIValue value{};
    value.string = makeString(broker, text);
    return value.string != nullptr && put(holder, name, value, CMPI_string);
}

/// Sets an array property whose elements `fill(index, value)` provides.
template <typename Fill>
bool putArray(const CMPIBroker* broker, CMPIInstance* instance, const char* name, std::size_t size,
              CMPIType elementType, Fill fill) {
    if (broker == nullptr || instance == nullptr || name == nullptr) {
        return false;
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIValue value{};
    value.array = broker->eft->newArray(broker, static_cast<CMPICount>(size), elementType, &status);
    if (value.array == nullptr || !isOk(status)) {
        return false;
    }
    for (std::size_t i = 0; i < size; ++i) {
        CMPIValue element{};
        if (!fill(i, element) ||
            !isOk(value.array->ft->setElementAt(value.array, static_cast<CMPICount>(i), &element,
                                                elementType))) {
            return false;
        }
    }
    return put(instance, name, value, static_cast<CMPIType>(CMPI_ARRAY | elementType));
}

bool classIsA(const CMPIBroker* broker, const std::string& nameSpace, const char* className,
              const char* ancestor) {
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPIObjectPath* path =
        broker->eft->newObjectPath(broker, nameSpace.c_str(), className, &status);
    if (path == nullptr || !isOk(status)) {
        return false;
    }
    return broker->eft->classPathIsA(broker, path, ancestor, &status) != 0 && isOk(status);
}

/// A key's name as the schema writes it. Clients may write it in any case (DSP0004),
/// and some object managers pass on what they wrote, while the keys of a moniker are
/// compared exactly.
std::string schemaKeyName(std::string_view name) {
    constexpr std::array<std::string_view, 5> keys{"Name", "SystemName", "CreationClassName",
                                                   "SystemCreationClassName", "InstanceID"};
    const auto* found = std::find_if(
        keys.begin(), keys.end(), [name](std::string_view key) { return equalNames(key, name); });
    return std::string(found == keys.end() ? name : *found);
}

}  // namespace

unsigned short ProviderUtilities::getClassId(const CMPIObjectPath* path) {
    if (path == nullptr) {
        return unknownClass;
    }
    const CMPIString* name = path->ft->getClassName(path, nullptr);
    return getClassId(name == nullptr ? nullptr : textOf(name).data());
}

bool ProviderUtilities::areClassesRelated(const CMPIBroker* broker, const std::string& nameSpace,
                                          const char* className, const char* parent) {
    if (className == nullptr || *className == '\0') {
        return true;
    }
    if (broker == nullptr || parent == nullptr) {
        return false;
    }
    if (classIsA(broker, nameSpace, className, parent)) {
        return true;
    }
    // NOLINTNEXTLINE(readability-suspicious-call-argument): either may be the ancestor
    return classIsA(broker, nameSpace, parent, className);
}

std::string ProviderUtilities::getNamespace(const CMPIObjectPath* path) {
    if (path == nullptr) {
        return {};
    }
    return std::string(textOf(path->ft->getNameSpace(path, nullptr)));
}

CMPIObjectPath* ProviderUtilities::createObjectPath(const CMPIBroker* broker, const char* className,
                                                    const std::string& nameSpace) {
    if (broker == nullptr || className == nullptr) {
        return nullptr;
    }
    lastBroker = broker;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIObjectPath* path =
        broker->eft->newObjectPath(broker, nameSpace.c_str(), className, &status);
    return isOk(status) ? path : nullptr;
}

CMPIInstance* ProviderUtilities::createInstance(const CMPIBroker* broker,
                                                const CMPIObjectPath* path) {
    if (broker == nullptr || path == nullptr) {
        return nullptr;
    }
    lastBroker = broker;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIInstance* instance = broker->eft->newInstance(broker, path, &status);
    return isOk(status) ? instance : nullptr;
}

bool ProviderUtilities::isListed(const char* const* properties, std::string_view name) noexcept {
    if (properties == nullptr) {
        return true;
    }
    for (; *properties != nullptr; ++properties) {
        if (equalNames(*properties, name)) {
            return true;
        }
    }
    return false;
}

unsigned int ProviderUtilities::getKeyCount(const CMPIObjectPath* path) {
    const CMPICount declared = path == nullptr ? 0 : path->ft->getKeyCount(path, nullptr);
    unsigned int count = 0;
    for (CMPICount i = 0; i < declared; ++i) {
        CMPIString* name = nullptr;
        CMPIData data{};
        count += readKeyAt(path, i, name, data) ? 1U : 0U;
    }
    return count;
}

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* path, const char* name,
                                       std::string& value) {
    if (path == nullptr || name == nullptr) {
        return false;
    }
    CMPIData data{};
    return readKey(path, name, data) && readText(data, value);
}

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* path, const char* name,
                                       CMPIObjectPath** reference) {
    if (path == nullptr || name == nullptr || reference == nullptr) {
        return false;
    }
    CMPIData data{};
    if (!readKey(path, name, data) || data.type != CMPI_ref || data.value.ref == nullptr) {
        return false;
    }
    *reference = data.value.ref;
    return true;
}

bool ProviderUtilities::setKeyProperty(CMPIObjectPath* path, const char* name,
                                       const std::string& value) {
    return putText(lastBroker, path, name, value);
}

bool ProviderUtilities::setKeyProperty(CMPIObjectPath* path, const char* name,
                                       CMPIObjectPath* reference) {
    CMPIValue value{};
    value.ref = reference;
    return reference != nullptr && put(path, name, value, CMPI_ref);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name,
                                    const std::string& value) {
    return putText(lastBroker, instance, name, value);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name,
                                    unsigned short number) {
    CMPIValue value{};
    value.uint16 = number;
    return put(instance, name, value, CMPI_uint16);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned int number) {
    CMPIValue value{};
    value.uint32 = number;
    return put(instance, name, value, CMPI_uint32);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name,
                                    unsigned long long number) {
    CMPIValue value{};
    value.uint64 = number;
    return put(instance, name, value, CMPI_uint64);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, bool truth) {
    CMPIValue value{};
    value.boolean = truth ? 1 : 0;
    return put(instance, name, value, CMPI_boolean);
}

bool ProviderUtilities::setProperty(CMPIInstance* instance, const char* name,
                                    CMPIObjectPath* reference) {
    CMPIValue value{};
    value.ref = reference;
    return reference != nullptr && put(instance, name, value, CMPI_ref);
}

bool ProviderUtilities::setNull(CMPIInstance* instance, const char* name, CMPIType type) {
    return instance != nullptr && name != nullptr &&
           isOk(instance->ft->setProperty(instance, name, nullptr, type));
}

bool ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance,
                                    const char* name, const std::string& text, bool dateTime) {
    if (broker == nullptr || instance == nullptr || name == nullptr) {
        return false;
    }
    if (!dateTime) {
        return putText(broker, instance, name, text);
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIValue value{};
    value.dateTime = broker->eft->newDateTimeFromChars(broker, text.c_str(), &status);
    return value.dateTime != nullptr && isOk(status) && put(instance, name, value, CMPI_dateTime);
}

bool ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance,
                                    const char* name, const std::vector<unsigned short>& values) {
    return putArray(broker, instance, name, values.size(), CMPI_uint16,
                    [&values](std::size_t i, CMPIValue& element) {
                        element.uint16 = values[i];
                        return true;
                    });
}

bool ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance,
                                    const char* name, const std::vector<std::string>& values) {
    return putArray(broker, instance, name, values.size(), CMPI_string,
                    [broker, &values](std::size_t i, CMPIValue& element) {
                        element.string = makeString(broker, values[i]);
                        return element.string != nullptr;
                    });
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name,
                                    std::string& value, bool dateTime) {
    if (instance == nullptr || name == nullptr) {
        return false;
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPIData data = instance->ft->getProperty(instance, name, &status);
    if (!isOk(status) || !holdsValue(data)) {
        return false;
    }
    if (!dateTime) {
        return readText(data, value);
    }
    if (data.type != CMPI_dateTime || data.value.dateTime == nullptr) {
        return false;
    }
    const CMPIString* text = data.value.dateTime->ft->getStringFormat(data.value.dateTime, &status);
    if (text == nullptr || !isOk(status)) {
        return false;
    }
    value = textOf(text);
    return true;
}

bool ProviderUtilities::transformObjectPathToMoniker(const CMPIObjectPath* path, Moniker& moniker) {
    if (path == nullptr) {
        return false;
    }
    const CMPICount count = path->ft->getKeyCount(path, nullptr);
    for (CMPICount i = 0; i < count; ++i) {
        CMPIString* name = nullptr;
        CMPIData data{};
        std::string value;
        if (readKeyAt(path, i, name, data) && readText(data, value)) {
            moniker.addKey(schemaKeyName(textOf(name)), value);
        }
    }
    return true;
}

bool ProviderUtilities::transformMonikerToObjectPath(Moniker& moniker, CMPIObjectPath** path) {
    if (path == nullptr || *path == nullptr) {
        return false;
    }
    const CMPIString* className = (*path)->ft->getClassName(*path, nullptr);
    if (className == nullptr) {
        return false;
    }
    // One after the other: as arguments, a compiler asks for them in any order.
    const std::string name(textOf(className));
    const std::string nameSpace = getNamespace(*path);
    CMPIObjectPath* transformed = createObjectPath(lastBroker, name.c_str(), nameSpace);
    if (transformed == nullptr) {
        return false;
    }
    for (std::size_t i = 0; i < moniker.getKeyCount(); ++i) {
        std::string keyName;
        std::string value;
        if (!moniker.selectKey(i) || !moniker.getName(keyName) || !moniker.getValue(value) ||
            !setKeyProperty(transformed, keyName.c_str(), value)) {
            return false;
        }
    }
    *path = transformed;
    return true;
}

}  // namespace ZR
