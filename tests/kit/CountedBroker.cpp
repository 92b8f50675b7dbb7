#include "kit/CountedBroker.h"

#include <deque>
#include <numeric>
#include <stdexcept>
#include <utility>

namespace test {

namespace {

constexpr std::array<const char*, functionCount> names{
    "newInstance",    "newObjectPath",    "newString",
    "newArray",       "classPathIsA",     "enumerateInstances",
    "getInstance",    "getNameSpace",     "getClassName",
    "addKey",         "getKey",           "getKeyAt",
    "getKeyCount",    "toString",         "getProperty",
    "setProperty",    "getObjectPath",    "getCharPtr",
    "setElementAt",   "hasNext",          "getNext",
    "returnInstance", "returnObjectPath", "returnDone",
};

struct State {
    const CMPIBroker* real = nullptr;
    std::array<unsigned, functionCount> calls{};
    Function failing = Function::newInstance;
    unsigned failingCall = 0;
    unsigned callsOfFailing = 0;
    Fault fault = Fault::none;
    std::size_t deliveredBeforeFault = 0;
    Function watched = Function::newInstance;
    std::function<void()> look;

    // The stand-ins of one request.
    std::deque<CMPIObjectPath> paths;
    std::deque<CMPIInstance> instances;
    std::deque<CMPIString> strings;
    std::deque<CMPIArray> arrays;
    std::deque<CMPIEnumeration> enumerations;
    std::deque<CMPIResult> results;
};

State state;

extern const CMPIObjectPathFT pathTable;
extern const CMPIInstanceFT instanceTable;
extern const CMPIStringFT stringTable;
extern const CMPIArrayFT arrayTable;
extern const CMPIEnumerationFT enumerationTable;
extern const CMPIResultFT resultTable;

template <typename Object, typename Table>
Object* standInFor(std::deque<Object>& kept, const Object* real, const Table& table) {
    if (real == nullptr) {
        return nullptr;
    }
    Object object{};
    object.hdl = const_cast<Object*>(real);  // NOLINT(cppcoreguidelines-pro-type-const-cast)
    object.ft = &table;
    return &kept.emplace_back(object);
}

CMPIObjectPath* wrap(const CMPIObjectPath* real) {
    return standInFor(state.paths, real, pathTable);
}
CMPIInstance* wrap(const CMPIInstance* real) {
    return standInFor(state.instances, real, instanceTable);
}
CMPIString* wrap(const CMPIString* real) {
    return standInFor(state.strings, real, stringTable);
}
CMPIArray* wrap(const CMPIArray* real) {
    return standInFor(state.arrays, real, arrayTable);
}
CMPIEnumeration* wrap(const CMPIEnumeration* real) {
    return standInFor(state.enumerations, real, enumerationTable);
}

/// The object behind a stand-in.
template <typename Object>
Object* realOf(const Object* standIn) {
    return static_cast<Object*>(standIn->hdl);
}

/// The same of one that may be null.
template <typename Object>
Object* behind(const Object* standIn) {
    return standIn == nullptr ? nullptr : realOf(standIn);
}

CMPIValue behind(const CMPIValue& value, CMPIType type) {
    CMPIValue result = value;
    if ((type & CMPI_ARRAY) != 0) {
        result.array = behind(value.array);
    } else if (type == CMPI_ref) {
        result.ref = behind(value.ref);
    } else if (type == CMPI_string) {
        result.string = behind(value.string);
    } else if (type == CMPI_instance) {
        result.inst = behind(value.inst);
    }
    return result;
}

CMPIData wrap(const CMPIData& data) {
    CMPIData result = data;
    if ((data.type & CMPI_ARRAY) != 0) {
        result.value.array = wrap(data.value.array);
    } else if (data.type == CMPI_ref) {
        result.value.ref = wrap(data.value.ref);
    } else if (data.type == CMPI_string) {
        result.value.string = wrap(data.value.string);
    } else if (data.type == CMPI_instance) {
        result.value.inst = wrap(data.value.inst);
    }
    return result;
}

unsigned& callsOf(Function function) {
    return state.calls[static_cast<std::size_t>(function)];
}

/// Notes a call; whether it is the one that fails.
bool failsNow(Function function) {
    const std::size_t delivered =
        callsOf(Function::returnInstance) + callsOf(Function::returnObjectPath);
    ++callsOf(function);
    if (state.look && state.watched == function) {
        state.look();
    }
    if (state.fault == Fault::none || state.failing != function ||
        ++state.callsOfFailing != state.failingCall) {
        return false;
    }
    state.deliveredBeforeFault = delivered;
    if (state.fault == Fault::exception) {
        throw std::runtime_error("a function of the broker threw");
    }
    return true;
}

CMPIStatus faultStatus() {
    return {state.fault == Fault::status ? CMPI_RC_ERR_FAILED : CMPI_RC_OK, nullptr};
}

CMPIData faultData() {
    CMPIData data{};
    data.state = state.fault == Fault::status ? CMPI_badValue : CMPI_nullValue;
    return data;
}

/// A call that returns a value and writes the status.
template <typename Result, typename Body>
Result call(Function function, CMPIStatus* rc, const Result& nothing, const Body& body) {
    if (!failsNow(function)) {
        return body();
    }
    if (rc != nullptr) {
        *rc = faultStatus();
    }
    return nothing;
}

/// A call that returns a status.
template <typename Body>
CMPIStatus call(Function function, const Body& body) {
    return failsNow(function) ? faultStatus() : body();
}

template <typename Object>
constexpr Object* nothing = nullptr;

// The broker.

CMPIInstance* newInstance(const CMPIBroker* /*mb*/, const CMPIObjectPath* path, CMPIStatus* rc) {
    return call(Function::newInstance, rc, nothing<CMPIInstance>,
                [&] { return wrap(state.real->eft->newInstance(state.real, behind(path), rc)); });
}

CMPIObjectPath* newObjectPath(const CMPIBroker* /*mb*/, const char* nameSpace,
                              const char* className, CMPIStatus* rc) {
    return call(Function::newObjectPath, rc, nothing<CMPIObjectPath>, [&] {
        return wrap(state.real->eft->newObjectPath(state.real, nameSpace, className, rc));
    });
}

CMPIString* newString(const CMPIBroker* /*mb*/, const char* text, CMPIStatus* rc) {
    return call(Function::newString, rc, nothing<CMPIString>,
                [&] { return wrap(state.real->eft->newString(state.real, text, rc)); });
}

CMPIArray* newArray(const CMPIBroker* /*mb*/, CMPICount size, CMPIType type, CMPIStatus* rc) {
    return call(Function::newArray, rc, nothing<CMPIArray>,
                [&] { return wrap(state.real->eft->newArray(state.real, size, type, rc)); });
}

CMPIBoolean classPathIsA(const CMPIBroker* /*mb*/, const CMPIObjectPath* path, const char* type,
                         CMPIStatus* rc) {
    return call(Function::classPathIsA, rc, CMPIBoolean{0},
                [&] { return state.real->eft->classPathIsA(state.real, behind(path), type, rc); });
}

CMPIEnumeration* enumerateInstances(const CMPIBroker* /*mb*/, const CMPIContext* context,
                                    const CMPIObjectPath* path, const char** properties,
                                    CMPIStatus* rc) {
    return call(Function::enumerateInstances, rc, nothing<CMPIEnumeration>, [&] {
        return wrap(
            state.real->bft->enumerateInstances(state.real, context, behind(path), properties, rc));
    });
}

CMPIInstance* getInstance(const CMPIBroker* /*mb*/, const CMPIContext* context,
                          const CMPIObjectPath* path, const char** properties, CMPIStatus* rc) {
    return call(Function::getInstance, rc, nothing<CMPIInstance>, [&] {
        return wrap(
            state.real->bft->getInstance(state.real, context, behind(path), properties, rc));
    });
}

// Object paths.

CMPIString* getNameSpace(const CMPIObjectPath* self, CMPIStatus* rc) {
    return call(Function::getNameSpace, rc, nothing<CMPIString>,
                [&] { return wrap(realOf(self)->ft->getNameSpace(realOf(self), rc)); });
}

CMPIString* getClassName(const CMPIObjectPath* self, CMPIStatus* rc) {
    return call(Function::getClassName, rc, nothing<CMPIString>,
                [&] { return wrap(realOf(self)->ft->getClassName(realOf(self), rc)); });
}

CMPIStatus addKey(const CMPIObjectPath* self, const char* name, const CMPIValue* value,
                  const CMPIType type) {
    return call(Function::addKey, [&] {
        const CMPIValue real = behind(*value, type);
        return realOf(self)->ft->addKey(realOf(self), name, &real, type);
    });
}

CMPIData getKey(const CMPIObjectPath* self, const char* name, CMPIStatus* rc) {
    return call(Function::getKey, rc, faultData(),
                [&] { return wrap(realOf(self)->ft->getKey(realOf(self), name, rc)); });
}

CMPIData getKeyAt(const CMPIObjectPath* self, CMPICount index, CMPIString** name, CMPIStatus* rc) {
    return call(Function::getKeyAt, rc, faultData(), [&] {
        const CMPIData data = realOf(self)->ft->getKeyAt(realOf(self), index, name, rc);
        if (name != nullptr) {
            *name = wrap(*name);
        }
        return wrap(data);
    });
}

CMPICount getKeyCount(const CMPIObjectPath* self, CMPIStatus* rc) {
    return call(Function::getKeyCount, rc, CMPICount{0},
                [&] { return realOf(self)->ft->getKeyCount(realOf(self), rc); });
}

CMPIString* toString(const CMPIObjectPath* self, CMPIStatus* rc) {
    return call(Function::toString, rc, nothing<CMPIString>,
                [&] { return wrap(realOf(self)->ft->toString(realOf(self), rc)); });
}

// Instances.

CMPIData getProperty(const CMPIInstance* self, const char* name, CMPIStatus* rc) {
    return call(Function::getProperty, rc, faultData(),
                [&] { return wrap(realOf(self)->ft->getProperty(realOf(self), name, rc)); });
}

CMPIStatus setProperty(const CMPIInstance* self, const char* name, const CMPIValue* value,
                       CMPIType type) {
    return call(Function::setProperty, [&] {
        if (value == nullptr) {
            return realOf(self)->ft->setProperty(realOf(self), name, nullptr, type);
        }
        const CMPIValue real = behind(*value, type);
        return realOf(self)->ft->setProperty(realOf(self), name, &real, type);
    });
}

CMPIObjectPath* getObjectPath(const CMPIInstance* self, CMPIStatus* rc) {
    return call(Function::getObjectPath, rc, nothing<CMPIObjectPath>,
                [&] { return wrap(realOf(self)->ft->getObjectPath(realOf(self), rc)); });
}

// Strings, arrays, enumerations.

const char* getCharPtr(const CMPIString* self, CMPIStatus* rc) {
    return call(Function::getCharPtr, rc, nothing<const char>,
                [&] { return realOf(self)->ft->getCharPtr(realOf(self), rc); });
}

CMPIStatus setElementAt(const CMPIArray* self, CMPICount index, const CMPIValue* value,
                        CMPIType type) {
    return call(Function::setElementAt, [&] {
        const CMPIValue real = behind(*value, type);
        return realOf(self)->ft->setElementAt(realOf(self), index, &real, type);
    });
}

CMPIBoolean hasNext(const CMPIEnumeration* self, CMPIStatus* rc) {
    return call(Function::hasNext, rc, CMPIBoolean{0},
                [&] { return realOf(self)->ft->hasNext(realOf(self), rc); });
}

CMPIData getNext(const CMPIEnumeration* self, CMPIStatus* rc) {
    return call(Function::getNext, rc, faultData(),
                [&] { return wrap(realOf(self)->ft->getNext(realOf(self), rc)); });
}

// Results.

CMPIStatus returnInstance(const CMPIResult* self, const CMPIInstance* instance) {
    return call(Function::returnInstance,
                [&] { return realOf(self)->ft->returnInstance(realOf(self), behind(instance)); });
}

CMPIStatus returnObjectPath(const CMPIResult* self, const CMPIObjectPath* path) {
    return call(Function::returnObjectPath,
                [&] { return realOf(self)->ft->returnObjectPath(realOf(self), behind(path)); });
}

CMPIStatus returnDone(const CMPIResult* self) {
    return call(Function::returnDone, [&] { return realOf(self)->ft->returnDone(realOf(self)); });
}

constexpr int version = 200;

CMPIObjectPathFT makePathTable() {
    CMPIObjectPathFT table{};
    table.ftVersion = version;
    table.getNameSpace = &getNameSpace;
    table.getClassName = &getClassName;
    table.addKey = &addKey;
    table.getKey = &getKey;
    table.getKeyAt = &getKeyAt;
    table.getKeyCount = &getKeyCount;
    table.toString = &toString;
    return table;
}

CMPIInstanceFT makeInstanceTable() {
    CMPIInstanceFT table{};
    table.ftVersion = version;
    table.getProperty = &getProperty;
    table.setProperty = &setProperty;
    table.getObjectPath = &getObjectPath;
    return table;
}

CMPIStringFT makeStringTable() {
    CMPIStringFT table{};
    table.ftVersion = version;
    table.getCharPtr = &getCharPtr;
    return table;
}

CMPIArrayFT makeArrayTable() {
    CMPIArrayFT table{};
    table.ftVersion = version;
    table.setElementAt = &setElementAt;
    return table;
}

CMPIEnumerationFT makeEnumerationTable() {
    CMPIEnumerationFT table{};
    table.ftVersion = version;
    table.hasNext = &hasNext;
    table.getNext = &getNext;
    return table;
}

CMPIResultFT makeResultTable() {
    CMPIResultFT table{};
    table.ftVersion = version;
    table.returnInstance = &returnInstance;
    table.returnObjectPath = &returnObjectPath;
    table.returnDone = &returnDone;
    return table;
}

CMPIBrokerFT makeBrokerTable() {
    CMPIBrokerFT table{};
    table.brokerVersion = version;
    table.brokerName = "CountedBroker";
    table.enumerateInstances = &enumerateInstances;
    table.getInstance = &getInstance;
    return table;
}

CMPIBrokerEncFT makeEncapsulationTable() {
    CMPIBrokerEncFT table{};
    table.ftVersion = version;
    table.newInstance = &newInstance;
    table.newObjectPath = &newObjectPath;
    table.newString = &newString;
    table.newArray = &newArray;
    table.classPathIsA = &classPathIsA;
    return table;
}

const CMPIObjectPathFT pathTable = makePathTable();
const CMPIInstanceFT instanceTable = makeInstanceTable();
const CMPIStringFT stringTable = makeStringTable();
const CMPIArrayFT arrayTable = makeArrayTable();
const CMPIEnumerationFT enumerationTable = makeEnumerationTable();
const CMPIResultFT resultTable = makeResultTable();
const CMPIBrokerFT brokerTable = makeBrokerTable();
const CMPIBrokerEncFT encapsulationTable = makeEncapsulationTable();

}  // namespace

const char* nameOf(Function function) {
    return names[static_cast<std::size_t>(function)];
}

bool canReturnNull(Function function) {
    switch (function) {
        case Function::addKey:
        case Function::setProperty:
        case Function::setElementAt:
        case Function::returnInstance:
        case Function::returnObjectPath:
        case Function::returnDone:
            return false;
        default:
            return true;
    }
}

CountedBroker::CountedBroker(const CMPIBroker* real)
    : record_{nullptr, &brokerTable, &encapsulationTable, nullptr, nullptr} {
    state = {};
    state.real = real;
}

CountedBroker::~CountedBroker() {
    state = {};
}

void CountedBroker::beginRequest() {
    state.calls = {};
    state.callsOfFailing = 0;
    state.deliveredBeforeFault = 0;
    state.paths.clear();
    state.instances.clear();
    state.strings.clear();
    state.arrays.clear();
    state.enumerations.clear();
    state.results.clear();
}

const CMPIObjectPath* CountedBroker::standIn(const CMPIObjectPath* path) {
    return wrap(path);
}

const CMPIInstance* CountedBroker::standIn(const CMPIInstance* instance) {
    return wrap(instance);
}

const CMPIResult* CountedBroker::standIn(const CMPIResult* result) {
    return standInFor(state.results, result, resultTable);
}

void CountedBroker::fail(Function function, unsigned call, Fault fault) {
    state.failing = function;
    state.failingCall = call;
    state.callsOfFailing = 0;
    state.fault = fault;
}

void CountedBroker::failNothing() {
    state.fault = Fault::none;
}

void CountedBroker::watch(Function function, std::function<void()> look) {
    state.watched = function;
    state.look = std::move(look);
}

unsigned CountedBroker::calls(Function function) const {
    return callsOf(function);
}

unsigned CountedBroker::calls() const {
    return std::accumulate(state.calls.begin(), state.calls.end(), 0U);
}

std::size_t CountedBroker::deliveredBeforeFault() const {
    return state.deliveredBeforeFault;
}

}  // namespace test
