#include "arguments/OptionGroups.h"

#include <CLI/CLI.hpp>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <sstream>
#include <string>
#include <vector>

#include "zrcommon/Strings.h"

namespace cimdhcp {

namespace {

constexpr const char* serversGroup = "Other machines";
constexpr const char* outputGroup = "The output";
constexpr int mostParallel = 256;
constexpr int longestTimeout = 86400;

constexpr const char* limitGroup = "Limits of what a client may cost; none can be switched off";

void addLimits(CLI::App& app, cimom::wbem::Limits& limits) {
    const auto number = [&app](const char* option, std::size_t& value, const char* text) {
        app.add_option(option, value, text)->type_name("N")->group(limitGroup);
    };
    const auto seconds = [&app](const char* option, std::chrono::seconds& value, const char* text) {
        app.add_option_function<std::uint32_t>(
               option,
               [&value](const std::uint32_t& given) { value = std::chrono::seconds(given); }, text)
            ->type_name("SECONDS")
            ->group(limitGroup);
    };
    number("--max-header-line", limits.headerLine, "Bytes of one header (8192)");
    number("--max-headers", limits.headers, "Bytes of all headers (16384)");
    number("--max-body", limits.body, "Bytes of a request (1048576)");
    number("--max-depth", limits.depth, "Depth of a request's XML (64)");
    number("--max-connections", limits.connections, "Open connections (512)");
    number("--max-connections-each", limits.connectionsEach,
           "Of these, of an address that has not shown a right password (128)");
    number("--max-connection-rate", limits.connectionRate,
           "New ones of such an address in a second, once it has had so many (20)");
    number("--max-checks-each", limits.checksEach,
           "Passwords of an address that are checked at the same time (8)");
    number("--max-refusals-each", limits.refusalsEach,
           "Wrong passwords of an address in a minute (60)");
    number("--max-memory", limits.memory, "Bytes that all requests take (50331648)");
    number("--max-waiting", limits.waiting, "Requests that wait for a worker (256)");
    number("--max-enumerations", limits.sessions.sessions, "Open enumerations (128)");
    number("--max-enumerations-each", limits.sessions.each,
           "Of these, of one user or address (32)");
    number("--max-result", limits.result, "Bytes of a result (1073741824)");
    number("--workers", limits.workers, "Operations at the same time (4)");
    number("--max-stuck", limits.stuck,
           "Further workers, for those whose operation does not return (16)");
    number("--io-threads", limits.ioThreads, "Threads that read and send (2)");
    seconds("--head-timeout", limits.head, "For the head of the first request of a connection (5)");
    seconds("--request-timeout", limits.request,
            "For a request to arrive, and again for its operation (30)");
    seconds("--answer-timeout", limits.response, "For a client to take its response (300)");
    seconds("--enumeration-timeout", limits.sessions.defaultTimeout,
            "Silence after which an open enumeration is forgotten (60)");
    seconds("--max-enumeration-timeout", limits.sessions.longestTimeout,
            "The longest such silence that a client may ask for (600)");
}

constexpr const char* deliveryGroup = "Subscriptions and their listeners";

void addDelivery(CLI::App& app, ServeCommand& serve) {
    constexpr std::uint32_t mostObjects = 100000;
    constexpr std::uint32_t longest = 31536000;  // seconds
    const auto number = [&app](const char* option, auto& value, std::uint32_t least,
                               const char* text) {
        app.add_option(option, value, text)
            ->type_name("N")
            ->check(CLI::Range(least, mostObjects).description(""))
            ->group(deliveryGroup);
    };
    const auto seconds = [&app](const char* option, std::chrono::milliseconds& value,
                                const char* text) {
        app.add_option_function<std::uint32_t>(
               option,
               [&value](const std::uint32_t& given) { value = std::chrono::seconds(given); }, text)
            ->type_name("SECONDS")
            ->check(CLI::Range(std::uint32_t{1}, longest).description(""))
            ->group(deliveryGroup);
    };
    app.add_option("--subscriptions", serve.subscriptions,
                   "Where they are kept; /var/lib/dhcp-client-provider/subscriptions")
        ->type_name("DIR")
        ->group(deliveryGroup);
    app.add_option("--listener-cacert", serve.delivery.caCertificates,
                   "Who vouches for listeners (PEM), not the system's")
        ->type_name("FILE")
        ->group(deliveryGroup);
    number("--max-filters", serve.subscriptionLimits.filters, 1, "Filters of a user (64)");
    number("--max-listeners", serve.subscriptionLimits.listeners, 1,
           "Listener destinations of a user (16)");
    number("--max-subscriptions", serve.subscriptionLimits.subscriptions, 1,
           "Subscriptions of a user (64)");
    number("--max-queue", serve.delivery.queued, 1, "Indications that wait for a listener (1000)");
    number("--delivery-retries", serve.delivery.retries, 0,
           "How often a delivery is tried again (3)");
    seconds("--retry-interval", serve.delivery.retryInterval, "The time between attempts (30)");
    seconds("--listener-timeout", serve.delivery.patience, "For a listener to respond (10)");
    seconds("--give-up-after", serve.delivery.removalTime,
            "How long a listener may fail before it is given up (86400)");
}

}  // namespace

CLI::Option* addList(CLI::App& app, const char* option, std::vector<std::string>& values,
                     const char* text, const char* type) {
    return app
        .add_option_function<std::vector<std::string>>(
            option,
            [&values, name = std::string(option)](const std::vector<std::string>& lists) {
                for (const std::string& list : lists) {
                    std::istringstream parts(list);
                    for (std::string part; std::getline(parts, part, ',');) {
                        const std::string word(ZR::trim(part));
                        if (word.empty()) {
                            throw CLI::ValidationError(name, "a name is empty in \"" + list + '"');
                        }
                        values.push_back(word);
                    }
                }
            },
            text)
        ->type_name(type)
        ->expected(1)
        ->allow_extra_args(false)
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll)
        ->check([](const std::string& list) {
            return list.empty() ? std::string("it needs a name") : std::string();
        });
}

