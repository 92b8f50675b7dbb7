#include "commands/Fleet.h"

#include <ostream>

#include "commands/ClientCommands.h"
#include "commands/FleetOutput.h"
#include "commands/Interruption.h"
#include "commands/ServerAccess.h"
#include "text/DisplayText.h"
#include "text/ProgressBar.h"

namespace cimdhcp {

ExitStatus runRemotely(const CommandLine& line, const Presentation& presentation,
                       const Outputs& outputs, const Style& errorStyle) {
    const std::vector<ServerUrl> servers = serversOf(line.options);
    const bool several = servers.size() > 1 || line.options.hosts;
    const auto* const graph = std::get_if<GraphCommand>(&line.command);
    if (several && graph != nullptr && graph->svg) {
        throw Failure(ExitStatus::usage, "--svg draws one machine; ask one server at a time");
    }
    if (several && std::holds_alternative<MetricsCommand>(line.command)) {
        throw Failure(ExitStatus::usage,
                      "metrics are those of one machine; \"cimdhcp exporter\" tells of many");
    }
    warnOfInsecurity(line.options, outputs.err);
    const Interruption interruption;
    const ServerAccess access(line.options, interruption.wanted());
    const auto ask = [&](const ServerUrl& server, const TellStep& tell) {
        try {
            RemoteClient client = access.clientOf(server);
            return carryOut(line.command, client, presentation, tell);
        } catch (const cimom::wbem::ConnectionError& error) {
            throw failureOf(error);
        }
    };
    if (!several) {
        Outcome outcome;
        try {
            WaitingLine waiting(outputs.err, outputs.errWidth,
                                "waiting for " + printable(servers.front().given));
            outcome = ask(servers.front(), waiting.steps());
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
        if (line.options.failed) {
            writeServers(*line.options.failed,
                         outcome.failure ? servers : std::vector<ServerUrl>());
        }
        if (outcome.failure) {
            throw Failure(*outcome.failure);
        }
        return ExitStatus::ok;
    }
    FleetOutput output(servers, presentation, line.options.time, outputs, errorStyle);
    askFleet(
        servers, line.options.parallel,
        [&ask](const ServerUrl& server) { return ask(server, untold); },
        [&output](ServerReport&& report) { output.show(std::move(report)); },
        interruption.wanted());
    const ExitStatus status = output.finish(interruption.wanted());
    if (line.options.failed) {
        writeServers(*line.options.failed, output.notDone());
    }
    return status;
}

}  // namespace cimdhcp
