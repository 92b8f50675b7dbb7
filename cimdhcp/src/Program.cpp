#include "cimdhcp/Program.h"

#include <chrono>
#include <exception>
#include <ostream>
#include <type_traits>
#include <variant>

#include "cimdhcp/Check.h"
#include "cimdhcp/CimCommands.h"
#include "cimdhcp/ClassList.h"
#include "cimdhcp/Client.h"
#include "cimdhcp/CommandLine.h"
#include "cimdhcp/Directories.h"
#include "cimdhcp/Failure.h"
#include "cimdhcp/Graph.h"
#include "cimdhcp/GraphDrawing.h"
#include "cimdhcp/JsonFormat.h"
#include "cimdhcp/MachineOverview.h"
#include "cimdhcp/MofFormat.h"
#include "cimdhcp/Overview.h"
#include "cimdhcp/PlatformSetup.h"
#include "cimdhcp/Rename.h"
#include "cimdhcp/Serve.h"
#include "cimdhcp/TableFormat.h"
#include "cimdhcp/UserAdd.h"
#include "zrclient/InstrumentationService.h"
#include "zrclient/LiveSource.h"
#include "zrclient/SnapshotJson.h"
#include "zrcommon/PlatformSettings.h"
#include "zrcommon/PlatformUtilities.h"

namespace cimdhcp {

namespace {

/// How long the service processor may take.
constexpr std::chrono::seconds patience(1);

/// Runs one command line.
class Execution {
  public:
    Execution(const Options& options, const Outputs& outputs)
        : options_(options), outputs_(outputs) {}

    void operator()(const ShowCommand& /*command*/) const {
        Client client = openClient();
        const ServedInstances served = askProvider(client);
        const auto snapshot = ZR::InstrumentationService::process().current();
        auto interfaces = interfacesOf(*snapshot);
        addServed(served, client.repository(), interfaces);
        outputs_.out << (json() ? overviewJson(interfaces)
                                : overviewTable(interfaces, outputs_.width));
        outputs_.err << remarkLine(snapshot->remarks());
    }

    void operator()(const RenameCommand& command) const {
        Client client = openClient();
        const RenameReport report =
            rename(command, ZR::PlatformUtilities::getKestraDataDir(), client);
        outputs_.out << (json() ? renameJson(report) : renameText(report));
    }

    void operator()(const GraphCommand& command) const {
        Client client = openClient();
        const std::string text = graphvizText(graphOfMachine(client));
        outputs_.out << (command.svg ? drawSvg(text) : text);
    }

    void operator()(const TreeCommand& command) const {
        auto& service = ZR::InstrumentationService::process();
        if (command.explain) {
            if (!ZR::PlatformSettings::process().instrumentationTree.empty()) {
                throw Failure(ExitStatus::usage,
                              "only of the live machine it is known where properties came from");
            }
            service.useSource(ZR::openLiveSource(ZR::Explain::Yes));
        }
        service.settle(patience);
        outputs_.out << ZR::toJson(*service.current());
    }

    void operator()(const ClassesCommand& /*command*/) const {
        const Client client = openClient();
        const auto classes = servedClasses(client.registrations(), client.repository());
        outputs_.out << (json() ? classJson(classes) : classTable(classes, outputs_.width));
    }

    void operator()(const ServeCommand& command) const {
        Client client = openClient();
        serve(command, client, outputs_.out);
    }

    void operator()(const CheckCommand& /*command*/) const {
        const auto findings = check(options_, installations(executableFile()));
        outputs_.out << (json() ? checkJson(findings) : checkText(findings));
        if (!isGood(findings)) {
            throw Failure(ExitStatus::notDone, "something is wrong, as the list tells");
        }
    }

    void operator()(const UserAddCommand& command) const {
        addUser(command, outputs_.out, outputs_.err);
    }

    template <typename CimCommand>
    void operator()(const CimCommand& command) const {
        Client client = openClient();
        const Request request = carryOut(command, client);
        outputs_.out << formatted(request.answer, client);
        if (!request.answer.status.ok()) {
            throw client.failure(request.answer, request.asked);
        }
        if (std::is_same_v<CimCommand, ModifyCommand> && options_.format == Format::table) {
            outputs_.out << "Modified.\n";
        }
    }

  private:
    [[nodiscard]] bool json() const { return options_.format == Format::json; }

    [[nodiscard]] Client openClient() const {
        Client client{findDirectories(options_, installations(executableFile())),
                      options_.nameSpace};
        awaitServiceProcessor(client);
        return client;
    }

    /// The service processor answers when it likes, and no request waits for it. This
    /// program ends after one request: the provider is made to ask, then a question is
    /// asked behind its own, and the answer to that one awaited.
    static void awaitServiceProcessor(Client& client) {
        if (!ZR::InstrumentationService::process().awaiting()) {
            return;
        }
        static_cast<void>(client.enumerateNames(client.classPath("QVXZR_DHCPProtocolEndpoint")));
        ZR::InstrumentationService(ZR::openLiveSource()).settle(patience);
    }

    [[nodiscard]] std::string formatted(const Answer& answer, const Client& client) const {
        switch (options_.format) {
            case Format::json:
                return asJson(answer);
            case Format::mof:
                return asMof(answer, client.repository());
            case Format::table:
                break;
        }
        return asTable(answer, client.repository(), outputs_.width);
    }

    const Options& options_;
    const Outputs& outputs_;
};

void runCommand(const std::vector<std::string>& arguments, const Outputs& outputs) {
    const auto parsed = readCommandLine(arguments);
    if (const auto* const information = std::get_if<Information>(&parsed)) {
        outputs.out << information->text;
    } else {
        const auto& line = std::get<CommandLine>(parsed);
        // Who may use the server has nothing to do with the machine; the check does
        // this itself, and goes on when it fails.
        if (!std::holds_alternative<UserAddCommand>(line.command) &&
            !std::holds_alternative<CheckCommand>(line.command)) {
            setUpPlatform(line.options, outputs.err);
        }
        std::visit(Execution(line.options, outputs), line.command);
    }
}

}  // namespace

int run(const std::vector<std::string>& arguments, const Outputs& outputs) noexcept {
    ExitStatus status = ExitStatus::ok;
    const auto complain = [&](ExitStatus reason, const char* message) {
        status = reason;
        outputs.err << "cimdhcp: " << message << '\n';
    };
    try {
        runCommand(arguments, outputs);
    } catch (const Failure& failure) {
        complain(failure.status(), failure.what());
    } catch (const std::exception& exception) {
        complain(ExitStatus::notLoaded, exception.what());
    }
    // What has been printed before a failure is to come out, too.
    if (!outputs.out.flush() && status == ExitStatus::ok) {
        complain(ExitStatus::notLoaded, "the output cannot be written");
    }
    return static_cast<int>(status);
}

}  // namespace cimdhcp
