#include "http/PageHead.h"

#include <algorithm>

#include "cimom/Names.h"
#include "cimxml/Errors.h"
#include "cimxml/HttpStatus.h"

namespace cimom::wbem {

namespace {

[[noreturn]] void refusePage(unsigned status, const char* reason) {
    throw HttpFailure(status, "", reason);
}

/// How many headers of that name there are.
auto countOf(const PageRequest& request, std::string_view name) {
    return std::count_if(request.headers.begin(), request.headers.end(),
                         [name](const auto& each) { return sameName(each.first, name); });
}

void checkPageSizes(const PageRequest& request, const Limits& limits) {
    constexpr std::size_t punctuation = 4;  // colon, blank, carriage return, line feed
    std::size_t sum = 0;
    for (const auto& [name, value] : request.headers) {
        const std::size_t size = name.size() + value.size() + punctuation;
        sum += size;
        if (size > limits.headerLine || sum > limits.headers) {
            refusePage(http::headersTooLarge, "the headers are too long");
        }
    }
}

}  // namespace

std::string PageRequest::header(std::string_view name) const {
    std::string joined;
    for (const auto& [each, value] : headers) {
        if (sameName(each, name)) {
            joined += (joined.empty() ? "" : ", ") + value;
        }
    }
    return joined;
}

std::optional<std::string> checkPageRequest(std::string_view method, std::string_view version,
                                            const PageRequest& request, const Limits& limits) {
    if (method != "GET" && method != "HEAD") {
        refusePage(http::methodNotAllowed, "only GET and HEAD are served here");
    }
    checkPageSizes(request, limits);
    const auto hosts = countOf(request, "Host");
    if (hosts > 1 || (hosts == 0 && version == "HTTP/1.1")) {
        refusePage(http::badRequest, "not one Host");
    }
    const std::string length = request.header("Content-Length");
    if (countOf(request, "Transfer-Encoding") > 0 || (!length.empty() && length != "0")) {
        refusePage(http::badRequest, "a request for a page with a body");
    }
    const auto credentials = countOf(request, "Authorization");
    if (credentials > 1) {
        refusePage(http::badRequest, "Authorization is given twice");
    }
    return credentials == 0 ? std::nullopt : std::optional(request.header("Authorization"));
}

}  // namespace cimom::wbem
