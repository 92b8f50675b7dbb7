#include "kit/Allocations.h"

#include <atomic>
#include <cerrno>
#include <cstddef>
#include <cstdlib>
#include <new>
#include <utility>

#if defined(ZR_SANITIZERS)
#define ZR_OWNS_MALLOC 0
#else
#define ZR_OWNS_MALLOC 1
#endif

namespace ZR::Testing {
namespace {

std::atomic<std::int64_t> held{0};
// Plain, so that it is there from the first instruction of a thread to its last.
thread_local Allocations* watching = nullptr;

}  // namespace

Allocations::Allocations(const CallOrigin& origin, unsigned failing) noexcept
    : origin_(origin), failing_(failing) {
    watching = this;
}

Allocations::~Allocations() {
    watching = nullptr;
}

std::int64_t Allocations::blocksHeld() noexcept {
    return held.load();
}

bool Allocations::fails(const void* returnAddress) noexcept {
    // Taken away while it looks, should looking allocate.
    Allocations* const here = std::exchange(watching, nullptr);
    if (here == nullptr) {
        return false;
    }
    const bool counts = here->origin_.includes(returnAddress);
    watching = here;
    return counts && ++here->count_ == here->failing_;
}

}  // namespace ZR::Testing

namespace {

using ZR::Testing::Allocations;
using ZR::Testing::held;

void* keep(void* block) noexcept {
    if (block != nullptr) {
        held.fetch_add(1, std::memory_order_relaxed);
    }
    return block;
}

void drop(const void* block) noexcept {
    if (block != nullptr) {
        held.fetch_sub(1, std::memory_order_relaxed);
    }
}

}  // namespace

// These take the place of the C library's and the C++ library's functions in the whole
// process, and so have their names, their linkage and their plain pointers.
// NOLINTBEGIN
#define ZR_REPLACES extern "C" __attribute__((visibility("default")))

#if ZR_OWNS_MALLOC
extern "C" {
void* __libc_malloc(std::size_t size);
void* __libc_calloc(std::size_t count, std::size_t size);
void* __libc_realloc(void* block, std::size_t size);
void* __libc_memalign(std::size_t alignment, std::size_t size);
void __libc_free(void* block);
}

namespace {
bool refused(const void* returnAddress) {
    if (Allocations::fails(returnAddress)) {
        errno = ENOMEM;
        return true;
    }
    return false;
}
}  // namespace

ZR_REPLACES void* malloc(std::size_t size) {
    return refused(__builtin_return_address(0)) ? nullptr : keep(__libc_malloc(size));
}
ZR_REPLACES void* calloc(std::size_t count, std::size_t size) {
    return refused(__builtin_return_address(0)) ? nullptr : keep(__libc_calloc(count, size));
}
ZR_REPLACES void* realloc(void* block, std::size_t size) {
    if (refused(__builtin_return_address(0))) {
        return nullptr;
    }
    void* const resized = __libc_realloc(block, size);
    if (block == nullptr) {
        keep(resized);
    } else if (resized == nullptr && size == 0) {
        drop(block);
    }
    return resized;
}
ZR_REPLACES void free(void* block) {
    drop(block);
    __libc_free(block);
}
ZR_REPLACES void* memalign(std::size_t alignment, std::size_t size) {
    return keep(__libc_memalign(alignment, size));
}
ZR_REPLACES void* aligned_alloc(std::size_t alignment, std::size_t size) {
    return keep(__libc_memalign(alignment, size));
}
ZR_REPLACES int posix_memalign(void** block, std::size_t alignment, std::size_t size) {
    *block = keep(__libc_memalign(alignment, size));
    return *block == nullptr ? ENOMEM : 0;
}

#define ZR_TAKE(size) keep(__libc_malloc(size))
#define ZR_TAKE_ALIGNED(alignment, size) keep(__libc_memalign(alignment, size))
#define ZR_GIVE_BACK(block) (drop(block), __libc_free(block))
#else
#define ZR_TAKE(size) keep(std::malloc(size))
#define ZR_TAKE_ALIGNED(alignment, size) \
    keep(std::aligned_alloc(alignment, ((size) + (alignment)-1) / (alignment) * (alignment)))
#define ZR_GIVE_BACK(block) (drop(block), std::free(block))
#endif

namespace {
void* takeOrThrow(std::size_t size, const void* returnAddress) {
    void* const block = Allocations::fails(returnAddress) ? nullptr : ZR_TAKE(size == 0 ? 1 : size);
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    return block;
}
void* takeAlignedOrThrow(std::size_t size, std::align_val_t alignment, const void* returnAddress) {
    const auto boundary = static_cast<std::size_t>(alignment);
    void* const block = Allocations::fails(returnAddress)
                            ? nullptr
                            : ZR_TAKE_ALIGNED(boundary, size == 0 ? boundary : size);
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    return block;
}
}  // namespace

#define ZR_VISIBLE __attribute__((visibility("default")))

ZR_VISIBLE void* operator new(std::size_t size) {
    return takeOrThrow(size, __builtin_return_address(0));
}
ZR_VISIBLE void* operator new[](std::size_t size) {
    return takeOrThrow(size, __builtin_return_address(0));
}
ZR_VISIBLE void* operator new(std::size_t size, const std::nothrow_t& /*tag*/) noexcept {
    return Allocations::fails(__builtin_return_address(0)) ? nullptr : ZR_TAKE(size + 1);
}
ZR_VISIBLE void* operator new[](std::size_t size, const std::nothrow_t& /*tag*/) noexcept {
    return Allocations::fails(__builtin_return_address(0)) ? nullptr : ZR_TAKE(size + 1);
}
ZR_VISIBLE void* operator new(std::size_t size, std::align_val_t alignment) {
    return takeAlignedOrThrow(size, alignment, __builtin_return_address(0));
}
ZR_VISIBLE void* operator new[](std::size_t size, std::align_val_t alignment) {
    return takeAlignedOrThrow(size, alignment, __builtin_return_address(0));
}
ZR_VISIBLE void operator delete(void* block) noexcept {
    ZR_GIVE_BACK(block);
}
ZR_VISIBLE void operator delete[](void* block) noexcept {
    ZR_GIVE_BACK(block);
}
ZR_VISIBLE void operator delete(void* block, std::size_t /*size*/) noexcept {
    ZR_GIVE_BACK(block);
}
ZR_VISIBLE void operator delete[](void* block, std::size_t /*size*/) noexcept {
    ZR_GIVE_BACK(block);
}
ZR_VISIBLE void operator delete(void* block, const std::nothrow_t& /*tag*/) noexcept {
    ZR_GIVE_BACK(block);
}
ZR_VISIBLE void operator delete[](void* block, const std::nothrow_t& /*tag*/) noexcept {
    ZR_GIVE_BACK(block);
}
ZR_VISIBLE void operator delete(void* block, std::align_val_t /*alignment*/) noexcept {
    ZR_GIVE_BACK(block);
}
ZR_VISIBLE void operator delete[](void* block, std::align_val_t /*alignment*/) noexcept {
    ZR_GIVE_BACK(block);
}
ZR_VISIBLE void operator delete(void* block, std::size_t /*size*/,
                                std::align_val_t /*alignment*/) noexcept {
    ZR_GIVE_BACK(block);
}
ZR_VISIBLE void operator delete[](void* block, std::size_t /*size*/,
                                  std::align_val_t /*alignment*/) noexcept {
    ZR_GIVE_BACK(block);
}
// NOLINTEND
