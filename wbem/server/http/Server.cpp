#include "wbem/Server.h"

#include <malloc.h>
#include <microhttpd.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <optional>
#include <system_error>
#include <thread>
#include <utility>

#include "http/Acceptor.h"
#include "http/AddressShares.h"
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
/// How often what happens again and again is logged.
constexpr std::chrono::seconds logInterval{10};
/// A refused body that is not longer is read and forgotten, so that its connection can go on;
/// else the connection is closed.
constexpr std::size_t shortBody = 65536;
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

// Other C libraries than GNU's have neither these calls nor their reason: their allocators give
// long blocks back.
#ifdef __GLIBC__
/// Sees to it that what long requests had goes back at once: by itself, the allocator would keep
/// ever larger blocks for the next ones, in pieces between what lasts.
void giveLongBlocksBack() {
    constexpr int longBlock = 131072;
    // Cannot fail: the value is one of those that are allowed.
    static_cast<void>(::mallopt(M_MMAP_THRESHOLD, longBlock));
}
/// Gives back what threads have freed between what they still use.
void giveFreedBack() {
    ::malloc_trim(0);
}
#else
void giveLongBlocksBack() {}
void giveFreedBack() {}
#endif

/// Sees to it that the process may have a descriptor for each connection and its response.
/// Throws ServerError.
void provideDescriptors(const Limits& limits) {
    constexpr rlim_t others = 128;
    const rlim_t connections = limits.connections + Connections::mostEnding;
    const rlim_t wanted = 2 * connections + limits.sessions.sessions + others;
    rlimit files{};
    if (::getrlimit(RLIMIT_NOFILE, &files) != 0 || files.rlim_cur >= wanted) {
        return;
    }
    const rlim_t possible = std::min(wanted, files.rlim_max);
    rlimit raised = files;
    raised.rlim_cur = possible;
    const bool isRaised = possible > files.rlim_cur && ::setrlimit(RLIMIT_NOFILE, &raised) == 0;
    const rlim_t most = isRaised ? possible : files.rlim_cur;
    if (most < connections + others) {
        throw ServerError("the process may have " + std::to_string(most) +
                          " descriptors (ulimit -n, LimitNOFILE=); " +
                          std::to_string(limits.connections) + " connections need " +
                          std::to_string(connections + others));
    }
}

}  // namespace

class Server::Implementation {
  public:
    Implementation(ObjectManager* manager, PageHandler pages, ServerSettings settings,
                   ServerLog log)
        : pages_(std::move(pages)),
          settings_(checked(std::move(settings))),
          log_(std::move(log)),
          shares_(settings_.limits),
          connections_(settings_.limits, shares_),
          dispatcher_(manager, pages_, settings_, log_, shares_, counts_) {
        provideDescriptors(settings_.limits);
        giveLongBlocksBack();
        if (settings_.tls) {
            tls_.emplace(*settings_.tls,
                         [this](const std::string& line) { log_(LogKind::failure, line); });
        }
        try {
            start();
        } catch (const SocketError& error) {
            throw ServerError(error.what());
        } catch (const std::system_error& error) {
            throw ServerError(error.what());
        }
        watch();
    }

    ~Implementation() {
        stopping_ = true;
        acceptor_.reset();
        // From here on only the requests that a worker has are finished.
        dispatcher_.stop();
        connections_.endAll();
        const auto patience = Connections::Clock::now() + farewell;
        while (connections_.isBusy() && Connections::Clock::now() < patience) {
            std::this_thread::sleep_for(watchInterval / 10);
        }
        // Ends what still comes in on open connections, too: see handle().
        daemon_.reset();
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
            // So that no thread ever meets the limit: Connections counts, and libmicrohttpd
            // 0.9.75 would not answer any more after it had met its own.
            {MHD_OPTION_CONNECTION_LIMIT,
             static_cast<std::intptr_t>(limits.ioThreads * 2 *
                                        (limits.connections + Connections::mostEnding)),
             nullptr},
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
        unsigned flags = MHD_USE_EPOLL_INTERNAL_THREAD | MHD_ALLOW_SUSPEND_RESUME |
                         MHD_USE_NO_LISTEN_SOCKET | MHD_USE_ERROR_LOG;
        if (settings_.tls) {
            flags |= MHD_USE_TLS;
            tls_->addOptions(options);
        }
        options.push_back({MHD_OPTION_END, 0, nullptr});
        daemon_.reset(MHD_start_daemon(flags, 0, nullptr, nullptr, &handleRequest, this,
                                       MHD_OPTION_EXTERNAL_LOGGER, &libraryMessage, this,
                                       MHD_OPTION_ARRAY, options.data(), MHD_OPTION_END));
        if (!daemon_) {
            throw ServerError("the server cannot start: " + libraryDiagnostic_);
        }
        starting_ = false;
        acceptor_.emplace(std::move(socket),
                          [this](int client, const sockaddr* address, socklen_t length) {
                              accept(client, address, length);
                          });
    }

