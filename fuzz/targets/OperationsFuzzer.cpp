// A request above the HTTP library: the request line and headers, a line each, an empty
// line, and the body, carried out on the real provider.
#include <algorithm>
#include <array>

#include "Input.h"
#include "cimxml/Errors.h"
#include "http/HttpHead.h"
#include "operations/Operations.h"
#include "support/FuzzMachine.h"

namespace {

using cimom::wbem::Call;
using cimom::wbem::CimHeaders;
using cimom::wbem::HttpHead;

HttpHead headOf(std::string_view text) {
    HttpHead head;
    const auto lines = fuzz::fields(text, '\n');
    const auto words = fuzz::fields(lines.front(), ' ');
    head.method = words.front();
    head.target = words.size() > 1 ? words[1] : "";
    head.version = words.size() > 2 ? words[2] : "";
    for (std::size_t i = 1; i < lines.size(); ++i) {
        const std::size_t colon = std::min(lines[i].find(':'), lines[i].size());
        head.headers.emplace_back(lines[i].substr(0, colon),
                                  lines[i].substr(std::min(colon + 1, lines[i].size())));
    }
    return head;
}

void checkRefusal(const cimom::wbem::HttpFailure& failure) {
    constexpr std::array<unsigned, 7> statuses{400, 404, 405, 411, 413, 431, 501};
    fuzz::require(std::find(statuses.begin(), statuses.end(), failure.status) != statuses.end(),
                  "a refusal has a status of HTTP");
    fuzz::require(failure.cimError.find_first_of("\r\n") == std::string::npos,
                  "a header is one line");
}

std::optional<CimHeaders> headersOf(std::string_view text, const cimom::wbem::Limits& limits) {
    try {
        auto headers = cimom::wbem::readHead(headOf(text), limits);
        fuzz::require(!headers.contentLength || *headers.contentLength <= limits.body,
                      "a body is not longer than it may be");
        return headers;
    } catch (const cimom::wbem::HttpFailure& failure) {
        checkRefusal(failure);
        return std::nullopt;
    }
}

std::string responseTo(const Call& call, const cimom::wbem::Limits& limits) {
    cimom::wbem::Operations operations(fuzz::machine(), limits,
                                       [](const cimom::wbem::Modification&) {});
    auto response = operations.perform(call, {std::nullopt, "192.0.2.1", true, nullptr});
    std::string xml;
    constexpr std::size_t piece = 64;
    while (!response.ended()) {
        const std::size_t before = xml.size();
        response.write(xml, before + piece);
        fuzz::require(response.ended() || xml.size() >= before + piece, "a response goes on");
    }
    return xml;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    const cimom::wbem::Limits limits;
    const std::size_t end = text.find("\n\n");
    const auto headers = headersOf(text.substr(0, end), limits);
    if (end == std::string_view::npos) {
        return 0;
    }
    try {
        const Call call = cimom::wbem::readCall(text.substr(end + 2), limits.depth);
        if (headers) {
            try {
                cimom::wbem::checkAgreement(*headers, call);
            } catch (const cimom::wbem::HttpFailure& failure) {
                checkRefusal(failure);
            }
        }
        // Without good headers, too: the body is what an input is about most often.
        const auto element = fuzz::validResponse(responseTo(call, limits));
        const std::string* const id = element.children.at(0).attribute("ID");
        fuzz::require(id != nullptr && *id == call.messageId,
                      "a response bears the request's number");
    } catch (const cimom::wbem::HttpFailure& failure) {
        checkRefusal(failure);
    } catch (const cimom::wbem::NotValid& error) {
        fuzz::require(*error.what() != '\0', "a refusal has a reason");
    }
    return 0;
}
