// The objects of CMPI as this broker lays them out: each begins with the structure that
// providers see, and lives in an arena.
#pragma once

#include <cmpift.h>

#include <atomic>
#include <memory>
#include <string>
#include <string_view>

#include "broker/Arena.h"
#include "broker/objects/BrokerString.h"
#include "broker/objects/BrokerValues.h"
#include "cimom/DateTimeText.h"
#include "cimom/Forward.h"
#include "cimom/Status.h"

namespace cimom::broker {

/// A CMPIArray: fixed length, all elements of one type, each possibly null.
struct ArrayRecord : CMPIArray {
    Arena* arena;
    CMPIType elementType;  ///< as stored: never CMPI_chars, never with the array bit
    CMPICount size;
    CMPIData* elements;
};

extern const CMPIArrayFT arrayTable;

/// Null unless the array was made by this broker and is alive.
[[nodiscard]] ArrayRecord* arrayOf(const CMPIArray* array) noexcept;

/// `size` null elements of a stored type. Throws std::bad_alloc.
ArrayRecord* makeArray(Arena& arena, CMPICount size, CMPIType elementType);
ArrayRecord* copyArray(Arena& arena, const ArrayRecord& array);

/// A CMPIDateTime. The text is kept as given, with its offset from UTC and its
/// unknown digits. Never changes.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct DateTimeRecord : CMPIDateTime {
    Arena* arena;
    DateTime value;
    StringRecord* text;
};

extern const CMPIDateTimeFT dateTimeTable;

/// Null unless the datetime was made by this broker and is alive.
[[nodiscard]] DateTimeRecord* dateTimeOf(const CMPIDateTime* dateTime) noexcept;

/// Null for a text that is not a datetime. Throws std::bad_alloc.
DateTimeRecord* makeDateTime(Arena& arena, std::string_view text);
/// Null for a value that has no text.
DateTimeRecord* makeDateTime(Arena& arena, const DateTime& value);
/// The current time.
DateTimeRecord* makeDateTime(Arena& arena);
DateTimeRecord* copyDateTime(Arena& arena, const DateTimeRecord& dateTime);

/// A CMPIArgs: named method arguments.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct ArgsRecord : CMPIArgs {
    Arena* arena;
    EntryList entries;
};

extern const CMPIArgsFT argsTable;

/// Null unless the arguments were made by this broker and are alive.
[[nodiscard]] ArgsRecord* argsOf(const CMPIArgs* args) noexcept;

/// Throws std::bad_alloc.
ArgsRecord* makeArgs(Arena& arena);

/// A CMPIEnumeration: a cursor over an array of instances or paths.
struct EnumerationRecord : CMPIEnumeration {
    Arena* arena;
    ArrayRecord* elements;
    CMPICount next;
};

extern const CMPIEnumerationFT enumerationTable;

/// Null unless the enumeration was made by this broker and is alive.
[[nodiscard]] EnumerationRecord* enumerationOf(const CMPIEnumeration* enumeration) noexcept;

/// The elements must live in the arena. Throws std::bad_alloc.
EnumerationRecord* makeEnumeration(Arena& arena, ArrayRecord* elements);

/// A CMPIContext: what a provider may know of a request beside its parameters.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct ContextRecord : CMPIContext {
    Arena* arena;
    EntryList entries;
    unsigned depth;  ///< how many requests the one it belongs to is nested in, itself included
};

extern const CMPIContextFT contextTable;

/// Null unless the context was made by this broker and is alive.
[[nodiscard]] ContextRecord* contextOf(const CMPIContext* context) noexcept;

/// A context with the standard entries. Throws std::bad_alloc.
ContextRecord* makeContext(Arena& arena, std::string_view nameSpace, std::string_view principal,
                           CMPIFlags flags, unsigned depth);

/// The authenticated user that the context names; empty without one.
[[nodiscard]] std::string principalOf(const CMPIContext* context);

/// A CMPIObjectPath. Components that are not set are empty texts.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct PathRecord : CMPIObjectPath {
    Arena* arena;
    const ClassRepository* classes;  ///< null: no class is known
    StringRecord* host;
    StringRecord* nameSpace;
    StringRecord* className;
    EntryList keys;
    unsigned changes;  ///< how often a setter was used since it was made
};

