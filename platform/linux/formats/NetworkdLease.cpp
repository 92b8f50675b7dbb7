#include "formats/NetworkdLease.h"

#include "formats/TimeSpan.h"
#include "zrcommon/PropertyFile.h"

namespace ZR::Live {

NetworkdLease parseNetworkdLease(std::string_view text) {
    NetworkdLease lease;
    for (const PropertyLine& line : parsePropertyLines(text)) {
        if (line.key == "ADDRESS") {
            lease.address = IpAddress::ipv4FromText(line.value);
        } else if (line.key == "SERVER_ADDRESS") {
            lease.server = IpAddress::ipv4FromText(line.value);
        } else if (line.key == "LIFETIME") {
            lease.lifetime = parseTimeSpan(line.value);
        }
    }
    return lease;
}

}  // namespace ZR::Live
