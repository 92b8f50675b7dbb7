#include "Lindows/DHCPSettingData.h"

#include "Lindows/ConfigurationFile.h"
#include "Lindows/ElementIteration.h"
#include "zrcommon/File.h"
#include "zrcommon/InterfaceFile.h"
#include "zrcommon/PlatformUtilities.h"
#include "zrcommon/PropertyFile.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientProvider {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

const std::string loggerDHCPSettingData = loggerCategory;

namespace {

const TraceSource source{"Lindows/DHCPSettingData", loggerDHCPSettingData};

constexpr const char* configurationNameKey = InterfaceFile::configurationName;

/// The path of an interface's file, traced; empty when the name can name none,
/// which is told in a failure line.
std::string tracedFileName(const std::string& interfaceName, const TracePoint& at) {
    std::string path = configurationFilePath(PlatformUtilities::getKestraDataDir(), interfaceName);
    traceVariable(at, "l_cFileName", path);
    if (path.empty()) {
        traceMessage(at, "The interface name cannot name a configuration file");
    }
    return path;
}

}  // namespace

DHCPSettingData::DHCPSettingData() {
    const TraceScope scope(ZR_HERE);
    cursor_.selectNode(NodeType::NetworkInterface);
}

DHCPSettingData::~DHCPSettingData() {
    const TraceScope scope(ZR_HERE);
}

void DHCPSettingData::setFilter(FilterType type, const std::string& reference) {
    const ParameterScope scope(ZR_HERE, " filterType=", &type, " reference=", reference);
    addFilter(filtered_, filters_, type, reference);
    searchOnward(cursor_, *this);
}

DHCPSettingData::operator bool() const {
    const TraceScope scope(ZR_HERE);
    return static_cast<bool>(cursor_);
}

void DHCPSettingData::operator++() {
    const TraceScope scope(ZR_HERE);
    stepOnward(cursor_, filtered_, *this);
}

bool DHCPSettingData::evaluate() const {
    const TraceScope scope(ZR_HERE);
    return holdsByInstanceID(filters_, *this, FilterByInstanceID, ZR_HERE);
}

bool DHCPSettingData::getInstanceID(std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    std::string name;
    getElementName(name);
    const std::string description = readSystemDescription(cursor_, ZR_HERE, "systemNode");
    value = description == NodeLexicon::serviceProcessorDescription ? description
                                                                    : NodeLexicon::hostDescription;
    value += '%';
    value += name;
    return true;
}

bool DHCPSettingData::getElementName(std::string& value) const {
    fromNode(ZR_HERE, cursor_, Properties::Name, value);
    return true;
}

bool DHCPSettingData::getConfigurationName(std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", &value);
    std::string name;
    getElementName(name);
    const std::string path = tracedFileName(name, ZR_HERE);
    if (path.empty() || !File::exists(make_wstring(path))) {
        return true;
    }
    PropertyFile file{File::Path(path)};
    // A file that cannot be read has no keys; the name is then empty.
    file.open(PropertyFile::readMode);
    value = make_string(file.getValue(make_wstring(configurationNameKey)));
    file.close();
    return true;
}

bool DHCPSettingData::setConfigurationName(const std::string& value) const {
    const ParameterScope scope(ZR_HERE, " value=", value);
    std::string name;
    getElementName(name);
    const std::string path = tracedFileName(name, ZR_HERE);
    if (!path.empty()) {
        modifyValue(path, configurationNameKey, value);
    }
    return true;
}

bool DHCPSettingData::getAddressOrigin(unsigned short& value) const {
    constexpr unsigned short dhcp = 4;
    return constant(ZR_HERE, value, dhcp);
}

bool DHCPSettingData::getRequestedIPv4Address(std::string& value) const {
    return fromNode(ZR_HERE, cursor_, Properties::IPv4Address, value);
}

bool DHCPSettingData::getClientIdentifier(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPSettingData::getVendorClassIdentifier(std::string& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPSettingData::getRequestedLeaseTime(unsigned int& value) const {
    return unsupported(ZR_HERE, &value);
}

bool DHCPSettingData::getRequestedOptions(unsigned short& value) const {
    return unsupported(ZR_HERE, &value);
}

// The parameters are taken by value as the operation always has been.
// NOLINTNEXTLINE(performance-unnecessary-value-param)
void modifyValue(std::string path, std::string key, std::string value) {
    const ParameterScope scope(ZR_HERE, " path=", path, " key=", key, " value=", value);
    if (const auto reason = rewriteValue(path, key, value)) {
        traceMessage(ZR_HERE, reason->c_str());
    }
}

}  // namespace ZR::DHCPClientProvider

namespace ZR {

using DHCPClientProvider::source;

void stringTokenize(const std::string& text, std::vector<std::string>& tokens,
                    const std::string& delimiters) {
    const ParameterScope scope(ZR_HERE, " text=", text, " tokens=", &tokens,
                               " delimiters=", delimiters);
    std::size_t start = text.find_first_not_of(delimiters);
    while (start != std::string::npos) {
        const std::size_t end = text.find_first_of(delimiters, start);
        tokens.push_back(text.substr(start, end - start));
        start = text.find_first_not_of(delimiters, end);
    }
}

}  // namespace ZR
