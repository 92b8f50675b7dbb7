#include "arguments/OptionGroups.h"

#include <stdexcept>
#include <string>
#include <utility>
#include <variant>

#include "text/Failure.h"

namespace cimdhcp {

namespace {

template <typename... Kinds>
bool isOneOf(const Command& command) noexcept {
    return (std::holds_alternative<Kinds>(command) || ...);
}

/// Whether the result of the command is a list, which can be sorted and counted.
bool givesList(const Command& command) noexcept {
    return asksClient(command) && !isOneOf<WatchCommand, RenameCommand, GraphCommand, GetCommand,
                                           ModifyCommand, MetricsCommand>(command);
}

/// Whether what the command prints has columns.
bool hasColumns(const Command& command) noexcept {
    return givesList(command) || isOneOf<GetCommand>(command);
}

bool hasMofForm(const Command& command) noexcept {
    return asksClient(command) &&
           !isOneOf<ShowCommand, WatchCommand, RenameCommand, GraphCommand, ClassesCommand,
                    ProfilesCommand, MetricsCommand, DescribeCommand>(command);
}

[[noreturn]] void refuse(const std::string& reason) {
    throw Failure(ExitStatus::usage, reason);
}

void checkServers(const CommandLine& line) {
    const Options& options = line.options;
    if (!options.remote()) {
        const bool given = options.credentials || options.caCertificate || options.insecure;
        if (given) {
            refuse(
                "--credentials, --cacert and --insecure are about servers; name "
                "one with --connect, or several with --hosts");
        }
        if (options.failed) {
            refuse("--failed gets servers that failed; name them with --connect or --hosts");
        }
        return;
    }
    // The check examines a server otherwise than this machine.
    if (!asksClient(line.command) && !isOneOf<CheckCommand>(line.command)) {
        refuse(
            "this command is about this machine alone; --connect and --hosts are "
            "not for it");
    }
    if (options.tree || options.dataDir) {
        refuse(
            "--tree and --data-dir are about this machine; they cannot be given "
            "with --connect or --hosts");
    }
    if (options.exact) {
        refuse(
            "--exact is about the providers of this machine; it cannot be given with "
            "--connect or --hosts");
    }
    const auto* const rename = std::get_if<RenameCommand>(&line.command);
    if (rename != nullptr && rename->create) {
        refuse("--create cannot make files on other machines");
    }
    if (options.failed && isOneOf<WatchCommand>(line.command)) {
        refuse("a watch asks servers that fail again; --failed is not for it");
    }
}

void checkFormat(const CommandLine& line) {
    const Format format = line.options.format;
    if (format == Format::json && std::holds_alternative<GraphCommand>(line.command)) {
        refuse(
            "a graph has no JSON output; it is in Graphviz' language, or with --svg "
            "drawn");
    }
    if (format == Format::json && std::holds_alternative<MetricsCommand>(line.command)) {
        refuse("metrics have no JSON output; they are in the text format of Prometheus");
    }
    if (format == Format::mof && !hasMofForm(line.command)) {
        refuse("this command has no MOF output; use --format table or json");
    }
    if (format == Format::tsv && !hasColumns(line.command)) {
        refuse("the result of this command has no columns: it has no tsv output");
    }
    if (line.options.table.columns.empty()) {
        return;
    }
    if (!hasColumns(line.command)) {
        refuse("the result of this command has no columns to choose from");
    }
    if (format != Format::table && format != Format::tsv) {
        refuse("--columns is for --format table and tsv");
    }
}

void checkWatch(const CommandLine& line) {
    const auto* const watch = std::get_if<WatchCommand>(&line.command);
    if (watch != nullptr && watch->listen && (watch->poll || !line.options.remote())) {
        refuse(
            "--listen is for servers that tell of changes: with --connect or --hosts, and "
            "without --poll");
    }
}

void checkLimits(const Command& command) {
    if (const auto* const serve = std::get_if<ServeCommand>(&command)) {
        try {
            serve->limits.check();
        } catch (const std::invalid_argument& error) {
            refuse(std::string("--") + error.what());
        }
    }
}

}  // namespace

bool asksClient(const Command& command) noexcept {
    return !isOneOf<TreeCommand, ServeCommand, UserAddCommand, CheckCommand, ExporterCommand,
                    CompleteCommand>(command);
}

void completeCommandLine(CommandLine& line) {
    Options& options = line.options;
    std::string& nameSpace = options.nameSpace;
    nameSpace.erase(0, nameSpace.find_first_not_of('/'));
    nameSpace.erase(nameSpace.find_last_not_of('/') + 1);
    if (nameSpace.empty()) {
        refuse("--namespace needs a name, such as root/cimv2");
    }
    for (const auto& [name, value] :
         {std::pair{"--tree", &options.tree}, std::pair{"--data-dir", &options.dataDir}}) {
        if (*value && (*value)->empty()) {
            refuse(std::string(name) + " needs a name");
        }
    }
    checkLimits(line.command);
    checkWatch(line);
    checkServers(line);
    if ((options.sort || options.count) && !givesList(line.command)) {
        refuse("the result of this command is not a list: there is nothing to " +
               std::string(options.sort ? "sort" : "count"));
    }
    checkFormat(line);
}

}  // namespace cimdhcp
