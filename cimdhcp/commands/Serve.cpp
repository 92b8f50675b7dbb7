#include "commands/Serve.h"

#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <chrono>
#include <condition_variable>
#include <csignal>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

#include "cimom/ClassRepository.h"
#include "cimom/Interop.h"
#include "cimom/ObjectManager.h"
#include "indications/Subscriptions.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "tklogger/TKLogger.h"
#include "wbem/Server.h"
#include "zrcommon/File.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/PlatformSettings.h"

namespace cimdhcp {

namespace {

std::string pemText(const std::string& file) {
    constexpr std::size_t longest = 1U << 20U;
    auto content = ZR::File::read(file, longest);
    if (!content) {
        throw Failure(ExitStatus::notLoaded, file + ": " + std::strerror(errno));
    }
    return *std::move(content);
}

cimom::wbem::ServerSettings::Tls tlsOf(const ServeCommand& command) {
    struct ::stat status {};
    // Whoever has the key can be the server. A group of those that may read keys is usual.
    if (::stat(command.tlsKey->c_str(), &status) == 0 &&
        (status.st_mode & (S_IWGRP | S_IRWXO)) != 0) {
        throw Failure(ExitStatus::notLoaded,
                      printable(*command.tlsKey) +
                          ": may be read or written by others; \"chmod 640\" mends that");
    }
    return {pemText(*command.tlsCertificate), pemText(*command.tlsKey)};
}

/// What the interop namespace tells of the server.
cimom::CommunicationMechanism communicationMechanism(const cimom::wbem::ServerSettings& settings) {
    // Numbers of the value maps of CIM_ObjectManagerCommunicationMechanism.
    constexpr std::uint16_t cimXml = 2;
    constexpr std::uint16_t noAuthentication = 2;
    constexpr std::uint16_t basicAuthentication = 3;
    // Basic read, association traversal, query execution, indications; of these, pulled.
    std::vector<std::uint16_t> operations{2, 6, 7, 9, 10, 11, 12};
    if (!settings.readOnly) {
        // Basic write and instance manipulation.
        operations.insert(operations.end(), {3, 5});
    }
    return {"CIM-XML",
            std::string("CIM-XML over ") + (settings.tls ? "HTTPS" : "HTTP"),
            cimXml,
            "1.0",
            std::move(operations),
            {settings.users ? basicAuthentication : noAuthentication}};
}

/// Notices and failures are kept by default; lines about each request,
/// which only help to find a fault, are not.
void log(cimom::wbem::LogKind kind, const std::string& message) {
    static const std::string category = "ZR.WBEM";
    TKLog::TKLogger::logLevelMessage(
        "cimdhcp/Serve", "log", __LINE__, category,
        kind == cimom::wbem::LogKind::request ? ZR::LogLevel::flow : ZR::LogLevel::failure, nullptr,
        0, 0, printable(message));
}

/// The users as they are now, for those who ask while the server runs. Safe for concurrent use.
class CurrentUsers {
  public:
    explicit CurrentUsers(std::vector<cimom::wbem::User> users) : users_(std::move(users)) {}

    void renew(std::vector<cimom::wbem::User> users) {
        const std::lock_guard lock(mutex_);
        users_.swap(users);
    }
    [[nodiscard]] bool has(const std::string& name) const {
        const std::lock_guard lock(mutex_);
        return std::any_of(users_.begin(), users_.end(),
                           [&name](const auto& user) { return user.name == name; });
    }

