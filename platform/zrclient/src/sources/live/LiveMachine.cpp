#include "LiveMachine.h"

#include <linux/if_arp.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <utility>

#include "Decide.h"
#include "Dhclient.h"
#include "IpmiDevice.h"
#include "Networkd.h"
#include "Processes.h"
#include "tklogger/TKLogger.h"
#include "zrclient/LiveSource.h"
#include "zrcommon/SystemName.h"

namespace ZR::Live {
namespace {

constexpr int errorLevel = 6000;

// Leaves time for the files, out of the 250 ms that a reading may take.
constexpr std::chrono::milliseconds kernelTime{150};

// Clients' own words name further places to look at, which in turn are to be
// watched before they are read.
constexpr int clientRounds = 3;

/// Who reads the traces of clients, in the order in which their claims are heard.
/// Processes go first: their arguments name files.
constexpr std::array clientReaders{readProcesses, readNetworkd, readDhclient};

std::vector<WatchedPlace> fixedPlaces(const Roots& roots) {
    std::vector<WatchedPlace> places{
        {.directory = roots.path(networkdLinksDirectory), .namePrefix = ""},
        {.directory = roots.path(networkdLeasesDirectory), .namePrefix = ""}};
    for (const DhclientDirectory& directory : dhclientDirectories) {
        places.push_back({.directory = roots.path(directory.path),
                          .namePrefix = std::string{dhclientNamePrefix}});
    }
    return places;
}

bool isCovered(const std::vector<WatchedPlace>& places, const WatchedPlace& wanted) {
    return std::any_of(places.begin(), places.end(),
                       [&](const WatchedPlace& place) { return place.covers(wanted); });
}

/// Adds what netlink does not tell. It makes a difference to the description only:
/// in a namespace of its own, this may be another machine's view of the name.
void markWireless(const Roots& roots, std::vector<Link>& links) {
    for (Link& link : links) {
        if (link.hasParentDevice && link.arphrdType == ARPHRD_ETHER && link.kind.empty()) {
            const std::string path = roots.path("/sys/class/net/") + link.name + "/phy80211";
            link.wireless = ::access(path.c_str(), F_OK) == 0;
        }
    }
}

void complainToLog(std::string_view message) {
    TKLog::TKLogger::logLevelMessage("zrclient/LiveMachine", "read", __LINE__, "ZR.Instrumentation",
                                     errorLevel, nullptr, 0, 0, message);
}

}  // namespace

LiveMachine::LiveMachine(Surroundings surroundings)
    : surroundings_(std::move(surroundings)),
      reader_(std::move(surroundings_.transport)),
      processor_(
          surroundings_.ipmi ? std::move(surroundings_.ipmi) : ipmiDevice(surroundings_.roots),
          surroundings_.uptime),
      places_(fixedPlaces(surroundings_.roots)) {
    if (!surroundings_.complain) {
        surroundings_.complain = complainToLog;
    }
}

bool LiveMachine::changed() {
    // Being asked is what moves the talk with the service processor on.
    return processor_.changed() || monitor_.changed();
}

std::shared_ptr<const Snapshot> LiveMachine::read() {
    std::vector<std::string> complaints;
    ClientFacts clients = readClients(complaints);
    NetworkState network = reader_.read(std::chrono::steady_clock::now() + kernelTime);
    std::move(network.complaints.begin(), network.complaints.end(), std::back_inserter(complaints));
    if (!network.certain) {
        monitor_.markChanged();
    }
    if (surroundings_.realProcesses) {
        watchProcesses(clients.processes);
    }
    markWireless(surroundings_.roots, network.links);
    std::optional<ServiceProcessor> processor = processor_.read(complaints);
    report(std::move(complaints));
    return decide({.hostName = getSystemName(),
                   .links = std::move(network.links),
                   .addresses = std::move(network.addresses),
                   .leases = std::move(clients.leases),
                   .managements = std::move(clients.managements),
                   .processes = std::move(clients.processes),
                   .serviceProcessor = std::move(processor)},
                  surroundings_.now());
}

/// A client that ends may leave everything else as it was.
void LiveMachine::watchProcesses(const std::vector<ClientProcess>& processes) {
    std::vector<std::int32_t> pids;
    pids.reserve(processes.size());
    for (const ClientProcess& process : processes) {
        pids.push_back(process.pid);
    }
    monitor_.watchProcesses(pids);
}

/// Watches first and reads then, until nothing was read that was not watched.
ClientFacts LiveMachine::readClients(std::vector<std::string>& complaints) {
    ClientFacts facts;
    for (int round = 0; round < clientRounds; ++round) {
        complaints.clear();
        monitor_.begin(places_, complaints);
        facts = {};
        for (const auto reader : clientReaders) {
            reader(surroundings_.roots, facts);
        }
        std::vector<WatchedPlace> wanted = fixedPlaces(surroundings_.roots);
        for (WatchedPlace& place : facts.places) {
            if (!isCovered(wanted, place)) {
                wanted.push_back(std::move(place));
            }
        }
        const bool watched =
            std::all_of(wanted.begin(), wanted.end(),
                        [&](const WatchedPlace& place) { return isCovered(places_, place); });
        places_ = std::move(wanted);
        if (watched) {
            std::move(facts.complaints.begin(), facts.complaints.end(),
                      std::back_inserter(complaints));
            return facts;
        }
    }
    monitor_.markChanged();
    std::move(facts.complaints.begin(), facts.complaints.end(), std::back_inserter(complaints));
    return facts;
}

/// Reports what the last reading did not complain about: a lasting trouble is one
/// line, however often the machine is read.
void LiveMachine::report(std::vector<std::string> complaints) {
    for (const std::string& complaint : complaints) {
        if (std::find(reported_.begin(), reported_.end(), complaint) == reported_.end()) {
            surroundings_.complain(complaint);
        }
    }
    reported_ = std::move(complaints);
}

}  // namespace ZR::Live

namespace ZR {

std::unique_ptr<SnapshotSource> openLiveSource() {
    return std::make_unique<Live::LiveMachine>(Live::Surroundings{});
}

}  // namespace ZR
