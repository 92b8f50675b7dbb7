#include "commands/Watch.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
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

#include "cimom/Indications.h"
#include "cimom/ObjectManager.h"
#include "client/EmbeddedClient.h"
#include "client/MachineInterfaces.h"
#include "client/Response.h"
#include "commands/Fleet.h"
#include "commands/Interruption.h"
#include "commands/Overview.h"
#include "commands/ServerAccess.h"
#include "commands/WatchLog.h"
#include "commands/WatchSubscriptions.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/Times.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

namespace {

using Machines = std::set<std::size_t>;
using std::chrono::milliseconds;

// What happens at once is told by several signs: a client sets the address first, and writes
// its lease down when it is back from that.
constexpr milliseconds settling{40};

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
    return askMachine(client, AskDiagnostics::No).interfaces;
}

WatchLog logFor(const WatchCommand& command, std::vector<std::string> machines, bool hosts,
                const Presentation& presentation, const Outputs& outputs) {
    return {command.interfaces,
            std::move(machines),
            {presentation.json(), hosts, showsUtf8() ? "\u2192" : "->"},
            outputs};
}

/// Lets the providers of this process tell of changes.
cimom::IndicationSubscription subscribe(EmbeddedClient& client,
                                        cimom::IndicationReceiver receiver) {
    const cimom::IndicationFilter filter{.query = "SELECT * FROM CIM_InstIndication",
                                         .sourceNameSpaces = {client.nameSpace()},
                                         .owner = {}};
    cimom::IndicationActivation activation =
        client.manager().indications().activate(filter, std::move(receiver));
    if (!activation.status.ok()) {
        const std::string& words = activation.status.message;
        throw Failure(ExitStatus::notLoaded, "no provider tells of changes (" +
                                                 std::string(statusNameOf(activation.status)) +
                                                 (words.empty() ? "" : ": " + printable(words)) +
                                                 "); --poll SECONDS looks again and again");
    }
    return std::move(activation.subscription);
}

/// Asks servers at the same time, and hands over in this thread what comes of it.
template <typename Result>
void askAll(const std::vector<ServerUrl>& servers, const Machines& machines, std::size_t parallel,
            const std::function<Result(std::size_t)>& ask, const std::atomic<bool>& interrupted,
            const std::function<void(std::size_t, Result&&)>& arrived,
            const std::function<void(std::size_t, const Failure&)>& failed) {
    std::vector<ServerUrl> asked;
    const std::vector<std::size_t> places(machines.begin(), machines.end());
    asked.reserve(places.size());
    for (const std::size_t machine : places) {
        asked.push_back(servers[machine]);
    }
    std::vector<std::optional<Result>> results(asked.size());
    const auto askOne = [&](const ServerUrl& server) {
        const auto place = static_cast<std::size_t>(&server - asked.data());
        try {
            results[place] = ask(places[place]);
        } catch (const cimom::wbem::ConnectionError& error) {
            throw failureOf(error);
        }
        return Outcome();
    };
    askFleet(
        asked, parallel, askOne,
        [&](const ServerReport& report) {
            const std::size_t machine = places[report.server];
            if (report.outcome.failure) {
                failed(machine, *report.outcome.failure);
            } else if (results[report.server]) {
                arrived(machine, *std::move(results[report.server]));
            }
        },
        interrupted);
}

/// Looks at machines, writes what has changed, and waits, until the program is to end.
class Watching {
  public:
    /// Looks at these machines and puts into the log what it has found.
    using Look = std::function<void(const Machines&)>;

    Watching(WatchLog& log, Machines all, Look look, Bell& bell, const Interruption& interruption)
        : log_(log),
          all_(std::move(all)),
          look_(std::move(look)),
          bell_(bell),
          interruption_(interruption) {}

    void begin() const {
        look_(all_);
        if (!interruption_.wanted()) {
            log_.announce();
        }
    }

