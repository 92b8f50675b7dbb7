#include "commands/ClientCommands.h"

#include <cstdint>
#include <type_traits>
#include <utility>

#include "client/Client.h"
#include "client/Response.h"
#include "commands/CimOperations.h"
#include "commands/ClassTable.h"
#include "commands/DiagnosticText.h"
#include "commands/Findings.h"
#include "commands/Graph.h"
#include "commands/Metrics.h"
#include "commands/Overview.h"
#include "commands/PlatformSetup.h"
#include "commands/Profiles.h"
#include "commands/Rename.h"
#include "commands/ResponseText.h"
#include "text/JsonText.h"

namespace cimdhcp {

namespace {

template <typename Held, typename... Kinds>
constexpr bool isOneOf = (std::is_same_v<Held, Kinds> || ...);

class Execution {
  public:
    Execution(Client& client, const Presentation& presentation)
        : client_(client), presentation_(presentation) {}

    Outcome operator()(const ShowCommand& /*command*/) const {
        // Those of a tree are told by the name that a person gave it.
        MachineInterfaces machine =
            askMachine(client_, treeName().empty() ? AskDiagnostics::Yes : AskDiagnostics::No);
        const std::int64_t now = presentation_.now;
        std::string diagnostics = diagnosticText(machine.diagnostics, machine.interfaces);
        if (!presentation_.count) {
            diagnostics += unknownText(machine.interfaces, now);
        }
        using Rows = std::vector<InterfaceOverview>;
        return {list(
                    overviewColumns(now), std::move(machine.interfaces),
                    [now](const Rows& rows, std::optional<std::size_t> width, const Style& style) {
                        return overviewTable(rows, now, width, style);
                    },
                    [now](const Rows& rows) { return overviewJson(rows, now); }),
                std::move(diagnostics), std::nullopt};
    }

    Outcome operator()(const ClassesCommand& /*command*/) const {
        return {list(classColumns(), client_.servedClasses(), classTable, classJson), "",
                std::nullopt};
    }

    Outcome operator()(const ProfilesCommand& /*command*/) const {
        Profiles read = readProfiles(client_);
        return {list(profileColumns(), std::move(read.profiles), profileTable,
                     [&read](const std::vector<Profile>& profiles) {
                         return profileJson(read.nameSpace, profiles);
                     }),
                "", std::nullopt};
    }

    Outcome operator()(const MetricsCommand& command) const {
        const MachineInterfaces machine = askMachine(client_, AskDiagnostics::Yes);
        const std::string text = cimom::wbem::metricsText(
            machineMetrics(machine, presentation_.now), cimom::wbem::MetricsFormat::text);
        if (!command.output) {
            return {text, "", std::nullopt};
        }
        replaceFile(*command.output, text);
        return {};
    }

    Outcome operator()(const RenameCommand& command) const {
        const RenameReport report = rename(command, client_);
        return {presentation_.json() ? renameJson(report) : renameText(report),
                renameRemarks(command, report), std::nullopt};
    }

    Outcome operator()(const GraphCommand& command) const {
        const std::string text = graphvizText(graphOfMachine(client_));
        return {command.svg ? drawSvg(text) : text, "", std::nullopt};
    }

    Outcome operator()(const CheckCommand& /*command*/) const {
        const std::vector<Finding> findings = serverFindings(client_);
        Outcome outcome{presentation_.json() ? findingsJson(findings) : findingsText(findings), "",
                        std::nullopt};
        if (!isGood(findings)) {
            outcome.failure = somethingIsWrong();
        }
        return outcome;
    }

    template <typename Kind>
    Outcome operator()(const Kind& command) const {
        if constexpr (isOneOf<Kind, TreeCommand, ServeCommand, UserAddCommand, WatchCommand,
                              ExporterCommand>) {
            throw Failure(ExitStatus::usage, "this command does not ask one server once");
        } else {
            CimOperation operation = cimdhcp::carryOut(command, client_);
            if (presentation_.sort) {
                sortResponse(*presentation_.sort, operation.response);
            }
            Outcome outcome{formatted(operation.response), "", std::nullopt};
            if (!operation.response.status.ok()) {
                outcome.failure = client_.failure(operation.response, operation.path);
            } else if (std::is_same_v<Kind, ModifyCommand> &&
                       presentation_.format == Format::table) {
                outcome.text += "Modified.\n";
            }
            return outcome;
        }
    }

  private:
    /// `table` and `json` make the text of rows; a table has a width and a style, too.
    template <typename Row, typename TableText, typename JsonText>
    [[nodiscard]] std::string list(const std::vector<Column<Row>>& columns, std::vector<Row> rows,
                                   const TableText& table, const JsonText& json) const {
        if (presentation_.sort) {
            sortBy(*presentation_.sort, columns, rows);
        }
        if (presentation_.count) {
            return counted(rows.size());
        }
        return presentation_.json() ? json(rows)
                                    : table(rows, presentation_.width, presentation_.style);
    }

    [[nodiscard]] std::string counted(std::size_t number) const {
        return presentation_.json() ? jsonText(JsonMembers{{"count", std::uint64_t{number}}})
                                    : std::to_string(number) + '\n';
    }

    [[nodiscard]] std::string formatted(const Response& response) const {
        if (presentation_.count && response.status.ok()) {
            return counted(response.paths.size() + response.instances.size());
        }
        switch (presentation_.format) {
            case Format::json:
                return asJson(response);
            case Format::mof:
                return asMof(response, client_.classes());
            case Format::table:
                break;
        }
        return asTable(response, client_.classes(), presentation_.width, presentation_.style);
    }

    Client& client_;
    const Presentation& presentation_;
};

}  // namespace

Outcome carryOut(const Command& command, Client& client, const Presentation& presentation) {
    return std::visit(Execution(client, presentation), command);
}

}  // namespace cimdhcp
