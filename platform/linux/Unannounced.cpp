#include "Unannounced.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <string_view>

#include "StateReaders.h"
#include "clients/Processes.h"
#include "formats/Files.h"
#include "kernel/Sockets.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {
namespace {

/// The number of the process that started last, behind the last blank of /proc/loadavg.
std::string readLastProcess(const Roots& roots) {
    const UniqueFd fd{::open((roots.proc + "/loadavg").c_str(), O_RDONLY | O_CLOEXEC)};
    std::array<char, 128> buffer{};
    const ssize_t got = fd ? ::read(fd.get(), buffer.data(), buffer.size()) : 0;
    const std::string_view text{buffer.data(), static_cast<std::size_t>(std::max<ssize_t>(got, 0))};
    const std::size_t blank = text.rfind(' ');
    return std::string{text.substr(blank == std::string_view::npos ? 0 : blank + 1)};
}

void takeProcesses(const ClientFacts& from, ClientFacts& to) {
    to.processes = from.processes;
    to.managers = from.managers;
    to.hiddenClients = from.hiddenClients;
    to.processesHidden = from.processesHidden;
}

bool sameProcesses(const ClientFacts& a, const ClientFacts& b) {
    return a.processes == b.processes && a.managers == b.managers &&
           a.hiddenClients == b.hiddenClients && a.processesHidden == b.processesHidden;
}

}  // namespace

void Unannounced::begin() {
    lastProcess_ = readLastProcess(roots_);
    std::vector<Diagnostic> ignored;  // the reader of the sockets tells them
    packetSockets_ = readPacketSockets(roots_, ignored);
    settled_ = false;
}

void Unannounced::keepProcesses(const ClientFacts& facts) {
    takeProcesses(facts, processes_);
}

void Unannounced::keepSockets(const ClientFacts& facts) {
    takeProcesses(facts, sockets_);
    sockets_.sockets = facts.sockets;
}

bool Unannounced::changed() {
    std::string last = readLastProcess(roots_);
    const bool started = last != lastProcess_;
    if (started || !settled_) {
        ClientFacts seen;
        readProcesses(roots_, seen);
        if (!sameProcesses(seen, processes_)) {
            return true;
        }
        lastProcess_ = std::move(last);
        settled_ = !started;
    }
    ClientFacts seen;
    takeProcesses(sockets_, seen);
    readClientSockets(roots_, seen);
    // Also those beside which none is bound to the clients' port, as while a client asks for
    // its first address.
    return seen.sockets != sockets_.sockets || seen.sockets.packets != packetSockets_;
}

}  // namespace ZR::Live
