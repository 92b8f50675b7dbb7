#include "clients/Clients.h"

#include <array>

#include "clients/Connman.h"
#include "clients/Dhclient.h"
#include "clients/Dhcpcd.h"
#include "clients/Ipconfig.h"
#include "clients/NetworkManager.h"
#include "clients/Networkd.h"
#include "clients/Processes.h"
#include "clients/Udhcpc.h"
#include "clients/Wicked.h"
#include "configuration/Ifcfg.h"
#include "configuration/Ifupdown.h"
#include "configuration/KernelBoot.h"
#include "configuration/Netplan.h"
#include "kernel/Sockets.h"

namespace ZR::Live {
namespace {

// Nothing tells of a process that starts; but most clients write its number before long.
constexpr std::string_view pidDirectory = "/run";

constexpr std::array networkdPlaces{ClientPlace{networkdLinksDirectory, ""},
                                    ClientPlace{networkdLeasesDirectory, ""}};
constexpr std::array networkManagerPlaces{
    ClientPlace{networkManagerDevices, ""}, ClientPlace{networkManagerState, "internal-"},
    ClientPlace{networkManagerProfiles[0], ""}, ClientPlace{networkManagerProfiles[1], ""},
    ClientPlace{networkManagerProfiles[2], ""}};
constexpr std::array wickedPlaces{ClientPlace{wickedDirectories[0], wickedLeasePrefix},
                                  ClientPlace{wickedDirectories[1], wickedLeasePrefix}};
constexpr std::array connmanPlaces{ClientPlace{connmanDirectory, ""}};
constexpr std::array dhclientPlaces{ClientPlace{dhclientDirectories[0].path, dhclientNamePrefix},
                                    ClientPlace{dhclientDirectories[1].path, dhclientNamePrefix},
                                    ClientPlace{dhclientDirectories[2].path, dhclientNamePrefix},
                                    ClientPlace{dracutDirectory, dracutPrefix},
                                    ClientPlace{pidDirectory, dhclientNamePrefix}};
constexpr std::array dhcpcdPlaces{
    ClientPlace{dhcpcdDirectories[0].path, dhcpcdDirectories[0].namePrefix},
    ClientPlace{dhcpcdDirectories[1].path, dhcpcdDirectories[1].namePrefix},
    ClientPlace{dhcpcdDirectories[2].path, dhcpcdDirectories[2].namePrefix},
    ClientPlace{"/run/dhcpcd", ""}};
constexpr std::array udhcpcPlaces{ClientPlace{udhcpcStateDirectory, udhcpcStatePrefix}};
constexpr std::array ipconfigPlaces{ClientPlace{ipconfigDirectory, ipconfigPrefix}};
constexpr std::array dhcp6cPlaces{ClientPlace{pidDirectory, "dhcp6c"}};
constexpr std::array netplanPlaces{ClientPlace{netplanDirectory, ""}};
constexpr std::array ifupdownPlaces{ClientPlace{ifupdownDirectory, ifupdownFile},
                                    ClientPlace{ifupdownStateDirectory, ifupdownStateFile}};
constexpr std::array ifcfgPlaces{ClientPlace{ifcfgDirectories[0], ifcfgPrefix},
                                 ClientPlace{ifcfgDirectories[1], ifcfgPrefix}};

// Managers before the clients that they may start, and those before what is left of
// the boot. The files of /proc cannot be watched.
constexpr std::array sources{
    ClientSource{readProcesses, dhcp6cPlaces},
    ClientSource{readNetworkd, networkdPlaces},
    ClientSource{readNetworkManager, networkManagerPlaces},
    ClientSource{readWicked, wickedPlaces},
    ClientSource{readConnman, connmanPlaces},
    ClientSource{readDhclient, dhclientPlaces},
    ClientSource{readDhcpcd, dhcpcdPlaces},
    ClientSource{readUdhcpc, udhcpcPlaces},
    ClientSource{readIpconfig, ipconfigPlaces},
    ClientSource{readKernelBoot, {}},
    ClientSource{readNetplan, netplanPlaces},
    ClientSource{readIfupdown, ifupdownPlaces},
    ClientSource{readIfcfg, ifcfgPlaces},
    ClientSource{readSockets, {}},
};

}  // namespace

std::span<const ClientSource> clientSources() noexcept {
    return sources;
}

}  // namespace ZR::Live
