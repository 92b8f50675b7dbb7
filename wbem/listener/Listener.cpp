#include "listener/Listener.h"

#include <microhttpd.h>
#include <unistd.h>

#include <array>
#include <exception>
#include <string_view>
#include <utility>

#include "cimom/Names.h"
#include "cimxml/Errors.h"
#include "cimxml/ExportMessage.h"
#include "cimxml/HttpStatus.h"
#include "transport/ListeningSocket.h"

namespace cimom::wbem {

namespace {

constexpr unsigned notAcceptable = 406;

/// A message while it arrives.
struct Incoming {
    std::string body;
    unsigned refused = 0;  ///< the HTTP status that is decided already
    std::string cimError;
};

struct Response {
    unsigned status = http::ok;
    std::string body;
    std::string cimError;
};

std::string headerOf(MHD_Connection* connection, const char* name) {
    const char* const value = MHD_lookup_connection_value(connection, MHD_HEADER_KIND, name);
    return value == nullptr ? "" : value;
}

std::string_view trimmedText(std::string_view text) noexcept {
    const std::size_t first = text.find_first_not_of(" \t\"");
    return first == std::string_view::npos
               ? std::string_view()
               : text.substr(first, text.find_last_not_of(" \t\"") - first + 1);
}

/// Whether the body is XML in UTF-8.
bool isXmlType(std::string_view value) {
    const std::size_t end = value.find(';');
    const std::string_view type = trimmedText(value.substr(0, end));
    if (!sameName(type, "application/xml") && !sameName(type, "text/xml")) {
        return false;
    }
    const std::string_view rest =
        end == std::string_view::npos ? std::string_view() : trimmedText(value.substr(end + 1));
    const std::size_t equals = rest.find('=');
    return equals == std::string_view::npos ||
           !sameName(trimmedText(rest.substr(0, equals)), "charset") ||
           sameName(trimmedText(rest.substr(equals + 1)), "utf-8");
}

/// Decides what the head alone tells.
void judgeHead(MHD_Connection* connection, std::string_view method, Incoming& incoming) {
    const auto refuse = [&incoming](unsigned status, const char* cimError) {
        incoming.refused = status;
        incoming.cimError = cimError;
    };
    if (method != "POST" && method != "M-POST") {
        refuse(http::methodNotAllowed, "");
        return;
    }
    const std::string coding = headerOf(connection, "Content-Encoding");
    if (!isXmlType(headerOf(connection, "Content-Type")) ||
        (!coding.empty() && !sameName(coding, "identity"))) {
        refuse(notAcceptable, "header-mismatch");
    }
}

MHD_Result sendTo(MHD_Connection* connection, Response response) {
    MHD_Response* const made = MHD_create_response_from_buffer(
        response.body.size(), response.body.data(), MHD_RESPMEM_MUST_COPY);
    if (made == nullptr) {
        return MHD_NO;
    }
    if (response.status == http::ok) {
        MHD_add_response_header(made, "Content-Type", "application/xml; charset=\"utf-8\"");
        MHD_add_response_header(made, "CIMExport", "MethodResponse");
    }
    if (!response.cimError.empty()) {
        MHD_add_response_header(made, "CIMError", response.cimError.c_str());
    }
    if (response.status == http::methodNotAllowed) {
        MHD_add_response_header(made, "Allow", "POST, M-POST");
    }
    const MHD_Result result = MHD_queue_response(connection, response.status, made);
    MHD_destroy_response(made);
    return result;
}

}  // namespace

class Listener::Implementation {
  public:
    Implementation(ListenerSettings settings, ReceiveIndication receive)
        : settings_(std::move(settings)), receive_(std::move(receive)) {
        try {
            start();
        } catch (const SocketError& error) {
            throw ListenerError(error.what());
        }
    }
    ~Implementation() { MHD_stop_daemon(daemon_); }
    Implementation(const Implementation&) = delete;
    Implementation& operator=(const Implementation&) = delete;

    [[nodiscard]] std::uint16_t port() const noexcept { return port_; }

