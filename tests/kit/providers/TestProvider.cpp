// A well-behaved provider with things, links between them, values of every
// type, and requests to other providers. It keeps a log of the calls it gets.
#include <cmpift.h>

#include <array>
#include <atomic>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace {

/// The broker of the last factory call. One factory may run while requests that came
/// by the other are served.
class LastBroker {
  public:
    LastBroker& operator=(const CMPIBroker* broker) {
        broker_ = broker;
        return *this;
    }
    operator const CMPIBroker*() const { return broker_; }
    const CMPIBroker* operator->() const { return broker_; }

  private:
    std::atomic<const CMPIBroker*> broker_ = nullptr;
};

LastBroker broker;

std::mutex logMutex;
std::string callLog;
std::atomic<int> factories{0};
std::atomic<int> cleanups{0};
std::mutex noteMutex;
std::string note = "never changed";

std::string_view text(const CMPIString* string) {
    return string == nullptr ? std::string_view() : string->ft->getCharPtr(string, nullptr);
}

std::string_view classOf(const CMPIObjectPath* path) {
    return text(path->ft->getClassName(path, nullptr));
}

std::string orNull(const char* word) {
    return word == nullptr ? "null" : word;
}

void log(const std::string& line) {
    const std::lock_guard lock(logMutex);
    callLog += line + "\n";
}

CMPIStatus ok() {
    return {CMPI_RC_OK, nullptr};
}

CMPIValue textValue(const std::string& words) {
    CMPIValue value{};
    value.string = broker->eft->newString(broker, words.c_str(), nullptr);
    return value;
}

CMPIObjectPath* thing(const char* className, const std::string& id) {
    CMPIObjectPath* const path =
        broker->eft->newObjectPath(broker, "root/test", className, nullptr);
    const CMPIValue value = textValue(id);
    path->ft->addKey(path, "Id", &value, CMPI_string);
    return path;
}

CMPIObjectPath* numbered(unsigned short number) {
    // Without a namespace: the object manager knows where it asked.
    CMPIObjectPath* const path = broker->eft->newObjectPath(broker, "", "Test_Numbered", nullptr);
    CMPIValue value{};
    value.uint16 = number;
    path->ft->addKey(path, "Number", &value, CMPI_uint16);
    return path;
}

CMPIObjectPath* link(const char* className, CMPIObjectPath* near, CMPIObjectPath* far) {
    CMPIObjectPath* const path =
        broker->eft->newObjectPath(broker, "root/test", className, nullptr);
    CMPIValue value{};
    value.ref = near;
    path->ft->addKey(path, "Near", &value, CMPI_ref);
    value.ref = far;
    path->ft->addKey(path, "Far", &value, CMPI_ref);
    return path;
}

struct Link {
    const char* className;
    const char* nearClass;
    const char* near;
    const char* farClass;
    const char* far;
};
constexpr std::array<Link, 4> links{{
    {"Test_LinkA", "Test_Left", "l1", "Test_Right", "r1"},
    {"Test_LinkA", "Test_Right", "r1", "Test_Left", "l2"},
    {"Test_LinkB", "Test_Left", "l1", "Test_RightSpecial", "s1"},
    {"Test_LinkB", "Test_Left", "l2", "Test_Right", "r1"},
}};

CMPIObjectPath* pathOf(const Link& one) {
    return link(one.className, thing(one.nearClass, one.near), thing(one.farClass, one.far));
}

template <typename Set>
CMPIValue arrayOf(CMPIType type, Set&& set) {
    CMPIArray* const array = broker->eft->newArray(broker, 3, type, nullptr);
    for (CMPICount index = 0; index < 2; ++index) {
        CMPIValue element{};
        set(element, index);
        array->ft->setElementAt(array, index, &element, type);
    }
    CMPIValue value{};
    value.array = array;  // the third element stays null
    return value;
}

