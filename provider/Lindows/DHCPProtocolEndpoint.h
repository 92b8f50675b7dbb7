#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPProtocolEndpoint;

/// Walks the DHCP protocol endpoints of the machine: one for each network
/// interface whose DHCP flag is set.
///
/// Construct; set a filter for each key that is known; then, while the iterator
/// is true, read the getters and step on. setFilter and operator++ apply the
/// filters, operator bool the DHCP flag: a name filter that stops on an interface
/// without DHCP thus yields the next one with it, whatever its name.
///
/// A getter returns false, and leaves its output as it was, when the property is
/// not supported. Nothing throws. Used by one thread.
class DHCPProtocolEndpoint {
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

    DHCPProtocolEndpoint();
    ~DHCPProtocolEndpoint();
    DHCPProtocolEndpoint(const DHCPProtocolEndpoint&) = delete;
    DHCPProtocolEndpoint& operator=(const DHCPProtocolEndpoint&) = delete;

    /// Adds a filter and goes back to the first interface for which all hold.
    void setFilter(FilterType type, std::string reference);

    /// Whether the iterator stands on an endpoint; skips interfaces without DHCP.
    explicit operator bool();
    void operator++();

    /// Whether every filter holds for the present interface.
    [[nodiscard]] bool evaluate() const;
    /// Whether there is a record to read where the iterator stands; moves nothing,
    /// and asks neither filters nor the DHCP flag.
    [[nodiscard]] bool isOnRecord() const { return static_cast<bool>(cursor_); }

    /// True also when the name cannot be read; the output is then as it was.
    bool getName(std::string& value) const;
    bool getElementName(std::string& value) const;
    /// False only when the host name cannot be had.
    bool getSystemName(std::string& value) const;
    bool getCreationClassName(std::string& value) const;
    bool getSystemCreationClassName(std::string& value) const;
    bool getDescription(std::string& value) const;
    bool getNameFormat(std::string& value) const;
    bool getOtherTypeDescription(std::string& value) const;
    bool getProtocolIFType(unsigned short& value) const;
    bool getRequestedState(unsigned short& value) const;
    /// True without a written output when the interface state cannot be read.
    bool getEnabledState(unsigned short& value) const;
    /// True without a written output when the enabled state tells nothing.
    bool getClientState(unsigned short& value) const;
    /// Appends to the output.
    bool getOptionsReceived(std::vector<unsigned short>& value) const;

    // Not supported.
    bool getCaption(std::string& value) const;
    bool getInstallDate(std::string& value) const;
    bool getStatusDescriptions(std::vector<std::string>& value) const;
    bool getHealthState(unsigned short& value) const;
    bool getPrimaryStatus(unsigned short& value) const;
    bool getDetailedStatus(unsigned short& value) const;
    bool getOperatingStatus(unsigned short& value) const;
    bool getCommunicationStatus(unsigned short& value) const;
    bool getOtherEnabledState(std::string& value) const;
    bool getEnabledDefault(unsigned short& value) const;
    bool getAvailableRequestedStates(std::vector<unsigned short>& value) const;
    bool getTransitioningToState(unsigned short& value) const;
    bool getOperationalStatus(std::vector<unsigned short>& value) const;
    bool getTimeOfLastStateChange(std::string& value) const;
    bool getBroadcastResetSupported(bool& value) const;
    bool getRenewalTime(unsigned int& value) const;
    bool getRebindingTime(unsigned int& value) const;
    bool getLeaseTime(unsigned int& value) const;
    bool getLeaseObtained(std::string& value) const;
    bool getLeaseExpires(std::string& value) const;

  private:
    bool filtered_ = false;
    std::vector<Filter> filters_;
    Instrumentation cursor_;
};

}  // namespace ZR::DHCPClientProvider
