#include "commands/RemoteRun.h"

#include <cerrno>
#include <cstring>
#include <ostream>
#include <utility>

#include "client/Credentials.h"
#include "client/RemoteClient.h"
#include "commands/ClientCommands.h"
#include "commands/Fleet.h"
#include "commands/FleetOutput.h"
#include "commands/Interruption.h"
#include "text/DisplayText.h"
#include "zrcommon/File.h"

namespace cimdhcp {

namespace {

/// Carries the command out on servers, as the options say. Safe for concurrent use.
class Asker {
  public:
    Asker(const CommandLine& line, const Presentation& presentation,
          const std::atomic<bool>& interrupted)
        : line_(line), presentation_(presentation) {
        const Options& options = line.options;
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

    Outcome operator()(const ServerUrl& server) const {
        try {
            RemoteClient client(server, settingsFor(server), Deadline(line_.options.timeout),
                                line_.options.nameSpace);
            return carryOut(line_.command, client, presentation_);
        } catch (const cimom::wbem::ConnectionError& error) {
            throw failureOf(error);
        }
    }

  private:
    [[nodiscard]] HttpSettings settingsFor(const ServerUrl& server) const {
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

    const CommandLine& line_;
    const Presentation& presentation_;
    HttpSettings settings_;
    std::vector<Credential> credentials_;
};

std::vector<ServerUrl> serversOf(const Options& options) {
    std::vector<ServerUrl> servers;
    for (const std::string& text : options.connect) {
        servers.push_back(readServerUrl(text));
    }
    if (options.hosts) {
        for (ServerUrl& server : readServersFile(*options.hosts)) {
            servers.push_back(std::move(server));
        }
    }
    return servers;
}

}  // namespace

ExitStatus runRemotely(const CommandLine& line, const Presentation& presentation,
                       const Outputs& outputs, const Style& errorStyle) {
    const std::vector<ServerUrl> servers = serversOf(line.options);
    const bool several = servers.size() > 1 || line.options.hosts;
    const auto* const graph = std::get_if<GraphCommand>(&line.command);
    if (several && graph != nullptr && graph->svg) {
        throw Failure(ExitStatus::usage, "--svg draws one machine; ask one server at a time");
    }
    if (line.options.insecure) {
        outputs.err << "cimdhcp: warning: --insecure: the identity of the servers is not checked, "
                       "and passwords may be sent unencrypted\n";
    }
    const Interruption interruption;
    const Asker ask(line, presentation, interruption.wanted());
    if (!several) {
        Outcome outcome;
        try {
            outcome = ask(servers.front());
        } catch (const Failure& failure) {
            // A failure without a response of the server needs the server's name.
            const bool noResponse = failure.status() == ExitStatus::notLoaded;
            outcome.failure =
                noResponse ? Failure(interruption.wanted() ? ExitStatus::interrupted
                                                           : ExitStatus::notLoaded,
                                     printable(servers.front().given) + ": " + failure.what())
                           : failure;
        }
        outputs.out << outcome.text;
        outputs.err << outcome.diagnostics;
        if (outcome.failure) {
            throw Failure(*outcome.failure);
        }
        return ExitStatus::ok;
    }
    FleetOutput output(servers, presentation, line.options.time, outputs, errorStyle);
    askFleet(
        servers, line.options.parallel, ask,
        [&output](ServerReport&& report) { output.show(std::move(report)); },
        interruption.wanted());
    return output.finish(interruption.wanted());
}

}  // namespace cimdhcp