    /// Takes a new connection, or closes it.
    void accept(int client, const sockaddr* address, socklen_t length) {
        bool isAdmitted = false;
        try {
            isAdmitted = connections_.admit(client, addressKey(address), addressText(address));
        } catch (const std::exception& error) {
            // Out of memory.
            log_(LogKind::failure, error.what());
        }
        if (!isAdmitted) {
            // The client is told at once, and nothing of the connection is kept.
            const linger none{1, 0};
            static_cast<void>(::setsockopt(client, SOL_SOCKET, SO_LINGER, &none, sizeof none));
            ::close(client);
        } else if (MHD_add_connection(daemon_.get(), client, address, length) != MHD_YES) {
            // It has closed the socket.
            connections_.closed(client);
        }
    }

    /// Looks for what is overdue, again and again.
    void watch() {
        dispatcher_.runAfter(watchInterval, [this] {
            connections_.endOverdue();
            dispatcher_.endOverdue();
            shares_.tidy();
            if (shares_.gaveMuch()) {
                giveFreedBack();
            }
            tellOfTurnedAway();
            watch();
        });
    }

    void tellOfTurnedAway() {
        const auto now = Connections::Clock::now();
        if (now < nextTold_) {
            return;
        }
        if (const auto count = connections_.takeTurnedAway(); count > 0) {
            log_(LogKind::refusal, "closed " + std::to_string(count) +
                                       " connections of addresses that had their share");
            nextTold_ = now + logInterval;
        }
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
            server.counts_.connectionOpened();
            *context = server.connections_.find(
                MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CONNECTION_FD)->connect_fd);
        } else {
            server.counts_.connectionClosed();
            server.connections_.closed(static_cast<Connections::Connection*>(*context)->socket);
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
                const Connections::Connection& of = connectionOf(connection);
                auto exchange = std::make_unique<SharedExchange>(
                    std::make_shared<Exchange>(connection, of.address, of.key, server.shares_));
                const MHD_Result result = server.begin(
                    connection, *exchange, receivedHead(connection, target, method, version));
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

    MHD_Result begin(MHD_Connection* connection, const SharedExchange& exchange,
                     const HttpHead& head) {
        try {
            if (pages_) {
                exchange->page = readPageHead(head, argumentsOf(connection), settings_.limits);
                CimHeaders& headers = exchange->headers.emplace();
                headers.authorization = exchange->page->authorization;
                headers.contentLength = 0;
            } else if (asksForCapabilities(head, settings_.limits)) {
                // Sent once the request is over: at once would end the connection.
                exchange->early = HttpResponse::capabilities(settings_.readOnly);
                return MHD_YES;
            } else {
                exchange->headers = readHead(head, settings_.limits);
            }
        } catch (const HttpFailure& failure) {
            log_(LogKind::request, exchange->address() + ": " + failure.what());
            HttpResponse response = HttpResponse::failure(failure);
            if (pages_) {
                response.allowed = "GET, HEAD";
            }
            // Where the next request begins is not certain.
            response.close = true;
            return send(connection, *exchange, std::move(response));
        }
        exchange->wantsContinue = !head.values("Expect").empty();
        if (!settings_.users) {
            return expectBody(connection, *exchange);
        }
        if (!exchange->headers->authorization) {
            // Many clients ask so first, to learn what they need.
            return refuseBody(connection, *exchange, HttpResponse::refusal());
        }
        if (dispatcher_.isRemembered(*exchange)) {
            return expectBody(connection, *exchange);
        }
        // Nothing of the body is read before it is known whose it is.
        exchange->isHeadChecked = false;
        connections_.expectResult(connectionOf(connection), exchange);
        exchange->suspend();
        dispatcher_.authenticate(exchange);
        return MHD_YES;
    }

    MHD_Result expectBody(MHD_Connection* connection, Exchange& exchange) {
        connections_.expectRequest(connectionOf(connection));
        if (!shares_.hasMemory(exchange.key(), exchange.headers->contentLength.value_or(0))) {
            log_(LogKind::request, exchange.address() + ": no memory for its request");
            return refuseBody(connection, exchange,
                              HttpResponse::failure(http::serviceUnavailable));
        }
        return MHD_YES;
    }

    /// Responds to a request without its body.
    MHD_Result refuseBody(MHD_Connection* connection, Exchange& exchange, HttpResponse response) {
        if (exchange.wantsContinue ||
            exchange.headers->contentLength.value_or(shortBody + 1) > shortBody) {
            response.close = true;
            return send(connection, exchange, std::move(response));
        }
        connections_.expectRequest(connectionOf(connection));
        exchange.early = std::move(response);
        return MHD_YES;
    }

    /// False when the connection is to be closed: a client that sends far more than
    /// it may is not listened to until its end.
    bool addBody(Exchange& exchange, std::string_view data) const {
        const std::size_t limit = settings_.limits.body;
        if (!exchange.early) {
            if (data.size() > limit - exchange.body.size()) {
                exchange.early = HttpResponse::failure(http::contentTooLarge);
            } else if (!makeRoom(exchange, exchange.body.size() + data.size())) {
                exchange.early = HttpResponse::failure(http::serviceUnavailable);
            } else {
                exchange.body.append(data);
                return true;
            }
            exchange.discarded = exchange.body.size();
            exchange.body = std::string();
            exchange.memory.shrinkTo(0);
        }
        exchange.discarded += data.size();
        return exchange.discarded / 2 <= limit;
    }

    /// Memory is taken for what arrives, not for what is announced. False when there is none.
    [[nodiscard]] bool makeRoom(Exchange& exchange, std::size_t size) const {
        const auto length = exchange.headers->contentLength;
        if (size > exchange.body.capacity()) {
            // A long one is not copied again and again, which would leave holes in the memory.
            const std::size_t most = length.value_or(settings_.limits.body);
            const std::size_t wanted =
                length && size > shortBody ? *length : std::min(2 * exchange.body.capacity(), most);
            const std::size_t capacity = std::max(size, wanted);
            // While it grows, there are two of it.
            if (!exchange.memory.growTo(capacity + exchange.body.capacity())) {
                return false;
            }
            exchange.body.reserve(capacity);
            exchange.memory.shrinkTo(capacity);
        }
        return true;
    }

    /// The request is complete, or its response is there, or its user is admitted.
    MHD_Result handle(MHD_Connection* connection, const SharedExchange& exchange) {
        if (!exchange->isHeadChecked) {
            exchange->isHeadChecked = true;
            if (exchange->handedOver()) {
                HttpResponse response = responseOf(*exchange);
                if (response.status == http::serviceUnavailable) {
                    // Its address guesses too fast; a new connection takes it longer.
                    response.close = true;
                    return send(connection, *exchange, std::move(response));
                }
                return refuseBody(connection, *exchange, std::move(response));
            }
            return expectBody(connection, *exchange);
        }
        if (exchange->early) {
            exchange->complete = Exchange::Clock::now();
            return send(connection, *exchange, *std::move(exchange->early));
        }
        if (exchange->handedOver()) {
            return send(connection, *exchange, responseOf(*exchange));
        }
        exchange->complete = Exchange::Clock::now();
        if (stopping_) {
            return send(connection, *exchange, HttpResponse::failure(http::serviceUnavailable));
        }
        connections_.expectResult(connectionOf(connection), exchange);
        exchange->suspend();
        dispatcher_.dispatch(exchange);
        return MHD_YES;
    }

    static HttpResponse responseOf(Exchange& exchange) {
        auto response = exchange.take();
        // Woken without a response: not by this server.
        return response ? *std::move(response) : HttpResponse::failure(http::serverFault);
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
    AddressShares shares_;
    Connections connections_;
    Connections::Clock::time_point nextTold_{};  ///< of the watch alone
    std::atomic<bool> starting_{true};
    std::atomic<bool> stopping_{false};
    std::string libraryDiagnostic_;
    std::uint16_t port_ = 0;
    std::unique_ptr<MHD_Daemon, Stopped> daemon_;
    std::optional<Acceptor> acceptor_;
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