void setEveryType(CMPIInstance* instance) {
    const auto set = [instance](const char* name, CMPIType type, auto member, auto content) {
        CMPIValue value{};
        value.*member = content;
        instance->ft->setProperty(instance, name, &value, type);
        const CMPIValue array = arrayOf(type, [&](CMPIValue& element, CMPICount index) {
            element.*member = static_cast<decltype(content)>(index == 0 ? content : 0);
        });
        const std::string arrayName = std::string(name) + "A";
        instance->ft->setProperty(instance, arrayName.c_str(), &array,
                                  static_cast<CMPIType>(type | CMPI_ARRAY));
    };
    set("Boolean", CMPI_boolean, &CMPIValue::boolean, CMPIBoolean{1});
    set("Char16", CMPI_char16, &CMPIValue::char16, CMPIChar16{0x20ac});
    set("Uint8", CMPI_uint8, &CMPIValue::uint8, CMPIUint8{255});
    set("Uint16", CMPI_uint16, &CMPIValue::uint16, CMPIUint16{65535});
    set("Uint32", CMPI_uint32, &CMPIValue::uint32, CMPIUint32{4294967295U});
    set("Uint64", CMPI_uint64, &CMPIValue::uint64, CMPIUint64{18446744073709551615ULL});
    set("Sint8", CMPI_sint8, &CMPIValue::sint8, CMPISint8{-128});
    set("Sint16", CMPI_sint16, &CMPIValue::sint16, static_cast<CMPISint16>(-32768));
    set("Sint32", CMPI_sint32, &CMPIValue::sint32, CMPISint32{-2147483647 - 1});
    set("Sint64", CMPI_sint64, &CMPIValue::sint64, CMPISint64{-9223372036854775807LL - 1});
    set("Real32", CMPI_real32, &CMPIValue::real32, CMPIReal32{0.5F});
    set("Real64", CMPI_real64, &CMPIValue::real64, CMPIReal64{-1.25e300});
    const CMPIValue words = textValue("Grüße");
    instance->ft->setProperty(instance, "String", &words, CMPI_string);
    const CMPIValue list = arrayOf(CMPI_string, [](CMPIValue& element, CMPICount index) {
        element = textValue(index == 0 ? "one" : "");
    });
    instance->ft->setProperty(instance, "StringA", &list, CMPI_stringA);
    CMPIValue time{};
    time.dateTime = broker->eft->newDateTimeFromChars(broker, "20240131093000.12****+060", nullptr);
    instance->ft->setProperty(instance, "DateTime", &time, CMPI_dateTime);
    const CMPIValue times = arrayOf(
        CMPI_dateTime, [&](CMPIValue& element, CMPICount) { element.dateTime = time.dateTime; });
    instance->ft->setProperty(instance, "DateTimeA", &times, CMPI_dateTimeA);
    time.dateTime = broker->eft->newDateTimeFromBinary(broker, 1'000'000, 1, nullptr);
    instance->ft->setProperty(instance, "Interval", &time, CMPI_dateTime);
    CMPIValue inner{};
    inner.inst = broker->eft->newInstance(
        broker, broker->eft->newObjectPath(broker, "root/test", "Test_Inner", nullptr), nullptr);
    const CMPIValue innerText = textValue("inside");
    inner.inst->ft->setProperty(inner.inst, "Text", &innerText, CMPI_string);
    instance->ft->setProperty(instance, "Embedded", &inner, CMPI_instance);
}

std::vector<CMPIObjectPath*> pathsOf(std::string_view className) {
    if (className == "Test_Types") {
        return {thing("Test_Types", "types")};
    }
    if (className == "Test_Left") {
        return {thing("Test_Left", "l1"), thing("Test_Left", "l2")};
    }
    if (className == "Test_Right") {
        return {thing("Test_Right", "r1")};
    }
    if (className == "Test_RightSpecial") {
        return {thing("Test_RightSpecial", "s1")};
    }
    if (className == "Test_Numbered") {
        return {numbered(1), numbered(2), numbered(300)};
    }
    std::vector<CMPIObjectPath*> paths;
    for (const Link& one : links) {
        if (className == one.className) {
            paths.push_back(pathOf(one));
        }
    }
    return paths;
}

CMPIInstance* instanceOf(CMPIObjectPath* path) {
    CMPIInstance* const instance = broker->eft->newInstance(broker, path, nullptr);
    const std::string_view name = classOf(path);
    if (name == "Test_Types") {
        setEveryType(instance);
    }
    if (name != "Test_Numbered" && name != "Test_LinkA" && name != "Test_LinkB") {
        const CMPIData id = path->ft->getKey(path, "Id", nullptr);
        instance->ft->setProperty(instance, "Id", &id.value, id.type);
        const std::lock_guard lock(noteMutex);
        const CMPIValue words = textValue(note);
        instance->ft->setProperty(instance, "Note", &words, CMPI_string);
    }
    if (name == "Test_LinkA") {
        CMPIValue weight{};
        weight.uint16 = 1;
        instance->ft->setProperty(instance, "Weight", &weight, CMPI_uint16);
    }
    return instance;
}

CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    ++cleanups;
    return ok();
}

