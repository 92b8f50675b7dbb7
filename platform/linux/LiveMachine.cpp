#include "LiveMachine.h"

#include <linux/if_arp.h>
#include <unistd.h>

#include <algorithm>
#include <iterator>
#include <limits>
#include <unordered_set>
#include <utility>

#include "StateReaders.h"
#include "clients/Processes.h"
#include "formats/Files.h"
#include "ipmi/IpmiDevice.h"
#include "tklogger/TKLogger.h"
#include "zrclient/InstrumentationService.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/PlatformSettings.h"
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

// What one reading left to the next is read soon; but on a machine that never comes to rest,
// not all the time.
constexpr std::chrono::milliseconds soon{20};
constexpr int soonTries = 5;

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

auto processorOf(Surroundings& surroundings) {
    if constexpr (Built::has("service-processor")) {
        return IpmiReader{
            surroundings.ipmi ? std::move(surroundings.ipmi) : ipmiDevice(surroundings.roots),
            surroundings.uptime};
    } else {
        return NoIpmiReader{surroundings.roots};
    }
}

/// Who asks for explanations hears what nothing was read for.
void explainTheBuild(std::vector<Diagnostic>& diagnostics) {
    if constexpr (!Built::leftOut.empty()) {
        diagnostics.emplace_back("this build is without " + std::string{Built::leftOut},
                                 Diagnostic::Kind::Note);
    }
}

void reportToLog(std::string_view message) {
    TKLog::TKLogger::logLevelMessage("zrclient/LiveMachine", "read", __LINE__, "ZR.Instrumentation",
                                     LogLevel::failure, nullptr, 0, 0, message);
}

}  // namespace

LiveMachine::LiveMachine(Surroundings surroundings)
    : surroundings_(std::move(surroundings)),
      buses_(std::move(surroundings_.buses)),
      network_(RtnetlinkReader{std::move(surroundings_.transport)}),
      processor_(processorOf(surroundings_)),
      places_(fixedPlaces(surroundings_.roots)),
      unannounced_(surroundings_.roots) {
    if (!surroundings_.report) {
        surroundings_.report = reportToLog;
    }
}

bool LiveMachine::changed() {
    if (surroundings_.watch == Watch::No) {
        return readAt_ == 0 || processor_.changed();
    }
    if (signals_.heard()) {
        monitor_.markChanged();
    }
    // The conversation with the service processor goes on only when this is called.
    return processor_.changed() || monitor_.changed() || changedByTime() ||
           (troubled_ && surroundings_.uptime() >= troubleRest_);
}

/// What changes though nothing tells of it: leases end, and once a second it is looked
/// whether clients came. A clock that was set back makes all times in the snapshot doubtful.
bool LiveMachine::changedByTime() {
    const std::int64_t now = surroundings_.now();
    if (now >= readAt_ && now < changesAt_) {
        if (now == lookedAt_) {
            return false;
        }
        lookedAt_ = now;
        if (!unannounced_.changed()) {
            return false;
        }
    }
    monitor_.markChanged();
    return true;
}

bool LiveMachine::awaiting() {
    // Whether there is something new is for changed() to tell.
    static_cast<void>(processor_.changed());
    return processor_.awaiting();
}

ChangeSigns LiveMachine::signs() {
    using namespace std::chrono;  // NOLINT(google-build-using-namespace): of this function only
    const auto now = steady_clock::now();
    if (signals_.connect(surroundings_.uptime())) {
        monitor_.markChanged();
    }
    ChangeSigns signs{.descriptor = monitor_.sign(signals_.descriptor()), .askAt = std::nullopt};
    if (!signs.descriptor || monitor_.isBlind() || troubled_) {
        signs.askNoLaterThan(now + slowest);
    }
    if (monitor_.isMarked()) {
        signs.askNoLaterThan(now + (unfinished_ < soonTries ? soon : slowest));
    }
    // By the clock that the seconds of the snapshot are of: its next second begins then.
    const auto time = system_clock::now();
    const auto second = ceil<milliseconds>(floor<seconds>(time) + 1s - time);
    if (hasNetwork_) {
        signs.askNoLaterThan(now + second);
    }
    if (changesAt_ != std::numeric_limits<std::int64_t>::max()) {
        // Far ends are looked at again meanwhile: the clock may be set.
        const std::int64_t left = changesAt_ - surroundings_.now() - 1;
        signs.askNoLaterThan(now + second + seconds{std::clamp<std::int64_t>(left, 0, 60)});
    }
    signs.askNoLaterThan(now + processor_.rest());
    return signs;
}

