#include "commands/Program.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <exception>
#include <functional>
#include <memory>
#include <mutex>
#include <ostream>
#include <sstream>
#include <type_traits>
#include <variant>

#include "arguments/CommandLine.h"
#include "arguments/Directories.h"
#include "client/EmbeddedClient.h"
#include "client/Installation.h"
#include "commands/ClientCommands.h"
#include "commands/Complete.h"
#include "commands/Exporter.h"
#include "commands/Fleet.h"
#include "commands/Metrics.h"
#include "commands/Overview.h"
#include "commands/PlatformSetup.h"
#include "commands/Serve.h"
#include "commands/ServerAccess.h"
#include "commands/Watch.h"
#include "commands/check/Check.h"
#include "commands/check/Findings.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/Presentation.h"
#include "text/ProgressBar.h"
#include "text/Times.h"
#include "zrclient/InstrumentationService.h"
#include "zrclient/SnapshotJson.h"
#include "zrcommon/PlatformSettings.h"
#include "zrcommon/SystemName.h"
#include "zrlinux/LiveSource.h"

namespace cimdhcp {

namespace {

std::unique_ptr<EmbeddedClient> openClient(const Options& options) {
    return std::make_unique<EmbeddedClient>(
        findDirectories(options, installations(executableFile())), options.nameSpace);
}

/// Runs one command line on this machine.
class Execution {
  public:
    Execution(const CommandLine& line, const Presentation& presentation, const Outputs& outputs)
        : line_(line), presentation_(presentation), outputs_(outputs) {}

    void operator()(const TreeCommand& command) const {
        auto& service = ZR::InstrumentationService::process();
        if (command.explain) {
            if (!ZR::PlatformSettings::process().instrumentationTree.empty()) {
                throw Failure(ExitStatus::usage,
                              "the sources of properties are known for the live machine alone");
            }
            service.useSource(ZR::openLiveSource(ZR::Explain::Yes));
        }
        std::shared_ptr<const ZR::Snapshot> snapshot;
        {
            const WaitingLine waiting = waitingLine();
            snapshot = service.current();
        }
        outputs_.out << ZR::toJson(*snapshot, ZR::getSystemName());
        tell(*snapshot);
    }

    void operator()(const ServeCommand& command) const {
        tellOfTree();
        const auto client = openClient(line_.options);
        // The client is for one thread at a time, and each scrape asks it.
        std::mutex mutex;
        const auto ask = [&] {
            const std::lock_guard lock(mutex);
            return machineMetrics(askMachine(*client, AskDiagnostics::Yes), secondsNow());
        };
        serve(command, client->manager(), ask, outputs_.out);
    }

    void operator()(const ExporterCommand& command) const {
        serveExporter(command, line_.options, outputs_.out);
    }

    void operator()(const CheckCommand& /*command*/) const {
        std::vector<Finding> findings;
        {
            WaitingLine waiting = waitingLine();
            findings = check(line_.options, installations(executableFile()), presentation_.now,
                             waiting.steps());
        }
        outputs_.out << (presentation_.json() ? findingsJson(findings) : findingsText(findings));
        if (!isGood(findings)) {
            throw somethingIsWrong();
        }
    }

    void operator()(const WatchCommand& command) const {
        tellOfTree();
        const auto client = openClient(line_.options);
        watchMachine(command, *client, presentation_, outputs_);
    }

    void operator()(const UserAddCommand& command) const {
        addUser(command, outputs_.out, outputs_.err);
    }

    template <typename ClientCommand>
    void operator()(const ClientCommand& /*command*/) const {
        tellOfTree();
        Outcome outcome;
        {
            WaitingLine waiting = waitingLine();
            const auto client = openClient(line_.options);
            outcome = carryOut(line_.command, *client, presentation_, waiting.steps());
        }
        outputs_.out << outcome.text;
        outputs_.err << outcome.diagnostics;
        if (outcome.failure) {
            throw Failure(*outcome.failure);
        }
    }

  private:
    [[nodiscard]] WaitingLine waitingLine() const {
        return {outputs_.err, outputs_.errWidth, "reading this machine"};
    }

    void tell(const ZR::Snapshot& snapshot) const {
        for (const ZR::Diagnostic& diagnostic : snapshot.diagnostics()) {
            outputs_.err << "cimdhcp: " << printable(diagnostic.text) << '\n';
        }
    }

    /// Slips in a tree are its author's, who may run any command to see what comes of it.
    void tellOfTree() const {
        if (!treeName().empty()) {
            tell(*ZR::InstrumentationService::process().current());
        }
    }