std::string keysOf(const CMPIObjectPath* path) {
    std::string keys;
    for (CMPICount index = 0; index < path->ft->getKeyCount(path, nullptr); ++index) {
        CMPIString* name = nullptr;
        const CMPIData key = path->ft->getKeyAt(path, index, &name, nullptr);
        keys += "." + std::string(text(name)) + ":" + std::to_string(key.type);
    }
    return keys;
}

CMPIStatus enumerateInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                  const CMPIObjectPath* op) {
    log("enumerateInstanceNames " + std::string(classOf(op)) + keysOf(op));
    for (CMPIObjectPath* const path : pathsOf(classOf(op))) {
        result->ft->returnObjectPath(result, path);
    }
    return result->ft->returnDone(result);
}

CMPIStatus enumerateInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                              const CMPIObjectPath* op, const char** properties) {
    log("enumerateInstances " + std::string(classOf(op)) + (properties == nullptr ? "" : " list"));
    for (CMPIObjectPath* const path : pathsOf(classOf(op))) {
        result->ft->returnInstance(result, instanceOf(path));
    }
    return result->ft->returnDone(result);
}

/// Gives every instance of the class, and no returnDone: the object manager
/// looks for the right one.
CMPIStatus getInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                       const CMPIObjectPath* op, const char**) {
    log("getInstance " + std::string(classOf(op)) + keysOf(op));
    for (CMPIObjectPath* const path : pathsOf(classOf(op))) {
        result->ft->returnInstance(result, instanceOf(path));
    }
    return ok();
}

CMPIStatus modifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                          const CMPIObjectPath* op, const CMPIInstance* instance,
                          const char** properties) {
    CMPIStatus rc{};
    const CMPIData data = instance->ft->getProperty(instance, "Note", &rc);
    std::string line = "modifyInstance " + std::string(classOf(op));
    line += " " + std::to_string(instance->ft->getPropertyCount(instance, nullptr));
    for (; properties != nullptr && *properties != nullptr; ++properties) {
        line += std::string(" ") + *properties;
    }
    log(line);
    if (rc.rc == CMPI_RC_OK && data.type == CMPI_string) {
        const std::lock_guard lock(noteMutex);
        note = text(data.value.string);
    }
    return result->ft->returnDone(result);
}

/// Hands the path over, but for the instance "silent"; refuses "twice".
CMPIStatus createInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                          const CMPIObjectPath* op, const CMPIInstance* instance) {
    CMPIStatus rc{};
    const CMPIData noted = instance->ft->getProperty(instance, "Note", &rc);
    log("createInstance " + std::string(classOf(op)) + keysOf(op) +
        (rc.rc == CMPI_RC_OK && noted.type == CMPI_string
             ? " " + std::string(text(noted.value.string))
             : ""));
    const CMPIData id = op->ft->getKey(op, "Id", &rc);
    const std::string name(rc.rc == CMPI_RC_OK ? text(id.value.string) : "");
    if (name == "twice") {
        return {CMPI_RC_ERR_ALREADY_EXISTS, nullptr};
    }
    if (name != "silent") {
        result->ft->returnObjectPath(result, op);
    }
    return result->ft->returnDone(result);
}

CMPIStatus deleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                          const CMPIObjectPath* op) {
    log("deleteInstance " + std::string(classOf(op)) + keysOf(op));
    const CMPIData id = op->ft->getKey(op, "Id", nullptr);
    if (std::string(text(id.value.string)) == "none") {
        return {CMPI_RC_ERR_NOT_FOUND, nullptr};
    }
    return result->ft->returnDone(result);
}

const CMPIInstanceMIFT instanceTable{CMPIVersion200,
                                     1,
                                     "instanceTest",
                                     cleanup,
                                     enumerateInstanceNames,
                                     enumerateInstances,
                                     getInstance,
                                     createInstance,
                                     modifyInstance,
                                     deleteInstance,
                                     nullptr};
CMPIInstanceMI instanceRecord{nullptr, &instanceTable};

// Associations: the provider knows association and result classes by their
// exact names only, and no roles.

bool isThing(const char* className, const char* id, const CMPIObjectPath* op) {
    const CMPIData key = op->ft->getKey(op, "Id", nullptr);
    return classOf(op) == className && key.type == CMPI_string && text(key.value.string) == id;
}

