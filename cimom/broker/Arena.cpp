#include "broker/Arena.h"

#include <sys/mman.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>

namespace cimom::broker {

namespace {

constexpr std::size_t largestChunk = std::size_t{1024} * 1024;
/// A request that needs more than some chunks up to this size gets the largest at once.
constexpr std::size_t largestSmallChunk = std::size_t{64} * 1024;
constexpr std::size_t cloneChunk = 512;
constexpr std::size_t fileChunk = std::size_t{512} * 1024;
/// What an arena has up to this size stays in memory: enough for a thousand instances,
/// which would cost a fifth more in a file.
constexpr std::size_t warm = std::size_t{4} * 1024 * 1024;

/// Chunks of the largest size that ended arenas have left for the next ones: getting new pages
/// from the system takes longer than filling them. So many at most stay with the process. Safe
/// for concurrent use.
class SpareChunks {
  public:
    /// Null when there is none.
    void* take() noexcept {
        const std::lock_guard lock(mutex_);
        return count_ == 0 ? nullptr : chunks_[--count_];
    }
    /// False when there is no room for it.
    bool keep(void* chunk) noexcept {
        const std::lock_guard lock(mutex_);
        if (count_ == most) {
            return false;
        }
        chunks_[count_++] = chunk;
        return true;
    }

  private:
#ifdef ZR_SANITIZERS
    // They are to see what a provider uses after its request.
    static constexpr std::size_t most = 0;
#else
    static constexpr std::size_t most = 6;
#endif
    std::mutex mutex_;
    std::array<void*, most + 1> chunks_{};
    std::size_t count_ = 0;
};

/// Without a destructor that does anything: arenas may end after it.
constinit SpareChunks spareChunks;

}  // namespace

// Chunks have no type, and no object of theirs is ever destroyed.
// NOLINTBEGIN(cppcoreguidelines-no-malloc)

Arena::~Arena() {
    while (chunks_ != nullptr) {
        Chunk* const previous = chunks_->previous;
        if (chunks_->mapped > 0) {
            ::munmap(chunks_, chunks_->mapped);
        } else if (chunks_->size != largestChunk || !spareChunks.keep(chunks_)) {
            std::free(chunks_);
        }
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
    if (bytes > largest || reserved_ > largest - bytes) {
        throw std::bad_alloc();
    }
    std::size_t size = std::max(nextChunk_, bytes + header);
    void* memory = nullptr;
    std::size_t mapped = 0;
    if (reserved_ >= warm && !locked_) {
        size = (bytes + header + fileChunk - 1) / fileChunk * fileChunk;
        memory = growInFile(size);
        mapped = memory == nullptr ? 0 : size;
    }
    if (memory == nullptr && size == largestChunk) {
        memory = spareChunks.take();
    }
    if (memory == nullptr) {
        memory = std::malloc(size);
    }
    if (memory == nullptr) {
        throw std::bad_alloc();
    }
    chunks_ = ::new (memory) Chunk{chunks_, mapped, size};
    reserved_ += size;
    nextChunk_ = std::max(nextChunk_, size) * 2;
    if (nextChunk_ > largestSmallChunk) {
        nextChunk_ = largestChunk;
    }
    std::byte* const first = static_cast<std::byte*>(memory) + header;
    next_ = first + bytes;
    end_ = static_cast<std::byte*>(memory) + size;
    return first;
}

// NOLINTEND(cppcoreguidelines-no-malloc)

void* Arena::growInFile(std::size_t size) noexcept {
    try {
        if (!file_) {
            file_ = std::make_unique<TemporaryFile>();
        }
    } catch (const std::exception&) {
        // Without a disk, memory is used.
        return nullptr;
    }
    void* const memory = file_->map(fileSize_, size);
    if (memory == nullptr) {
        return nullptr;
    }
    fileSize_ += size;
    // Pages that go come back from the file when they are used again; the advice to
    // let them go is not a promise, and nothing depends on it. The chunk before the last
    // goes: an object in the last one may still be written, and touching one page brings
    // its neighbours back as well.
    Chunk* const full = chunks_ == nullptr ? nullptr : chunks_->previous;
    if (full != nullptr && full->mapped > 0) {
        static_cast<void>(::madvise(full, full->mapped, MADV_DONTNEED));
    }
    return memory;
}

}  // namespace cimom::broker
