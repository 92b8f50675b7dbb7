#pragma once

#include <cmpidt.h>
#include <cmpift.h>

#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/Status.h"
#include "kit/StrictTraits.h"

namespace strict {

/// What a strict object manager hands to a provider: objects of its own, with tables
/// that hold what each object manager fills and nothing else. Where a real one would
/// die or send its client an empty response, a violation is noted.
/// What a provider did that some object manager does not survive. Safe for
/// concurrent use.
class Violations {
  public:
    void add(std::string text);
    /// What was noted since the last time.
    [[nodiscard]] std::vector<std::string> take();

  private:
    std::mutex mutex_;
    std::vector<std::string> texts_;
};

/// The one list of the process: the tables of CMPI have no room for a state of ours.
Violations& violations();

/// The objects of one request: they live until it ends, and no other thread may use
/// them. Requests nest where a provider asks for the objects of another one.
class RequestObjects {
  public:
    explicit RequestObjects(const Traits& traits);
    ~RequestObjects();
    RequestObjects(const RequestObjects&) = delete;
    RequestObjects& operator=(const RequestObjects&) = delete;

    /// Makes an object of the innermost request of this thread, known by the
    /// address of its C record.
    template <typename Object, typename... Arguments>
    static Object* make(Arguments&&... arguments) {
        auto object = std::make_shared<Object>(std::forward<Arguments>(arguments)...);
        Object* made = object.get();
        keep(static_cast<const typename Object::Record*>(made), std::move(object));
        return made;
    }

    /// The object of a record that a provider passes to a function. Null, with a
    /// violation, when it is null, of no request of this thread, or of another kind.
    template <typename Object>
    static Object* get(const typename Object::Record* record, const char* function) {
        if (record == nullptr) {
            note(function, "was given no object");
            return nullptr;
        }
        void* found = find(record);
        if (found == nullptr || record->ft != &Object::table) {
            note(function, "was given a dead or foreign object");
            return nullptr;
        }
        return static_cast<Object*>(found);
    }

    /// The traits of the host whose request this thread serves; those of a plain one when
    /// it serves none.
    static const Traits& traits();

  private:
    static void note(const char* function, const char* violation);
    static void keep(const void* record, std::shared_ptr<void> object);
    static void* find(const void* record);

    std::unordered_map<const void*, std::shared_ptr<void>> objects_;
    Traits traits_;
    RequestObjects* outer_;
};

struct StringObject : CMPIString {
    using Record = CMPIString;
    static const CMPIStringFT table;
    explicit StringObject(std::string content);
    std::string text;
};

struct DateTimeObject : CMPIDateTime {
    using Record = CMPIDateTime;
    static const CMPIDateTimeFT table;
    explicit DateTimeObject(std::string content);
    std::string text;
};

struct PathObject : CMPIObjectPath {
    using Record = CMPIObjectPath;
    static const CMPIObjectPathFT table;
    PathObject(const cimom::ClassRepository& classes, cimom::ObjectPath content);
    const cimom::ClassRepository* repository;
    cimom::ObjectPath model;
};

struct InstanceObject : CMPIInstance {
    using Record = CMPIInstance;
    static const CMPIInstanceFT table;
    InstanceObject(const cimom::ClassRepository& classes, cimom::Instance content);
    const cimom::ClassRepository* repository;
    cimom::Instance model;
};

struct ArrayObject : CMPIArray {
    using Record = CMPIArray;
    static const CMPIArrayFT table;
    ArrayObject(const cimom::ClassRepository& classes, CMPICount size, CMPIType elementType);
    const cimom::ClassRepository* repository;
    CMPIType type;
    cimom::Array elements;
};

struct EnumerationObject : CMPIEnumeration {
    using Record = CMPIEnumeration;
    static const CMPIEnumerationFT table;
    EnumerationObject(const cimom::ClassRepository& classes, std::vector<cimom::Instance> content);
    const cimom::ClassRepository* repository;
    std::vector<cimom::Instance> items;
    std::size_t next = 0;
};

/// A context that knows its entries, or none: object managers differ.
struct ContextObject : CMPIContext {
    using Record = CMPIContext;
    static const CMPIContextFT table;
    ContextObject(const cimom::ClassRepository& classes, std::vector<cimom::NamedValue> content);
    const cimom::ClassRepository* repository;
    std::vector<cimom::NamedValue> entries;
};

/// The result of a request: what was handed over.
struct ResultObject : CMPIResult {
    using Record = CMPIResult;
    static const CMPIResultFT table;
    enum class Kind { paths, instances, nothing };
    ResultObject(const cimom::ClassRepository& classes, Kind kindOfRequest);
    const cimom::ClassRepository* repository;
    Kind kind;
    std::vector<cimom::ObjectPath> paths;
    std::vector<cimom::Instance> instances;
    unsigned doneCalls = 0;
};

/// Writes a status where the caller wants one.
void setStatus(CMPIStatus* status, CMPIrc code);

/// Notes a violation when an argument is null.
bool given(const void* argument, const char* function, const char* name);

class StrictHost;

/// The broker of a strict host: slots that are null in some object manager are null in it.
CMPIBroker strictBroker(StrictHost& host, const Traits& traits);

/// Between the values of CMPI and those of the model, and the checks of what a
/// provider sets and delivers. Each wrong value is a violation.
/// What a provider hands over. A null object inside is a violation and becomes null.
cimom::Scalar scalarFrom(const CMPIValue& value, CMPIType type, const char* function);
cimom::Value valueFrom(const CMPIValue& value, CMPIType type, const char* function);

/// The null of a type of CMPI.
cimom::Value nullOf(CMPIType type);

/// What a provider gets; its texts and paths are objects of the present request.
CMPIData dataFrom(const cimom::ClassRepository& repository, const cimom::Value& value,
                  CMPIValueState state);
CMPIData missing();

/// Adds a named value, or replaces it.
void put(std::vector<cimom::NamedValue>& values, const std::string& name, cimom::Value value);

/// Whether the class declares such a property, of this type.
bool hasType(const cimom::ClassRepository& repository, const std::string& className,
             const std::string& property, CMPIType type, const char* function);

/// A path must have all keys of its class, none of them null, and no others; an
/// instance its references as well. Object managers return nothing at all otherwise.
void checkDelivered(const cimom::ClassRepository& repository, const cimom::ObjectPath& path);
void checkDelivered(const cimom::ClassRepository& repository, const cimom::Instance& instance);

/// Whose default counts: that of the class, or that of the topmost superclass that has one.
enum class Defaults { declared, inherited };

/// The instance with the default in place of each property that is unset.
cimom::Instance withDefaults(const cimom::ClassRepository& repository, cimom::Instance instance,
                             Defaults defaults);

}  // namespace strict
