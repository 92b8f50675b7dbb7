#include <algorithm>
#include <array>
#include <string_view>

#include "providerutilities/ProviderUtilities.h"
#include "zrcommon/Strings.h"

namespace ZR {

namespace {

struct ClassIdentifier {
    std::string_view name;
    unsigned short id;
};

/// The numbering that all providers of the platform share.
constexpr std::array<ClassIdentifier, 14> classIdentifiers{{
    {"QVXZR_ComputerSystem", 1},
    {"QVXZR_DHCPProtocolEndpoint", 4},
    {"QVXZR_DHCPCapabilities", 5},
    {"QVXZR_DHCPElementCapabilities", 6},
    {"QVXZR_SAPSAPDependency", 8},
    {"QVXZR_IPProtocolEndpoint", 9},
    {"QVXZR_HostedDHCPPoint", 34},
    {"QVXZR_IPAssignmentSettingData", 66},
    {"QVXZR_DHCPRemoteServiceAccessPoint", 82},
    {"QVXZR_DHCPRemoteAccessAvailableToElement", 83},
    {"QVXZR_DHCPRemoteHostedAccessPoint", 84},
    {"QVXZR_DHCPSettingData", 85},
    {"QVXZR_DHCPElementSettingData", 86},
    {"QVXZR_DHCPOrderedComponent", 87},
}};

}  // namespace

unsigned short ProviderUtilities::getClassId(const char* className) {
    if (className == nullptr) {
        return unknownClass;
    }
    const auto* found = std::find_if(classIdentifiers.begin(), classIdentifiers.end(),
                                     [className](const ClassIdentifier& identifier) {
                                         return equalNames(identifier.name, className);
                                     });
    return found == classIdentifiers.end() ? unknownClass : found->id;
}

}  // namespace ZR