extern const CMPIObjectPathFT objectPathTable;

/// Null unless the path was made by this broker and is alive.
[[nodiscard]] PathRecord* pathOf(const CMPIObjectPath* path) noexcept;

/// Throw std::bad_alloc.
PathRecord* makePath(Arena& arena, const ClassRepository* classes, std::string_view nameSpace,
                     std::string_view className);
PathRecord* copyPath(Arena& arena, const PathRecord& path);

/// Which properties an instance keeps.
struct PropertyFilter {
    bool active = false;
    CMPICount size = 0;
    StringRecord** names = nullptr;
};

/// A CMPIInstance. A key that its path lacks is added to the path when it is set as a
/// property, also when the filter excludes the property: some providers make all paths so.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct InstanceRecord : CMPIInstance {
    Arena* arena;
    PathRecord* path;
    const ClassDeclaration* declaration;  ///< null: its class is unknown, nothing is checked
    /// So many keys came with the path; those behind them were set as properties.
    CMPICount ownKeys;
    EntryList properties;
    PropertyFilter filter;
    /// The copy of the path last handed out; handed out again while neither has changed.
    std::atomic<PathRecord*>* handedOut;
};

extern const CMPIInstanceFT instanceTable;

/// Null unless the instance was made by this broker and is alive.
[[nodiscard]] InstanceRecord* instanceOf(const CMPIInstance* instance) noexcept;

/// An instance without properties; the path is copied. Throw std::bad_alloc.
InstanceRecord* makeInstance(Arena& arena, const PathRecord& path);
InstanceRecord* copyInstance(Arena& arena, const InstanceRecord& instance);

/// A CMPISelectExp: the text of a query, which is read again each time a provider has
/// an instance evaluated. Never changes.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct SelectExpRecord : CMPISelectExp {
    Arena* arena;
    const ClassRepository* classes;
    StringRecord* query;
    StringRecord* language;
};

extern const CMPISelectExpFT selectExpTable;

/// Null unless the expression was made by this broker and is alive.
[[nodiscard]] SelectExpRecord* selectExpOf(const CMPISelectExp* expression) noexcept;

/// Throws std::bad_alloc. The query is not looked at.
SelectExpRecord* makeSelectExp(Arena& arena, const ClassRepository& classes, std::string_view query,
                               std::string_view language);

/// A CMPIError: the attributes of CIM_Error. Texts and lists that are not set
/// are null pointers.
struct ErrorRecord : CMPIError {
    Arena* arena;
    CMPIErrorType type;
    CMPIErrorSeverity severity;
    CMPIErrorProbableCause cause;
    CMPIErrorSrcFormat sourceFormat;
    CMPIrc code;
    StringRecord* otherType;
    StringRecord* owner;
    StringRecord* messageId;
    StringRecord* message;
    StringRecord* causeText;
    StringRecord* source;
    StringRecord* otherSourceFormat;
    StringRecord* codeText;
    ArrayRecord* actions;
    ArrayRecord* arguments;
};

extern const CMPIErrorFT errorTable;

/// Null unless the error was made by this broker and is alive.
[[nodiscard]] ErrorRecord* errorOf(const CMPIError* error) noexcept;

/// Throws std::bad_alloc. Null texts stay unset.
ErrorRecord* makeError(Arena& arena, const char* owner, const char* messageId, const char* message,
                       CMPIErrorSeverity severity, CMPIErrorProbableCause cause, CMPIrc code);

/// A qualifier of the path's class or of one of its properties, from the class
/// repository. CMPI_RC_ERR_INVALID_CLASS for an unknown class,
/// CMPI_RC_ERR_NO_SUCH_PROPERTY for an unknown property,
/// CMPI_RC_ERR_NOT_FOUND when it does not have the qualifier.
CMPIData classQualifier(const PathRecord* path, const char* name, CMPIStatus* rc);
CMPIData propertyQualifier(const PathRecord* path, const char* property, const char* name,
                           CMPIStatus* rc);

}  // namespace cimom::broker