void addRemoteOptions(CLI::App& app, Options& options) {
    const auto file = [&app](const char* name, std::optional<std::string>& value,
                             const char* text) {
        app.add_option(name, value, text)->type_name("FILE")->group(serversGroup);
    };
    app.add_option("--connect", options.connect,
                   "A WBEM server to ask, https://HOST; may be repeated")
        ->type_name("URL")
        ->expected(1)
        // Otherwise the parser takes "[::1]" for a list, and strips the brackets.
        ->allow_extra_args(false)
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll)
        ->group(serversGroup);
    file("--hosts", options.hosts, "WBEM servers to ask, one per line; -: standard input");
    app.add_option("--parallel", options.parallel,
                   "How many servers are asked at the same time (64)")
        ->type_name("N")
        ->check(CLI::Range(1, mostParallel).description(""))
        ->group(serversGroup);
    app.add_option_function<unsigned>(
           "--timeout",
           [&options](const unsigned& given) { options.timeout = std::chrono::seconds(given); },
           "For all requests to one server together (30)")
        ->type_name("SECONDS")
        ->check(CLI::Range(1, longestTimeout).description(""))
        ->group(serversGroup);
    file("--credentials", options.credentials, "Lines: machine HOST login USER password SECRET");
    file("--cacert", options.caCertificate, "Who vouches for servers (PEM), not the system's");
    app.add_flag("--insecure", options.insecure, "Trust any server, and send passwords over http")
        ->group(serversGroup);
    file("--failed", options.failed, "Gets the servers that failed, as a file for --hosts");
}

void addOutputOptions(CLI::App& app, Options& options) {
    app.add_flag("--no-header", options.table.noHeader, "Tables without their headings")
        ->group(outputGroup);
    app.add_flag("--wide", options.table.wide, "Tables as wide as they are, on a terminal, too")
        ->group(outputGroup);
    addList(app, "--columns", options.table.columns, "Tables with these columns, in this order",
            "COLUMN,...")
        ->group(outputGroup);
    app.add_option("--sort", options.sort, "Sort by a column, by PATH or by a property")
        ->type_name("COLUMN")
        ->group(outputGroup);
    app.add_flag("--count", options.count, "The number of results alone")->group(outputGroup);
    app.add_flag("--time", options.time, "Tell how long it took")->group(outputGroup);
    app.add_flag("--debug", options.debug, "JSON with what helps to debug a provider")
        ->group(outputGroup);
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

void addWatchOptions(CLI::App& app, WatchCommand& watch) {
    constexpr int longestPause = 86400;
    app.add_option_function<unsigned>(
           "--poll", [&watch](const unsigned& given) { watch.poll = std::chrono::seconds(given); },
           "Look so often, where a server cannot tell of changes")
        ->type_name("SECONDS")
        ->check(CLI::Range(1, longestPause).description(""));
    app.add_option("--listen", watch.listen,
                   "Where servers tell of changes: an address of this machine")
        ->type_name("ADDRESS");
}

void addServeOptions(CLI::App& app, ServeCommand& serve) {
    app.add_option("--listen", serve.listen,
                   "Where to listen; 127.0.0.1 by default. Any address that other "
                   "machines reach needs TLS and users")
        ->type_name("ADDRESS[:PORT]");
    const auto file = [&app](const char* option, std::optional<std::string>& value,
                             const char* text) {
        app.add_option(option, value, text)->type_name("FILE");
    };
    file("--tls-cert", serve.tlsCertificate,
         "The certificate with its chain (PEM); the port is then 5989");
    file("--tls-key", serve.tlsKey, "Its private key (PEM)");
    file("--users", serve.users, "Only these users, made by \"cimdhcp user add\"");
    app.add_flag("--read-only", serve.readOnly, "No client may modify");
    app.add_option("--metrics", serve.metrics,
                   "Serve GET /metrics for Prometheus, too; at the address of --listen, port "
                   "9988, by default")
        ->type_name("[ADDRESS:PORT]")
        ->expected(0, 1)
        ->default_str("");
    addLimits(app, serve.limits);
    addDelivery(app, serve);
}

void addExporterOptions(CLI::App& app, ExporterCommand& exporter) {
    const auto file = [&app](const char* option, std::optional<std::string>& value,
                             const char* text) {
        app.add_option(option, value, text)->type_name("FILE");
    };
    app.add_option("--config", exporter.config, "The targets that may be probed (JSON)")
        ->type_name("FILE")
        ->required();
    app.add_option("--listen", exporter.server.listen,
                   "Where to listen; 127.0.0.1:9989 by default. Any address that other "
                   "machines reach needs TLS and users")
        ->type_name("ADDRESS[:PORT]");
    file("--tls-cert", exporter.server.tlsCertificate, "The certificate with its chain (PEM)");
    file("--tls-key", exporter.server.tlsKey, "Its private key (PEM)");
    file("--users", exporter.server.users, "Only these users, made by \"cimdhcp user add\"");
    app.add_flag("--check", exporter.check, "Only tell whether the configuration can be used");
}

}  // namespace cimdhcp