  private:
    mutable std::mutex mutex_;
    std::vector<cimom::wbem::User> users_;
};

/// Where subscriptions are kept when the command line does not say it.
std::filesystem::path standardDirectory() {
    // As systemd says it to a service with StateDirectory=, of which the first counts.
    const char* const given = std::getenv("STATE_DIRECTORY");
    const std::string first =
        given == nullptr ? "" : std::string(given).substr(0, std::string_view(given).find(':'));
    return first.empty() ? "/var/lib/dhcp-client-provider/subscriptions" : first;
}

/// The subscriptions of clients. Without a directory that was asked for and can be used, they
/// last as long as the server.
std::unique_ptr<cimom::wbem::Subscriptions> subscriptionsOf(
    const ServeCommand& command, const std::shared_ptr<const CurrentUsers>& users,
    cimom::ObjectManager& manager) {
    cimom::wbem::SubscriptionSettings settings;
    settings.directory =
        command.subscriptions ? std::filesystem::path(*command.subscriptions) : standardDirectory();
    settings.delivery = command.delivery;
    settings.limits = command.subscriptionLimits;
    if (command.delivery.caCertificates) {
        static_cast<void>(pemText(*command.delivery.caCertificates));
    }
    if (users) {
        settings.isUser = [users](const std::string& name) { return users->has(name); };
    }
    const auto tell = [](const std::string& line) { log(cimom::wbem::LogKind::failure, line); };
    try {
        return std::make_unique<cimom::wbem::Subscriptions>(manager, manager.indications(),
                                                            settings, tell);
    } catch (const std::system_error& error) {
        if (command.subscriptions) {
            throw Failure(ExitStatus::notLoaded, printable(error.what()));
        }
        tell(std::string("subscriptions end with the server: ") + error.what());
    }
    settings.directory.clear();
    return std::make_unique<cimom::wbem::Subscriptions>(manager, manager.indications(), settings,
                                                        tell);
}

/// Does one thing of a renewal; tells what it was, or why it stays as it was.
template <typename Action>
void renewed(const std::string& what, Action&& action) {
    try {
        std::forward<Action>(action)();
        log(cimom::wbem::LogKind::notice, "read anew: " + what);
    } catch (const std::exception& error) {
        log(cimom::wbem::LogKind::failure, what + ": not read anew: " + error.what());
    }
}

/// The signals that the server heeds, as sigwait wants them: blocked in all threads,
/// which inherit this one's mask.
sigset_t blockSignals() {
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGTERM);
    sigaddset(&signals, SIGINT);
    sigaddset(&signals, SIGHUP);
    const int error = ::pthread_sigmask(SIG_BLOCK, &signals, nullptr);
    if (error != 0) {
        throw Failure(ExitStatus::notLoaded, std::strerror(error));
    }
    return signals;
}

/// Ends the process by force when its orderly end takes too long: an operation of a
/// provider may never return, and its thread cannot be stopped.
class EndInTime {
  public:
    explicit EndInTime(std::chrono::seconds patience)
        : thread_([this, patience] {
              std::unique_lock lock(mutex_);
              if (!ended_.wait_for(lock, patience, [this] { return over_; })) {
                  log(cimom::wbem::LogKind::failure,
                      "ending without waiting for operations that do not return");
                  std::_Exit(static_cast<int>(ExitStatus::ok));
              }
          }) {}
    ~EndInTime() {
        {
            const std::lock_guard lock(mutex_);
            over_ = true;
        }
        ended_.notify_one();
        thread_.join();
    }
    EndInTime(const EndInTime&) = delete;
    EndInTime& operator=(const EndInTime&) = delete;

  private:
    std::mutex mutex_;
    std::condition_variable ended_;
    bool over_ = false;
    std::thread thread_;
};

/// Where lines are logged may have changed.
void renewLogging() {
    renewed("what is logged, and where", [] {
        const auto settings = ZR::PlatformSettings::read(
            [](const char* name) -> const char* { return std::getenv(name); });
        TKLog::TKLogger::configure({settings.logLevel, settings.logSink},
                                   {settings.traceLevel, settings.traceSink});
        for (const std::string& diagnostic : settings.diagnostics) {
            log(cimom::wbem::LogKind::failure, diagnostic);
        }
    });
}

/// The families of the server itself.
MetricFamilies serverMetrics(const cimom::wbem::Server& server,
                             const cimom::wbem::Subscriptions* subscriptions) {
    MetricFamilies families = server.counts().families();
    families.push_back(buildInfo("cimdhcp_server"));
    const std::size_t count = subscriptions == nullptr ? 0 : subscriptions->count();
    families.push_back({"cimdhcp_server_subscriptions",
                        cimom::wbem::MetricFamily::Kind::gauge,
                        "Subscriptions of clients to indications.",
                        "",
                        {{{}, static_cast<double>(count), ""}}});
    return families;
}

/// The same address, users, certificate and limits as the server's, and another port.
cimom::wbem::ServerSettings metricsSettings(cimom::wbem::ServerSettings settings,
                                            const std::string& place) {
    constexpr std::uint16_t metricsPort = 9988;
    settings.port = metricsPort;
    if (!place.empty()) {
        const Listening listening = readListening(place, "--metrics");
        settings.address = listening.address;
        settings.port = listening.port.value_or(metricsPort);
    }
    return settings;
}

}  // namespace

cimom::wbem::ServerSettings settingsOf(const ServeCommand& command) {
    const Listening listening = readListening(command.listen);
    cimom::wbem::ServerSettings settings;
    settings.address = listening.address;
    settings.port = listening.port;
    settings.readOnly = command.readOnly;
    settings.limits = command.limits;
    if (command.tlsCertificate.has_value() != command.tlsKey.has_value()) {
        throw Failure(ExitStatus::usage, "--tls-cert and --tls-key belong together");
    }
    if (command.tlsCertificate) {
        settings.tls = tlsOf(command);
    }
    if (command.users) {
        settings.users = cimom::wbem::readUsers(*command.users);
    }
    return settings;
}

