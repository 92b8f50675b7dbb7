#include "http/HttpResponse.h"

#include <algorithm>
#include <exception>
#include <memory>
#include <utility>
#include <vector>

#include "cimom/Names.h"
#include "http/GzipStream.h"
#include "http/HttpHead.h"

namespace cimom::wbem {

namespace {

/// How much of a body is written at a time.
constexpr std::size_t pieceSize = 65536;

/// Shorter bodies are sent as they are: too little would be won.
constexpr std::size_t leastCompressed = 4096;

/// A body on its way, which libmicrohttpd asks for piece by piece.
struct Sending {
    std::optional<ResponseBody> body;
    std::string plain;  ///< the part of the body that comes next
    std::unique_ptr<GzipStream> gzip;
    std::string piece;
    std::size_t offset = 0;
    bool ended = false;

    /// Makes the next piece, which may be empty; false when there is none.
    bool next() {
        if (ended) {
            return false;
        }
        piece.clear();
        offset = 0;
        if (plain.empty() && body) {
            body->write(plain, pieceSize);
        }
        ended = !body || body->ended();
        if (gzip) {
            gzip->add(plain, ended, piece);
        } else {
            piece.swap(plain);
        }
        plain.clear();
        return true;
    }
};

ssize_t nextPiece(void* self, std::uint64_t /*position*/, char* buffer, std::size_t space) {
    auto& sending = *static_cast<Sending*>(self);
    try {
        while (sending.offset == sending.piece.size()) {
            if (!sending.next()) {
                return MHD_CONTENT_READER_END_OF_STREAM;
            }
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

/// What the head of a request says about the form of its response.
struct WantedForm {
    std::vector<std::string> transfer;
    std::vector<std::string> content;

    [[nodiscard]] bool chunked() const {
        return accepts(transfer, "chunked") || accepts(transfer, "trailers");
    }
    [[nodiscard]] bool compressed() const { return accepts(content, "gzip"); }
};

MHD_Result addForm(void* self, MHD_ValueKind /*kind*/, const char* name, const char* value) {
    auto& form = *static_cast<WantedForm*>(self);
    if (name != nullptr && value != nullptr) {
        if (sameName(name, "TE")) {
            form.transfer.emplace_back(value);
        } else if (sameName(name, "Accept-Encoding")) {
            form.content.emplace_back(value);
        }
    }
    return MHD_YES;
}

MhdResponse makeResponse(HttpResponse& response, bool chunked, std::unique_ptr<GzipStream> gzip) {
    const bool whole = !response.body || response.body->ended();
    if (whole && !chunked) {
        std::string content = std::move(response.begun);
        if (gzip) {
            std::string compressed;
            gzip->add(content, true, compressed);
            content.swap(compressed);
        }
        return MhdResponse(
            MHD_create_response_from_buffer(content.size(), content.data(), MHD_RESPMEM_MUST_COPY));
    }
    auto sending = std::make_unique<Sending>();
    sending->body = std::move(response.body);
    sending->plain = std::move(response.begun);
    sending->gzip = std::move(gzip);
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

HttpResponse HttpResponse::capabilities(bool readOnly) {
    HttpResponse response;
    response.offered = "basic-read, association-traversal, query-execution, qualifier-declaration";
    if (!readOnly) {
        response.offered += ", basic-write, instance-manipulation";
    }
    return response;
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
    const bool close = response.close;
    WantedForm form;
    MHD_get_connection_values(connection, MHD_HEADER_KIND, addForm, &form);
    auto gzip = form.compressed() && response.begun.size() >= leastCompressed ? GzipStream::begin()
                                                                              : nullptr;
    const bool compressed = gzip != nullptr;
    const MhdResponse made = makeResponse(response, form.chunked(), std::move(gzip));
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
    if (compressed) {
        add("Content-Encoding", "gzip");
    }
    if (close) {
        add("Connection", "close");
    }
    if (!response.offered.empty()) {
        add("Allow", "POST, M-POST, OPTIONS");
        add("Opt", "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73");
        add("73-CIMProtocolVersion", "1.0");
        add("73-CIMSupportedFunctionalGroups", response.offered);
        add("73-CIMSupportedQueryLanguages", "WQL, DMTF:CQL");
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
