#include "http/HttpHead.h"

#include <algorithm>
#include <charconv>

#include "cimom/Names.h"
#include "cimxml/Errors.h"
#include "cimxml/HttpStatus.h"

namespace cimom::wbem {

namespace {

[[noreturn]] void refuse(unsigned status, const std::string& reason, const char* cimError = "") {
    throw HttpFailure(status, cimError, reason);
}

std::string_view trimmed(std::string_view text) noexcept {
    const std::size_t first = text.find_first_not_of(" \t");
    if (first == std::string_view::npos) {
        return {};
    }
    return text.substr(first, text.find_last_not_of(" \t") - first + 1);
}

/// The value of a header that may stand there once at most.
std::optional<std::string> single(const HttpHead& head, const std::string& name) {
    std::vector<std::string> values = head.values(name);
    if (values.size() > 1) {
        refuse(http::badRequest, name + " is given twice");
    }
    return values.empty() ? std::nullopt : std::optional(std::string(trimmed(values.front())));
}

void checkSizes(const HttpHead& head, const Limits& limits) {
    constexpr std::size_t punctuation = 4;  // colon, blank, carriage return, line feed
    std::size_t sum = 0;
    for (const auto& [name, value] : head.headers) {
        const std::size_t size = name.size() + value.size() + punctuation;
        sum += size;
        if (size > limits.headerLine || sum > limits.headers) {
            refuse(http::headersTooLarge, "the headers are too long");
        }
    }
}

/// A character of the names of headers (RFC 9110, 5.6.2).
bool isTokenCharacter(char character) noexcept {
    constexpr std::string_view marks = "!#$%&'*+-.^_`|~";
    const char letter = lowered(character);
    return isDigit(letter) || (letter >= 'a' && letter <= 'z') ||
           marks.find(letter) != std::string_view::npos;
}

bool isControl(char character) noexcept {
    const auto byte = static_cast<unsigned char>(character);
    return (byte < 0x20 && character != '\t') || byte == 0x7F;
}

/// A head that a proxy in front of the server could read differently is refused.
void checkForm(const HttpHead& head) {
    const bool formed =
        !head.ambiguous &&
        std::all_of(head.headers.begin(), head.headers.end(), [](const auto& header) {
            const auto& [name, value] = header;
            return !name.empty() && std::all_of(name.begin(), name.end(), isTokenCharacter) &&
                   std::none_of(value.begin(), value.end(), isControl);
        });
    if (!formed) {
        refuse(http::badRequest, "the head has lines that are not of the form of HTTP");
    }
}

/// The path of a target: clients may send the whole URL (RFC 9112, 3.2.2).
std::string_view pathOf(std::string_view target) noexcept {
    for (const std::string_view scheme : {"http://", "https://"}) {
        if (sameName(target.substr(0, scheme.size()), scheme)) {
            target.remove_prefix(scheme.size());
            const std::size_t slash = target.find('/');
            // Without a host it is not a URL.
            return slash == std::string_view::npos || slash == 0 ? "/" : target.substr(slash);
        }
    }
    return target;
}

constexpr std::string_view servedPath = "/cimom";

/// How long the body is. A request that says so twice, or in two ways, could mean
/// different things to a proxy and to this server, and is refused.
std::optional<std::size_t> readLength(const HttpHead& head, const Limits& limits) {
    const auto coding = single(head, "Transfer-Encoding");
    const auto length = single(head, "Content-Length");
    if (coding) {
        if (length) {
            refuse(http::badRequest, "both Transfer-Encoding and Content-Length");
        }
        if (!sameName(*coding, "chunked") || head.version != "HTTP/1.1") {
            refuse(http::notImplemented, "a Transfer-Encoding other than chunked");
        }
        return std::nullopt;
    }
    if (!length) {
        refuse(http::lengthRequired, "no Content-Length");
    }
    std::size_t bytes = 0;
    const char* const end = length->data() + length->size();
    const auto [stop, error] = std::from_chars(length->data(), end, bytes);
    if (stop != end || length->empty() || error == std::errc::invalid_argument) {
        refuse(http::badRequest, "Content-Length is not a number");
    }
    if (error == std::errc::result_out_of_range || bytes > limits.body) {
        refuse(http::contentTooLarge, "the body is too long");
    }
    return bytes;
}

std::string unquoted(std::string_view text) {
    if (text.size() >= 2 && text.front() == '"' && text.back() == '"') {
        text = text.substr(1, text.size() - 2);
    }
    return std::string(text);
}

void checkContentType(const HttpHead& head) {
    const std::string value = single(head, "Content-Type").value_or("");
    const std::size_t semicolon = value.find(';');
    const std::string_view type = trimmed(std::string_view(value).substr(0, semicolon));
    if (!sameName(type, "application/xml") && !sameName(type, "text/xml")) {
        refuse(http::badRequest, "Content-Type is not application/xml");
    }
    std::string_view rest = semicolon == std::string::npos
                                ? std::string_view()
                                : std::string_view(value).substr(semicolon + 1);
    while (!rest.empty()) {
        const std::size_t next = std::min(rest.find(';'), rest.size());
        const std::string_view parameter = trimmed(rest.substr(0, next));
        rest.remove_prefix(std::min(next + 1, rest.size()));
        const std::size_t equals = parameter.find('=');
        if (equals != std::string_view::npos &&
            sameName(trimmed(parameter.substr(0, equals)), "charset") &&
            !sameName(unquoted(trimmed(parameter.substr(equals + 1))), "utf-8")) {
            refuse(http::badRequest, "the charset is not utf-8");
        }
    }
}

/// The prefix of the CIM headers of an M-POST, as "73-" (DSP0200, 7.2.2).
std::string readPrefix(const HttpHead& head) {
    if (head.version != "HTTP/1.1") {
        refuse(http::badRequest, "M-POST is for HTTP/1.1");
    }
    const std::string man = single(head, "Man").value_or("");
    const std::size_t semicolon = man.find(';');
    const std::string uri = unquoted(trimmed(std::string_view(man).substr(0, semicolon)));
    std::string_view rest = semicolon == std::string::npos
                                ? std::string_view()
                                : trimmed(std::string_view(man).substr(semicolon + 1));
    if (uri != "http://www.dmtf.org/cim/mapping/http/v1.0" || !rest.starts_with("ns")) {
        refuse(http::badRequest, "M-POST without the Man of CIM");
    }
    rest = trimmed(rest.substr(2));
    if (!rest.starts_with('=')) {
        refuse(http::badRequest, "M-POST without the Man of CIM");
    }
    rest = trimmed(rest.substr(1));
    if (rest.size() != 2 || !isDigit(rest[0]) || !isDigit(rest[1])) {
        refuse(http::badRequest, "M-POST without the Man of CIM");
    }
    return std::string(rest) + '-';
}

std::optional<unsigned char> hexDigit(char digit) noexcept {
    if (isDigit(digit)) {
        return static_cast<unsigned char>(digit - '0');
    }
    const char letter = lowered(digit);
    return letter >= 'a' && letter <= 'f'
               ? std::optional(static_cast<unsigned char>(letter - 'a' + 10))
               : std::nullopt;
}

/// Percent-decoding (DSP0200, 7.3.2).
std::string decoded(const std::string& value) {
    std::string text;
    for (std::size_t at = 0; at < value.size(); ++at) {
        if (value[at] != '%') {
            text += value[at];
            continue;
        }
        const auto high = at + 2 < value.size() ? hexDigit(value[at + 1]) : std::nullopt;
        const auto low = high ? hexDigit(value[at + 2]) : std::nullopt;
        if (!low) {
            refuse(http::badRequest, "a percent sign without two digits", "header-mismatch");
        }
        text += static_cast<char>((*high << 4U) | *low);
        at += 2;
    }
    return text;
}

std::string requiredDecoded(const HttpHead& head, const std::string& name) {
    const auto value = single(head, name);
    if (!value || value->empty()) {
        refuse(http::badRequest, "no " + name, "header-mismatch");
    }
    return decoded(*value);
}

std::string_view withoutSlashes(std::string_view text) noexcept {
    while (text.starts_with('/')) {
        text.remove_prefix(1);
    }
    while (text.ends_with('/')) {
        text.remove_suffix(1);
    }
    return text;
}

}  // namespace

std::vector<std::string> HttpHead::values(std::string_view name) const {
    std::vector<std::string> found;
    for (const auto& [each, value] : headers) {
        if (sameName(each, name)) {
            found.push_back(value);
        }
    }
    return found;
}

bool accepts(const std::vector<std::string>& lists, std::string_view word) {
    std::optional<bool> named;
    bool others = false;
    for (const std::string& list : lists) {
        std::string_view rest = list;
        while (!rest.empty()) {
            const std::size_t next = std::min(rest.find(','), rest.size());
            const std::string_view entry = rest.substr(0, next);
            rest.remove_prefix(std::min(next + 1, rest.size()));
            const std::size_t semicolon = std::min(entry.find(';'), entry.size());
            std::string_view weight = trimmed(entry.substr(semicolon));
            weight.remove_prefix(std::min<std::size_t>(1, weight.size()));
            weight = trimmed(weight);
            // "q=0", "q=0." and "q=0.000", in either case.
            const bool wanted = !sameName(weight.substr(0, 2), "q=") ||
                                weight.find_first_not_of("0.", 2) != std::string_view::npos;
            const std::string_view name = trimmed(entry.substr(0, semicolon));
            if (sameName(name, word)) {
                named = wanted;
            } else if (name == "*") {
                others = wanted;
            }
        }
    }
    return named.value_or(others);
}

std::string PageRequest::header(std::string_view name) const {
    std::string joined;
    for (const auto& [each, value] : headers) {
        if (sameName(each, name)) {
            joined += (joined.empty() ? "" : ", ") + value;
        }
    }
    return joined;
}

PageRequest readPageHead(const HttpHead& head, PageArguments arguments, const Limits& limits) {
    if (head.method != "GET" && head.method != "HEAD") {
        refuse(http::methodNotAllowed, "only GET and HEAD are served here");
    }
    checkForm(head);
    checkSizes(head, limits);
    if (head.version == "HTTP/1.1" && !single(head, "Host")) {
        refuse(http::badRequest, "no Host");
    }
    if (single(head, "Content-Length").value_or("0") != "0" || single(head, "Transfer-Encoding")) {
        refuse(http::badRequest, "a request for a page with a body");
    }
    PageRequest request;
    request.path = head.target;
    if (!arguments.empty()) {
        request.path.pop_back();  // the sign in front of the query
    }
    request.arguments = std::move(arguments);
    request.headers = head.headers;
    request.authorization = single(head, "Authorization");
    request.arrived = std::chrono::steady_clock::now();
    return request;
}

bool asksForCapabilities(const HttpHead& head, const Limits& limits) {
    if (head.method != "OPTIONS" || (head.target != "*" && pathOf(head.target) != servedPath)) {
        return false;
    }
    checkForm(head);
    checkSizes(head, limits);
    return true;
}

CimHeaders readHead(const HttpHead& head, const Limits& limits) {
    checkForm(head);
    if (pathOf(head.target) != servedPath) {
        refuse(http::notFound, "nothing is at this path");
    }
    if (head.method != "POST" && head.method != "M-POST") {
        refuse(http::methodNotAllowed, "only POST and M-POST are served");
    }
    checkSizes(head, limits);
    if (head.version == "HTTP/1.1" && !single(head, "Host")) {
        refuse(http::badRequest, "no Host");
    }
    CimHeaders headers;
    headers.contentLength = readLength(head, limits);
    checkContentType(head);
    headers.manPost = head.method == "M-POST";
    const std::string prefix = headers.manPost ? readPrefix(head) : "";
    const auto operation = single(head, prefix + "CIMOperation");
    if (!operation) {
        refuse(http::badRequest, "no CIMOperation");
    }
    if (!sameName(*operation, "MethodCall")) {
        refuse(http::badRequest, "CIMOperation is not MethodCall", "unsupported-operation");
    }
    if (single(head, prefix + "CIMBatch")) {
        refuse(http::notImplemented, "several requests", "multiple-requests-unsupported");
    }
    headers.method = requiredDecoded(head, prefix + "CIMMethod");
    headers.object = requiredDecoded(head, prefix + "CIMObject");
    headers.protocolVersion = single(head, prefix + "CIMProtocolVersion");
    headers.authorization = single(head, "Authorization");
    return headers;
}

void checkAgreement(const CimHeaders& headers, const Call& call) {
    const auto mismatch = [](const char* name) {
        refuse(http::badRequest, std::string(name) + " is not what the body says",
               "header-mismatch");
    };
    if (!sameName(headers.method, call.method)) {
        mismatch("CIMMethod");
    }
    if (call.intrinsic &&
        !sameName(withoutSlashes(headers.object), withoutSlashes(call.nameSpace))) {
        mismatch("CIMObject");
    }
    if (headers.protocolVersion && *headers.protocolVersion != call.protocolVersion) {
        mismatch("CIMProtocolVersion");
    }
}

}  // namespace cimom::wbem
