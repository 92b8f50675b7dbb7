#include "LiveMachine.h"

#include <linux/if_arp.h>
#include <unistd.h>

#include <algorithm>
#include <iterator>
#include <unordered_set>
#include <utility>

#include "Decide.h"
#include "StateReaders.h"
#include "formats/Files.h"
#include "formats/SystemErrors.h"
#include "ipmi/IpmiDevice.h"
#include "tklogger/TKLogger.h"
#include "zrclient/InstrumentationService.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/SystemName.h"
#include "zrlinux/LiveSource.h"

namespace ZR::Live {
namespace {

// What could not be read is tried again at the next request. When it fails again for the
// same reason, the next try comes after this time: nothing tells when the reason is gone.
constexpr std::chrono::seconds troublePause{1};

// Ten thousand links take a twentieth of it. A busy machine needs longer, and links that
// have come in part only are not shown.
constexpr std::chrono::seconds kernelTime{1};

// Files and command lines of clients name further files. Their directories are to be
// watched, too, before they are read, which takes another round.
constexpr int clientRounds = 3;

std::vector<WatchedPlace> fixedPlaces(const Roots& roots) {
    std::vector<WatchedPlace> places;
    for (const StateReader& reader : stateReaders()) {
        for (const StatePlace& place : reader.places) {
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

/// Adds what netlink does not tell. Only the description depends on it: in another network
/// namespace than that of /sys, the name there may be that of another link.
void markWireless(const Roots& roots, std::vector<Link>& links) {
    for (Link& link : links) {
        if (link.hasParentDevice && link.arphrdType == ARPHRD_ETHER && link.kind.empty()) {
            const std::string path =
                pathIn(pathIn(roots.path("/sys/class/net"), link.name.view()), "phy80211");
            link.wireless = ::access(path.c_str(), F_OK) == 0;
        }
    }
}

/// Several readers may report the same.
void removeRepeated(std::vector<Diagnostic>& diagnostics) {
    std::unordered_set<std::string> met;
    std::erase_if(diagnostics, [&](const Diagnostic& diagnostic) {
        return !met.insert(diagnostic.text).second;
    });
}

void reportToLog(std::string_view message) {
    TKLog::TKLogger::logLevelMessage("zrclient/LiveMachine", "read", __LINE__, "ZR.Instrumentation",
                                     LogLevel::failure, nullptr, 0, 0, message);
}

}  // namespace

LiveMachine::LiveMachine(Surroundings surroundings)
    : surroundings_(std::move(surroundings)),
      buses_(std::move(surroundings_.buses)),
      reader_(std::move(surroundings_.transport)),
      processor_(
          surroundings_.ipmi ? std::move(surroundings_.ipmi) : ipmiDevice(surroundings_.roots),
          surroundings_.uptime),
      places_(fixedPlaces(surroundings_.roots)) {
    if (!surroundings_.report) {
        surroundings_.report = reportToLog;
    }
}

bool LiveMachine::changed() {
    // The conversation with the service processor goes on only when this is called.
    return processor_.changed() || monitor_.changed() || socketsChanged() ||
           (troubled_ && surroundings_.uptime() >= troubleRest_);
}

/// Nothing tells when a socket is closed. Where a socket is all that was seen of a client,
/// the sockets are therefore read with every request.
bool LiveMachine::socketsChanged() const {
    if (!sockets_) {
        return false;
    }
    std::vector<Diagnostic> ignored;  // what cannot be read shows as a change
    return readSockets(surroundings_.roots, ignored) != sockets_;
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
        // The monitor has forgotten the changes, and their effect was not read.
        monitor_.markChanged();
        throw;
    }
}

std::shared_ptr<const Snapshot> LiveMachine::tryToRead() {
    ClientFacts clients = readClients();
    buses_.consult(clients, surroundings_.uptime());
    NetworkState network = reader_.read(std::chrono::steady_clock::now() + kernelTime);
    std::move(network.diagnostics.begin(), network.diagnostics.end(),
              std::back_inserter(clients.diagnostics));
    if (!network.certain) {
        monitor_.markChanged();
    }
    if (surroundings_.realProcesses) {
        watchProcesses(clients);
    }
    sockets_.reset();
    if (clients.socketsStandAlone()) {
        sockets_ = clients.sockets;
    }
    markWireless(surroundings_.roots, network.links);
    SystemName system = readSystemName();
    if (system.name.empty()) {
        clients.diagnostics.emplace_back(std::move(system.diagnostic));
    }
    planAnotherTry(clients.diagnostics);
    // The service processor is asked again at its own pace.
    std::optional<ServiceProcessor> processor = processor_.read(clients.diagnostics);
    removeRepeated(clients.diagnostics);
    report(clients.diagnostics);
    return decide({.hostName = std::move(system.name),
                   .links = std::move(network.links),
                   .addresses = std::move(network.addresses),
                   .clients = std::move(clients),
                   .serviceProcessor = processor},
                  surroundings_.now(), surroundings_.explain);
}

/// The end of a program may change nothing else that is watched.
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
        monitor_.begin(places_, facts.diagnostics);
        for (const StateReader& reader : stateReaders()) {
            reader.read(surroundings_.roots, facts);
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

/// What was not there at the last reading may be gone at the next request.
void LiveMachine::planAnotherTry(const std::vector<Diagnostic>& diagnostics) {
    const bool lasts = std::all_of(
        diagnostics.begin(), diagnostics.end(),
        [&](const Diagnostic& diagnostic) { return reported_.contains(diagnostic.text); });
    troubled_ = !diagnostics.empty();
    troubleRest_ = surroundings_.uptime();
    if (lasts) {
        troubleRest_ += troublePause;
    }
}

/// Reports what the last reading did not report: what lasts is reported once, however
/// often the machine is read.
void LiveMachine::report(const std::vector<Diagnostic>& diagnostics) {
    std::unordered_set<std::string> told;
    for (const Diagnostic& diagnostic : diagnostics) {
        if (!reported_.contains(diagnostic.text)) {
            surroundings_.report(diagnostic.text);
        }
        told.insert(diagnostic.text);
    }
    reported_ = std::move(told);
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
