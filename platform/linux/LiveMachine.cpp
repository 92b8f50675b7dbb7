#include "LiveMachine.h"

#include <linux/if_arp.h>
#include <unistd.h>

#include <algorithm>
#include <iterator>
#include <unordered_set>
#include <utility>
#include <variant>

#include "Decide.h"
#include "clients/Clients.h"
#include "ipmi/IpmiDevice.h"
#include "kernel/Sockets.h"
#include "tklogger/TKLogger.h"
#include "zrclient/InstrumentationService.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/SystemName.h"
#include "zrlinux/LiveSource.h"

namespace ZR::Live {
namespace {

// What could not be read is tried again at the next request, and, when that was of no
// use, after so long: what is in the way may end without a sign.
constexpr std::chrono::seconds troublePause{1};

// Ten thousand links take a twentieth of it, but a machine that is busy with other things
// gives this process its time in small pieces: half an answer would be none.
constexpr std::chrono::seconds kernelTime{1};
constexpr std::chrono::milliseconds networkdTime{60};

// A networkd that did not answer is left alone for so long: it would cost every reading
// its time.
constexpr std::chrono::seconds networkdPause{30};

// Clients' own words name further places to look at, which in turn are to be
// watched before they are read.
constexpr int clientRounds = 3;

std::vector<WatchedPlace> fixedPlaces(const Roots& roots) {
    std::vector<WatchedPlace> places;
    for (const ClientSource& source : clientSources()) {
        for (const ClientPlace& place : source.places) {
            places.push_back({.directory = roots.path(place.directory),
                              .namePrefix = std::string{place.namePrefix}});
        }
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

/// Several readers may meet one obstacle.
void removeRepeated(std::vector<std::string>& complaints) {
    std::unordered_set<std::string> met;
    std::erase_if(complaints,
                  [&](const std::string& complaint) { return !met.insert(complaint).second; });
}

void complainToLog(std::string_view message) {
    TKLog::TKLogger::logLevelMessage("zrclient/LiveMachine", "read", __LINE__, "ZR.Instrumentation",
                                     LogLevel::failure, nullptr, 0, 0, message);
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
    return processor_.changed() || monitor_.changed() || socketsChanged() ||
           (troubled_ && surroundings_.uptime() >= troubleRest_);
}

/// Nothing tells when a socket is closed. Where it is all that was seen of a client, it is
/// looked at again with every question.
bool LiveMachine::socketsChanged() const {
    if (!sockets_) {
        return false;
    }
    ClientFacts now;
    readSockets(surroundings_.roots, now);
    return now.sockets != sockets_->sockets || now.packetLinks != sockets_->packetLinks;
}

bool LiveMachine::awaiting() {
    // Whether there is something new is for changed() to tell.
    static_cast<void>(processor_.changed());
    return processor_.awaiting();
}

std::shared_ptr<const Snapshot> LiveMachine::read() {
    try {
        return tryToRead();
    } catch (...) {
        // The changes that led here were taken note of, and not what they led to.
        monitor_.markChanged();
        throw;
    }
}

std::shared_ptr<const Snapshot> LiveMachine::tryToRead() {
    ClientFacts clients = readClients();
    consultNetworkd(clients);
    NetworkState network = reader_.read(std::chrono::steady_clock::now() + kernelTime);
    std::move(network.complaints.begin(), network.complaints.end(),
              std::back_inserter(clients.complaints));
    if (!network.certain) {
        monitor_.markChanged();
    }
    if (surroundings_.realProcesses) {
        watchProcesses(clients);
    }
    sockets_.reset();
    if (clients.socketsStandAlone()) {
        sockets_.emplace();
        sockets_->sockets = clients.sockets;
        sockets_->packetLinks = clients.packetLinks;
    }
    markWireless(surroundings_.roots, network.links);
    SystemName system = readSystemName();
    if (system.name.empty()) {
        clients.complaints.push_back(std::move(system.diagnostic));
    }
    planAnotherTry(clients.complaints);
    // The service processor is asked again at its own pace.
    std::optional<ServiceProcessor> processor = processor_.read(clients.complaints);
    removeRepeated(clients.complaints);
    report(clients.complaints);
    return decide({.hostName = std::move(system.name),
                   .links = std::move(network.links),
                   .addresses = std::move(network.addresses),
                   .clients = std::move(clients),
                   .serviceProcessor = std::move(processor)},
                  surroundings_.now(), surroundings_.explain);
}

/// Where networkd has links, asks it for what its files do not tell.
void LiveMachine::consultNetworkd(ClientFacts& clients) {
    const bool manages =
        std::any_of(clients.managements.begin(), clients.managements.end(),
                    [](const LinkConfiguration& each) { return each.client == Client::Networkd; });
    const auto now = surroundings_.uptime();
    if (!manages || !surroundings_.askNetworkd || now < networkdRest_) {
        return;
    }
    const NetworkdAnswer answer =
        surroundings_.askNetworkd(std::chrono::steady_clock::now() + networkdTime);
    if (!answer.reason.empty()) {
        clients.complaints.push_back(answer.reason);
        networkdRest_ = now + networkdPause;
        return;
    }
    if (answer.json.empty()) {
        return;
    }
    const auto parsed = parseNetworkdDescription(answer.json);
    if (const auto* const reason = std::get_if<std::string_view>(&parsed)) {
        clients.complaints.push_back("cannot use what systemd-networkd says: " +
                                     std::string{*reason});
        return;
    }
    addNetworkdDescription(std::get<std::vector<NetworkdAddress>>(parsed), clients);
}

/// A program that ends may leave everything else as it was.
void LiveMachine::watchProcesses(const ClientFacts& clients) {
    std::vector<std::int32_t> pids;
    pids.reserve(clients.processes.size() + clients.managers.size());
    for (const ClientProcess& process : clients.processes) {
        pids.push_back(process.pid);
    }
    for (const ManagerProcess& manager : clients.managers) {
        if (manager.where != ManagerProcess::Where::Elsewhere) {
            pids.push_back(manager.pid);
        }
    }
    monitor_.watchProcesses(pids);
}

/// Watches first and reads then, until nothing was read that was not watched.
ClientFacts LiveMachine::readClients() {
    ClientFacts facts;
    for (int round = 0; round < clientRounds; ++round) {
        facts = {};
        monitor_.begin(places_, facts.complaints);
        for (const ClientSource& source : clientSources()) {
            source.read(surroundings_.roots, facts);
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
            return facts;
        }
    }
    monitor_.markChanged();
    return facts;
}

/// What went wrong for the first time may be over at once.
void LiveMachine::planAnotherTry(const std::vector<std::string>& complaints) {
    const bool lasts =
        std::all_of(complaints.begin(), complaints.end(),
                    [&](const std::string& complaint) { return reported_.contains(complaint); });
    troubled_ = !complaints.empty();
    troubleRest_ = surroundings_.uptime();
    if (lasts) {
        troubleRest_ += troublePause;
    }
}

/// Reports what the last reading did not complain about: a lasting trouble is one
/// line, however often the machine is read.
void LiveMachine::report(const std::vector<std::string>& complaints) {
    for (const std::string& complaint : complaints) {
        if (!reported_.contains(complaint)) {
            surroundings_.complain(complaint);
        }
    }
    reported_ = {complaints.begin(), complaints.end()};
}

}  // namespace ZR::Live

namespace ZR {

void serveLiveMachine() noexcept {
    InstrumentationService::setMachine([] { return openLiveSource(); });
}

std::unique_ptr<SnapshotSource> openLiveSource(Explain explain) {
    Live::Surroundings surroundings;
    surroundings.explain = explain;
    return std::make_unique<Live::LiveMachine>(std::move(surroundings));
}

}  // namespace ZR
