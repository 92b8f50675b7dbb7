#include "commands/Program.h"

#include <chrono>
#include <cstdlib>
#include <exception>
#include <memory>
#include <mutex>
#include <ostream>
#include <type_traits>
#include <variant>

#include "arguments/CommandLine.h"
#include "arguments/Directories.h"
#include "client/EmbeddedClient.h"
#include "client/Installation.h"
#include "commands/Check.h"
#include "commands/ClientCommands.h"
#include "commands/Findings.h"
#include "commands/Fleet.h"
#include "commands/Metrics.h"
#include "commands/Overview.h"
#include "commands/PlatformSetup.h"
#include "commands/Serve.h"
#include "commands/UserAdd.h"
#include "commands/Watch.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/Presentation.h"
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
        const auto snapshot = service.current();
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
        const auto findings =
            check(line_.options, installations(executableFile()), presentation_.now);
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
        const auto client = openClient(line_.options);
        const Outcome outcome = carryOut(line_.command, *client, presentation_);
        outputs_.out << outcome.text;
        outputs_.err << outcome.diagnostics;
        if (outcome.failure) {
            throw Failure(*outcome.failure);
        }
    }

  private:
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

Style styleFor(const Options& options, bool terminal) {
    return {!options.noHeader,
            wantsColor(options.color, terminal, std::getenv("NO_COLOR"), std::getenv("TERM"))};
}

Presentation presentationOf(const CommandLine& line, const Outputs& outputs) {
    const Options& options = line.options;
    Presentation presentation;
    presentation.format = options.format;
    presentation.width = outputs.width;
    presentation.style = styleFor(options, outputs.width.has_value());
    presentation.sort = options.sort;
    presentation.count = options.count;
    presentation.comments =
        options.format == Format::mof || std::holds_alternative<GraphCommand>(line.command);
    presentation.now = secondsNow();
    return presentation;
}

ExitStatus runLine(const CommandLine& line, const Outputs& outputs, const Style& errorStyle) {
    const Presentation presentation = presentationOf(line, outputs);
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
        setUpPlatform(line.options, outputs.err);
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
