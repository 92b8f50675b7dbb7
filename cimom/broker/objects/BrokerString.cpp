#include "broker/objects/BrokerString.h"

#include <cstring>

#include "broker/objects/BrokerStatus.h"
#include "cimom/Status.h"

namespace cimom::broker {

namespace {

bool isOurs(const CMPIString* string) noexcept {
    return string != nullptr && string->ft == &stringTable && string->hdl != nullptr;
}

CMPIStatus release(CMPIString* self) {
    if (!isOurs(self)) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    Arena* const arena = static_cast<StringRecord*>(self)->arena;
    if (arena != nullptr && arena->isRoot(self)) {
        const std::unique_ptr<Arena> ended(arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPIString* clone(const CMPIString* self, CMPIStatus* rc) {
    return guarded<CMPIString*>(rc, nullptr, [self](CMPIrc& code) -> CMPIString* {
        if (!isOurs(self)) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        StringRecord* const copy =
            makeString(*arena, static_cast<const StringRecord*>(self)->view());
        arena.release()->setRoot(copy);
        return copy;
    });
}

const char* getCharPtr(const CMPIString* self, CMPIStatus* rc) {
    if (!isOurs(self)) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    setStatus(rc, CMPI_RC_OK);
    return static_cast<const char*>(self->hdl);
}

}  // namespace

const CMPIStringFT stringTable{CMPIVersion200, release, clone, getCharPtr};

StringRecord* makeString(Arena& arena, std::string_view text) {
    // Record and text in one block.
    void* const memory = arena.allocate(sizeof(StringRecord) + text.size() + 1);
    char* const characters = static_cast<char*>(memory) + sizeof(StringRecord);
    if (!text.empty()) {
        std::memcpy(characters, text.data(), text.size());
    }
    characters[text.size()] = '\0';
    return ::new (memory) StringRecord{{characters, &stringTable}, &arena, text.size()};
}

StringRecord* stringIn(Arena& arena, const CMPIString& string) {
    if (isOurs(&string)) {
        const auto& record = static_cast<const StringRecord&>(string);
        if (record.arena == &arena) {
            // Strings never change, so that sharing cannot be noticed.
            // NOLINTNEXTLINE(cppcoreguidelines-pro-type-const-cast)
            return const_cast<StringRecord*>(&record);
        }
        return makeString(arena, record.view());
    }
    return makeString(arena, textOf(&string));
}

StringRecord* nameIn(Arena& arena, const NameKey& name) {
    StringRecord** const kept = arena.name(name.hash());
    if (kept == nullptr) {
        return makeString(arena, name.text());
    }
    // The hash is that of several cases, and slots are shared.
    if (*kept == nullptr || (*kept)->view() != name.text()) {
        *kept = makeString(arena, name.text());
    }
    return *kept;
}

StringRecord* emptyString() noexcept {
    static char nothing[1] = {'\0'};
    static StringRecord record{{static_cast<void*>(nothing), &stringTable}, nullptr, 0};
    return &record;
}

std::string_view textOf(const CMPIString* string) {
    if (string == nullptr || string->hdl == nullptr || string->ft == nullptr) {
        return {};
    }
    if (isOurs(string)) {
        return static_cast<const StringRecord*>(string)->view();
    }
    const char* const text =
        string->ft->getCharPtr == nullptr ? nullptr : string->ft->getCharPtr(string, nullptr);
    return text == nullptr ? std::string_view() : std::string_view(text);
}

}  // namespace cimom::broker
