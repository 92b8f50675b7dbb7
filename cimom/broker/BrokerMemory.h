#pragma once

#include <cmpift.h>

#include <cstddef>
#include <mutex>
#include <string_view>
#include <unordered_set>

namespace cimom::broker {

/// The blocks that a provider library got from cmpiMalloc and its sisters.
/// What it has not freed is freed when the pool ends. Safe for concurrent use.
class MemoryPool {
  public:
    MemoryPool() = default;
    ~MemoryPool();
    MemoryPool(const MemoryPool&) = delete;
    MemoryPool& operator=(const MemoryPool&) = delete;

    // As the functions of the C library; null when there is no memory.
    void* allocate(std::size_t bytes);
    void* allocateCleared(std::size_t count, std::size_t bytes);
    /// Null also for a block that is not of this pool.
    void* resize(void* block, std::size_t bytes);
    /// Does nothing for a block that is not of this pool.
    void free(void* block);

    [[nodiscard]] std::size_t blocks() const;

  private:
    void* keep(void* block);

    mutable std::mutex mutex_;
    std::unordered_set<void*> blocks_;
};

extern const CMPIBrokerMemFT memoryTable;

}  // namespace cimom::broker
