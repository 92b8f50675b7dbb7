#include "wbem/Server.h"

#include <microhttpd.h>
#include <unistd.h>

#include <array>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <thread>
#include <utility>

#include "http/Connections.h"
#include "http/Dispatcher.h"
#include "http/Exchange.h"
#include "http/ReceivedHead.h"
#include "http/TlsMaterial.h"
#include "transport/ListeningSocket.h"

namespace cimom::wbem {

namespace {

constexpr std::uint16_t httpPort = 5988;
constexpr std::uint16_t httpsPort = 5989;
constexpr std::chrono::milliseconds watchInterval{100};
/// How long clients have to take their last responses when the server ends.
constexpr std::chrono::seconds farewell{2};

/// Texts of the library with their lengths: a null byte may be decoded within one.
MHD_Result addArgument(void* arguments, MHD_ValueKind /*kind*/, const char* name,
                       std::size_t nameSize, const char* value, std::size_t valueSize) {
    static_cast<PageArguments*>(arguments)->emplace_back(
        name == nullptr ? "" : std::string(name, nameSize),
        value == nullptr ? "" : std::string(value, valueSize));
    return MHD_YES;
}

PageArguments argumentsOf(MHD_Connection* connection) {
    PageArguments arguments;
    MHD_get_connection_values_n(connection, MHD_GET_ARGUMENT_KIND, addArgument, &arguments);
    return arguments;
}

}  // namespace

class Server::Implementation {
  public:
    Implementation(ObjectManager* manager, PageHandler pages, ServerSettings settings,
                   ServerLog log)
        : pages_(std::move(pages)),
          settings_(checked(std::move(settings))),
          log_(std::move(log)),
          connections_(settings_.limits.request, settings_.limits.response),
          dispatcher_(manager, pages_, settings_, log_, counts_) {
        if (settings_.tls) {
            tls_.emplace(*settings_.tls,
                         [this](const std::string& line) { log_(LogKind::failure, line); });
        }
        try {
            start();
        } catch (const SocketError& error) {
            throw ServerError(error.what());
        }
        watch();
    }

    ~Implementation() {
        stopping_ = true;
        MHD_quiesce_daemon(daemon_.get());
        // From here on only the requests that a worker has are finished.
        dispatcher_.stop();
        connections_.endAll();
        const auto patience = Connections::Clock::now() + farewell;
        while (connections_.isBusy() && Connections::Clock::now() < patience) {
            std::this_thread::sleep_for(watchInterval / 10);
        }
        // Ends what still comes in on open connections, too: see handle().
        daemon_.reset();
        ::close(socket_);
    }
    Implementation(const Implementation&) = delete;
    Implementation& operator=(const Implementation&) = delete;

    [[nodiscard]] std::uint16_t port() const noexcept { return port_; }
    [[nodiscard]] const ServerCounts& counts() const noexcept { return counts_; }

    [[nodiscard]] std::string url() const {
        const bool six = settings_.address.find(':') != std::string::npos;
        return (settings_.tls ? "https://" : "http://") +
               (six ? '[' + settings_.address + ']' : settings_.address) + ':' +
               std::to_string(port_) + (pages_ ? "/" : "/cimom");
    }

    void renewTls(const ServerSettings::Tls& tls) {
        if (!tls_) {
            throw ServerError("a server without TLS gets it by a restart only");
        }
        tls_->renew(tls);
    }

    void renewUsers(std::vector<User> users) {
        if (!settings_.users) {
            throw ServerError("a server without users gets them by a restart only");
        }
        dispatcher_.renewUsers(std::move(users));
    }

  private:
    static ServerSettings checked(ServerSettings settings) {
        checkSettings(settings);
        return settings;
    }

    struct Stopped {
        void operator()(MHD_Daemon* daemon) const noexcept { MHD_stop_daemon(daemon); }
    };

