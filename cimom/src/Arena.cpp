#include "Arena.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

namespace cimom::broker {

namespace {

constexpr std::size_t largestChunk = std::size_t{1024} * 1024;
constexpr std::size_t cloneChunk = 512;

}  // namespace

// Chunks have no type, and no object of theirs is ever destroyed.
// NOLINTBEGIN(cppcoreguidelines-no-malloc)

Arena::~Arena() {
    while (chunks_ != nullptr) {
        Chunk* const previous = chunks_->previous;
        std::free(chunks_);
        chunks_ = previous;
    }
}

std::unique_ptr<Arena> Arena::forClone() {
    auto arena = std::make_unique<Arena>();
    arena->nextChunk_ = cloneChunk;
    arena->locked_ = true;
    return arena;
}

char* Arena::copyText(std::string_view text) {
    char* const copy = static_cast<char*>(allocate(text.size() + 1));
    if (!text.empty()) {
        std::memcpy(copy, text.data(), text.size());
    }
    copy[text.size()] = '\0';
    return copy;
}

void* Arena::grow(std::size_t bytes) {
    constexpr std::size_t header = (sizeof(Chunk) + alignment - 1) & ~(alignment - 1);
    if (bytes > static_cast<std::size_t>(-1) / 2) {
        throw std::bad_alloc();
    }
    const std::size_t size = std::max(nextChunk_, bytes + header);
    void* const memory = std::malloc(size);
    if (memory == nullptr) {
        throw std::bad_alloc();
    }
    chunks_ = ::new (memory) Chunk{chunks_};
    reserved_ += size;
    nextChunk_ = std::min(std::max(nextChunk_, size) * 2, largestChunk);
    std::byte* const first = static_cast<std::byte*>(memory) + header;
    next_ = first + bytes;
    end_ = static_cast<std::byte*>(memory) + size;
    return first;
}

// NOLINTEND(cppcoreguidelines-no-malloc)

}  // namespace cimom::broker