template <typename Give>
CMPIStatus walkAssociators(const CMPIResult* result, const CMPIObjectPath* op,
                           const char* assocClass, const char* resultClass, Give&& give) {
    for (const Link& one : links) {
        if (assocClass != nullptr && std::string_view(assocClass) != one.className &&
            std::string_view(assocClass) != "Test_Link") {
            continue;
        }
        const auto end = [&](const char* className, const char* id) {
            if (resultClass == nullptr || std::string_view(resultClass) == className) {
                give(thing(className, id));
            }
        };
        if (isThing(one.nearClass, one.near, op)) {
            end(one.farClass, one.far);
        } else if (isThing(one.farClass, one.far, op)) {
            end(one.nearClass, one.near);
        }
    }
    return result->ft->returnDone(result);
}

CMPIStatus associators(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                       const CMPIObjectPath* op, const char* assocClass, const char* resultClass,
                       const char* role, const char* resultRole, const char**) {
    log("associators " + std::string(classOf(op)) + " " + orNull(assocClass) + " " +
        orNull(resultClass) + " " + orNull(role) + " " + orNull(resultRole));
    if (assocClass != nullptr && std::string_view(assocClass) == "Nobody_Knows") {
        return {CMPI_RC_ERR_INVALID_CLASS, nullptr};
    }
    return walkAssociators(result, op, assocClass, resultClass, [result](CMPIObjectPath* path) {
        result->ft->returnInstance(result, instanceOf(path));
    });
}

CMPIStatus associatorNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                           const CMPIObjectPath* op, const char* assocClass,
                           const char* resultClass, const char* role, const char* resultRole) {
    log("associatorNames " + std::string(classOf(op)) + " " + orNull(assocClass) + " " +
        orNull(resultClass) + " " + orNull(role) + " " + orNull(resultRole));
    return walkAssociators(result, op, assocClass, resultClass, [result](CMPIObjectPath* path) {
        result->ft->returnObjectPath(result, path);
    });
}

template <typename Give>
CMPIStatus walkReferences(const CMPIObjectPath* op, const char* resultClass, Give&& give) {
    const std::string_view wanted = resultClass == nullptr ? "" : resultClass;
    if (wanted != "Test_LinkA" && wanted != "Test_LinkB") {
        return {CMPI_RC_ERR_INVALID_CLASS, nullptr};
    }
    for (const Link& one : links) {
        if (wanted == one.className &&
            (isThing(one.nearClass, one.near, op) || isThing(one.farClass, one.far, op))) {
            give(pathOf(one));
        }
    }
    return ok();
}

CMPIStatus references(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                      const CMPIObjectPath* op, const char* resultClass, const char*,
                      const char**) {
    log("references " + std::string(classOf(op)) + " " + orNull(resultClass));
    return walkReferences(op, resultClass, [result](CMPIObjectPath* path) {
        result->ft->returnInstance(result, instanceOf(path));
    });
}

CMPIStatus referenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                          const CMPIObjectPath* op, const char* resultClass, const char*) {
    log("referenceNames " + std::string(classOf(op)) + " " + orNull(resultClass));
    return walkReferences(op, resultClass, [result](CMPIObjectPath* path) {
        result->ft->returnObjectPath(result, path);
    });
}

CMPIStatus associationCleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) {
    ++cleanups;
    return ok();
}

const CMPIAssociationMIFT associationTable{
    CMPIVersion200,  1,          "associationTest", associationCleanup, associators,
    associatorNames, references, referenceNames};
CMPIAssociationMI associationRecord{nullptr, &associationTable};

// A second provider, which asks others.

void tell(const CMPIResult* result, const char* className, const std::string& id,
          const std::string& words) {
    CMPIInstance* const instance = broker->eft->newInstance(broker, thing(className, id), nullptr);
    const CMPIValue value = textValue(words);
    instance->ft->setProperty(instance, "Text", &value, CMPI_string);
    result->ft->returnInstance(result, instance);
}

std::string outcome(const CMPIEnumeration* enumeration, const CMPIStatus& rc) {
    if (enumeration == nullptr) {
        return "status " + std::to_string(rc.rc) + " " + std::string(text(rc.msg));
    }
    std::string words;
    while (enumeration->ft->hasNext(enumeration, nullptr) != 0) {
        const CMPIData data = enumeration->ft->getNext(enumeration, nullptr);
        const CMPIObjectPath* const path =
            data.type == CMPI_ref ? data.value.ref
                                  : data.value.inst->ft->getObjectPath(data.value.inst, nullptr);
        words += std::string(classOf(path)) + "=" +
                 std::string(text(path->ft->getKey(path, "Id", nullptr).value.string)) + " ";
    }
    const CMPIArray* const all = enumeration->ft->toArray(enumeration, nullptr);
    CMPIStatus end{};
    enumeration->ft->getNext(enumeration, &end);
    return words + std::to_string(all->ft->getSize(all, nullptr)) +
           (end.rc == CMPI_RC_OK ? " no end" : "");
}