    /// Looks when the bell has rung, when leases end by time alone, and now and then at a
    /// machine that did not respond.
    void goOnWhenTold() {
        constexpr std::chrono::seconds untilNextTry{30};
        for (;;) {
            Machines failed;
            for (const std::size_t machine : all_) {
                if (log_.hasFailed(machine)) {
                    failed.insert(machine);
                }
            }
            const std::int64_t now = secondsNow();
            std::optional<milliseconds> time;
            if (const auto next = log_.nextAge(now)) {
                time = std::chrono::seconds(*next - now);
            }
            if (!failed.empty()) {
                time = std::min(time.value_or(untilNextTry), milliseconds(untilNextTry));
            }
            Machines changed = bell_.wait(time, interruption_);
            if (interruption_.wanted()) {
                return;
            }
            if (changed.empty()) {
                log_.age(secondsNow());
                changed = std::move(failed);
            }
            if (!changed.empty()) {
                look_(changed);
            }
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
    Bell& bell_;
    const Interruption& interruption_;
};

}  // namespace

void watchMachine(const WatchCommand& command, EmbeddedClient& client,
                  const Presentation& presentation, const Outputs& outputs) {
    const Interruption interruption;
    Bell bell;
    WatchLog log = logFor(command, {"this machine"}, false, presentation, outputs);
    const auto look = [&](const Machines& /*one*/) { log.saw(0, lookAt(client), secondsNow()); };
    Watching watching(log, {0}, look, bell, interruption);
    if (command.poll) {
        watching.begin();
        watching.goOnByPolling(*command.poll);
        return;
    }
    const cimom::IndicationSubscription subscription =
        subscribe(client, [&bell](const cimom::Indication&) { bell.ring(0); });
    watching.begin();
    watching.goOnWhenTold();
}

void watchServers(const WatchCommand& command, const Options& options,
                  const Presentation& presentation, const Outputs& outputs) {
    const std::vector<ServerUrl> servers = serversOf(options);
    const bool several = servers.size() > 1 || options.hosts;
    warnOfInsecurity(options, outputs.err);
    const Interruption interruption;
    Bell bell;
    const ServerAccess access(options, interruption.wanted());
    std::vector<std::string> names;
    Machines all;
    for (const ServerUrl& server : servers) {
        names.push_back(server.given);
        all.insert(all.size());
    }
    WatchLog log = logFor(command, std::move(names), several, presentation, outputs);
    std::optional<WatchSubscriptions> subscriptions;
    bool begun = false;
    const auto ask = [&](std::size_t machine) {
        RemoteClient client = access.clientOf(servers[machine]);
        if (subscriptions) {
            subscriptions->subscribe(machine, servers[machine], client);
        }
        return lookAt(client);
    };
    const auto failed = [&](std::size_t machine, const Failure& failure) {
        if (interruption.wanted()) {
            return;  // requests were broken off
        }
        if (!several && !begun) {
            throw Failure(failure.status(),
                          printable(servers[machine].given) + ": " + failure.what());
        }
        log.failed(machine, failure.what());
    };
    const auto look = [&](const Machines& machines) {
        askAll<std::vector<InterfaceOverview>>(
            servers, machines, options.parallel, ask, interruption.wanted(),
            [&](std::size_t machine, std::vector<InterfaceOverview>&& interfaces) {
                log.saw(machine, std::move(interfaces), secondsNow());
            },
            failed);
    };
    Watching watching(log, all, look, bell, interruption);
    if (command.poll) {
        watching.begin();
        begun = true;
        watching.goOnByPolling(*command.poll);
        return;
    }
    subscriptions.emplace(command.listen, servers.size(),
                          [&bell](std::size_t machine) { bell.ring(machine); });
    const auto endAll = [&] {
        const std::atomic<bool> never = false;
        const ServerAccess last(options, never);
        Machines left;
        for (const std::size_t machine : all) {
            if (subscriptions->hasLeft(machine)) {
                left.insert(machine);
            }
        }
        askAll<bool>(
            servers, left, options.parallel,
            [&](std::size_t machine) {
                RemoteClient client = last.clientOf(servers[machine]);
                subscriptions->unsubscribe(machine, client);
                return true;
            },
            never, [](std::size_t, bool&&) {},
            [&](std::size_t machine, const Failure& failure) {
                outputs.err << "cimdhcp: " << printable(servers[machine].given)
                            << ": a later watch will remove the subscriptions: " << failure.what()
                            << '\n';
            });
    };
    try {
        watching.begin();
        begun = true;
        watching.goOnWhenTold();
    } catch (...) {
        endAll();
        throw;
    }
    endAll();
}

}  // namespace cimdhcp
