#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"

namespace ZR {

/// Splits a text at every character of `delimiters` and appends the pieces to
/// `tokens`. Runs of delimiters count as one, and those at the ends do not count: a
/// piece is never empty.
void stringTokenize(const std::string& text, std::vector<std::string>& tokens,
                    const std::string& delimiters);

}  // namespace ZR

namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPSettingData;

/// Walks the DHCP setting data of the machine: one record for each network
/// interface, whether it uses DHCP or not. setFilter searches onward from where
/// the cursor stands and never goes back. Otherwise used as DHCPProtocolEndpoint is.
class DHCPSettingData {
  public:
    enum FilterType : unsigned int {
        FilterByInstanceID = 0,
    };

    /// A key that records must have. Types other than those above always hold.
    struct Filter {
        FilterType type;
        std::string reference;
    };

    DHCPSettingData();
    ~DHCPSettingData();
    DHCPSettingData(const DHCPSettingData&) = delete;
    DHCPSettingData& operator=(const DHCPSettingData&) = delete;

    void setFilter(FilterType type, const std::string& reference);
    explicit operator bool() const;
    void operator++();
    [[nodiscard]] bool evaluate() const;
    /// Whether there is a record to read where the iterator stands; moves nothing,
    /// and asks neither filters nor the DHCP flag.
    [[nodiscard]] bool isOnRecord() const { return static_cast<bool>(cursor_); }

    /// "BMC%" or "Computer%", and the interface name.
    bool getInstanceID(std::string& value) const;
    /// The interface name. True also when it cannot be read.
    bool getElementName(std::string& value) const;
    /// The configuration name in the interface's file. Always true; the output is
    /// left as it was when there is no file.
    bool getConfigurationName(std::string& value) const;
    /// Writes the configuration name into the interface's file, if there is one.
    /// Always true, whatever happened.
    [[nodiscard]] bool setConfigurationName(const std::string& value) const;
    bool getAddressOrigin(unsigned short& value) const;
    bool getRequestedIPv4Address(std::string& value) const;

    // Not supported.
    bool getClientIdentifier(std::string& value) const;
    bool getVendorClassIdentifier(std::string& value) const;
    bool getRequestedLeaseTime(unsigned int& value) const;
    bool getRequestedOptions(unsigned short& value) const;

  private:
    bool filtered_ = false;
    std::vector<Filter> filters_;
    Instrumentation cursor_;
};

/// Gives a key of a configuration file a new value, as rewriteValue does. Why it could
/// not is told in a failure line, and nowhere else.
void modifyValue(std::string path, std::string key, std::string value);

}  // namespace ZR::DHCPClientProvider
