#include "kit/StrictObjects.h"

#include "cimom/ClassDeclaration.h"
#include "cimom/ObjectPathText.h"

namespace strict {

namespace {

thread_local RequestObjects* current = nullptr;

}  // namespace

void Violations::add(std::string text) {
    const std::lock_guard lock(mutex_);
    texts_.push_back(std::move(text));
}

std::vector<std::string> Violations::take() {
    const std::lock_guard lock(mutex_);
    return std::exchange(texts_, {});
}

Violations& violations() {
    static Violations instance;
    return instance;
}

RequestObjects::RequestObjects(const Traits& traits)
    : traits_(traits), outer_(std::exchange(current, this)) {}

RequestObjects::~RequestObjects() {
    current = outer_;
}

const Traits& RequestObjects::traits() {
    static constexpr Traits plain{};
    return current == nullptr ? plain : current->traits_;
}

void RequestObjects::note(const char* function, const char* violation) {
    std::string text(function);
    violations().add(text.append(" ").append(violation));
}

void RequestObjects::keep(const void* record, std::shared_ptr<void> object) {
    if (current == nullptr) {
        violations().add("An object is made outside of any request");
        // It has to live somewhere; the test fails anyway.
        static RequestObjects strays{Traits{}};
        strays.objects_.emplace(record, std::move(object));
        return;
    }
    current->objects_.emplace(record, std::move(object));
}

void* RequestObjects::find(const void* record) {
    for (const RequestObjects* request = current; request != nullptr; request = request->outer_) {
        const auto found = request->objects_.find(record);
        if (found != request->objects_.end()) {
            return found->second.get();
        }
    }
    return nullptr;
}

void setStatus(CMPIStatus* status, CMPIrc code) {
    if (status != nullptr) {
        *status = {code, nullptr};
    }
}

bool given(const void* argument, const char* function, const char* name) {
    if (argument == nullptr) {
        violations().add(std::string(function) + " was given no " + name);
    }
    return argument != nullptr;
}

namespace {

constexpr int oldLevel = 1;  // what SFCB says in most of its tables

// Strings.

const char* getCharPtr(const CMPIString* string, CMPIStatus* status) {
    StringObject* object = RequestObjects::get<StringObject>(string, "getCharPtr");
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return object == nullptr ? nullptr : object->text.data();
}

// Date-times.

CMPIString* getStringFormat(const CMPIDateTime* moment, CMPIStatus* status) {
    DateTimeObject* object = RequestObjects::get<DateTimeObject>(moment, "getStringFormat");
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return object == nullptr ? nullptr : RequestObjects::make<StringObject>(object->text);
}

// Arrays.

CMPIStatus setElementAt(const CMPIArray* array, CMPICount index, const CMPIValue* value,
                        CMPIType type) {
    ArrayObject* object = RequestObjects::get<ArrayObject>(array, "setElementAt");
    if (object == nullptr || !given(value, "setElementAt", "value")) {
        return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
    }
    if (index >= object->elements.size() || type != object->type) {
        violations().add("setElementAt was given a wrong index or type");
        return {CMPI_RC_ERR_TYPE_MISMATCH, nullptr};
    }
    object->elements[index] = scalarFrom(*value, type, "setElementAt");
    return {CMPI_RC_OK, nullptr};
}

CMPICount getSize(const CMPIArray* array, CMPIStatus* status) {
    const ArrayObject* object = RequestObjects::get<ArrayObject>(array, "getSize");
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return object == nullptr ? 0 : static_cast<CMPICount>(object->elements.size());
}

CMPIType getSimpleType(const CMPIArray* array, CMPIStatus* status) {
    const ArrayObject* object = RequestObjects::get<ArrayObject>(array, "getSimpleType");
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return object == nullptr ? static_cast<CMPIType>(CMPI_null) : object->type;
}

CMPIData getElementAt(const CMPIArray* array, CMPICount index, CMPIStatus* status) {
    const ArrayObject* object = RequestObjects::get<ArrayObject>(array, "getElementAt");
    if (object == nullptr || index >= object->elements.size()) {
        setStatus(status, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return missing();
    }
    setStatus(status, CMPI_RC_OK);
    cimom::Value element = nullOf(object->type);
    element.content = object->elements[index];
    return dataFrom(*object->repository, element, CMPI_goodValue);
}

// Object paths.

/// A text of a path; an object manager may give null for one that is not set.
CMPIString* component(const CMPIObjectPath* path, CMPIStatus* status, const char* function,
                      std::string cimom::ObjectPath::*member) {
    const PathObject* object = RequestObjects::get<PathObject>(path, function);
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    if (object == nullptr || (object->model.*member).empty()) {
        return nullptr;
    }
    return RequestObjects::make<StringObject>(object->model.*member);
}

CMPIString* getNameSpace(const CMPIObjectPath* path, CMPIStatus* status) {
    return component(path, status, "getNameSpace", &cimom::ObjectPath::nameSpace);
}

CMPIString* getClassName(const CMPIObjectPath* path, CMPIStatus* status) {
    return component(path, status, "getClassName", &cimom::ObjectPath::className);
}

CMPIStatus addKey(const CMPIObjectPath* path, const char* name, const CMPIValue* value,
                  CMPIType type) {
    PathObject* object = RequestObjects::get<PathObject>(path, "addKey");
    if (object == nullptr || !given(name, "addKey", "name") || !given(value, "addKey", "value")) {
        return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
    }
    if (!hasType(*object->repository, object->model.className, name, type, "addKey")) {
        return {CMPI_RC_ERR_TYPE_MISMATCH, nullptr};
    }
    put(object->model.keys, name, valueFrom(*value, type, "addKey"));
    return {CMPI_RC_OK, nullptr};
}

/// The names of the keys that the path's class declares and the path lacks, where the host
/// counts them.
std::vector<std::string> unsetKeys(const PathObject& path) {
    std::vector<std::string> names;
    const cimom::ClassDeclaration* declaration = RequestObjects::traits().declaredKeys
                                                     ? path.repository->find(path.model.className)
                                                     : nullptr;
    if (declaration != nullptr) {
        for (const cimom::PropertyDeclaration& property : declaration->properties) {
            if (property.isKey() && path.model.key(property.name) == nullptr) {
                names.push_back(property.name);
            }
        }
    }
    return names;
}

CMPIData getKey(const CMPIObjectPath* path, const char* name, CMPIStatus* status) {
    const PathObject* object = RequestObjects::get<PathObject>(path, "getKey");
    if (object == nullptr || !given(name, "getKey", "name")) {
        setStatus(status, CMPI_RC_ERR_INVALID_HANDLE);
        return missing();
    }
    const cimom::Value* value = object->model.key(name);
    if (value == nullptr && RequestObjects::traits().declaredKeys) {
        violations().add(std::string("getKey reads out of bounds: the path has no ") + name);
    }
    // So says SFCB of a missing key, and other object managers something else.
    setStatus(status, value == nullptr ? CMPI_RC_ERR_NOT_FOUND : CMPI_RC_OK);
    return value == nullptr ? missing() : dataFrom(*object->repository, *value, CMPI_keyValue);
}

CMPIData getKeyAt(const CMPIObjectPath* path, CMPICount index, CMPIString** name,
                  CMPIStatus* status) {
    const PathObject* object = RequestObjects::get<PathObject>(path, "getKeyAt");
    const std::vector<std::string> unset =
        object == nullptr ? std::vector<std::string>{} : unsetKeys(*object);
    if (object == nullptr || index >= unset.size() + object->model.keys.size()) {
        setStatus(status, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return missing();
    }
    setStatus(status, CMPI_RC_OK);
    const bool isUnset = index < unset.size();
    const cimom::NamedValue key =
        isUnset ? cimom::NamedValue{unset[index], cimom::Value::null(cimom::Type::string, false)}
                : object->model.keys[index - unset.size()];
    if (name != nullptr) {
        *name = RequestObjects::make<StringObject>(key.name);
    }
    return dataFrom(*object->repository, key.value, isUnset ? CMPI_goodValue : CMPI_keyValue);
}

CMPICount getKeyCount(const CMPIObjectPath* path, CMPIStatus* status) {
    const PathObject* object = RequestObjects::get<PathObject>(path, "getKeyCount");
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return object == nullptr
               ? 0
               : static_cast<CMPICount>(unsetKeys(*object).size() + object->model.keys.size());
}

CMPIString* pathToString(const CMPIObjectPath* path, CMPIStatus* status) {
    const PathObject* object = RequestObjects::get<PathObject>(path, "toString");
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return object == nullptr ? nullptr
                             : RequestObjects::make<StringObject>(cimom::toText(object->model));
}

// Instances.

CMPIData getProperty(const CMPIInstance* instance, const char* name, CMPIStatus* status) {
    const InstanceObject* object = RequestObjects::get<InstanceObject>(instance, "getProperty");
    if (object == nullptr || !given(name, "getProperty", "name")) {
        setStatus(status, CMPI_RC_ERR_INVALID_HANDLE);
        return missing();
    }
    const cimom::Value* value = object->model.property(name);
    setStatus(status, value == nullptr ? CMPI_RC_ERR_NO_SUCH_PROPERTY : CMPI_RC_OK);
    return value == nullptr ? missing() : dataFrom(*object->repository, *value, CMPI_goodValue);
}

CMPIData getPropertyAt(const CMPIInstance* instance, CMPICount index, CMPIString** name,
                       CMPIStatus* status) {
    const InstanceObject* object = RequestObjects::get<InstanceObject>(instance, "getPropertyAt");
    if (object == nullptr || index >= object->model.properties.size()) {
        setStatus(status, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return missing();
    }
    setStatus(status, CMPI_RC_OK);
    const cimom::NamedValue& property = object->model.properties[index];
    if (name != nullptr) {
        *name = RequestObjects::make<StringObject>(property.name);
    }
    return dataFrom(*object->repository, property.value, CMPI_goodValue);
}

CMPICount getPropertyCount(const CMPIInstance* instance, CMPIStatus* status) {
    const InstanceObject* object =
        RequestObjects::get<InstanceObject>(instance, "getPropertyCount");
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return object == nullptr ? 0 : static_cast<CMPICount>(object->model.properties.size());
}

CMPIStatus setProperty(const CMPIInstance* instance, const char* name, const CMPIValue* value,
                       CMPIType type) {
    InstanceObject* object = RequestObjects::get<InstanceObject>(instance, "setProperty");
    if (object == nullptr || !given(name, "setProperty", "name")) {
        return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
    }
    if (!hasType(*object->repository, object->model.path.className, name, type, "setProperty")) {
        return {CMPI_RC_ERR_TYPE_MISMATCH, nullptr};
    }
    // No value is the null of the type.
    put(object->model.properties, name,
        value == nullptr ? nullOf(type) : valueFrom(*value, type, "setProperty"));
    return {CMPI_RC_OK, nullptr};
}

CMPIObjectPath* getObjectPath(const CMPIInstance* instance, CMPIStatus* status) {
    const InstanceObject* object = RequestObjects::get<InstanceObject>(instance, "getObjectPath");
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return object == nullptr
               ? nullptr
               : RequestObjects::make<PathObject>(*object->repository, object->model.path);
}

// Enumerations.

/// A record whose use crashes, or is noted.
CMPIInstance* deadInstance() {
    static CMPIInstance dead{nullptr, nullptr};
    return &dead;
}

CMPIData getNext(const CMPIEnumeration* enumeration, CMPIStatus* status) {
    EnumerationObject* object = RequestObjects::get<EnumerationObject>(enumeration, "getNext");
    if (object == nullptr || object->next == object->items.size()) {
        // Past the end there is an error status, and data that must not be read.
        setStatus(status, CMPI_RC_ERR_FAILED);
        CMPIData undefined{};
        undefined.type = CMPI_instance;
        undefined.value.inst = deadInstance();
        return undefined;
    }
    setStatus(status, CMPI_RC_OK);
    CMPIData data{};
    data.type = CMPI_instance;
    data.value.inst =
        RequestObjects::make<InstanceObject>(*object->repository, object->items[object->next]);
    ++object->next;
    return data;
}

CMPIBoolean hasNext(const CMPIEnumeration* enumeration, CMPIStatus* status) {
    const EnumerationObject* object =
        RequestObjects::get<EnumerationObject>(enumeration, "hasNext");
    setStatus(status, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return object != nullptr && object->next < object->items.size() ? 1 : 0;
}

// Contexts.

CMPIData getEntry(const CMPIContext* context, const char* name, CMPIStatus* status) {
    const ContextObject* object = RequestObjects::get<ContextObject>(context, "getEntry");
    if (object != nullptr && given(name, "getEntry", "name")) {
        for (const cimom::NamedValue& entry : object->entries) {
            if (entry.name == name) {
                setStatus(status, CMPI_RC_OK);
                return dataFrom(*object->repository, entry.value, CMPI_goodValue);
            }
        }
    }
    setStatus(status, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    return missing();
}

// Results.

/// The result, unless it is closed already.
ResultObject* openResult(const CMPIResult* result, const char* function) {
    ResultObject* object = RequestObjects::get<ResultObject>(result, function);
    if (object != nullptr && object->doneCalls > 0) {
        violations().add(std::string(function) + " came after returnDone");
    }
    return object;
}

CMPIStatus returnInstance(const CMPIResult* result, const CMPIInstance* instance) {
    ResultObject* object = openResult(result, "returnInstance");
    const InstanceObject* delivered =
        RequestObjects::get<InstanceObject>(instance, "returnInstance");
    if (object == nullptr || delivered == nullptr) {
        return {CMPI_RC_ERR_INVALID_PARAMETER, nullptr};
    }
    if (object->kind != ResultObject::Kind::instances) {
        violations().add("returnInstance responds to a request that is not for instances");
    }
    checkDelivered(*object->repository, delivered->model);
    object->instances.push_back(withDefaults(
        *object->repository, delivered->model,
        RequestObjects::traits().parentsDefaults ? Defaults::inherited : Defaults::declared));
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus returnObjectPath(const CMPIResult* result, const CMPIObjectPath* path) {
    ResultObject* object = openResult(result, "returnObjectPath");
    const PathObject* delivered = RequestObjects::get<PathObject>(path, "returnObjectPath");
    if (object == nullptr || delivered == nullptr) {
        return {CMPI_RC_ERR_INVALID_PARAMETER, nullptr};
    }
    if (object->kind != ResultObject::Kind::paths) {
        violations().add("returnObjectPath responds to a request that is not for paths");
    }
    checkDelivered(*object->repository, delivered->model);
    object->paths.push_back(delivered->model);
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus returnDone(const CMPIResult* result) {
    ResultObject* object = openResult(result, "returnDone");
    if (object == nullptr) {
        return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
    }
    ++object->doneCalls;
    return {CMPI_RC_OK, nullptr};
}

template <typename Table>
Table emptyTable() {
    Table table{};
    table.ftVersion = oldLevel;
    return table;
}

}  // namespace

// What no table below names is null, as some or all slots are in some object manager:
// a provider that comes to use one crashes here first.

const CMPIStringFT StringObject::table = [] {
    auto table = emptyTable<CMPIStringFT>();
    table.getCharPtr = &getCharPtr;
    return table;
}();

const CMPIDateTimeFT DateTimeObject::table = [] {
    auto table = emptyTable<CMPIDateTimeFT>();
    table.getStringFormat = &getStringFormat;
    return table;
}();

const CMPIArrayFT ArrayObject::table = [] {
    auto table = emptyTable<CMPIArrayFT>();
    table.getSize = &getSize;
    table.getSimpleType = &getSimpleType;
    table.getElementAt = &getElementAt;
    table.setElementAt = &setElementAt;
    return table;
}();

const CMPIObjectPathFT PathObject::table = [] {
    auto table = emptyTable<CMPIObjectPathFT>();
    table.getNameSpace = &getNameSpace;
    table.getClassName = &getClassName;
    table.addKey = &addKey;
    table.getKey = &getKey;
    table.getKeyAt = &getKeyAt;
    table.getKeyCount = &getKeyCount;
    table.toString = &pathToString;
    return table;
}();

const CMPIInstanceFT InstanceObject::table = [] {
    auto table = emptyTable<CMPIInstanceFT>();
    table.getProperty = &getProperty;
    table.getPropertyAt = &getPropertyAt;
    table.getPropertyCount = &getPropertyCount;
    table.setProperty = &setProperty;
    table.getObjectPath = &getObjectPath;
    return table;
}();

const CMPIEnumerationFT EnumerationObject::table = [] {
    auto table = emptyTable<CMPIEnumerationFT>();
    table.getNext = &getNext;
    table.hasNext = &hasNext;
    return table;
}();

const CMPIContextFT ContextObject::table = [] {
    auto table = emptyTable<CMPIContextFT>();
    table.getEntry = &getEntry;
    return table;
}();

const CMPIResultFT ResultObject::table = [] {
    auto table = emptyTable<CMPIResultFT>();
    table.returnInstance = &returnInstance;
    table.returnObjectPath = &returnObjectPath;
    table.returnDone = &returnDone;
    return table;
}();

// Providers of old read the text straight out of the handle.
StringObject::StringObject(std::string content)
    : CMPIString{nullptr, &table}, text(std::move(content)) {
    hdl = text.data();
}

DateTimeObject::DateTimeObject(std::string content)
    : CMPIDateTime{nullptr, &table}, text(std::move(content)) {
    hdl = text.data();
}

PathObject::PathObject(const cimom::ClassRepository& classes, cimom::ObjectPath content)
    : CMPIObjectPath{this, &table}, repository(&classes), model(std::move(content)) {}

InstanceObject::InstanceObject(const cimom::ClassRepository& classes, cimom::Instance content)
    : CMPIInstance{this, &table}, repository(&classes), model(std::move(content)) {}

ArrayObject::ArrayObject(const cimom::ClassRepository& classes, CMPICount size,
                         CMPIType elementType)
    : CMPIArray{this, &table}, repository(&classes), type(elementType), elements(size) {}

EnumerationObject::EnumerationObject(const cimom::ClassRepository& classes,
                                     std::vector<cimom::Instance> content)
    : CMPIEnumeration{this, &table}, repository(&classes), items(std::move(content)) {}

ContextObject::ContextObject(const cimom::ClassRepository& classes,
                             std::vector<cimom::NamedValue> content)
    : CMPIContext{this, &table}, repository(&classes), entries(std::move(content)) {}

ResultObject::ResultObject(const cimom::ClassRepository& classes, Kind kindOfRequest)
    : CMPIResult{this, &table}, repository(&classes), kind(kindOfRequest) {}

}  // namespace strict
