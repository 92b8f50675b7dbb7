#pragma once

#include <chrono>
#include <cstdint>
#include <ctime>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>
#include <unordered_set>
#include <vector>

#include "Decide.h"
#include "Unannounced.h"
#include "clients/ManagerBuses.h"
#include "clients/ManagerSignals.h"
#include "formats/Files.h"
#include "ipmi/IpmiReader.h"
#include "kernel/ChangeMonitor.h"
#include "kernel/KeptNetwork.h"
#include "kernel/NetlinkTransport.h"
#include "zrclient/SnapshotSource.h"
#include "zrcommon/BuiltSources.h"
#include "zrlinux/LiveSource.h"

namespace ZR::Live {

/// What a live machine is read from.
struct Surroundings {
    Roots roots;
    std::unique_ptr<NetlinkTransport> transport = kernelTransport();
    /// Seconds since the epoch. Asked with each request.
    std::function<std::int64_t()> now = [] { return std::int64_t{std::time(nullptr)}; };
    /// False when the process file system is one that was laid out: its numbers
    /// then are those of other processes.
    bool realProcesses = true;
    /// The way to the service processor; null: the device of the machine at `roots`.
    std::unique_ptr<IpmiTransport> ipmi = nullptr;
    IpmiReader::Clock uptime = std::chrono::steady_clock::now;
    ManagerBuses::Ways buses;
    Explain explain = Explain::No;
    Watch watch = Watch::Yes;
    /// Takes what could not be read, or not for certain.
    std::function<void(std::string_view)> report;
};

/// The machine as its kernel and its DHCP clients show it now.
class LiveMachine final : public SnapshotSource {
  public:
    explicit LiveMachine(Surroundings surroundings);

    [[nodiscard]] bool changed() override;
    [[nodiscard]] bool awaiting() override;
    [[nodiscard]] ChangeSigns signs() override;
    [[nodiscard]] std::shared_ptr<const Snapshot> read() override;

  private:
    [[nodiscard]] std::shared_ptr<const Snapshot> tryToRead();
    [[nodiscard]] ClientFacts readClients();
    void watchProcesses(const ClientFacts& clients);
    [[nodiscard]] bool changedByTime();
    void planAnotherTry(const std::vector<Diagnostic>& diagnostics);
    void report(const std::vector<Diagnostic>& diagnostics);

    Surroundings surroundings_;
    ManagerBuses buses_;
    std::conditional_t<Built::has("bus"), ManagerSignals, NoManagerSignals> signals_;
    KeptNetwork network_;
    ChangeMonitor monitor_;
    std::conditional_t<Built::has("service-processor"), IpmiReader, NoIpmiReader> processor_;
    Decided decided_;  // at the last reading; none where it is to be explained
    std::vector<WatchedPlace> places_;
    Unannounced unannounced_;
    std::int64_t readAt_ = 0;                   // when the last snapshot was made
    std::int64_t changesAt_ = 0;                // when it is no longer true, though nothing happens
    std::int64_t lookedAt_ = 0;                 // for what nothing announces
    bool hasNetwork_ = false;                   // there are links at which clients may come
    int unfinished_ = 0;                        // readings in a row that left something to read
    std::unordered_set<std::string> reported_;  // of the last reading
    bool troubled_ = false;                     // something could not be read
    std::chrono::steady_clock::time_point troubleRest_;  // it is not tried again before
};

}  // namespace ZR::Live
