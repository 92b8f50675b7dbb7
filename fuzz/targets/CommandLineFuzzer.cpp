// The arguments of cimdhcp with zero bytes between. They are read, and nothing is done.
#include "arguments/CommandLine.h"

#include <algorithm>
#include <chrono>

#include "Input.h"
#include "commands/Serve.h"
#include "text/Failure.h"

namespace {

using Arguments = std::vector<std::string>;
using cimdhcp::CommandLine;

void addOption(Arguments& arguments, const char* name, const std::optional<std::string>& value) {
    if (value) {
        arguments.push_back(std::string("--") + name + '=' + *value);
    }
}

void addFlag(Arguments& arguments, const char* name, bool given) {
    if (given) {
        arguments.push_back(std::string("--") + name);
    }
}

/// Each name of a list, which may be given one by one.
void addList(Arguments& arguments, const char* name, const Arguments& values) {
    for (const std::string& value : values) {
        addOption(arguments, name, value);
    }
}

/// Operands, which may begin with a "-".
void addOperands(Arguments& arguments, const Arguments& operands) {
    arguments.emplace_back("--");
    arguments.insert(arguments.end(), operands.begin(), operands.end());
}

/// Writes the arguments of a command behind the options that all have.
struct Writer {
    Arguments arguments;

    void operator()(const cimdhcp::ShowCommand& command) {
        arguments.emplace_back("show");
        addOperands(arguments, command.interfaces);
    }
    void operator()(const cimdhcp::WatchCommand& command) {
        arguments.emplace_back("watch");
        if (command.poll) {
            addNumber("poll", command.poll->count());
        }
        addOption(arguments, "listen", command.listen);
        addOperands(arguments, command.interfaces);
    }
    void operator()(const cimdhcp::ProfilesCommand&) { arguments.emplace_back("profiles"); }
    void operator()(const cimdhcp::ClassesCommand&) { arguments.emplace_back("classes"); }
    void operator()(const cimdhcp::CheckCommand&) { arguments.emplace_back("check"); }
    void operator()(const cimdhcp::RenameCommand& command) {
        arguments.emplace_back("rename");
        addFlag(arguments, "create", command.create);
        addFlag(arguments, "force", command.force);
        addOperands(arguments, {command.interfaceName, command.name});
    }
    void operator()(const cimdhcp::GraphCommand& command) {
        arguments.emplace_back("graph");
        addFlag(arguments, "svg", command.svg);
    }
    void operator()(const cimdhcp::TreeCommand& command) {
        arguments.emplace_back("tree");
        addFlag(arguments, "explain", command.explain);
    }
    void operator()(const cimdhcp::DescribeCommand& command) {
        arguments.emplace_back("describe");
        addOperands(arguments, {command.className});
    }
    void operator()(const cimdhcp::CompleteCommand& command) {
        // What stands before it would be of the line that is completed.
        arguments = {"complete"};
        arguments.insert(arguments.end(), command.words.begin(), command.words.end());
    }
    void operator()(const cimdhcp::NamesCommand& command) {
        arguments.emplace_back("names");
        addOperands(arguments, {command.className});
    }
    void operator()(const cimdhcp::InstancesCommand& command) {
        arguments.emplace_back("instances");
        addList(arguments, "properties", command.properties);
        addOperands(arguments, {command.className});
    }
    void operator()(const cimdhcp::GetCommand& command) {
        arguments.emplace_back("get");
        addList(arguments, "properties", command.properties);
        addOperands(arguments, {command.path});
    }
    void operator()(const cimdhcp::ModifyCommand& command) {
        arguments.emplace_back("modify");
        Arguments operands{command.path};
        operands.insert(operands.end(), command.assignments.begin(), command.assignments.end());
        addOperands(arguments, operands);
    }
    void operator()(const cimdhcp::AssociatorsCommand& command) {
        arguments.emplace_back("associators");
        addFlag(arguments, "names", command.names);
        addOption(arguments, "assoc-class", command.assocClass);
        addOption(arguments, "result-class", command.resultClass);
        addOption(arguments, "role", command.role);
        addOption(arguments, "result-role", command.resultRole);
        addOperands(arguments, {command.path});
    }
    void operator()(const cimdhcp::ReferencesCommand& command) {
        arguments.emplace_back("references");
        addFlag(arguments, "names", command.names);
        addOption(arguments, "result-class", command.resultClass);
        addOption(arguments, "role", command.role);
        addOperands(arguments, {command.path});
    }
    void operator()(const cimdhcp::ServeCommand& command) {
        arguments.emplace_back("serve");
        addOption(arguments, "listen", command.listen);
        addOption(arguments, "tls-cert", command.tlsCertificate);
        addOption(arguments, "tls-key", command.tlsKey);
        addOption(arguments, "users", command.users);
        addFlag(arguments, "read-only", command.readOnly);
        addOption(arguments, "metrics", command.metrics);
        addOption(arguments, "subscriptions", command.subscriptions);
        addOption(arguments, "listener-cacert", command.delivery.caCertificates);
        addLimits(command.limits);
        addNumber("max-filters", command.subscriptionLimits.filters);
        addNumber("max-listeners", command.subscriptionLimits.listeners);
        addNumber("max-subscriptions", command.subscriptionLimits.subscriptions);
        addNumber("max-queue", command.delivery.queued);
        addNumber("delivery-retries", command.delivery.retries);
        addSeconds("retry-interval", command.delivery.retryInterval);
        addSeconds("listener-timeout", command.delivery.patience);
        addSeconds("give-up-after", command.delivery.removalTime);
    }
    void operator()(const cimdhcp::MetricsCommand& command) {
        arguments.emplace_back("metrics");
        addOption(arguments, "output", command.output);
    }
    void operator()(const cimdhcp::ExporterCommand& command) {
        arguments.emplace_back("exporter");
        addOption(arguments, "config", command.config);
        addOption(arguments, "listen", command.server.listen);
        addOption(arguments, "tls-cert", command.server.tlsCertificate);
        addOption(arguments, "tls-key", command.server.tlsKey);
        addOption(arguments, "users", command.server.users);
        addFlag(arguments, "check", command.check);
    }
    void operator()(const cimdhcp::UserAddCommand& command) {
        arguments.emplace_back("user");
        arguments.emplace_back("add");
        addOption(arguments, "users", command.users);
        addFlag(arguments, "modify", command.mayModify);
        addOperands(arguments, {command.name});
    }