void askOthers(const CMPIContext* context, const CMPIResult* result) {
    const CMPIBrokerFT& ask = *broker->bft;
    const auto report = [result](const char* id, const std::string& words) {
        tell(result, "Test_Asks", id, words);
    };
    CMPIStatus rc{};
    CMPIObjectPath* const base = broker->eft->newObjectPath(broker, "root/test", "Test_Right", &rc);
    report("enumerateInstanceNames",
           outcome(ask.enumerateInstanceNames(broker, context, base, &rc), rc));
    report("enumerateInstances",
           outcome(ask.enumerateInstances(broker, context, base, nullptr, &rc), rc));
    CMPIObjectPath* const l1 = thing("Test_Left", "l1");
    CMPIEnumeration* const names =
        ask.associatorNames(broker, context, l1, "Test_LinkA", nullptr, nullptr, nullptr, &rc);
    CMPIEnumeration* const copy = names->ft->clone(names, nullptr);
    report("associatorNames", outcome(names, rc));
    report("clonedEnumeration", outcome(copy, rc));
    copy->ft->release(copy);
    report("associators", outcome(ask.associators(broker, context, l1, nullptr, "Test_Right",
                                                  nullptr, nullptr, nullptr, &rc),
                                  rc));
    const auto linked = [](CMPIEnumeration* enumeration) {
        return std::to_string(
            enumeration->ft->toArray(enumeration, nullptr)
                ->ft->getSize(enumeration->ft->toArray(enumeration, nullptr), nullptr));
    };
    report("references",
           linked(ask.references(broker, context, l1, nullptr, nullptr, nullptr, &rc)));
    report("referenceNames", linked(ask.referenceNames(broker, context, l1, nullptr, "Far", &rc)));
    CMPIInstance* const one = ask.getInstance(broker, context, l1, nullptr, &rc);
    report("getInstance", std::string(text(one->ft->getProperty(one, "Id", nullptr).value.string)));
    const CMPIInstance* const none =
        ask.getInstance(broker, context, thing("Test_Left", "l9"), nullptr, &rc);
    report("getMissingInstance", (none == nullptr ? "null " : "there ") + std::to_string(rc.rc));
    const CMPIData property = ask.getProperty(broker, context, l1, "id", &rc);
    report("getProperty", std::string(text(property.value.string)));
    ask.getProperty(broker, context, l1, "Nope", &rc);
    report("getMissingProperty", std::to_string(rc.rc));
    const CMPIEnumeration* const nowhere = ask.enumerateInstances(
        broker, context, broker->eft->newObjectPath(broker, "root/nowhere", "Test_Left", nullptr),
        nullptr, &rc);
    report("unknownNameSpace", outcome(nowhere, rc));
    const CMPIValue words = textValue("changed by a provider");
    one->ft->setProperty(one, "Note", &words, CMPI_string);
    rc = ask.modifyInstance(broker, context, l1, one, nullptr);
    report("modifyInstance", std::to_string(rc.rc));
    report("modified",
           std::string(text(ask.getProperty(broker, context, l1, "Note", nullptr).value.string)));
    report("nullPath", outcome(ask.enumerateInstances(broker, context, nullptr, nullptr, &rc), rc));
    const CMPIValue shorter = textValue("set");
    report("setProperty",
           std::to_string(ask.setProperty(broker, context, l1, "note", &shorter, CMPI_string).rc));
    const auto create = [&](const char* id) {
        CMPIInstance* const wanted =
            broker->eft->newInstance(broker, thing("Test_Left", id), nullptr);
        const CMPIValue value = textValue(id);
        wanted->ft->setProperty(wanted, "Id", &value, CMPI_string);
        const CMPIObjectPath* const made =
            ask.createInstance(broker, context, thing("Test_Left", "of no meaning"), wanted, &rc);
        return made == nullptr
                   ? "status " + std::to_string(rc.rc)
                   : std::string(classOf(made)) + "=" +
                         std::string(text(made->ft->getKey(made, "Id", nullptr).value.string));
    };
    report("createInstance", create("l3"));
    report("createTwice", create("twice"));
    report("deleteInstance", std::to_string(ask.deleteInstance(broker, context, l1).rc));
    report("deleteMissingInstance",
           std::to_string(ask.deleteInstance(broker, context, thing("Test_Left", "none")).rc));
    const auto select = [&](const char* query) {
        return outcome(ask.execQuery(broker, context, base, query, "WQL", &rc), rc);
    };
    report("execQuery", select("SELECT Id FROM Test_Base WHERE Id LIKE '%1'"));
    report("badQuery", select("SELECT"));
    report("queryOfUnknownClass", select("SELECT * FROM Nobody_Knows"));
}

