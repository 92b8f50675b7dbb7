#include "broker/objects/BrokerRecords.h"

#include <chrono>

#include "broker/objects/BrokerStatus.h"
#include "cimom/Status.h"

namespace cimom::broker {

namespace {

DateTimeRecord* make(Arena& arena, const DateTime& value, std::string_view text) {
    auto* const record = arena.make<DateTimeRecord>();
    *record = DateTimeRecord{{record, &dateTimeTable}, &arena, value, makeString(arena, text)};
    return record;
}

CMPIStatus release(CMPIDateTime* self) {
    DateTimeRecord* const dateTime = dateTimeOf(self);
    if (dateTime == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (dateTime->arena->isRoot(dateTime)) {
        const std::unique_ptr<Arena> ended(dateTime->arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPIDateTime* clone(const CMPIDateTime* self, CMPIStatus* rc) {
    return guarded<CMPIDateTime*>(rc, nullptr, [self](CMPIrc& code) -> CMPIDateTime* {
        const DateTimeRecord* const dateTime = dateTimeOf(self);
        if (dateTime == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        DateTimeRecord* const copy = copyDateTime(*arena, *dateTime);
        arena.release()->setRoot(copy);
        return copy;
    });
}

CMPIUint64 getBinaryFormat(const CMPIDateTime* self, CMPIStatus* rc) {
    const DateTimeRecord* const dateTime = dateTimeOf(self);
    if (dateTime == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return 0;
    }
    if (dateTime->value.microseconds < 0) {
        // The binary form is unsigned and counts from 1970.
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return 0;
    }
    setStatus(rc, CMPI_RC_OK);
    return static_cast<CMPIUint64>(dateTime->value.microseconds);
}

CMPIString* getStringFormat(const CMPIDateTime* self, CMPIStatus* rc) {
    const DateTimeRecord* const dateTime = dateTimeOf(self);
    setStatus(rc, dateTime == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return dateTime == nullptr ? nullptr : dateTime->text;
}

CMPIBoolean isInterval(const CMPIDateTime* self, CMPIStatus* rc) {
    const DateTimeRecord* const dateTime = dateTimeOf(self);
    setStatus(rc, dateTime == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return dateTime != nullptr && dateTime->value.interval ? 1 : 0;
}

}  // namespace

const CMPIDateTimeFT dateTimeTable{CMPIVersion200,  release,         clone,
                                   getBinaryFormat, getStringFormat, isInterval};

DateTimeRecord* dateTimeOf(const CMPIDateTime* dateTime) noexcept {
    return dateTime != nullptr && dateTime->ft == &dateTimeTable
               ? static_cast<DateTimeRecord*>(dateTime->hdl)
               : nullptr;
}

DateTimeRecord* makeDateTime(Arena& arena, std::string_view text) {
    const auto value = parseDateTime(text);
    return value ? make(arena, *value, text) : nullptr;
}

DateTimeRecord* makeDateTime(Arena& arena, const DateTime& value) {
    const auto text = toText(value);
    return text ? make(arena, value, *text) : nullptr;
}

DateTimeRecord* makeDateTime(Arena& arena) {
    const auto now = std::chrono::system_clock::now().time_since_epoch();
    const auto microseconds = std::chrono::duration_cast<std::chrono::microseconds>(now).count();
    return makeDateTime(arena, DateTime{false, microseconds});
}

DateTimeRecord* copyDateTime(Arena& arena, const DateTimeRecord& dateTime) {
    return make(arena, dateTime.value, dateTime.text->view());
}

}  // namespace cimom::broker
