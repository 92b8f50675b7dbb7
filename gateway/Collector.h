#pragma once

#include <cmpift.h>

#include <vector>

namespace ZR::DHCPClientGateway {

/// A result that keeps what a provider hands over. The objects belong to the object
/// manager, and live as long as the request. Used by one thread.
class Collector {
  public:
    Collector();
    Collector(const Collector&) = delete;
    Collector& operator=(const Collector&) = delete;

    /// Lives as long as the collector.
    [[nodiscard]] const CMPIResult* record() const noexcept { return &record_; }

    [[nodiscard]] const std::vector<const CMPIObjectPath*>& paths() const noexcept {
        return paths_;
    }
    [[nodiscard]] const std::vector<const CMPIInstance*>& instances() const noexcept {
        return instances_;
    }

  private:
    struct Slots;

    CMPIResult record_;
    std::vector<const CMPIObjectPath*> paths_;
    std::vector<const CMPIInstance*> instances_;
};

}  // namespace ZR::DHCPClientGateway