    void start() {
        ListeningSocket socket(settings_.address,
                               settings_.port.value_or(settings_.tls ? httpsPort : httpPort));
        port_ = socket.port();
        const Limits& limits = settings_.limits;
        // Room for the request line, for the tables that the headers become, and for
        // a piece of a response.
        constexpr std::size_t further = 65536;
        const std::size_t memory = 2 * limits.headers + further;
        std::vector<MHD_OptionItem> options{
            {MHD_OPTION_LISTEN_SOCKET, socket.get(), nullptr},
            {MHD_OPTION_CONNECTION_LIMIT, static_cast<std::intptr_t>(limits.connections), nullptr},
            {MHD_OPTION_CONNECTION_MEMORY_LIMIT, static_cast<std::intptr_t>(memory), nullptr},
            {MHD_OPTION_CONNECTION_TIMEOUT, static_cast<std::intptr_t>(limits.request.count()),
             nullptr},
            {MHD_OPTION_STRICT_FOR_CLIENT, libraryStrictness(), nullptr},
            {MHD_OPTION_NOTIFY_COMPLETED, reinterpret_cast<std::intptr_t>(&requestEnded), this},
            {MHD_OPTION_NOTIFY_CONNECTION, reinterpret_cast<std::intptr_t>(&connectionChanged),
             this},
        };
        if (limits.ioThreads > 1) {
            options.push_back({MHD_OPTION_THREAD_POOL_SIZE,
                               static_cast<std::intptr_t>(limits.ioThreads), nullptr});
        }
        unsigned flags =
            MHD_USE_EPOLL_INTERNAL_THREAD | MHD_ALLOW_SUSPEND_RESUME | MHD_USE_ERROR_LOG;
        if (settings_.tls) {
            flags |= MHD_USE_TLS;
            TlsSessions::addOptions(options);
        }
        options.push_back({MHD_OPTION_END, 0, nullptr});
        daemon_.reset(MHD_start_daemon(flags, 0, nullptr, nullptr, &handleRequest, this,
                                       MHD_OPTION_EXTERNAL_LOGGER, &libraryMessage, this,
                                       MHD_OPTION_ARRAY, options.data(), MHD_OPTION_END));
        if (!daemon_) {
            throw ServerError("the server cannot start: " + libraryDiagnostic_);
        }
        socket_ = socket.release();
        starting_ = false;
    }

    /// Looks for what is overdue, again and again.
    void watch() {
        dispatcher_.runAfter(watchInterval, [this] {
            connections_.endOverdue();
            dispatcher_.endOverdue();
            watch();
        });
    }

    // Called by libmicrohttpd, in its threads.

    __attribute__((format(printf, 2, 0))) static void libraryMessage(void* self, const char* format,
                                                                     va_list arguments) {
        auto& server = *static_cast<Implementation*>(self);
        std::array<char, 256> text{};
        if (std::vsnprintf(text.data(), text.size(), format, arguments) < 0) {
            return;
        }
        std::string message = text.data();
        while (message.ends_with('\n')) {
            message.pop_back();
        }
        if (server.starting_) {
            server.libraryDiagnostic_ = message;
        }
        server.log_(LogKind::request, message);
    }

