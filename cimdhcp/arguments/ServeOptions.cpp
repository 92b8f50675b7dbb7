#include "arguments/ServeOptions.h"

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

namespace cimdhcp {

namespace {

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
    number("--max-waiting", limits.waiting, "Requests that wait for a worker (256)");
    number("--max-enumerations", limits.sessions.sessions, "Open enumerations (64)");
    number("--max-result", limits.result, "Bytes of a result (1073741824)");
    number("--workers", limits.workers, "Operations at the same time (4)");
    number("--max-stuck", limits.stuck,
           "Further workers, for those whose operation does not return (16)");
    number("--io-threads", limits.ioThreads, "Threads that read and send (2)");
    seconds("--request-timeout", limits.request,
            "For a request to arrive, and again for its operation (30)");
    seconds("--answer-timeout", limits.response, "For a client to take its answer (300)");
    seconds("--enumeration-timeout", limits.sessions.defaultTimeout,
            "Silence after which an open enumeration is forgotten (60)");
    seconds("--max-enumeration-timeout", limits.sessions.longestTimeout,
            "The longest such silence that a client may ask for (600)");
}

}  // namespace

void addServeOptions(CLI::App& app, ServeCommand& serve) {
    app.add_option("--listen", serve.listen,
                   "Where to listen; 127.0.0.1 if nothing is said. Any address that other "
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
    app.add_flag("--read-only", serve.readOnly, "Nobody may modify");
    addLimits(app, serve.limits);
}

}  // namespace cimdhcp