std::shared_ptr<const Snapshot> LiveMachine::read() {
    try {
        return tryToRead();
    } catch (...) {
        // The monitor has forgotten the changes, and their effect was not read.
        monitor_.markChanged();
        readAt_ = 0;
        throw;
    }
}

std::shared_ptr<const Snapshot> LiveMachine::tryToRead() {
    ClientFacts clients = readClients();
    signals_.follow(clients);
    buses_.consult(clients, surroundings_.uptime());
    const bool watches = surroundings_.watch == Watch::Yes;
    NetworkState network = network_.read(watches ? monitor_.takeNetworkChanges() : NetworkChanges{},
                                         std::chrono::steady_clock::now() + kernelTime);
    std::move(network.diagnostics.begin(), network.diagnostics.end(),
              std::back_inserter(clients.diagnostics));
    if (!network.certain) {
        monitor_.markChanged();
    }
    if (surroundings_.realProcesses && watches) {
        watchProcesses(clients);
    }
    markWireless(surroundings_.roots, network.links);
    SystemName system = readSystemName();
    if (system.name.empty()) {
        clients.diagnostics.emplace_back(std::move(system.diagnostic));
    }
    planAnotherTry(clients.diagnostics);
    if (surroundings_.explain == Explain::Yes) {
        explainTheBuild(clients.diagnostics);
    }
    // The service processor is asked again at its own pace.
    std::optional<ServiceProcessor> processor = processor_.read(clients.diagnostics);
    removeRepeated(clients.diagnostics);
    report(clients.diagnostics);
    readAt_ = surroundings_.now();
    lookedAt_ = readAt_;
    hasNetwork_ = std::ranges::any_of(
        network.links, [](const Link& link) { return link.arphrdType != ARPHRD_LOOPBACK; });
    unfinished_ = monitor_.isMarked() ? unfinished_ + 1 : 0;
    auto machine =
        std::make_unique<const Machine>(MachineFacts{.hostName = std::move(system.name),
                                                     .links = std::move(network.links),
                                                     .addresses = std::move(network.addresses),
                                                     .clients = std::move(clients),
                                                     .serviceProcessor = processor},
                                        readAt_);
    changesAt_ = machine->changesAt();
    if (surroundings_.explain == Explain::Yes) {
        return decide(*machine, Explain::Yes);
    }
    decided_ = decide(std::move(machine), decided_);
    return decided_.tree;
}

/// The end of a program may change nothing else that is watched.
void LiveMachine::watchProcesses(const ClientFacts& clients) {
    std::vector<std::int32_t> pids;
    for (const auto* processes : {&clients.processes, &clients.hiddenClients}) {
        for (const ClientProcess& process : *processes) {
            pids.push_back(process.pid);
        }
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
    if (surroundings_.watch == Watch::No) {
        for (const StateReader& reader : stateReaders()) {
            reader.read(surroundings_.roots, facts);
        }
        return facts;
    }
    for (int round = 0; round < clientRounds; ++round) {
        facts = {};
        monitor_.begin(places_, facts.diagnostics);
        unannounced_.begin();
        for (const StateReader& reader : stateReaders()) {
            readState(reader, surroundings_.roots, facts);
            if (reader.read == readProcesses) {
                unannounced_.keepProcesses(facts);
            }
        }
        unannounced_.keepSockets(facts);
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

/// What was not there at the last reading may be gone at the next request. What a file says
/// stays as it is until the file changes.
void LiveMachine::planAnotherTry(const std::vector<Diagnostic>& diagnostics) {
    const auto mayEnd = [](const Diagnostic& diagnostic) {
        return diagnostic.kind == Diagnostic::Kind::Unreadable ||
               diagnostic.kind == Diagnostic::Kind::Denied ||
               diagnostic.kind == Diagnostic::Kind::Untrusted;
    };
    const bool lasts = std::all_of(
        diagnostics.begin(), diagnostics.end(),
        [&](const Diagnostic& diagnostic) { return reported_.contains(diagnostic.text); });
    troubled_ = std::any_of(diagnostics.begin(), diagnostics.end(), mayEnd);
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
    InstrumentationService::setMachine([] {
        const bool once = PlatformSettings::process().readOnce;
        return openLiveSource(Explain::No, once ? Watch::No : Watch::Yes);
    });
}

std::unique_ptr<SnapshotSource> openLiveSource(Explain explain, Watch watch) {
    Live::Surroundings surroundings;
    surroundings.explain = explain;
    surroundings.watch = watch;
    return std::make_unique<Live::LiveMachine>(std::move(surroundings));
}

}  // namespace ZR
