#include "arguments/OptionGroups.h"

#include <map>
#include <string>

#include "commands/ClientCommands.h"
#include "text/Failure.h"

namespace cimdhcp {

namespace {

constexpr const char* serversGroup = "Other machines";
constexpr const char* outputGroup = "The output";
constexpr int mostParallel = 256;
constexpr int longestTimeout = 86400;

void checkServers(const CommandLine& line) {
    const Options& options = line.options;
    if (!options.remote()) {
        const bool given = options.credentials || options.caCertificate || options.insecure;
        if (given) {
            throw Failure(ExitStatus::usage,
                          "--credentials, --cacert and --insecure are about servers; name "
                          "one with --connect, or several with --hosts");
        }
        return;
    }
    if (!asksClient(line.command)) {
        throw Failure(ExitStatus::usage,
                      "this command is about this machine alone; --connect and --hosts are "
                      "not for it");
    }
    if (options.tree || options.dataDir) {
        throw Failure(ExitStatus::usage,
                      "--tree and --data-dir are about this machine; they cannot be given "
                      "with --connect or --hosts");
    }
    const auto* const rename = std::get_if<RenameCommand>(&line.command);
    if (rename != nullptr && rename->create) {
        throw Failure(ExitStatus::usage, "--create cannot make files on other machines");
    }
}

}  // namespace

void addRemoteOptions(CLI::App& app, Options& options) {
    const auto file = [&app](const char* name, std::optional<std::string>& value,
                             const char* text) {
        app.add_option(name, value, text)->type_name("FILE")->group(serversGroup);
    };
    app.add_option("--connect", options.connect,
                   "A WBEM server to ask, https://HOST; may be repeated")
        ->type_name("URL")
        ->expected(1)
        // Or the parser would take "[::1]" for a list, and the brackets off.
        ->allow_extra_args(false)
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll)
        ->group(serversGroup);
    file("--hosts", options.hosts, "WBEM servers to ask, one per line; -: standard input");
    app.add_option("--parallel", options.parallel,
                   "How many servers are asked at the same time (16)")
        ->type_name("N")
        ->check(CLI::Range(1, mostParallel).description(""))
        ->group(serversGroup);
    app.add_option_function<unsigned>(
           "--timeout",
           [&options](const unsigned& given) { options.timeout = std::chrono::seconds(given); },
           "For all that is asked of one server (30)")
        ->type_name("SECONDS")
        ->check(CLI::Range(1, longestTimeout).description(""))
        ->group(serversGroup);
    file("--credentials", options.credentials, "Lines: machine HOST login USER password SECRET");
    file("--cacert", options.caCertificate, "Who vouches for servers (PEM), not the system's");
    app.add_flag("--insecure", options.insecure, "Trust any server, and send passwords over http")
        ->group(serversGroup);
}

void addOutputOptions(CLI::App& app, Options& options) {
    app.add_flag("--no-header", options.noHeader, "Tables without their headings")
        ->group(outputGroup);
    app.add_option("--sort", options.sort, "Sort by a column, by PATH or by a property")
        ->type_name("COLUMN")
        ->group(outputGroup);
    app.add_flag("--count", options.count, "How many there are, and nothing else")
        ->group(outputGroup);
    app.add_flag("--time", options.time, "Tell how long it took")->group(outputGroup);
    const std::map<std::string, ColorMode> modes{
        {"auto", ColorMode::automatic}, {"always", ColorMode::always}, {"never", ColorMode::never}};
    app.add_option_function<std::string>(
           "--color",
           [&options, modes](const std::string& name) { options.color = modes.at(name); },
           "auto (the default: on a terminal), always or never")
        ->type_name("WHEN")
        ->check([modes](const std::string& name) {
            return modes.contains(name) ? std::string()
                                        : "--color is auto, always or never, not \"" + name + "\"";
        })
        ->group(outputGroup);
}

void checkOptionsFor(const CommandLine& line) {
    const Options& options = line.options;
    checkServers(line);
    if ((options.sort || options.count) && !answersList(line.command)) {
        throw Failure(ExitStatus::usage, "this command answers no list: there is nothing to " +
                                             std::string(options.sort ? "sort" : "count"));
    }
}

}  // namespace cimdhcp
