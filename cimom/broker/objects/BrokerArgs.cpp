#include "broker/objects/BrokerRecords.h"

#include "broker/objects/BrokerStatus.h"

namespace cimom::broker {

namespace {

CMPIStatus release(CMPIArgs* self) {
    ArgsRecord* const args = argsOf(self);
    if (args == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (args->arena->isRoot(args)) {
        const std::unique_ptr<Arena> ended(args->arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPIArgs* clone(const CMPIArgs* self, CMPIStatus* rc) {
    return guarded<CMPIArgs*>(rc, nullptr, [self](CMPIrc& code) -> CMPIArgs* {
        const ArgsRecord* const args = argsOf(self);
        if (args == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        ArgsRecord* const copy = makeArgs(*arena);
        copy->entries = args->entries.copyInto(*arena);
        arena.release()->setRoot(copy);
        return copy;
    });
}

CMPIStatus addArg(const CMPIArgs* self, const char* name, const CMPIValue* value, CMPIType type) {
    return guarded([=] {
        ArgsRecord* const args = argsOf(self);
        if (args == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        if (name == nullptr) {
            return CMPI_RC_ERR_INVALID_PARAMETER;
        }
        CMPIData data{};
        const CMPIrc code = copyValue(*args->arena, value, type, data);
        if (code == CMPI_RC_OK) {
            args->entries.set(*args->arena, name, data);
        }
        return code;
    });
}

CMPIData getArg(const CMPIArgs* self, const char* name, CMPIStatus* rc) {
    const ArgsRecord* const args = argsOf(self);
    if (args == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    return dataByName(args->entries, name, CMPI_goodValue, rc);
}

CMPIData getArgAt(const CMPIArgs* self, CMPICount index, CMPIString** name, CMPIStatus* rc) {
    const ArgsRecord* const args = argsOf(self);
    if (args == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    return dataAt(args->entries, index, CMPI_goodValue, name, rc);
}

CMPICount getArgCount(const CMPIArgs* self, CMPIStatus* rc) {
    const ArgsRecord* const args = argsOf(self);
    setStatus(rc, args == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return args == nullptr ? 0 : args->entries.size();
}

}  // namespace

const CMPIArgsFT argsTable{CMPIVersion200, release, clone, addArg, getArg, getArgAt, getArgCount};

ArgsRecord* argsOf(const CMPIArgs* args) noexcept {
    return args != nullptr && args->ft == &argsTable ? static_cast<ArgsRecord*>(args->hdl)
                                                     : nullptr;
}

ArgsRecord* makeArgs(Arena& arena) {
    auto* const args = arena.make<ArgsRecord>();
    *args = ArgsRecord{{args, &argsTable}, &arena, EntryList{}};
    return args;
}

}  // namespace cimom::broker