  private:
    template <typename Number>
    void addNumber(const char* name, Number number) {
        addOption(arguments, name, std::to_string(number));
    }
    void addSeconds(const char* name, std::chrono::milliseconds time) {
        addNumber(name, std::chrono::duration_cast<std::chrono::seconds>(time).count());
    }
    void addLimits(const cimom::wbem::Limits& limits) {
        const auto add = [this](const char* name, auto number) { addNumber(name, number); };
        add("max-header-line", limits.headerLine);
        add("max-headers", limits.headers);
        add("max-body", limits.body);
        add("max-depth", limits.depth);
        add("max-connections", limits.connections);
        add("max-connections-each", limits.connectionsEach);
        add("max-connection-rate", limits.connectionRate);
        add("max-checks-each", limits.checksEach);
        add("max-refusals-each", limits.refusalsEach);
        add("max-memory", limits.memory);
        add("max-waiting", limits.waiting);
        add("max-enumerations", limits.sessions.sessions);
        add("max-enumerations-each", limits.sessions.each);
        add("max-result", limits.result);
        add("workers", limits.workers);
        add("max-stuck", limits.stuck);
        add("io-threads", limits.ioThreads);
        add("head-timeout", limits.head.count());
        add("request-timeout", limits.request.count());
        add("answer-timeout", limits.response.count());
        add("enumeration-timeout", limits.sessions.defaultTimeout.count());
        add("max-enumeration-timeout", limits.sessions.longestTimeout.count());
    }
};

const char* nameOf(cimdhcp::Format format) {
    return format == cimdhcp::Format::mof    ? "mof"
           : format == cimdhcp::Format::json ? "json"
           : format == cimdhcp::Format::tsv  ? "tsv"
                                             : "table";
}

const char* nameOf(cimdhcp::ColorMode mode) {
    return mode == cimdhcp::ColorMode::always  ? "always"
           : mode == cimdhcp::ColorMode::never ? "never"
                                               : "auto";
}

Arguments written(const CommandLine& line) {
    Writer writer;
    addOption(writer.arguments, "tree", line.options.tree);
    addOption(writer.arguments, "data-dir", line.options.dataDir);
    addOption(writer.arguments, "namespace", line.options.nameSpace);
    addOption(writer.arguments, "format", nameOf(line.options.format));
    addOption(writer.arguments, "schema-dir", line.options.directories.schemaDir);
    addOption(writer.arguments, "registration-dir", line.options.directories.registrationDir);
    for (const std::string& directory : line.options.directories.providerDirs) {
        addOption(writer.arguments, "provider-dir", directory);
    }
    addOption(writer.arguments, "cim-schema", line.options.directories.cimSchema);
    for (const std::string& server : line.options.connect) {
        addOption(writer.arguments, "connect", server);
    }
    addOption(writer.arguments, "hosts", line.options.hosts);
    addOption(writer.arguments, "parallel", std::to_string(line.options.parallel));
    addOption(writer.arguments, "timeout", std::to_string(line.options.timeout.count()));
    addOption(writer.arguments, "cacert", line.options.caCertificate);
    addFlag(writer.arguments, "insecure", line.options.insecure);
    addOption(writer.arguments, "credentials", line.options.credentials);
    addOption(writer.arguments, "failed", line.options.failed);
    addFlag(writer.arguments, "exact", line.options.exact);
    addFlag(writer.arguments, "debug", line.options.debug);
    addFlag(writer.arguments, "no-header", line.options.table.noHeader);
    addFlag(writer.arguments, "wide", line.options.table.wide);
    addList(writer.arguments, "columns", line.options.table.columns);
    addOption(writer.arguments, "sort", line.options.sort);
    addFlag(writer.arguments, "count", line.options.count);
    addFlag(writer.arguments, "time", line.options.time);
    addOption(writer.arguments, "color", nameOf(line.options.color));
    std::visit(writer, line.command);
    return writer.arguments;
}

/// Making the parser takes a hundred times as long as reading a line. That it keeps
/// nothing from line to line shows with each line that is read again.
std::variant<CommandLine, cimdhcp::Information> readLine(const Arguments& arguments) {
    static cimdhcp::CommandLineReader reader;
    return reader.read(arguments);
}

/// What comes of a line that was read and written; no text when it is refused.
std::variant<CommandLine, cimdhcp::Information> readAgain(const CommandLine& line) {
    try {
        return readLine(written(line));
    } catch (const cimdhcp::Failure& failure) {
        static_cast<void>(std::fprintf(stderr, "%s\n", failure.what()));
        return cimdhcp::Information{};
    }
}

/// The parser takes "[a,b]" for a list of two, also within such a list. No assignment
/// begins so.
bool hasBrackets(const CommandLine& line) {
    const auto* const modify = std::get_if<cimdhcp::ModifyCommand>(&line.command);
    return modify != nullptr &&
           std::any_of(modify->assignments.begin(), modify->assignments.end(),
                       [](const std::string& each) { return each.starts_with('['); });
}

void checkListening(const CommandLine& line) {
    const auto* const serve = std::get_if<cimdhcp::ServeCommand>(&line.command);
    if (serve == nullptr) {
        return;
    }
    try {
        const cimdhcp::Listening listening = cimdhcp::readListening(serve->listen);
        if (listening.port) {
            fuzz::require(serve->listen.ends_with(':' + std::to_string(*listening.port)) ||
                              serve->listen.find(":0") != std::string::npos,
                          "a port stands behind a colon");
        }
        // In brackets an address has no end within itself.
        if (listening.address.find(']') == std::string::npos) {
            fuzz::require(
                cimdhcp::readListening('[' + listening.address + ']').address == listening.address,
                "an address survives being written");
        }
    } catch (const cimdhcp::Failure& failure) {
        fuzz::require(failure.status() == cimdhcp::ExitStatus::usage, "what is wrong is the usage");
    }
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto parts = fuzz::fields(fuzz::text(data, size));
    try {
        const auto read = readLine({parts.begin(), parts.end()});
        const auto* const line = std::get_if<CommandLine>(&read);
        if (line == nullptr) {
            fuzz::require(!std::get<cimdhcp::Information>(read).text.empty(), "help helps");
            return 0;
        }
        checkListening(*line);
        fuzz::require(hasBrackets(*line) || readAgain(*line) == read,
                      "a command line survives being written");
    } catch (const cimdhcp::Failure& failure) {
        fuzz::require(failure.status() == cimdhcp::ExitStatus::usage, "what is wrong is the usage");
        fuzz::require(std::string_view(failure.what()).find('\n') == std::string_view::npos,
                      "what is wrong is told in one line");
    }
    return 0;
}
