#include "broker/BrokerMemory.h"

#include <cstdlib>
#include <cstring>

#include "broker/Broker.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerStatus.h"

namespace cimom::broker {

// Providers allocate here as they would with malloc(), and may resize what they have.
// NOLINTBEGIN(cppcoreguidelines-no-malloc)

MemoryPool::~MemoryPool() {
    for (void* const block : blocks_) {
        std::free(block);
    }
}

void* MemoryPool::keep(void* block) {
    if (block == nullptr) {
        return nullptr;
    }
    try {
        const std::lock_guard lock(mutex_);
        blocks_.insert(block);
        return block;
    } catch (const std::bad_alloc&) {
        std::free(block);
        return nullptr;
    }
}

void* MemoryPool::allocate(std::size_t bytes) {
    // A block of no bytes is a block too, and null would mean a lack of memory.
    return keep(std::malloc(bytes == 0 ? 1 : bytes));
}

void* MemoryPool::allocateCleared(std::size_t count, std::size_t bytes) {
    if (bytes != 0 && count > static_cast<std::size_t>(-1) / bytes) {
        return nullptr;
    }
    const std::size_t all = count * bytes;
    return keep(std::calloc(all == 0 ? 1 : all, 1));
}

void* MemoryPool::resize(void* block, std::size_t bytes) {
    if (block == nullptr) {
        return allocate(bytes);
    }
    const std::lock_guard lock(mutex_);
    auto node = blocks_.extract(block);
    if (node.empty()) {
        return nullptr;
    }
    void* const resized = std::realloc(block, bytes == 0 ? 1 : bytes);
    if (resized != nullptr) {
        node.value() = resized;
    }
    blocks_.insert(std::move(node));
    return resized;
}

void MemoryPool::free(void* block) {
    const std::lock_guard lock(mutex_);
    if (blocks_.erase(block) == 1) {
        std::free(block);
    }
}

// NOLINTEND(cppcoreguidelines-no-malloc)

std::size_t MemoryPool::blocks() const {
    const std::lock_guard lock(mutex_);
    return blocks_.size();
}

namespace {

CMPIGcStat* mark(const CMPIBroker* mb, CMPIStatus* rc) {
    return guarded<CMPIGcStat*>(rc, nullptr, [mb](CMPIrc& code) -> CMPIGcStat* {
        if (Broker::of(mb) == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        // The mark is opaque to the provider, which only gives it back.
        // NOLINTNEXTLINE(cppcoreguidelines-pro-type-const-cast)
        return const_cast<void*>(RequestScope::current().mark());
    });
}

CMPIStatus release(const CMPIBroker* mb, const CMPIGcStat* level) {
    return guarded([=] {
        const bool known = Broker::of(mb) != nullptr && RequestScope::current().release(level);
        return known ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE;
    });
}

void* cmpiMalloc(const CMPIBroker* mb, std::size_t size) {
    Broker* const broker = Broker::of(mb);
    return broker == nullptr ? nullptr : broker->memory().allocate(size);
}

void* cmpiCalloc(const CMPIBroker* mb, std::size_t count, std::size_t size) {
    Broker* const broker = Broker::of(mb);
    return broker == nullptr ? nullptr : broker->memory().allocateCleared(count, size);
}

void* cmpiRealloc(const CMPIBroker* mb, void* block, std::size_t size) {
    Broker* const broker = Broker::of(mb);
    return broker == nullptr ? nullptr : broker->memory().resize(block, size);
}

char* cmpiStrDup(const CMPIBroker* mb, const char* text) {
    Broker* const broker = Broker::of(mb);
    if (broker == nullptr || text == nullptr) {
        return nullptr;
    }
    const std::size_t size = std::strlen(text) + 1;
    void* const copy = broker->memory().allocate(size);
    if (copy != nullptr) {
        std::memcpy(copy, text, size);
    }
    return static_cast<char*>(copy);
}

void cmpiFree(const CMPIBroker* mb, void* block) {
    if (Broker* const broker = Broker::of(mb); broker != nullptr && block != nullptr) {
        broker->memory().free(block);
    }
}

/// Objects go with their level or request, so there is nothing to do early; a
/// clone, which this function is not for, stays valid.
template <typename Object>
void leaveToRequest(const CMPIBroker*, Object*) {}

}  // namespace

const CMPIBrokerMemFT memoryTable{CMPIVersion200,
                                  mark,
                                  release,
                                  cmpiMalloc,
                                  cmpiCalloc,
                                  cmpiRealloc,
                                  cmpiStrDup,
                                  cmpiFree,
                                  leaveToRequest<CMPIInstance>,
                                  leaveToRequest<CMPIObjectPath>,
                                  leaveToRequest<CMPIArgs>,
                                  leaveToRequest<CMPIString>,
                                  leaveToRequest<CMPIArray>,
                                  leaveToRequest<CMPIDateTime>,
                                  leaveToRequest<CMPISelectExp>};

}  // namespace cimom::broker
