#pragma once

#include <cmpift.h>

#include "broker/Arena.h"
#include "broker/objects/BrokerArray.h"
#include "broker/objects/BrokerString.h"
#include "cimom/Status.h"

namespace cimom::broker {

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

}  // namespace cimom::broker
