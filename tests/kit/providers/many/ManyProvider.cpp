// A provider of as many instances as a test or benchmark wants, of about 1,000
// bytes each in CIM-XML, and of classes whose operations do not return before they
// are released: one waits, one delivers without an end.
#include <cmpift.h>

#include <condition_variable>
#include <cstdlib>
#include <mutex>
#include <string>
#include <string_view>

namespace {

const CMPIBroker* broker = nullptr;

std::mutex mutex;
std::condition_variable changed;
unsigned things = 3;
/// A program that runs on its own is held by its environment, for ever.
bool held = std::getenv("MANY_HELD") != nullptr;
unsigned waiting = 0;

CMPIStatus ok() {
    return {CMPI_RC_OK, nullptr};
}

CMPIValue textValue(const std::string& words) {
    CMPIValue value{};
    value.string = broker->eft->newString(broker, words.c_str(), nullptr);
    return value;
}

CMPIObjectPath* pathOf(const std::string& id) {
    CMPIObjectPath* const path =
        broker->eft->newObjectPath(broker, "root/test", "Many_Thing", nullptr);
    const CMPIValue value = textValue(id);
    path->ft->addKey(path, "Id", &value, CMPI_string);
    return path;
}

void give(const CMPIResult* result, unsigned number) {
    const std::string id = "thing " + std::to_string(number);
    CMPIInstance* const instance = broker->eft->newInstance(broker, pathOf(id), nullptr);
    CMPIValue value = textValue(id);
    instance->ft->setProperty(instance, "Id", &value, CMPI_string);
    value = textValue(std::string(400, 'x') + " & " + id);
    instance->ft->setProperty(instance, "Text", &value, CMPI_string);
    value.uint32 = number;
    instance->ft->setProperty(instance, "Number", &value, CMPI_uint32);
    constexpr CMPICount size = 3;
    value.array = broker->eft->newArray(broker, size, CMPI_string, nullptr);
    for (CMPICount index = 0; index < size; ++index) {
        const CMPIValue element = textValue("element of the list");
        value.array->ft->setElementAt(value.array, index, &element, CMPI_string);
    }
    instance->ft->setProperty(instance, "List", &value, CMPI_stringA);
    result->ft->returnInstance(result, instance);
}

void wait() {
    std::unique_lock lock(mutex);
    ++waiting;
    changed.notify_all();
    changed.wait(lock, [] { return !held; });
    --waiting;
}

void deliverUntilReleased(const CMPIResult* result) {
    CMPIInstance* const instance = broker->eft->newInstance(broker, pathOf("again"), nullptr);
    std::unique_lock lock(mutex);
    ++waiting;
    changed.notify_all();
    while (held) {
        lock.unlock();
        result->ft->returnInstance(result, instance);
        lock.lock();
    }
    --waiting;
}

bool isOf(const CMPIObjectPath* op, std::string_view className) {
    const CMPIString* const name = op->ft->getClassName(op, nullptr);
    return name->ft->getCharPtr(name, nullptr) == className;
}

CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    return ok();
}

CMPIStatus enumerateInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                              const CMPIObjectPath* op, const char**) {
    if (isOf(op, "Many_Endless")) {
        deliverUntilReleased(result);
        return result->ft->returnDone(result);
    }
    if (!isOf(op, "Many_Thing")) {
        wait();
        return result->ft->returnDone(result);
    }
    unsigned count = 0;
    {
        const std::lock_guard lock(mutex);
        count = things;
    }
    if (const char* const wanted = std::getenv("MANY_THINGS")) {
        count = static_cast<unsigned>(std::strtoul(wanted, nullptr, 10));
    }
    for (unsigned number = 0; number < count; ++number) {
        give(result, number);
    }
    return result->ft->returnDone(result);
}

CMPIStatus enumerateInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                  const CMPIObjectPath*) {
    result->ft->returnObjectPath(result, pathOf("thing 0"));
    return result->ft->returnDone(result);
}

CMPIStatus getInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                       const CMPIObjectPath*, const char**) {
    give(result, 0);
    return result->ft->returnDone(result);
}

const CMPIInstanceMIFT table{CMPIVersion200,
                             1,
                             "instanceMany",
                             cleanup,
                             enumerateInstanceNames,
                             enumerateInstances,
                             getInstance,
                             nullptr,
                             nullptr,
                             nullptr,
                             nullptr};
CMPIInstanceMI record{nullptr, &table};

}  // namespace

CMPI_EXTERN_C CMPIInstanceMI* Many_Create_InstanceMI(const CMPIBroker* mb, const CMPIContext*,
                                                     CMPIStatus*) {
    broker = mb;
    return &record;
}

extern "C" CMPI_EXPORT unsigned manySetCount(unsigned count) {
    const std::lock_guard lock(mutex);
    things = count;
    return count;
}
extern "C" CMPI_EXPORT unsigned manyHold() {
    const std::lock_guard lock(mutex);
    held = true;
    return waiting;
}
extern "C" CMPI_EXPORT unsigned manyRelease() {
    const std::lock_guard lock(mutex);
    held = false;
    changed.notify_all();
    return waiting;
}
extern "C" CMPI_EXPORT unsigned manyAwait(unsigned count) {
    std::unique_lock lock(mutex);
    changed.wait(lock, [count] { return waiting >= count; });
    return waiting;
}