struct ThreadWork {
    CMPIContext* context;
    const CMPIResult* result;
    std::string name;
};

void* deliverFromThread(void* parameter) {
    auto& work = *static_cast<ThreadWork*>(parameter);
    broker->bft->attachThread(broker, work.context);
    for (int count = 0; count < 100; ++count) {
        CMPIObjectPath* const path = thing("Test_Threads", work.name + std::to_string(count));
        work.result->ft->returnInstance(work.result,
                                        broker->eft->newInstance(broker, path, nullptr));
    }
    broker->bft->detachThread(broker, work.context);
    return nullptr;
}

void deliverFromThreads(const CMPIContext* context, const CMPIResult* result) {
    std::array<ThreadWork, 4> works;
    std::array<void*, 4> threads{};
    for (std::size_t index = 0; index < works.size(); ++index) {
        works.at(index) = {broker->bft->prepareAttachThread(broker, context), result,
                           std::string(1, static_cast<char>('a' + index))};
        threads.at(index) = broker->xft->newThread(deliverFromThread, &works.at(index), 0);
    }
    for (void* const thread : threads) {
        broker->xft->joinThread(thread, nullptr);
    }
}

CMPIStatus askingEnumerateInstances(CMPIInstanceMI*, const CMPIContext* context,
                                    const CMPIResult* result, const CMPIObjectPath* op,
                                    const char**) {
    const std::string_view name = classOf(op);
    if (name == "Test_Asks") {
        askOthers(context, result);
    } else if (name == "Test_Threads") {
        deliverFromThreads(context, result);
    } else {
        // Itself again, deeper and deeper; the status of the deepest comes up.
        CMPIStatus rc{};
        const CMPIEnumeration* const more =
            broker->bft->enumerateInstances(broker, context, op, nullptr, &rc);
        log("deeper");
        if (more == nullptr) {
            return rc;
        }
    }
    return result->ft->returnDone(result);
}

const CMPIInstanceMIFT askingTable{
    CMPIVersion200, 1,       "instanceAsking", cleanup, nullptr, askingEnumerateInstances,
    nullptr,        nullptr, nullptr,          nullptr, nullptr};
CMPIInstanceMI askingRecord{nullptr, &askingTable};

}  // namespace

CMPI_EXTERN_C CMPIInstanceMI* Test_Create_InstanceMI(const CMPIBroker* mb, const CMPIContext*,
                                                     CMPIStatus* rc) {
    ++factories;
    broker = mb;
    *rc = ok();
    return &instanceRecord;
}

CMPI_EXTERN_C CMPIAssociationMI* Test_Create_AssociationMI(const CMPIBroker* mb,
                                                           const CMPIContext* context,
                                                           CMPIStatus* rc) {
    ++factories;
    broker = mb;
    const CMPIData entry = context->ft->getEntry(context, CMPIInitNameSpace, nullptr);
    if (text(entry.value.string) != "root/test") {
        *rc = {CMPI_RC_ERR_FAILED, nullptr};
        return nullptr;
    }
    return &associationRecord;
}

/// Serves the name "Asking" only.
CMPI_EXTERN_C CMPIInstanceMI* _Generic_Create_InstanceMI(const CMPIBroker* mb, const CMPIContext*,
                                                         const char* name, CMPIStatus* rc) {
    if (std::string_view(name) != "Asking") {
        *rc = {CMPI_RC_ERR_NOT_FOUND, nullptr};
        return nullptr;
    }
    broker = mb;
    return &askingRecord;
}

/// For the tests: the calls so far, one per line; then forgets them.
extern "C" CMPI_EXPORT const char* testTakeLog() {
    static std::string taken;
    const std::lock_guard lock(logMutex);
    taken.swap(callLog);
    callLog.clear();
    return taken.c_str();
}
extern "C" CMPI_EXPORT int testFactories() {
    return factories;
}
extern "C" CMPI_EXPORT int testCleanups() {
    return cleanups;
}
