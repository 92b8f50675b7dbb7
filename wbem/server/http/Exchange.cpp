#include "http/Exchange.h"

#include <algorithm>
#include <exception>
#include <utility>

namespace cimom::wbem {

namespace {

/// How much of a body is written at a time.
constexpr std::size_t pieceSize = 65536;

/// A body on its way, which libmicrohttpd asks for piece by piece.
struct Sending {
    Answer answer;
    std::string piece;
    std::size_t offset = 0;
};

ssize_t nextPiece(void* self, std::uint64_t /*position*/, char* buffer, std::size_t space) {
    auto& sending = *static_cast<Sending*>(self);
    try {
        if (sending.offset == sending.piece.size()) {
            if (sending.answer.ended()) {
                return MHD_CONTENT_READER_END_OF_STREAM;
            }
            sending.piece.clear();
            sending.offset = 0;
            sending.answer.write(sending.piece, pieceSize);
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
using Response = std::unique_ptr<MHD_Response, Destroyed>;

Response makeResponse(HttpAnswer& answer) {
    if (!answer.body || answer.body->ended()) {
        return Response(MHD_create_response_from_buffer(answer.begun.size(), answer.begun.data(),
                                                        MHD_RESPMEM_MUST_COPY));
    }
    auto sending =
        std::make_unique<Sending>(Sending{std::move(*answer.body), std::move(answer.begun), 0});
    Response response(MHD_create_response_from_callback(MHD_SIZE_UNKNOWN, pieceSize, nextPiece,
                                                        sending.get(), endSending));
    if (response) {
        // It belongs to the response now, which ends it with endSending.
        static_cast<void>(sending.release());
    }
    return response;
}

}  // namespace

HttpAnswer HttpAnswer::failure(unsigned status, std::string cimError) {
    HttpAnswer answer;
    answer.status = status;
    answer.cimError = std::move(cimError);
    return answer;
}

HttpAnswer HttpAnswer::failure(const HttpFailure& failure) {
    return HttpAnswer::failure(failure.status, failure.cimError);
}

HttpAnswer HttpAnswer::refusal() {
    constexpr unsigned unauthorized = 401;
    HttpAnswer answer = failure(unauthorized);
    answer.authenticate = true;
    return answer;
}

HttpAnswer HttpAnswer::of(Answer answer) {
    HttpAnswer made;
    answer.write(made.begun, pieceSize);
    made.body = std::move(answer);
    return made;
}

void Exchange::suspend() {
    const std::lock_guard lock(mutex_);
    handedOver_ = true;
    MHD_suspend_connection(connection_);
}

bool Exchange::handedOver() const {
    const std::lock_guard lock(mutex_);
    return handedOver_;
}

bool Exchange::isFinished() const {
    const std::lock_guard lock(mutex_);
    return finished_;
}

void Exchange::finish(HttpAnswer answer) {
    const std::lock_guard lock(mutex_);
    if (handedOver_ && !finished_) {
        finished_ = true;
        answer_ = std::move(answer);
        // The connection lives at least until it has been resumed.
        MHD_resume_connection(connection_);
    }
}

std::optional<HttpAnswer> Exchange::take() {
    const std::lock_guard lock(mutex_);
    return std::exchange(answer_, std::nullopt);
}

MHD_Result sendAnswer(MHD_Connection* connection, HttpAnswer answer, bool manPost,
                      std::chrono::microseconds serverTime) {
    const bool isCim = answer.body.has_value();
    const Response response = makeResponse(answer);
    if (!response) {
        return MHD_NO;
    }
    bool complete = true;
    const auto add = [&](const char* name, const std::string& value) {
        complete =
            MHD_add_response_header(response.get(), name, value.c_str()) == MHD_YES && complete;
    };
    if (isCim) {
        add("Content-Type", R"(application/xml; charset="utf-8")");
        // Of an M-POST's answer the mandatory header is prefixed (DSP0200, 7.2.2).
        if (manPost) {
            add("Ext", " ");
            add("Cache-Control", "no-cache");
            add("Man", "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73");
        }
        add(manPost ? "73-CIMOperation" : "CIMOperation", "MethodResponse");
        add("WBEMServerResponseTime", std::to_string(serverTime.count()));
    }
    if (!answer.cimError.empty()) {
        add("CIMError", answer.cimError);
    }
    if (answer.authenticate) {
        add("WWW-Authenticate", R"(Basic realm="CIM", charset="UTF-8")");
    }
    constexpr unsigned methodNotAllowed = 405;
    if (answer.status == methodNotAllowed) {
        add("Allow", "POST, M-POST");
    }
    constexpr unsigned serviceUnavailable = 503;
    if (answer.status == serviceUnavailable) {
        add("Retry-After", "10");
    }
    return complete ? MHD_queue_response(connection, answer.status, response.get()) : MHD_NO;
}

}  // namespace cimom::wbem
