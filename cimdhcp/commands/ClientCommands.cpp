#include "commands/ClientCommands.h"

#include <nlohmann/json.hpp>
#include <type_traits>
#include <utility>
#include <variant>

#include "client/ClassList.h"
#include "client/MachineInterfaces.h"
#include "commands/Graph.h"
#include "commands/GraphDrawing.h"
#include "commands/Operations.h"
#include "commands/Overview.h"
#include "commands/Rename.h"
#include "commands/ResponseOrder.h"
#include "commands/ResponseText.h"
#include "text/JsonText.h"
#include "text/MofFormat.h"

namespace cimdhcp {

namespace {

template <typename Held, typename... Kinds>
constexpr bool isOneOf = (std::is_same_v<Held, Kinds> || ...);

class Execution {
  public:
    Execution(Client& client, const Presentation& presentation)
        : client_(client), presentation_(presentation) {}

    Outcome operator()(const ShowCommand& /*command*/) const {
        const ServedInstances served = askProvider(client_);
        MachineInterfaces machine = client_.interfaces(served);
        addServed(served, client_.classes(), machine.interfaces);
        return {list(overviewColumns(), std::move(machine.interfaces), overviewTable, overviewJson),
                remarkLine(machine.remarks), std::nullopt};
    }

    Outcome operator()(const ClassesCommand& /*command*/) const {
        return {list(classColumns(), client_.servedClasses(), classTable, classJson), "",
                std::nullopt};
    }

    Outcome operator()(const RenameCommand& command) const {
        const RenameReport report = rename(command, client_);
        return {presentation_.json() ? renameJson(report) : renameText(report), "", std::nullopt};
    }

    Outcome operator()(const GraphCommand& command) const {
        const std::string text = graphvizText(graphOfMachine(client_));
        return {command.svg ? drawSvg(text) : text, "", std::nullopt};
    }

    template <typename Kind>
    Outcome operator()(const Kind& command) const {
        if constexpr (isOneOf<Kind, TreeCommand, ServeCommand, UserAddCommand, CheckCommand>) {
            throw Failure(ExitStatus::usage, "this command is about this machine alone");
        } else {
            Request request = cimdhcp::carryOut(command, client_);
            if (presentation_.sort) {
                sortAnswer(*presentation_.sort, request.answer);
            }
            Outcome outcome{formatted(request.answer), "", std::nullopt};
            if (!request.answer.status.ok()) {
                outcome.failure = client_.failure(request.answer, request.asked);
            } else if (std::is_same_v<Kind, ModifyCommand> &&
                       presentation_.format == Format::table) {
                outcome.text += "Modified.\n";
            }
            return outcome;
        }
    }

  private:
    template <typename Row>
    std::string list(const std::vector<Column<Row>>& columns, std::vector<Row> rows,
                     std::string (*table)(const std::vector<Row>&, std::optional<std::size_t>,
                                          const Style&),
                     std::string (*json)(const std::vector<Row>&)) const {
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
        return presentation_.json() ? jsonText({{"count", number}}) : std::to_string(number) + '\n';
    }

    [[nodiscard]] std::string formatted(const Answer& answer) const {
        if (presentation_.count && answer.status.ok()) {
            return counted(answer.paths.size() + answer.instances.size());
        }
        switch (presentation_.format) {
            case Format::json:
                return asJson(answer);
            case Format::mof:
                return asMof(answer, client_.classes());
            case Format::table:
                break;
        }
        return asTable(answer, client_.classes(), presentation_.width, presentation_.style);
    }

    Client& client_;
    const Presentation& presentation_;
};

}  // namespace

bool asksClient(const Command& command) noexcept {
    return !std::holds_alternative<TreeCommand>(command) &&
           !std::holds_alternative<ServeCommand>(command) &&
           !std::holds_alternative<UserAddCommand>(command) &&
           !std::holds_alternative<CheckCommand>(command);
}

bool answersList(const Command& command) noexcept {
    return asksClient(command) && !std::holds_alternative<RenameCommand>(command) &&
           !std::holds_alternative<GraphCommand>(command) &&
           !std::holds_alternative<GetCommand>(command) &&
           !std::holds_alternative<ModifyCommand>(command);
}

Outcome carryOut(const Command& command, Client& client, const Presentation& presentation) {
    return std::visit(Execution(client, presentation), command);
}

}  // namespace cimdhcp
