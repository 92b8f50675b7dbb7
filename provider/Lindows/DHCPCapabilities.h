#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPCapabilities;

/// Walks the DHCP capabilities of the machine: one record for each network
/// interface whose DHCP flag is set. Used as DHCPProtocolEndpoint is, with one
/// difference: setFilter searches onward from where the cursor stands and never
/// goes back.
class DHCPCapabilities {
  public:
    enum FilterType : unsigned int {
        FilterByInstanceID = 0,
    };

    /// A key that records must have. Types other than those above always hold.
    struct Filter {
        FilterType type;
        std::string reference;
    };

    DHCPCapabilities();
    ~DHCPCapabilities();
    DHCPCapabilities(const DHCPCapabilities&) = delete;
    DHCPCapabilities& operator=(const DHCPCapabilities&) = delete;

    void setFilter(FilterType type, std::string reference);
    explicit operator bool();
    void operator++();
    [[nodiscard]] bool evaluate() const;
    /// Whether there is a record to read where the iterator stands; moves nothing,
    /// and asks neither filters nor the DHCP flag.
    [[nodiscard]] bool isOnRecord() const { return static_cast<bool>(cursor_); }

    /// The interface name, without a prefix. True also when it cannot be read.
    bool getInstanceID(std::string& value) const;
    bool getElementName(std::string& value) const;
    /// Appends to the output.
    bool getOptionsSupported(std::vector<unsigned short>& value) const;
    /// The low 16 bits of the length that the node tells.
    bool getMaxElementNameLen(unsigned short& value) const;
    bool getElementNameEditSupported(bool& value) const;

    // Not supported.
    bool getRequestedStatesSupported(std::vector<unsigned short>& value) const;
    bool getElementNameMask(std::string& value) const;
    bool getStateAwareness(std::vector<unsigned short>& value) const;

  private:
    bool filtered_ = false;
    std::vector<Filter> filters_;
    Instrumentation cursor_;
};

}  // namespace ZR::DHCPClientProvider