void renewListeners(const ServeCommand& command, const std::vector<cimom::wbem::Server*>& servers,
                    const std::function<void(std::vector<cimom::wbem::User>)>& further) {
    if (command.tlsCertificate) {
        renewed("certificate and key", [&] {
            const auto tls = tlsOf(command);
            for (cimom::wbem::Server* const server : servers) {
                server->renewTls(tls);
            }
        });
    }
    if (command.users) {
        renewed("users", [&] {
            auto users = cimom::wbem::readUsers(*command.users);
            for (cimom::wbem::Server* const server : servers) {
                server->renewUsers(users);
            }
            if (further) {
                further(std::move(users));
            }
        });
    }
}

cimom::wbem::ServerLog serverLog() {
    return log;
}

Listening readListening(const std::string& text, const char* option) {
    const auto refuse = [&text, option] {
        throw Failure(ExitStatus::usage, std::string(option) + ": \"" + printable(text) +
                                             "\" is not of the form ADDRESS[:PORT]");
    };
    Listening listening{text, std::nullopt};
    std::size_t colon = text.rfind(':');
    if (text.starts_with('[')) {
        const std::size_t bracket = text.find(']');
        if (bracket == std::string::npos) {
            refuse();
        }
        listening.address = text.substr(1, bracket - 1);
        colon = bracket + 1 == text.size() ? std::string::npos : bracket + 1;
        if (colon != std::string::npos && text[colon] != ':') {
            refuse();
        }
    } else if (colon != text.find(':')) {
        return listening;  // several colons: an IPv6 address without a port
    } else {
        listening.address = text.substr(0, colon);
    }
    if (colon != std::string::npos) {
        std::uint16_t port = 0;
        const char* const end = text.data() + text.size();
        const auto [stop, error] = std::from_chars(text.data() + colon + 1, end, port);
        if (error != std::errc() || stop != end) {
            refuse();
        }
        listening.port = port;
    }
    return listening;
}

void serve(const ServeCommand& command, cimom::ObjectManager& manager, AskMetrics ask,
           std::ostream& out) {
    const sigset_t signals = blockSignals();
    try {
        // Shorter than service managers wait before they kill.
        constexpr std::chrono::seconds patience(5);
        std::optional<EndInTime> end;
        cimom::wbem::ServerSettings settings = settingsOf(command);
        if (manager.repository().find("CIM_ObjectManager") != nullptr) {
            cimom::serveInterop(manager,
                                {"cimdhcp", CIMDHCP_VERSION, {communicationMechanism(settings)}});
        } else {
            log(cimom::wbem::LogKind::notice,
                "the schema lacks CIM_ObjectManager: clients cannot find out what is served");
        }
        const auto users =
            settings.users ? std::make_shared<CurrentUsers>(*settings.users) : nullptr;
        std::unique_ptr<cimom::wbem::Subscriptions> subscriptions;
        if (manager.repository().find("CIM_IndicationFilter") != nullptr) {
            subscriptions = subscriptionsOf(command, users, manager);
        } else {
            log(cimom::wbem::LogKind::notice,
                "the schema lacks CIM_IndicationFilter: clients cannot subscribe");
        }
        const cimom::wbem::ServerSettings forMetrics =
            command.metrics ? metricsSettings(settings, *command.metrics)
                            : cimom::wbem::ServerSettings();
        cimom::wbem::Server server(manager, std::move(settings), log);
        std::vector<cimom::wbem::Server*> servers{&server};
        std::unique_ptr<cimom::wbem::Server> metrics;
        if (command.metrics) {
            metrics = serveMetrics(
                forMetrics, std::move(ask),
                [&] { return serverMetrics(server, subscriptions.get()); }, log);
            servers.push_back(metrics.get());
        }
        log(cimom::wbem::LogKind::notice, "listening on " + server.url());
        out << "Listening on " << server.url() << std::endl;
        if (metrics) {
            out << "Metrics at " << metrics->url() << "metrics" << std::endl;
        }
        int signal = 0;
        while (signal != SIGTERM && signal != SIGINT) {
            if (::sigwait(&signals, &signal) == 0 && signal == SIGHUP) {
                // First, since the rest is told there.
                renewLogging();
                renewListeners(command, servers,
                               [&users](auto read) { users->renew(std::move(read)); });
                log(cimom::wbem::LogKind::notice,
                    "address, port, limits and everything else on the command line stay until a "
                    "restart");
            }
        }
        log(cimom::wbem::LogKind::notice, "ending by signal " + std::to_string(signal));
        end.emplace(patience);
    } catch (const cimom::wbem::ServerError& error) {
        throw Failure(ExitStatus::notLoaded, printable(error.what()));
    } catch (const cimom::wbem::UsersError& error) {
        throw Failure(ExitStatus::notLoaded, printable(error.what()));
    }
}

}  // namespace cimdhcp