    static void connectionChanged(void* self, MHD_Connection* connection, void** context,
                                  MHD_ConnectionNotificationCode code) {
        auto& server = *static_cast<Implementation*>(self);
        if (code == MHD_CONNECTION_NOTIFY_STARTED) {
            if (server.tls_) {
                server.tls_->opened(connection);
            }
            const auto* const socket =
                MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CONNECTION_FD);
            const auto* const client =
                MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CLIENT_ADDRESS);
            server.counts_.connectionOpened();
            *context = server.connections_.opened(
                socket->connect_fd, addressText(client == nullptr ? nullptr : client->client_addr));
        } else {
            server.counts_.connectionClosed();
            server.connections_.closed(static_cast<Connections::Connection*>(*context));
            *context = nullptr;
            if (server.tls_) {
                server.tls_->closed(connection);
            }
        }
    }

    static Connections::Connection& connectionOf(MHD_Connection* connection) {
        return *static_cast<Connections::Connection*>(
            MHD_get_connection_info(connection, MHD_CONNECTION_INFO_SOCKET_CONTEXT)
                ->socket_context);
    }

    static void requestEnded(void* self, MHD_Connection* connection, void** context,
                             MHD_RequestTerminationCode /*code*/) {
        const std::unique_ptr<SharedExchange> ended(static_cast<SharedExchange*>(*context));
        *context = nullptr;
        static_cast<Implementation*>(self)->connections_.expectRequest(connectionOf(connection));
    }

    static MHD_Result handleRequest(void* self, MHD_Connection* connection, const char* target,
                                    const char* method, const char* version, const char* data,
                                    std::size_t* size, void** context) {
        auto& server = *static_cast<Implementation*>(self);
        try {
            if (*context == nullptr) {
                auto exchange = std::make_unique<SharedExchange>(
                    std::make_shared<Exchange>(connection, connectionOf(connection).address));
                const MHD_Result result = server.begin(
                    connection, **exchange, receivedHead(connection, target, method, version));
                *context = exchange.release();
                return result;
            }
            SharedExchange& exchange = *static_cast<SharedExchange*>(*context);
            if (*size > 0) {
                const bool goOn = server.addBody(*exchange, {data, *size});
                *size = 0;
                return goOn ? MHD_YES : MHD_NO;
            }
            return server.handle(connection, exchange);
        } catch (const std::exception& error) {
            server.log_(LogKind::failure, error.what());
            return MHD_NO;
        }
    }

    // The life of a request.

    MHD_Result begin(MHD_Connection* connection, Exchange& exchange, const HttpHead& head) {
        try {
            if (pages_) {
                exchange.page = readPageHead(head, argumentsOf(connection), settings_.limits);
                exchange.headers.emplace().authorization = exchange.page->authorization;
            } else if (asksForCapabilities(head, settings_.limits)) {
                // Sent once the request is over: at once would end the connection.
                exchange.early = HttpResponse::capabilities(settings_.readOnly);
                return MHD_YES;
            } else {
                exchange.headers = readHead(head, settings_.limits);
            }
            if (settings_.users && !exchange.headers->authorization) {
                // Nothing of a stranger's body is kept.
                exchange.early = HttpResponse::refusal();
            } else {
                exchange.body.reserve(exchange.headers->contentLength.value_or(0));
            }
            return MHD_YES;
        } catch (const HttpFailure& failure) {
            log_(LogKind::request, exchange.address() + ": " + failure.what());
            HttpResponse response = HttpResponse::failure(failure);
            if (pages_) {
                response.allowed = "GET, HEAD";
            }
            // Where the next request begins is not certain.
            response.close = true;
            return send(connection, exchange, std::move(response));
        }
    }

    /// False when the connection is to be closed: a client that sends far more than
    /// it may is not listened to until its end.
    bool addBody(Exchange& exchange, std::string_view data) const {
        const std::size_t limit = settings_.limits.body;
        if (!exchange.early && data.size() > limit - exchange.body.size()) {
            exchange.early = HttpResponse::failure(http::contentTooLarge);
            exchange.discarded = exchange.body.size();
            exchange.body = std::string();
        }
        if (!exchange.early) {
            exchange.body.append(data);
            return true;
        }
        exchange.discarded += data.size();
        return exchange.discarded / 2 <= limit;
    }

    /// The request is complete, or its response is there.
    MHD_Result handle(MHD_Connection* connection, const SharedExchange& exchange) {
        if (exchange->handedOver()) {
            auto response = exchange->take();
            // Woken without a response: not by this server.
            return send(connection, *exchange,
                        response ? *std::move(response) : HttpResponse::failure(http::serverFault));
        }
        exchange->complete = Exchange::Clock::now();
        if (stopping_) {
            return send(connection, *exchange, HttpResponse::failure(http::serviceUnavailable));
        }
        if (exchange->early && !exchange->early->authenticate) {
            return send(connection, *exchange, *std::move(exchange->early));
        }
        connections_.expectResult(connectionOf(connection), exchange);
        exchange->suspend();
        if (exchange->early) {
            dispatcher_.refuse(exchange, "a client without credentials");
        } else {
            dispatcher_.dispatch(exchange);
        }
        return MHD_YES;
    }

    MHD_Result send(MHD_Connection* connection, Exchange& exchange, HttpResponse response) {
        counts_.responded(response.status);
        connections_.expectTaking(connectionOf(connection));
        const auto time = exchange.complete == Exchange::Clock::time_point()
                              ? Exchange::Clock::duration()
                              : Exchange::Clock::now() - exchange.complete;
        return sendResponse(connection, std::move(response),
                            exchange.headers && exchange.headers->manPost,
                            std::chrono::duration_cast<std::chrono::microseconds>(time));
    }

    const PageHandler pages_;  ///< empty: CIM-XML is served
    ServerCounts counts_;
    const ServerSettings settings_;
    const ServerLog log_;
    std::optional<TlsSessions> tls_;
    Connections connections_;
    std::atomic<bool> starting_{true};
    std::atomic<bool> stopping_{false};
    std::string libraryDiagnostic_;
    std::uint16_t port_ = 0;
    int socket_ = -1;  ///< of the daemon, which leaves the closing to us once quiesced
    std::unique_ptr<MHD_Daemon, Stopped> daemon_;
    /// Ends first: its tasks use all of the above.
    Dispatcher dispatcher_;
};

Server::Server(ObjectManager& manager, ServerSettings settings, ServerLog log)
    : implementation_(std::make_unique<Implementation>(&manager, nullptr, std::move(settings),
                                                       std::move(log))) {}

Server::Server(PageHandler pages, ServerSettings settings, ServerLog log)
    : implementation_(std::make_unique<Implementation>(nullptr, std::move(pages),
                                                       std::move(settings), std::move(log))) {}

Server::~Server() = default;

std::uint16_t Server::port() const noexcept {
    return implementation_->port();
}

const ServerCounts& Server::counts() const noexcept {
    return implementation_->counts();
}

void Server::renewTls(const ServerSettings::Tls& tls) {
    implementation_->renewTls(tls);
}

void Server::renewUsers(std::vector<User> users) {
    implementation_->renewUsers(std::move(users));
}

std::string Server::url() const {
    return implementation_->url();
}

}  // namespace cimom::wbem