    const CommandLine& line_;
    const Presentation& presentation_;
    const Outputs& outputs_;
};

Look lookOf(const Command& command) {
    const bool again = std::holds_alternative<ServeCommand>(command) ||
                       std::holds_alternative<WatchCommand>(command) ||
                       std::holds_alternative<RenameCommand>(command) ||
                       std::holds_alternative<ModifyCommand>(command);
    return again ? Look::again : Look::once;
}

Style styleFor(const Options& options, bool terminal) {
    return {!options.table.noHeader,
            wantsColor(options.color, terminal, std::getenv("NO_COLOR"), std::getenv("TERM"))};
}

Presentation presentationOf(const CommandLine& line, const Outputs& outputs) {
    const Options& options = line.options;
    Presentation presentation;
    presentation.format = options.format;
    presentation.width = options.table.wide ? std::nullopt : outputs.width;
    presentation.columns = options.table.columns;
    // Whoever tests the exact library counts the calls of the provider.
    presentation.internals = options.debug || options.exact;
    presentation.exact = options.exact;
    presentation.style = styleFor(options, outputs.width.has_value());
    presentation.sort = options.sort;
    presentation.count = options.count;
    presentation.comments =
        options.format == Format::mof || std::holds_alternative<GraphCommand>(line.command);
    presentation.now = secondsNow();
    return presentation;
}

/// Calls `use` with a client of the machine that the line is about. Of a server that is slow,
/// a shell does not wait for the response.
void withClientOf(const Options& options, const std::function<void(Client&)>& use) {
    constexpr std::chrono::seconds patience{2};
    if (options.remote()) {
        Options hurried = options;
        hurried.timeout = std::min(options.timeout, patience);
        const std::atomic<bool> never = false;
        const ServerAccess access(hurried, never);
        RemoteClient client = access.clientOf(serversOf(hurried).front());
        use(client);
    } else {
        std::ostringstream unheard;
        setUpPlatform(options, Look::once, unheard);
        use(*openClient(options));
    }
}

/// What a shell asks for: nothing that fails is told.
std::string completed(const CompleteCommand& command) {
    const UnfinishedLine line = CommandLineReader().readUnfinished(command.words);
    return completionText(
        line,
        [&line](const std::function<void(Client&)>& use) {
            if (line.options) {
                withClientOf(*line.options, use);
            }
        },
        secondsNow());
}

ExitStatus runLine(const CommandLine& line, const Outputs& outputs, const Style& errorStyle) {
    const Presentation presentation = presentationOf(line, outputs);
    if (const auto* const complete = std::get_if<CompleteCommand>(&line.command)) {
        outputs.out << completed(*complete);
        return ExitStatus::ok;
    }
    const auto* const watch = std::get_if<WatchCommand>(&line.command);
    if (line.options.remote() && watch != nullptr) {
        watchServers(*watch, line.options, presentation, outputs);
        return ExitStatus::ok;
    }
    if (line.options.remote()) {
        return runRemotely(line, presentation, outputs, errorStyle);
    }
    // A user is added, and other machines are asked, without a look at the machine; the check sets
    // the platform up itself, and goes on when that fails.
    if (!std::holds_alternative<UserAddCommand>(line.command) &&
        !std::holds_alternative<ExporterCommand>(line.command) &&
        !std::holds_alternative<CheckCommand>(line.command)) {
        setUpPlatform(line.options, lookOf(line.command), outputs.err);
        requireDataDirectory(line.options);
    }
    std::visit(Execution(line, presentation, outputs), line.command);
    return ExitStatus::ok;
}

}  // namespace

int run(const std::vector<std::string>& arguments, const Outputs& outputs) noexcept {
    ExitStatus status = ExitStatus::ok;
    Style errorStyle;
    const auto fail = [&](ExitStatus reason, const char* message) {
        status = reason;
        outputs.err << errorStyle.alarming("cimdhcp:") << ' ' << message << '\n';
    };
    const auto start = std::chrono::steady_clock::now();
    bool time = false;
    try {
        ZR::serveLiveMachine();
        const auto parsed = readCommandLine(arguments);
        if (const auto* const information = std::get_if<Information>(&parsed)) {
            outputs.out << information->text;
        } else {
            const auto& line = std::get<CommandLine>(parsed);
            time = line.options.time;
            errorStyle = styleFor(line.options, outputs.errWidth.has_value());
            status = runLine(line, outputs, errorStyle);
        }
    } catch (const Failure& failure) {
        fail(failure.status(), failure.what());
    } catch (const std::exception& exception) {
        fail(ExitStatus::notLoaded, exception.what());
    }
    // What was printed before a failure comes out, too.
    if (!outputs.out.flush() && status == ExitStatus::ok) {
        fail(ExitStatus::notLoaded, "the output cannot be written");
    }
    if (time) {
        outputs.err << "cimdhcp: it took " << durationText(std::chrono::steady_clock::now() - start)
                    << '\n';
    }
    return static_cast<int>(status);
}

}  // namespace cimdhcp
