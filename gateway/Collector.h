#pragma once

#include <cmpift.h>

#include <exception>
#include <functional>

namespace ZR::DHCPClientGateway {

/// A result for a provider of this library, which hands on what it is given. The objects
/// belong to the object manager, and live as long as the request. Used by one thread.
class Collector {
  public:
    /// Takes a path, or an instance; the other one is null.
    using Take = std::function<void(const CMPIObjectPath* path, const CMPIInstance* instance)>;

    explicit Collector(Take take);
    Collector(const Collector&) = delete;
    Collector& operator=(const Collector&) = delete;

    /// Lives as long as the collector.
    [[nodiscard]] const CMPIResult* record() const noexcept { return &record_; }

    /// Throws what Take threw first, which does not pass through the provider. It was not
    /// called again after that.
    void rethrow() const;

  private:
    struct Slots;

    CMPIResult record_;
    Take take_;
    std::exception_ptr thrown_;
};

}  // namespace ZR::DHCPClientGateway