  private:
    void start() {
        ListeningSocket socket(settings_.address, settings_.port);
        port_ = socket.port();
        // Room for what the headers become, and for a piece of a message.
        const std::size_t memory = 2 * settings_.headers + 65536;
        daemon_ = MHD_start_daemon(
            MHD_USE_EPOLL_INTERNAL_THREAD, 0, nullptr, nullptr, &handleRequest, this,
            MHD_OPTION_LISTEN_SOCKET, socket.get(), MHD_OPTION_CONNECTION_LIMIT,
            static_cast<unsigned>(settings_.connections), MHD_OPTION_CONNECTION_MEMORY_LIMIT,
            memory, MHD_OPTION_CONNECTION_TIMEOUT,
            static_cast<unsigned>(settings_.patience.count()), MHD_OPTION_STRICT_FOR_CLIENT, 1,
            MHD_OPTION_NOTIFY_COMPLETED, &requestEnded, this, MHD_OPTION_END);
        if (daemon_ == nullptr) {
            throw ListenerError("the listener cannot start");
        }
        static_cast<void>(socket.release());  // the daemon closes it
    }

    // Called by libmicrohttpd, in its thread.

    static void requestEnded(void* /*self*/, MHD_Connection* /*connection*/, void** context,
                             MHD_RequestTerminationCode /*code*/) {
        const std::unique_ptr<Incoming> ended(static_cast<Incoming*>(*context));
        *context = nullptr;
    }

    static MHD_Result handleRequest(void* self, MHD_Connection* connection, const char* target,
                                    const char* method, const char* /*version*/, const char* data,
                                    std::size_t* size, void** context) {
        auto& listener = *static_cast<Implementation*>(self);
        try {
            if (*context == nullptr) {
                auto incoming = std::make_unique<Incoming>();
                judgeHead(connection, method, *incoming);
                *context = incoming.release();
                return MHD_YES;
            }
            Incoming& incoming = *static_cast<Incoming*>(*context);
            if (*size > 0) {
                const bool goOn = listener.addBody(incoming, {data, *size});
                *size = 0;
                return goOn ? MHD_YES : MHD_NO;
            }
            return sendTo(connection, listener.respond(connection, target, incoming));
        } catch (const std::exception&) {
            // Out of memory: the server tries again.
            return MHD_NO;
        }
    }

    /// False when the connection is to be closed: a sender of far too much is not heard out.
    bool addBody(Incoming& incoming, std::string_view data) const {
        if (incoming.body.size() + data.size() > settings_.body) {
            incoming.body = std::string();
            incoming.refused = http::contentTooLarge;
            return false;
        }
        if (incoming.refused == 0) {
            incoming.body.append(data);
        }
        return true;
    }

    Response respond(MHD_Connection* connection, const char* target, const Incoming& incoming) {
        if (incoming.refused != 0) {
            return {incoming.refused, "", incoming.cimError};
        }
        try {
            const ExportCall call = readExportCall(incoming.body, settings_.depth);
            return {http::ok, exportResponse(call, resultOf(connection, target, call)), ""};
        } catch (const HttpFailure& failure) {
            return {failure.status, "", failure.cimError};
        }
    }

    ExportResponse resultOf(MHD_Connection* connection, const char* target,
                            const ExportCall& call) {
        try {
            const auto* const client =
                MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CLIENT_ADDRESS);
            const bool taken =
                receive_({indicationOf(call), target,
                          addressText(client == nullptr ? nullptr : client->client_addr)});
            return taken ? ExportResponse{}
                         : ExportResponse{static_cast<unsigned>(CimStatus::failed),
                                          "the listener has no room for more"};
        } catch (const CimError& error) {
            return {error.code, error.what()};
        }
    }

    const ListenerSettings settings_;
    const ReceiveIndication receive_;
    std::uint16_t port_ = 0;
    MHD_Daemon* daemon_ = nullptr;
};

Listener::Listener(ListenerSettings settings, ReceiveIndication receive)
    : implementation_(std::make_unique<Implementation>(std::move(settings), std::move(receive))) {}

Listener::~Listener() = default;

std::uint16_t Listener::port() const noexcept {
    return implementation_->port();
}

}  // namespace cimom::wbem
