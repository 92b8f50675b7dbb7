#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPRemoteServiceAccessPoint;

/// Walks the remote DHCP server access points of the machine: one record for each
/// server address of each network interface, in the order of the addresses. The
/// DHCP flag does not matter.
///
/// setFilter searches onward for an interface, but does not load its addresses:
/// until operator++ crosses to another interface, records have the name of the
/// interface found and the addresses of the one loaded before.
///
/// getName and getInfoFormat may be called only while the iterator is true. The
/// other getters, failures and threads are as with DHCPProtocolEndpoint.
class DHCPRemoteServiceAccessPoint {
  public:
    enum FilterType : unsigned int {
        FilterBySystemName = 0,
        FilterByName = 1,
    };

    /// A key that records must have. Types other than those above always hold.
    struct Filter {
        FilterType type;
        std::string reference;
    };

    DHCPRemoteServiceAccessPoint();
    ~DHCPRemoteServiceAccessPoint();
    DHCPRemoteServiceAccessPoint(const DHCPRemoteServiceAccessPoint&) = delete;
    DHCPRemoteServiceAccessPoint& operator=(const DHCPRemoteServiceAccessPoint&) = delete;

    void setFilter(FilterType type, const std::string& reference);
    /// Whether the address index stands on an address; the cursor does not matter.
    explicit operator bool() const;
    void operator++();
    /// Whether every filter holds for the present interface. A name filter never
    /// rejects an interface whose name has no "_".
    [[nodiscard]] bool evaluate() const;
    /// Whether there is a record to read where the iterator stands; moves nothing,
    /// and asks neither filters nor the DHCP flag.
    [[nodiscard]] bool isOnRecord() const { return addressIndex_ < serverAddresses_.size(); }

    /// The interface name and "_IPv4" or "_IPv6", by the present address.
    bool getName(std::string& value) const;
    /// The host name, also for an interface of the service processor. False when
    /// it cannot be had.
    bool getSystemName(std::string& value) const;
    bool getCreationClassName(std::string& value) const;
    bool getSystemCreationClassName(std::string& value) const;
    bool getElementName(std::string& value) const;
    /// The present address; false when there are none.
    bool getAccessInfo(std::string& value) const;
    bool getInfoFormat(unsigned short& value) const;
    bool getAccessContext(unsigned short& value) const;
    /// How many addresses the present interface has, not the rank of this one.
    [[nodiscard]] unsigned int getOrderOfAccess() const;

    // Not supported.
    bool getOtherAccessContext(std::string& value) const;

  private:
    void loadAddresses();
    [[nodiscard]] bool isIPv6() const;

    bool filtered_ = false;
    std::vector<Filter> filters_;
    std::vector<std::string> serverAddresses_;
    unsigned int addressIndex_ = 0;
    Instrumentation cursor_;
};

}  // namespace ZR::DHCPClientProvider
