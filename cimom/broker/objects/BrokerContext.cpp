#include "broker/objects/BrokerRecords.h"

#include "broker/objects/BrokerStatus.h"

namespace cimom::broker {

namespace {

CMPIStatus release(CMPIContext* self) {
    ContextRecord* const context = contextOf(self);
    if (context == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (context->arena->isRoot(context)) {
        const std::unique_ptr<Arena> ended(context->arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPIContext* clone(const CMPIContext* self, CMPIStatus* rc) {
    return guarded<CMPIContext*>(rc, nullptr, [self](CMPIrc& code) -> CMPIContext* {
        const ContextRecord* const context = contextOf(self);
        if (context == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        auto* const copy = arena->make<ContextRecord>();
        *copy = ContextRecord{
            {copy, &contextTable}, arena.get(), context->entries.copyInto(*arena), context->depth};
        arena.release()->setRoot(copy);
        return copy;
    });
}

CMPIData getEntry(const CMPIContext* self, const char* name, CMPIStatus* rc) {
    const ContextRecord* const context = contextOf(self);
    if (context == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    return dataByName(context->entries, name, CMPI_goodValue, rc);
}

CMPIData getEntryAt(const CMPIContext* self, CMPICount index, CMPIString** name, CMPIStatus* rc) {
    const ContextRecord* const context = contextOf(self);
    if (context == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    return dataAt(context->entries, index, CMPI_goodValue, name, rc);
}

CMPICount getEntryCount(const CMPIContext* self, CMPIStatus* rc) {
    const ContextRecord* const context = contextOf(self);
    setStatus(rc, context == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return context == nullptr ? 0 : context->entries.size();
}

CMPIStatus addEntry(const CMPIContext* self, const char* name, const CMPIValue* value,
                    CMPIType type) {
    return guarded([=] {
        ContextRecord* const context = contextOf(self);
        if (context == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        if (name == nullptr) {
            return CMPI_RC_ERR_INVALID_PARAMETER;
        }
        CMPIData data{};
        const CMPIrc code = copyValue(*context->arena, value, type, data);
        if (code == CMPI_RC_OK) {
            context->entries.set(*context->arena, name, data);
        }
        return code;
    });
}

CMPIData textData(Arena& arena, std::string_view text) {
    CMPIData data{};
    data.type = CMPI_string;
    data.value.string = makeString(arena, text);
    return data;
}

}  // namespace

const CMPIContextFT contextTable{CMPIVersion200, release,       clone,   getEntry,
                                 getEntryAt,     getEntryCount, addEntry};

ContextRecord* contextOf(const CMPIContext* context) noexcept {
    return context != nullptr && context->ft == &contextTable
               ? static_cast<ContextRecord*>(context->hdl)
               : nullptr;
}

ContextRecord* makeContext(Arena& arena, std::string_view nameSpace, std::string_view principal,
                           CMPIFlags flags, unsigned depth) {
    auto* const context = arena.make<ContextRecord>();
    *context = ContextRecord{{context, &contextTable}, &arena, EntryList{}, depth};
    EntryList& entries = context->entries;
    entries.reserve(arena, 8);
    CMPIData flagData{};
    flagData.type = CMPI_uint32;
    flagData.value.uint32 = flags;
    entries.set(arena, CMPIInvocationFlags, flagData);
    entries.set(arena, CMPIInitNameSpace, textData(arena, nameSpace));
    entries.set(arena, CMPIPrincipal, textData(arena, principal));
    entries.set(arena, CMPIRole, textData(arena, ""));
    entries.set(arena, CMPIAcceptLanguage, textData(arena, ""));
    entries.set(arena, CMPIContentLanguage, textData(arena, ""));
    return context;
}

std::string principalOf(const CMPIContext* context) {
    const ContextRecord* const record = contextOf(context);
    const Entry* const entry = record == nullptr ? nullptr : record->entries.find(CMPIPrincipal);
    if (entry == nullptr || entry->data.type != CMPI_string ||
        (entry->data.state & CMPI_nullValue) != 0) {
        return {};
    }
    return std::string(textOf(entry->data.value.string));
}

}  // namespace cimom::broker
