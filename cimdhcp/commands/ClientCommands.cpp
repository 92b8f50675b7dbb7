#include "commands/ClientCommands.h"

#include <cstdint>
#include <type_traits>
#include <utility>

#include "arguments/ArgumentValue.h"
#include "cimom/ClassDeclaration.h"
#include "client/Client.h"
#include "client/Response.h"
#include "commands/Detail.h"
#include "commands/DiagnosticText.h"
#include "commands/Graph.h"
#include "commands/Metrics.h"
#include "commands/Overview.h"
#include "commands/PlatformSetup.h"
#include "commands/Profiles.h"
#include "commands/check/Findings.h"
#include "commands/classes/CimOperations.h"
#include "commands/classes/ClassTable.h"
#include "commands/classes/ResponseText.h"
#include "commands/rename/Rename.h"
#include "text/JsonText.h"

namespace cimdhcp {

namespace {

template <typename Held, typename... Kinds>
constexpr bool isOneOf = (std::is_same_v<Held, Kinds> || ...);

class Execution {
  public:
    Execution(Client& client, const Presentation& presentation, const TellStep& tell)
        : client_(client), presentation_(presentation), tell_(tell) {}

    Outcome operator()(const ShowCommand& command) const {
        const ServedInstances served = askServed(client_);
        // Those of a tree are told by the name that a person gave it.
        MachineInterfaces machine = askMachine(
            client_, treeName().empty() ? AskDiagnostics::Yes : AskDiagnostics::No, served);
        std::vector<InterfaceDetail> details;
        if (!command.interfaces.empty()) {
            details = detailsOf(command.interfaces, served, machine);
            machine.interfaces.clear();
            for (const InterfaceDetail& detail : details) {
                machine.interfaces.push_back(detail.overview);
            }
        }
        const std::int64_t now = presentation_.now;
        std::string diagnostics = diagnosticText(machine.diagnostics, machine.interfaces);
        if (!presentation_.count) {
            diagnostics += unknownText(machine.interfaces, now);
        }
        const bool inDetail = !details.empty() && !presentation_.sort && !presentation_.count &&
                              presentation_.columns.empty();
        if (inDetail && presentation_.json()) {
            return {detailJson(details, now), std::move(diagnostics), std::nullopt};
        }
        if (inDetail && presentation_.format == Format::table) {
            return {detailText(details, now, client_.classes(), presentation_.width,
                               presentation_.style),
                    std::move(diagnostics), std::nullopt};
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

    Outcome operator()(const DescribeCommand& command) const {
        const cimom::ObjectPath path = readClassArgument(command.className, client_.nameSpace());
        const cimom::ClassDeclaration* const declaration = client_.classes().find(path.className);
        if (declaration == nullptr) {
            Response response;
            response.operation = "GetClass";
            response.status = {CMPI_RC_ERR_INVALID_CLASS, ""};
            throw explainedFailure({path, std::move(response)}, client_);
        }
        using Rows = std::vector<cimom::PropertyDeclaration>;
        return {list(
                    propertyColumns(*declaration), declaration->properties,
                    [&](const Rows& rows, std::optional<std::size_t> width, const Style& style) {
                        cimom::ClassDeclaration sorted = *declaration;
                        sorted.properties = rows;
                        return describeText(sorted, width, style);
                    },
                    [&](const Rows& rows) { return describeJson(*declaration, rows); }),
                "", std::nullopt};
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
        const std::string text = graphvizText(graphOfMachine(client_, tell_));
        if (!command.svg) {
            return {text, "", std::nullopt};
        }
        tell_("drawing", 0, 0);
        return {drawSvg(text), "", std::nullopt};
    }

    Outcome operator()(const CheckCommand& /*command*/) const {
        const std::vector<Finding> findings = serverFindings(client_, tell_);
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
                              ExporterCommand, CompleteCommand>) {
            throw Failure(ExitStatus::usage, "this command does not ask one server once");
        } else {
            CimOperation operation = cimdhcp::carryOut(command, client_);
            if constexpr (isOneOf<Kind, AssociatorsCommand, ReferencesCommand>) {
                // What the exact provider gives is looked at as it is.
                if (!presentation_.exact) {
                    refuseMissingSource(command, operation, client_);
                }
            }
            if (presentation_.sort) {
                sortResponse(*presentation_.sort, operation.response);
            }
            Outcome outcome{formatted(operation.response, columnsFor(command)), "", std::nullopt};
            if (!operation.response.status.ok()) {
                outcome.failure = explainedFailure(operation, client_);
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
        if (presentation_.tsv()) {
            return tsvOf(
                presentation_.columns.empty() ? columns : chosenOf(columns, presentation_.columns),
                rows, presentation_.style.header);
        }
        if (!presentation_.columns.empty()) {
            return tableOf(chosenOf(columns, presentation_.columns), rows)
                .text(presentation_.width, presentation_.style);
        }
        return presentation_.json() ? json(rows)
                                    : table(rows, presentation_.width, presentation_.style);
    }

    [[nodiscard]] std::string counted(std::size_t number) const {
        return presentation_.json() ? jsonText(JsonMembers{{"count", std::uint64_t{number}}})
                                    : std::to_string(number) + '\n';
    }

    /// The columns that were chosen; without any, a property list chooses them.
    template <typename Kind>
    [[nodiscard]] std::vector<std::string> columnsFor(const Kind& command) const {
        std::vector<std::string> columns = presentation_.columns;
        if constexpr (isOneOf<Kind, InstancesCommand, GetCommand>) {
            if (columns.empty() && !command.properties.empty()) {
                columns = command.properties;
                columns.insert(columns.begin(), "PATH");
            }
        }
        return columns;
    }

    [[nodiscard]] std::string formatted(const Response& response,
                                        const std::vector<std::string>& columns) const {
        if (presentation_.count && response.status.ok()) {
            return counted(response.paths.size() + response.instances.size());
        }
        switch (presentation_.format) {
            case Format::json:
                return asJson(response, presentation_.internals);
            case Format::mof:
                return asMof(response, client_.classes());
            case Format::tsv:
                return response.status.ok()
                           ? asTsv(response, client_.classes(), columns, presentation_.style.header)
                           : std::string();
            case Format::table:
                break;
        }
        if (!presentation_.columns.empty() && response.status.ok()) {
            return asColumns(response, client_.classes(), presentation_.columns,
                             presentation_.width, presentation_.style);
        }
        return asTable(response, client_.classes(), presentation_.width, presentation_.style);
    }

    Client& client_;
    const Presentation& presentation_;
    const TellStep& tell_;
};

}  // namespace

Outcome carryOut(const Command& command, Client& client, const Presentation& presentation,
                 const TellStep& tell) {
    return std::visit(Execution(client, presentation, tell), command);
}

}  // namespace cimdhcp
