#pragma once

#include <cmpift.h>

#include <array>
#include <cstddef>
#include <functional>
#include <string>

namespace test {

/// The functions of the tables of CMPI that the provider uses. Any other entry of a
/// counted broker's tables is null, so that a new use shows as a crash of its test.
enum class Function {
    // The broker: making objects, asking other providers.
    newInstance,
    newObjectPath,
    newString,
    newArray,
    classPathIsA,
    enumerateInstances,
    getInstance,
    // Object paths.
    getNameSpace,
    getClassName,
    addKey,
    getKey,
    getKeyAt,
    getKeyCount,
    toString,
    // Instances.
    getProperty,
    setProperty,
    getObjectPath,
    // Strings, arrays, enumerations.
    getCharPtr,
    setElementAt,
    hasNext,
    getNext,
    // Results.
    returnInstance,
    returnObjectPath,
    returnDone,
};

inline constexpr std::size_t functionCount = static_cast<std::size_t>(Function::returnDone) + 1;

/// Name of the table entry, as CMPI has it.
const char* nameOf(Function function);

/// What a function does in place of its work.
enum class Fault {
    none,
    null,       ///< gives nothing (a null pointer, no value, 0), with status OK
    status,     ///< gives nothing, with an error status
    exception,  ///< throws a standard exception, as C++ behind a table might
};

/// Whether a function can return nothing while its status is OK: one that returns a
/// status alone cannot.
bool canReturnNull(Function function);

/// A broker that hands every call on to a real one, counts it, and can let one of
/// them fail. All objects that it gives out are stand-ins for the real broker's, so
/// that calls of their functions are seen as well; they live until the next request.
///
/// One at a time, used by one thread: the tables of CMPI have no room for a state
/// of ours.
class CountedBroker {
  public:
    explicit CountedBroker(const CMPIBroker* real);
    ~CountedBroker();
    CountedBroker(const CountedBroker&) = delete;
    CountedBroker& operator=(const CountedBroker&) = delete;

    [[nodiscard]] const CMPIBroker* record() const { return &record_; }

    /// Forgets the calls and stand-ins of the request before; what is to fail stays.
    void beginRequest();
    /// Stand-ins for what a request is called with.
    const CMPIObjectPath* standIn(const CMPIObjectPath* path);
    const CMPIInstance* standIn(const CMPIInstance* instance);
    const CMPIResult* standIn(const CMPIResult* result);

    /// The call of this number, from 1, fails: counted from now, and anew in each
    /// following request.
    void fail(Function function, unsigned call, Fault fault);
    void failNothing();

    /// Calls `look` at the beginning of every call of the function, until another is
    /// watched or none: with an empty `look`.
    void watch(Function function, std::function<void()> look);

    /// How often a function was called in the last request.
    [[nodiscard]] unsigned calls(Function function) const;
    /// All calls of the last request.
    [[nodiscard]] unsigned calls() const;
    /// How many objects had been delivered when the failing call came.
    [[nodiscard]] std::size_t deliveredBeforeFault() const;

  private:
    CMPIBroker record_;
};

}  // namespace test
