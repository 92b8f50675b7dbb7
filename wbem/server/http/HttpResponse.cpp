#include "http/HttpResponse.h"

#include <algorithm>
#include <exception>
#include <memory>
#include <utility>

namespace cimom::wbem {

namespace {

/// How much of a body is written at a time.
constexpr std::size_t pieceSize = 65536;

/// A body on its way, which libmicrohttpd asks for piece by piece.
struct Sending {
    ResponseBody body;
    std::string piece;
    std::size_t offset = 0;
};

ssize_t nextPiece(void* self, std::uint64_t /*position*/, char* buffer, std::size_t space) {
    auto& sending = *static_cast<Sending*>(self);
    try {
        if (sending.offset == sending.piece.size()) {
            if (sending.body.ended()) {
                return MHD_CONTENT_READER_END_OF_STREAM;
            }
            sending.piece.clear();
            sending.offset = 0;
            sending.body.write(sending.piece, pieceSize);
        }
    } catch (const std::exception&) {
        // The head is sent: all that can be told is that the body is not whole.
        return MHD_CONTENT_READER_END_WITH_ERROR;
    }
    const std::size_t length = std::min(space, sending.piece.size() - sending.offset);
    sending.piece.copy(buffer, length, sending.offset);
    sending.offset += length;
    return static_cast<ssize_t>(length);
}

void endSending(void* self) {
    const std::unique_ptr<Sending> ended(static_cast<Sending*>(self));
}

struct Destroyed {
    void operator()(MHD_Response* response) const noexcept { MHD_destroy_response(response); }
};
using MhdResponse = std::unique_ptr<MHD_Response, Destroyed>;

MhdResponse makeResponse(HttpResponse& response) {
    if (!response.body || response.body->ended()) {
        return MhdResponse(MHD_create_response_from_buffer(
            response.begun.size(), response.begun.data(), MHD_RESPMEM_MUST_COPY));
    }
    auto sending =
        std::make_unique<Sending>(Sending{std::move(*response.body), std::move(response.begun), 0});
    MhdResponse made(MHD_create_response_from_callback(MHD_SIZE_UNKNOWN, pieceSize, nextPiece,
                                                       sending.get(), endSending));
    if (made) {
        // It belongs to the response now, which ends it with endSending.
        static_cast<void>(sending.release());
    }
    return made;
}

}  // namespace

HttpResponse HttpResponse::failure(unsigned status, std::string cimError) {
    HttpResponse response;
    response.status = status;
    response.cimError = std::move(cimError);
    return response;
}

HttpResponse HttpResponse::failure(const HttpFailure& failure) {
    return HttpResponse::failure(failure.status, failure.cimError);
}

HttpResponse HttpResponse::refusal() {
    HttpResponse response = failure(http::unauthorized);
    response.authenticate = true;
    return response;
}

HttpResponse HttpResponse::of(Page page) {
    HttpResponse made;
    made.status = page.status;
    made.begun = std::move(page.text);
    made.contentType = std::move(page.contentType);
    return made;
}

HttpResponse HttpResponse::of(ResponseBody body) {
    HttpResponse made;
    body.write(made.begun, pieceSize);
    made.body = std::move(body);
    return made;
}

MHD_Result sendResponse(MHD_Connection* connection, HttpResponse response, bool manPost,
                        std::chrono::microseconds serverTime) {
    const bool isCim = response.body.has_value();
    const MhdResponse made = makeResponse(response);
    if (!made) {
        return MHD_NO;
    }
    bool complete = true;
    const auto add = [&](const char* name, const std::string& value) {
        complete = MHD_add_response_header(made.get(), name, value.c_str()) == MHD_YES && complete;
    };
    if (isCim) {
        add("Content-Type", R"(application/xml; charset="utf-8")");
        // In the response to an M-POST the mandatory header is prefixed (DSP0200, 7.2.2).
        if (manPost) {
            add("Ext", " ");
            add("Cache-Control", "no-cache");
            add("Man", "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73");
        }
        add(manPost ? "73-CIMOperation" : "CIMOperation", "MethodResponse");
        add("WBEMServerResponseTime", std::to_string(serverTime.count()));
    }
    if (!response.contentType.empty()) {
        add("Content-Type", response.contentType);
    }
    if (!response.cimError.empty()) {
        add("CIMError", response.cimError);
    }
    if (response.authenticate) {
        add("WWW-Authenticate", R"(Basic realm="CIM", charset="UTF-8")");
    }
    if (response.status == http::methodNotAllowed) {
        add("Allow", response.allowed);
    }
    if (response.status == http::serviceUnavailable) {
        add("Retry-After", "10");
    }
    return complete ? MHD_queue_response(connection, response.status, made.get()) : MHD_NO;
}

}  // namespace cimom::wbem
