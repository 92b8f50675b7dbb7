#include "broker/BrokerTables.h"

#include <cstdarg>
#include <utility>

#include "broker/Broker.h"
#include "broker/BrokerText.h"
#include "broker/BrokerTypes.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"
#include "broker/objects/BrokerStatus.h"
#include "cimom/ClassRepository.h"
#include "cimom/Query.h"

namespace cimom::broker {

namespace {

Arena& arena() {
    return RequestScope::current().arena();
}

std::string_view orEmpty(const char* text) noexcept {
    return text == nullptr ? std::string_view() : std::string_view(text);
}

/// Makes an object for a live broker: `make` gets the broker and the code.
template <typename Object, typename Make>
Object* made(const CMPIBroker* mb, CMPIStatus* rc, Make&& make) {
    return guarded<Object*>(rc, nullptr, [&](CMPIrc& code) -> Object* {
        const Broker* const broker = Broker::of(mb);
        if (broker == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        return make(*broker, code);
    });
}

/// An unknown class is not an error: nothing of the instance is checked then.
CMPIInstance* newInstance(const CMPIBroker* mb, const CMPIObjectPath* op, CMPIStatus* rc) {
    return made<CMPIInstance>(mb, rc, [op](const Broker&, CMPIrc& code) -> CMPIInstance* {
        const PathRecord* const path = pathOf(op);
        if (path == nullptr) {
            code = CMPI_RC_ERR_INVALID_PARAMETER;
            return nullptr;
        }
        return makeInstance(arena(), *path);
    });
}

CMPIObjectPath* newObjectPath(const CMPIBroker* mb, const char* nameSpace, const char* className,
                              CMPIStatus* rc) {
    return made<CMPIObjectPath>(mb, rc, [=](const Broker& broker, CMPIrc&) {
        return makePath(arena(), &broker.classes(), orEmpty(nameSpace), orEmpty(className));
    });
}

CMPIArgs* newArgs(const CMPIBroker* mb, CMPIStatus* rc) {
    return made<CMPIArgs>(mb, rc, [](const Broker&, CMPIrc&) { return makeArgs(arena()); });
}

CMPIString* newString(const CMPIBroker* mb, const char* text, CMPIStatus* rc) {
    return made<CMPIString>(mb, rc, [text](const Broker&, CMPIrc& code) -> CMPIString* {
        if (text == nullptr) {
            code = CMPI_RC_ERR_INVALID_PARAMETER;
            return nullptr;
        }
        return makeString(arena(), text);
    });
}

CMPIArray* newArray(const CMPIBroker* mb, CMPICount size, CMPIType type, CMPIStatus* rc) {
    return made<CMPIArray>(mb, rc, [=](const Broker&, CMPIrc& code) -> CMPIArray* {
        const auto element = cimType(type);
        if (!element) {
            code = CMPI_RC_ERR_INVALID_DATA_TYPE;
            return nullptr;
        }
        return makeArray(arena(), size, cmpiType(*element));
    });
}

CMPIDateTime* newDateTime(const CMPIBroker* mb, CMPIStatus* rc) {
    return made<CMPIDateTime>(mb, rc, [](const Broker&, CMPIrc&) { return makeDateTime(arena()); });
}

CMPIDateTime* orInvalid(CMPIDateTime* dateTime, CMPIrc& code) noexcept {
    if (dateTime == nullptr) {
        code = CMPI_RC_ERR_INVALID_PARAMETER;
    }
    return dateTime;
}

CMPIDateTime* newDateTimeFromBinary(const CMPIBroker* mb, CMPIUint64 time, CMPIBoolean interval,
                                    CMPIStatus* rc) {
    return made<CMPIDateTime>(mb, rc, [=](const Broker&, CMPIrc& code) {
        const bool fits = std::in_range<std::int64_t>(time);
        return orInvalid(
            fits ? makeDateTime(arena(), DateTime{interval != 0, static_cast<std::int64_t>(time)})
                 : nullptr,
            code);
    });
}

CMPIDateTime* newDateTimeFromChars(const CMPIBroker* mb, const char* text, CMPIStatus* rc) {
    return made<CMPIDateTime>(mb, rc, [=](const Broker&, CMPIrc& code) {
        return orInvalid(makeDateTime(arena(), orEmpty(text)), code);
    });
}

CMPISelectExp* newSelectExp(const CMPIBroker* mb, const char* query, const char* language,
                            CMPIArray** projection, CMPIStatus* rc) {
    if (projection != nullptr) {
        *projection = nullptr;
    }
    return made<CMPISelectExp>(mb, rc, [=](const Broker& broker, CMPIrc& code) -> CMPISelectExp* {
        try {
            const Query parsed = Query::parse(orEmpty(language), orEmpty(query));
            const auto& names = parsed.properties();
            if (projection != nullptr && names) {
                ArrayRecord* const list =
                    makeArray(arena(), static_cast<CMPICount>(names->size()), CMPI_string);
                for (CMPICount index = 0; index < list->size; ++index) {
                    list->elements[index].state = CMPI_goodValue;
                    list->elements[index].value.string = makeString(arena(), (*names)[index]);
                }
                *projection = list;
            }
        } catch (const QueryError& error) {
            code = error.code;
            return nullptr;
        }
        return makeSelectExp(arena(), broker.classes(), orEmpty(query), orEmpty(language));
    });
}

/// The namespace must be given; all namespaces have the same classes. An unknown
/// class matches its own name only.
CMPIBoolean classPathIsA(const CMPIBroker* mb, const CMPIObjectPath* op, const char* type,
                         CMPIStatus* rc) {
    return guarded<CMPIBoolean>(rc, 0, [=](CMPIrc& code) -> CMPIBoolean {
        const Broker* const broker = Broker::of(mb);
        const PathRecord* const path = pathOf(op);
        if (broker == nullptr || path == nullptr || type == nullptr) {
            code = broker == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_INVALID_PARAMETER;
            return 0;
        }
        if (path->nameSpace->length == 0) {
            code = CMPI_RC_ERR_INVALID_NAMESPACE;
            return 0;
        }
        const std::string_view className = path->className->view();
        const bool is = (!className.empty() && sameName(className, type)) ||
                        broker->classes().isA(className, type);
        return is ? 1 : 0;
    });
}

CMPIString* toString(const CMPIBroker* mb, const void* object, CMPIStatus* rc) {
    return made<CMPIString>(mb, rc, [object](const Broker&, CMPIrc& code) -> CMPIString* {
        if (kindOf(object).empty()) {
            code = CMPI_RC_ERR_INVALID_PARAMETER;
            return nullptr;
        }
        return makeString(arena(), describe(object));
    });
}

CMPIBoolean isOfType(const CMPIBroker* mb, const void* object, const char* type, CMPIStatus* rc) {
    return guarded<CMPIBoolean>(rc, 0, [=](CMPIrc& code) -> CMPIBoolean {
        const std::string_view kind = kindOf(object);
        if (Broker::of(mb) == nullptr || kind.empty() || type == nullptr) {
            code = Broker::of(mb) == nullptr ? CMPI_RC_ERR_INVALID_HANDLE
                                             : CMPI_RC_ERR_INVALID_PARAMETER;
            return 0;
        }
        return kind == type ? 1 : 0;
    });
}

CMPIString* getType(const CMPIBroker* mb, const void* object, CMPIStatus* rc) {
    return made<CMPIString>(mb, rc, [object](const Broker&, CMPIrc& code) -> CMPIString* {
        const std::string_view kind = kindOf(object);
        if (kind.empty()) {
            code = CMPI_RC_ERR_INVALID_PARAMETER;
            return nullptr;
        }
        return makeString(arena(), kind);
    });
}

CMPIString* message(const CMPIBroker* mb, const char* text, CMPIStatus* rc, CMPICount count,
                    std::va_list arguments) {
    std::va_list copy;
    va_copy(copy, arguments);
    auto* const result = made<CMPIString>(mb, rc, [&](const Broker&, CMPIrc& code) -> CMPIString* {
        std::string formatted;
        if (!formatMessage(orEmpty(text), count, copy, formatted)) {
            code = count > 10 ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_TYPE_MISMATCH;
            return nullptr;
        }
        return makeString(arena(), formatted);
    });
    va_end(copy);
    return result;
}

// The slots of the function table have a variable number of arguments.
// NOLINTBEGIN(cert-dcl50-cpp)

/// No translations exist, so that the default text always counts.
CMPIString* getMessage(const CMPIBroker* mb, const char*, const char* text, CMPIStatus* rc,
                       CMPICount count, ...) {
    std::va_list arguments;
    va_start(arguments, count);
    CMPIString* const result = message(mb, text, rc, count, arguments);
    va_end(arguments);
    return result;
}

CMPIString* getMessage2(const CMPIBroker* mb, const char*, CMPIMsgFileHandle, const char* text,
                        CMPIStatus* rc, CMPICount count, ...) {
    std::va_list arguments;
    va_start(arguments, count);
    CMPIString* const result = message(mb, text, rc, count, arguments);
    va_end(arguments);
    return result;
}

// NOLINTEND(cert-dcl50-cpp)

/// Not supported: providers have logs of their own.
CMPIStatus logMessage(const CMPIBroker*, int, const char*, const char*, const CMPIString*) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus trace(const CMPIBroker*, int, const char*, const char*, const CMPIString*) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIError* newCMPIError(const CMPIBroker* mb, const char* owner, const char* messageId,
                        const char* text, const CMPIErrorSeverity severity,
                        const CMPIErrorProbableCause cause, const CMPIrc code, CMPIStatus* rc) {
    return made<CMPIError>(mb, rc, [=](const Broker&, CMPIrc&) {
        return makeError(arena(), owner, messageId, text, severity, cause, code);
    });
}

CMPIStatus openMessageFile(const CMPIBroker*, const char*, CMPIMsgFileHandle* handle) {
    if (handle != nullptr) {
        *handle = nullptr;
    }
    return statusOf(CMPI_RC_ERR_NOT_FOUND);
}

/// The only handle that openMessageFile gives is null, which may be closed.
CMPIStatus closeMessageFile(const CMPIBroker*, CMPIMsgFileHandle handle) {
    return statusOf(handle == nullptr ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
}

}  // namespace

const CMPIBrokerEncFT encapsulationTable{CMPIVersion200,
                                         newInstance,
                                         newObjectPath,
                                         newArgs,
                                         newString,
                                         newArray,
                                         newDateTime,
                                         newDateTimeFromBinary,
                                         newDateTimeFromChars,
                                         newSelectExp,
                                         classPathIsA,
                                         toString,
                                         isOfType,
                                         getType,
                                         getMessage,
                                         logMessage,
                                         trace,
                                         newCMPIError,
                                         openMessageFile,
                                         closeMessageFile,
                                         getMessage2};

}  // namespace cimom::broker
