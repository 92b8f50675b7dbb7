#include "broker/objects/BrokerRecords.h"

#include "broker/objects/BrokerStatus.h"

namespace cimom::broker {

namespace {

StringRecord* textIn(Arena& arena, const StringRecord* text) {
    return text == nullptr ? nullptr : stringIn(arena, *text);
}

ArrayRecord* listIn(Arena& arena, const ArrayRecord* list) {
    return list == nullptr ? nullptr : copyArray(arena, *list);
}

CMPIStatus release(CMPIError* self) {
    ErrorRecord* const error = errorOf(self);
    if (error == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (error->arena->isRoot(error)) {
        const std::unique_ptr<Arena> ended(error->arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPIError* clone(const CMPIError* self, CMPIStatus* rc) {
    return guarded<CMPIError*>(rc, nullptr, [self](CMPIrc& code) -> CMPIError* {
        const ErrorRecord* const error = errorOf(self);
        if (error == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        auto* const copy = arena->make<ErrorRecord>(*error);
        copy->hdl = copy;
        copy->arena = arena.get();
        for (const auto member :
             {&ErrorRecord::otherType, &ErrorRecord::owner, &ErrorRecord::messageId,
              &ErrorRecord::message, &ErrorRecord::causeText, &ErrorRecord::source,
              &ErrorRecord::otherSourceFormat, &ErrorRecord::codeText}) {
            copy->*member = textIn(*arena, error->*member);
        }
        copy->actions = listIn(*arena, error->actions);
        copy->arguments = listIn(*arena, error->arguments);
        arena.release()->setRoot(copy);
        return copy;
    });
}

/// A member as it is; `Result{}` for a dead error.
template <auto member, typename Result>
Result get(const CMPIError* self, CMPIStatus* rc) {
    const ErrorRecord* const error = errorOf(self);
    setStatus(rc, error == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return error == nullptr ? Result{} : Result{error->*member};
}

template <auto member, typename Argument>
CMPIStatus set(const CMPIError* self, Argument value) {
    ErrorRecord* const error = errorOf(self);
    if (error == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    error->*member = value;
    return statusOf(CMPI_RC_OK);
}

template <StringRecord* ErrorRecord::*member>
CMPIStatus setText(const CMPIError* self, const char* text) {
    return guarded([=] {
        ErrorRecord* const error = errorOf(self);
        if (error == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        error->*member = text == nullptr ? nullptr : makeString(*error->arena, text);
        return CMPI_RC_OK;
    });
}

template <ArrayRecord* ErrorRecord::*member>
CMPIrc setList(const CMPIError* self, const CMPIArray* values) {
    ErrorRecord* const error = errorOf(self);
    if (error == nullptr) {
        return CMPI_RC_ERR_INVALID_HANDLE;
    }
    const ArrayRecord* const list = arrayOf(values);
    if (list == nullptr || list->elementType != CMPI_string) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    error->*member = copyArray(*error->arena, *list);
    return CMPI_RC_OK;
}

CMPIStatus setActions(const CMPIError* self, const CMPIArray* values) {
    return guarded([=] { return setList<&ErrorRecord::actions>(self, values); });
}

CMPIStatus setArguments(const CMPIError* self, CMPIArray* values) {
    return guarded([=] { return setList<&ErrorRecord::arguments>(self, values); });
}

}  // namespace

const CMPIErrorFT errorTable{CMPIVersion200,
                             release,
                             clone,
                             get<&ErrorRecord::type, CMPIErrorType>,
                             get<&ErrorRecord::otherType, CMPIString*>,
                             get<&ErrorRecord::owner, CMPIString*>,
                             get<&ErrorRecord::messageId, CMPIString*>,
                             get<&ErrorRecord::message, CMPIString*>,
                             get<&ErrorRecord::severity, CMPIErrorSeverity>,
                             get<&ErrorRecord::cause, CMPIErrorProbableCause>,
                             get<&ErrorRecord::causeText, CMPIString*>,
                             get<&ErrorRecord::actions, CMPIArray*>,
                             get<&ErrorRecord::source, CMPIString*>,
                             get<&ErrorRecord::sourceFormat, CMPIErrorSrcFormat>,
                             get<&ErrorRecord::otherSourceFormat, CMPIString*>,
                             get<&ErrorRecord::code, CMPIrc>,
                             get<&ErrorRecord::codeText, CMPIString*>,
                             get<&ErrorRecord::arguments, CMPIArray*>,
                             set<&ErrorRecord::type, const CMPIErrorType>,
                             setText<&ErrorRecord::otherType>,
                             setText<&ErrorRecord::causeText>,
                             setActions,
                             setText<&ErrorRecord::source>,
                             set<&ErrorRecord::sourceFormat, const CMPIErrorSrcFormat>,
                             setText<&ErrorRecord::otherSourceFormat>,
                             setText<&ErrorRecord::codeText>,
                             setArguments};

ErrorRecord* errorOf(const CMPIError* error) noexcept {
    return error != nullptr && error->ft == &errorTable ? static_cast<ErrorRecord*>(error->hdl)
                                                        : nullptr;
}

ErrorRecord* makeError(Arena& arena, const char* owner, const char* messageId, const char* message,
                       CMPIErrorSeverity severity, CMPIErrorProbableCause cause, CMPIrc code) {
    const auto text = [&arena](const char* characters) -> StringRecord* {
        return characters == nullptr ? nullptr : makeString(arena, characters);
    };
    auto* const error = arena.make<ErrorRecord>();
    *error = ErrorRecord{};
    static_cast<CMPIError&>(*error) = {error, &errorTable};
    error->arena = &arena;
    error->severity = severity;
    error->cause = cause;
    error->code = code;
    error->owner = text(owner);
    error->messageId = text(messageId);
    error->message = text(message);
    return error;
}

}  // namespace cimom::broker
