#include "ProfileObjects.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

#include "MachineObjects.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientExtensions {

namespace {

constexpr const char* profileId = "QVXZR:DHCP Client";

/// As the registration has it.
constexpr const char* endpointNamespace = "root/cimv2";

/// What object managers call theirs, the most usual name first.
constexpr std::array interopNamespaces{"root/interop", "interop", "root/PG_InterOp"};

bool isInterop(std::string_view nameSpace) {
    return std::any_of(interopNamespaces.begin(), interopNamespaces.end(),
                       [nameSpace](const char* each) { return equalNames(each, nameSpace); });
}

ObjectName profileIn(const char* nameSpace) {
    return {profileClass, {{"InstanceID", profileId}}, nameSpace};
}

/// The namespace in which the object manager has the profile.
const char* interopNamespaceOf(const Request& request) {
    for (const char* each : interopNamespaces) {
        CMPIStatus status{CMPI_RC_OK, nullptr};
        const CMPIInstance* profile = request.broker->bft->getInstance(
            request.broker, request.context, makePath(request.broker, each, profileIn(each)),
            nullptr, &status);
        if (status.rc == CMPI_RC_OK && profile != nullptr) {
            return each;
        }
    }
    return interopNamespaces.front();
}

}  // namespace

std::vector<ExtensionObject> profileObjects(const Snapshot& /*machine*/) {
    using Numbers = std::vector<unsigned short>;
    constexpr std::uint64_t profile = 2;
    constexpr std::uint64_t dmtf = 2;
    constexpr unsigned short notAdvertised = 2;
    return {{profileClass,
             profileId,
             {{"ElementName", CMPI_string, std::string("DHCP Client Profile")},
              {"SpecificationType", CMPI_uint16, profile},
              {"RegisteredOrganization", CMPI_uint16, dmtf},
              {"RegisteredName", CMPI_string, std::string("DHCP Client")},
              {"RegisteredVersion", CMPI_string, std::string("1.0.4")},
              {"AdvertiseTypes", CMPI_uint16A, Numbers{notAdvertised}}}}};
}

std::vector<Link> profileLinks(const Request& request) {
    const bool fromInterop = isInterop(request.nameSpace);
    const ObjectName profile =
        profileIn(fromInterop ? request.nameSpace.c_str() : interopNamespaceOf(request));
    std::vector<Link> links;
    for (ObjectName& endpoint : endpointNames(*request.machine)) {
        endpoint.nameSpace = fromInterop ? endpointNamespace : request.nameSpace;
        links.push_back({profile, std::move(endpoint)});
    }
    return links;
}

}  // namespace ZR::DHCPClientExtensions
