#include "commands/ServerAccess.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <ostream>
#include <unordered_set>
#include <utility>

#include "text/DisplayText.h"
#include "text/Failure.h"
#include "zrcommon/File.h"

namespace cimdhcp {

ServerAccess::ServerAccess(const Options& options, const std::atomic<bool>& interrupted)
    : options_(options) {
    settings_.caCertificates = options.caCertificate;
    settings_.insecure = options.insecure;
    settings_.interrupted = &interrupted;
    if (options.caCertificate && !ZR::File::read(*options.caCertificate)) {
        throw Failure(ExitStatus::notLoaded,
                      printable(*options.caCertificate) + ": " + std::strerror(errno));
    }
    if (options.credentials) {
        credentials_ = readCredentials(*options.credentials);
    }
}

RemoteClient ServerAccess::clientOf(const ServerUrl& server) const {
    return {server, settingsFor(server), Deadline(options_.timeout), options_.nameSpace};
}

HttpSettings ServerAccess::settingsFor(const ServerUrl& server) const {
    HttpSettings settings = settings_;
    const Credential* const credential = credentialFor(credentials_, server.host, server.port);
    if (credential != nullptr) {
        if (!server.encrypted && !server.isHere() && !settings.insecure) {
            throw Failure(ExitStatus::notLoaded,
                          "the password could be read on the way over http; use https, or "
                          "--insecure if no one can listen");
        }
        settings.credential = {credential->user, credential->password};
    }
    return settings;
}

namespace {

/// Puts the server to the others, unless one of them is the same.
class DistinctServers {
  public:
    void add(ServerUrl server) {
        std::string place = server.text();
        std::transform(place.begin(), place.end(), place.begin(), [](char letter) {
            return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
        });
        // Case counts in paths alone.
        place += server.path;
        if (known_.insert(std::move(place)).second) {
            servers_.push_back(std::move(server));
        }
    }

    std::vector<ServerUrl> take() { return std::move(servers_); }

  private:
    std::unordered_set<std::string> known_;
    std::vector<ServerUrl> servers_;
};

}  // namespace

std::vector<ServerUrl> serversOf(const Options& options) {
    DistinctServers servers;
    for (const std::string& text : options.connect) {
        servers.add(readServerUrl(text));
    }
    if (options.hosts) {
        for (ServerUrl& server : readServersFile(*options.hosts)) {
            servers.add(std::move(server));
        }
    }
    return servers.take();
}

void warnOfInsecurity(const Options& options, std::ostream& err) {
    if (options.insecure) {
        err << "cimdhcp: warning: --insecure: the identity of the servers is not checked, "
               "and passwords may be sent unencrypted\n";
    }
}

}  // namespace cimdhcp
