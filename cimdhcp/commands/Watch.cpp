#include "commands/Watch.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <cstdint>
#include <cstring>
#include <functional>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "client/EmbeddedClient.h"
#include "client/MachineInterfaces.h"
#include "commands/Fleet.h"
#include "commands/Interruption.h"
#include "commands/Overview.h"
#include "commands/ServerAccess.h"
#include "commands/WatchLog.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/Terminal.h"
#include "text/Times.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

namespace {

using Machines = std::set<std::size_t>;
using std::chrono::milliseconds;

// What happens at once is told by several indications: of the lease, of its endpoint.
constexpr milliseconds settling{20};

/// Rings when something has changed on machines. Any thread may ring it.
class Bell {
  public:
    Bell() : descriptor_(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
        if (!descriptor_) {
            throw Failure(ExitStatus::notLoaded,
                          std::string("cannot wait for changes: ") + std::strerror(errno));
        }
    }

    void ring(std::size_t machine) {
        const std::lock_guard lock(mutex_);
        rung_.insert(machine);
        constexpr std::uint64_t one = 1;
        // It fails only when it has been rung more often than it can count, and so rings.
        static_cast<void>(::write(descriptor_.get(), &one, sizeof one) == sizeof one);
    }

    /// Waits until it rings, the time is over (none: it never is) or the program is to end;
    /// the machines for which it has rung.
    Machines wait(std::optional<milliseconds> time, const Interruption& interruption) {
        if (ready(descriptor_.get(), time, interruption) && !interruption.wanted()) {
            ready(-1, settling, interruption);
        }
        const std::lock_guard lock(mutex_);
        std::uint64_t ignored = 0;
        // It fails when it has not rung.
        static_cast<void>(::read(descriptor_.get(), &ignored, sizeof ignored) > 0);
        return std::exchange(rung_, {});
    }

  private:
    static bool ready(int descriptor, std::optional<milliseconds> time,
                      const Interruption& interruption) {
        std::array<pollfd, 2> waited{
            {{interruption.descriptor(), POLLIN, 0}, {descriptor, POLLIN, 0}}};
        constexpr std::int64_t longest = 3600'000;
        const int limit =
            time ? static_cast<int>(std::min<std::int64_t>(time->count(), longest)) : -1;
        // Interrupted by a signal, it is as if the time were over.
        return ::poll(waited.data(), waited.size(), limit) > 0 && waited[1].revents != 0;
    }

    ZR::UniqueFd descriptor_;
    std::mutex mutex_;
    Machines rung_;
};

/// The interfaces as "show" has them.
std::vector<InterfaceOverview> lookAt(Client& client) {
    const ServedInstances served = askProvider(client);
    MachineInterfaces machine = client.interfaces(served);
    addServed(served, machine.interfaces);
    return std::move(machine.interfaces);
}

WatchLog logFor(const WatchCommand& command, std::vector<std::string> machines, bool hosts,
                const Presentation& presentation, const Outputs& outputs) {
    return {command.interfaces,
            std::move(machines),
            {presentation.json(), hosts, showsUtf8() ? "\u2192" : "->"},
            outputs};
}

/// Looks at machines, writes what has changed, and waits, until the program is to end.
class Watching {
  public:
    /// Looks at these machines and puts into the log what it has found.
    using Look = std::function<void(const Machines&)>;

    Watching(WatchLog& log, Machines all, Look look, const Interruption& interruption)
        : log_(log), all_(std::move(all)), look_(std::move(look)), interruption_(interruption) {}

    [[nodiscard]] Bell& bell() noexcept { return bell_; }

    void begin() const {
        look_(all_);
        if (!interruption_.wanted()) {
            log_.announce();
        }
    }

    void goOnByPolling(std::chrono::seconds pause) {
        for (bell_.wait(pause, interruption_); !interruption_.wanted();
             bell_.wait(pause, interruption_)) {
            look_(all_);
        }
    }

  private:
    WatchLog& log_;
    Machines all_;
    Look look_;
    const Interruption& interruption_;
    Bell bell_;
};

}  // namespace

void watchMachine(const WatchCommand& command, EmbeddedClient& client,
                  const Presentation& presentation, const Outputs& outputs) {
    const Interruption interruption;
    WatchLog log = logFor(command, {"this machine"}, false, presentation, outputs);
    const auto look = [&](const Machines& /*one*/) { log.saw(0, lookAt(client), secondsNow()); };
    Watching watching(log, {0}, look, interruption);
    watching.begin();
    watching.goOnByPolling(command.poll.value_or(std::chrono::seconds(1)));
}

void watchServers(const WatchCommand& command, const Options& options,
                  const Presentation& presentation, const Outputs& outputs) {
    const std::vector<ServerUrl> servers = serversOf(options);
    const bool several = servers.size() > 1 || options.hosts;
    warnOfInsecurity(options, outputs.err);
    const Interruption interruption;
    const ServerAccess access(options, interruption.wanted());
    std::vector<std::string> names;
    Machines all;
    for (const ServerUrl& server : servers) {
        names.push_back(server.given);
        all.insert(all.size());
    }
    WatchLog log = logFor(command, std::move(names), several, presentation, outputs);
    bool begun = false;
    const auto look = [&](const Machines& machines) {
        std::vector<ServerUrl> asked;
        std::vector<std::size_t> places;
        for (const std::size_t machine : machines) {
            asked.push_back(servers[machine]);
            places.push_back(machine);
        }
        std::vector<std::vector<InterfaceOverview>> seen(asked.size());
        const auto ask = [&](const ServerUrl& server) {
            try {
                RemoteClient client = access.clientOf(server);
                seen[static_cast<std::size_t>(&server - asked.data())] = lookAt(client);
                return Outcome();
            } catch (const ConnectionError& error) {
                throw Failure(ExitStatus::notLoaded, error.what());
            }
        };
        const auto arrived = [&](const ServerReport& report) {
            const std::size_t machine = places[report.server];
            if (!report.outcome.failure) {
                log.saw(machine, std::move(seen[report.server]), secondsNow());
            } else if (interruption.wanted()) {
                return;  // the user wants no more of it
            } else if (!several && !begun) {
                throw Failure(
                    report.outcome.failure->status(),
                    printable(servers[machine].given) + ": " + report.outcome.failure->what());
            } else {
                log.failed(machine, report.outcome.failure->what());
            }
        };
        askFleet(asked, options.parallel, ask, arrived, interruption.wanted());
    };
    Watching watching(log, all, look, interruption);
    watching.begin();
    begun = true;
    watching.goOnByPolling(command.poll.value_or(std::chrono::seconds(1)));
}

}  // namespace cimdhcp
