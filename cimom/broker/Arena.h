#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <new>
#include <string_view>
#include <type_traits>
#include <utility>

#include "cimom/TemporaryFile.h"

namespace cimom::broker {

struct StringRecord;

/// Memory that only grows and is given back as a whole. Objects in it are never
/// destroyed one by one, so only trivially destructible types may live there.
///
/// A provider may go on using whatever it got until its request ends, also what it
/// has long handed over. What an arena has beyond some megabytes is therefore backed
/// by a temporary file, and leaves the process' memory while it is not used.
///
/// An arena of a request belongs to the thread that runs the request and takes
/// no lock. A clone has an arena of its own, whose root is the clone; it may
/// travel between threads, so its allocations are locked.
class Arena {
  public:
    Arena() = default;
    ~Arena();
    Arena(const Arena&) = delete;
    Arena& operator=(const Arena&) = delete;

    /// The arena of a clone: small first chunk, locked.
    static std::unique_ptr<Arena> forClone();

    /// At least `bytes` of memory, aligned for any type. Throws std::bad_alloc.
    void* allocate(std::size_t bytes) {
        if (locked_) {
            const std::lock_guard lock(mutex_);
            return bump(bytes);
        }
        return bump(bytes);
    }

    template <typename T, typename... Arguments>
    T* make(Arguments&&... arguments) {
        static_assert(std::is_trivially_destructible_v<T>);
        static_assert(alignof(T) <= alignment);
        return ::new (allocate(sizeof(T))) T{std::forward<Arguments>(arguments)...};
    }

    /// `count` value-initialised objects.
    template <typename T>
    T* makeMany(std::size_t count) {
        static_assert(std::is_trivially_destructible_v<T>);
        static_assert(alignof(T) <= alignment);
        constexpr std::size_t size =
            sizeof(T);  // NOLINT(bugprone-sizeof-expression): of pointers, too
        if (count > static_cast<std::size_t>(-1) / 2 / size) {
            throw std::bad_alloc();
        }
        T* const first = static_cast<T*>(allocate(count * size));
        std::uninitialized_value_construct_n(first, count);
        return first;
    }

    /// Where the string of a name with this hash is kept for the next object that has the name:
    /// null at first. Null when this arena keeps none, as those of clones do.
    StringRecord** name(std::uint64_t hash) {
        if (locked_) {
            return nullptr;
        }
        if (names_ == nullptr) {
            names_ = makeMany<StringRecord*>(nameSlots);
        }
        return &names_[hash % nameSlots];
    }

    /// A copy of the text with a zero byte behind it.
    char* copyText(std::string_view text);

    /// Whether the object is the clone that owns this arena.
    [[nodiscard]] bool isRoot(const void* object) const noexcept { return root_ == object; }
    void setRoot(const void* object) noexcept { root_ = object; }

    /// Bytes taken from the system so far.
    [[nodiscard]] std::size_t reserved() const noexcept { return reserved_; }

    /// What one arena may take in all: a provider that makes objects for ever must
    /// not fill the disk.
    static constexpr std::size_t largest = std::size_t{1} << 31U;

  private:
    static constexpr std::size_t alignment = alignof(std::max_align_t);
    static constexpr std::size_t nameSlots = 128;
    struct Chunk {
        Chunk* previous;
        std::size_t mapped;  ///< bytes of the file; 0: memory of its own
        std::size_t size;
    };

    void* bump(std::size_t bytes) {
        const std::size_t rounded = (bytes + (alignment - 1)) & ~(alignment - 1);
        if (rounded > static_cast<std::size_t>(end_ - next_)) {
            return grow(rounded);
        }
        void* const memory = next_;
        next_ += rounded;
        return memory;
    }
    void* grow(std::size_t bytes);
    /// A chunk in the file; null when there is no room for it.
    void* growInFile(std::size_t size) noexcept;

    std::byte* next_ = nullptr;
    std::byte* end_ = nullptr;
    Chunk* chunks_ = nullptr;
    StringRecord** names_ = nullptr;
    std::size_t nextChunk_ = std::size_t{16} * 1024;
    std::size_t reserved_ = 0;
    const void* root_ = nullptr;
    std::unique_ptr<TemporaryFile> file_;
    std::size_t fileSize_ = 0;
    bool locked_ = false;
    std::mutex mutex_;
};

}  // namespace cimom::broker
