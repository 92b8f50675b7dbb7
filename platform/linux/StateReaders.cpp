#include "StateReaders.h"

#include <sys/types.h>

#include <array>
#include <string>
#include <vector>

#include "clients/Connman.h"
#include "clients/Dhclient.h"
#include "clients/Dhcpcd.h"
#include "clients/Ipconfig.h"
#include "clients/NetworkManager.h"
#include "clients/Networkd.h"
#include "clients/Processes.h"
#include "clients/Udhcpc.h"
#include "clients/Wicked.h"
#include "configuration/ConfigurationFiles.h"
#include "kernel/Sockets.h"

namespace ZR::Live {
namespace {

// Nothing tells of a process that starts; but most clients write its number before long.
constexpr std::string_view pidDirectory = "/run";

constexpr std::array networkdPlaces{StatePlace{networkdLinksDirectory, ""},
                                    StatePlace{networkdLeasesDirectory, ""}};
constexpr std::array networkManagerPlaces{
    StatePlace{networkManagerDevices, ""}, StatePlace{networkManagerState, "internal-"},
    StatePlace{networkManagerProfiles[0], ""}, StatePlace{networkManagerProfiles[1], ""},
    StatePlace{networkManagerProfiles[2], ""}};
constexpr std::array wickedPlaces{StatePlace{wickedDirectories[0], wickedLeasePrefix},
                                  StatePlace{wickedDirectories[1], wickedLeasePrefix}};
constexpr std::array connmanPlaces{
    StatePlace{connmanDirectory, ""},
    StatePlace{connmanConfigurationDirectory, connmanConfigurationFile}};
constexpr std::array dhclientPlaces{StatePlace{dhclientDirectories[0].path, dhclientNamePrefix},
                                    StatePlace{dhclientDirectories[1].path, dhclientNamePrefix},
                                    StatePlace{dhclientDirectories[2].path, dhclientNamePrefix},
                                    StatePlace{dracutDirectory, dracutPrefix},
                                    StatePlace{pidDirectory, dhclientNamePrefix}};
constexpr std::array dhcpcdPlaces{
    StatePlace{dhcpcdDirectories[0].path, dhcpcdDirectories[0].namePrefix},
    StatePlace{dhcpcdDirectories[1].path, dhcpcdDirectories[1].namePrefix},
    StatePlace{dhcpcdDirectories[2].path, dhcpcdDirectories[2].namePrefix},
    StatePlace{"/run/dhcpcd", ""}};
constexpr std::array udhcpcPlaces{StatePlace{udhcpcStateDirectory, udhcpcStatePrefix}};
constexpr std::array ipconfigPlaces{StatePlace{ipconfigDirectory, ipconfigPrefix}};
constexpr std::array dhcp6cPlaces{StatePlace{pidDirectory, "dhcp6c"}};
constexpr std::array netplanPlaces{StatePlace{netplanDirectory, ""}};
// A file names the further directory. Were it not watched from the start, a first
// reading would have to read everything once more.
constexpr std::array ifupdownPlaces{StatePlace{ifupdownDirectory, ifupdownFile},
                                    StatePlace{ifupdownFurtherDirectory, ""},
                                    StatePlace{ifupdownStateDirectory, ifupdownStateFile}};
constexpr std::array ifcfgPlaces{StatePlace{ifcfgDirectories[0], ifcfgPrefix},
                                 StatePlace{ifcfgDirectories[1], ifcfgPrefix}};

/// What reads the state of a program; null where the build is without it.
template <Client client>
constexpr decltype(StateReader::read) readerOf() {
    if constexpr (!isBuilt(client)) {
        return nullptr;
    } else if constexpr (client == Client::Networkd) {
        return readNetworkd;
    } else if constexpr (client == Client::NetworkManager) {
        return readNetworkManager;
    } else if constexpr (client == Client::Wicked) {
        return readWicked;
    } else if constexpr (client == Client::Connman) {
        return readConnman;
    } else if constexpr (client == Client::Dhclient) {
        return readDhclient;
    } else if constexpr (client == Client::Dhcpcd) {
        return readDhcpcd;
    } else if constexpr (client == Client::Udhcpc) {
        return readUdhcpc;
    } else if constexpr (client == Client::Ipconfig) {
        return readIpconfig;
    } else if constexpr (client == Client::KernelBoot) {
        return readKernelBoot;
    } else if constexpr (client == Client::Netplan) {
        return readNetplan;
    } else if constexpr (client == Client::Ifupdown) {
        return readIfupdown;
    } else {
        static_assert(client == Client::Ifcfg);
        return readIfcfg;
    }
}

template <Client client>
constexpr StateReader rowOf(std::span<const StatePlace> places) {
    return {readerOf<client>(), places, client};
}

// Managers before the clients that they may start, and those before what is left of
// the boot. The files of /proc cannot be watched.
constexpr std::array readers{
    StateReader{readProcesses, dhcp6cPlaces},
    rowOf<Client::Networkd>(networkdPlaces),
    rowOf<Client::NetworkManager>(networkManagerPlaces),
    rowOf<Client::Wicked>(wickedPlaces),
    rowOf<Client::Connman>(connmanPlaces),
    rowOf<Client::Dhclient>(dhclientPlaces),
    rowOf<Client::Dhcpcd>(dhcpcdPlaces),
    rowOf<Client::Udhcpc>(udhcpcPlaces),
    rowOf<Client::Ipconfig>(ipconfigPlaces),
    rowOf<Client::KernelBoot>({}),
    rowOf<Client::Netplan>(netplanPlaces),
    rowOf<Client::Ifupdown>(ifupdownPlaces),
    rowOf<Client::Ifcfg>(ifcfgPlaces),
    StateReader{readClientSockets, {}},
};

/// A file that lies in one of the places; empty without one. What cannot be listed is as if it
/// were not there: nothing in it would be read.
std::string findFile(std::span<const StatePlace> places, const Roots& roots) {
    std::vector<Diagnostic> ignored;
    for (const StatePlace& place : places) {
        const std::string directory = roots.path(place.directory);
        for (const std::string& name : listOptionalDirectory(directory, ignored)) {
            if (name.starts_with(place.namePrefix)) {
                return pathIn(directory, name);
            }
        }
    }
    return {};
}

}  // namespace

void readState(const StateReader& reader, const Roots& roots, ClientFacts& facts) {
    if (reader.read != nullptr) {
        reader.read(roots, facts);
        return;
    }
    const std::string file = findFile(reader.places, roots);
    if (!file.empty()) {
        facts.diagnostics.emplace_back("this build does not read what is of " +
                                           std::string{nameOf(*reader.client)} + ", and there is " +
                                           file,
                                       Diagnostic::Kind::Note);
    }
}

void readClientSockets(const Roots& roots, ClientFacts& facts) {
    std::vector<uid_t> users;
    for (const ClientProcess& process : facts.processes) {
        users.push_back(process.user);
    }
    for (const ManagerProcess& manager : facts.managers) {
        if (manager.where != ManagerProcess::Where::Elsewhere) {
            users.push_back(manager.user);
        }
    }
    facts.sockets = readSockets(roots, facts.diagnostics, users);
}

std::span<const StateReader> stateReaders() noexcept {
    return readers;
}

}  // namespace ZR::Live
