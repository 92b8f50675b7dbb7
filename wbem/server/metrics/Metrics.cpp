#include "wbem/Metrics.h"

#include <unistd.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <fstream>

#include "cimom/Names.h"
#include "cimxml/Errors.h"

namespace cimom::wbem {

namespace {

std::string_view withoutBlanks(std::string_view text) noexcept {
    const std::size_t first = text.find_first_not_of(" \t");
    return first == std::string_view::npos
               ? std::string_view()
               : text.substr(first, text.find_last_not_of(" \t") - first + 1);
}

/// Takes what stands before the next separator off the text.
std::string_view nextPart(std::string_view& text, char separator) {
    const std::size_t end = std::min(text.find(separator), text.size());
    const std::string_view part = withoutBlanks(text.substr(0, end));
    text.remove_prefix(std::min(end + 1, text.size()));
    return part;
}

/// One of the media types that a client accepts.
struct Accepted {
    std::string_view type;
    std::string_view version;  ///< empty: any
    double quality = 1;
};

Accepted readAccepted(std::string_view text) {
    Accepted accepted{nextPart(text, ';'), "", 1};
    while (!text.empty()) {
        std::string_view parameter = nextPart(text, ';');
        const std::string_view name = nextPart(parameter, '=');
        if (sameName(name, "version")) {
            accepted.version = parameter;
        } else if (sameName(name, "q")) {
            double quality = 0;
            const char* const end = parameter.data() + parameter.size();
            const auto [stop, error] = std::from_chars(parameter.data(), end, quality);
            accepted.quality = error == std::errc() && stop == end ? quality : 0;
        }
    }
    return accepted;
}

/// How many bytes the UTF-8 character at the beginning of the text has; 0: it is none, or one
/// that stands for nothing that can be seen.
std::size_t visibleCharacter(std::string_view text) noexcept {
    const auto byte = [text](std::size_t at) { return static_cast<unsigned char>(text[at]); };
    const unsigned first = byte(0);
    constexpr unsigned char blank = 0x20;
    constexpr unsigned char deleted = 0x7F;
    if (first < deleted) {
        return first < blank ? 0 : 1;
    }
    const std::size_t length = first >= 0xF0 ? 4 : first >= 0xE0 ? 3 : 2;
    if (first < 0xC2 || first > 0xF4 || text.size() < length) {
        return 0;
    }
    for (std::size_t at = 1; at < length; ++at) {
        if ((byte(at) & 0xC0U) != 0x80U) {
            return 0;
        }
    }
    // Longer forms than need be, surrogates, and beyond the last character; and the controls
    // above ASCII.
    const unsigned second = byte(1);
    const bool wrong = (first == 0xE0 && second < 0xA0) || (first == 0xED && second > 0x9F) ||
                       (first == 0xF0 && second < 0x90) || (first == 0xF4 && second > 0x8F) ||
                       (first == 0xC2 && second < 0xA0);
    return wrong ? 0 : length;
}

void appendEscaped(std::string& out, std::string_view text, bool quotes) {
    for (const char letter : text) {
        if (letter == '\\') {
            out += "\\\\";
        } else if (letter == '\n') {
            out += "\\n";
        } else if (letter == '"' && quotes) {
            out += "\\\"";
        } else {
            out += letter;
        }
    }
}

void appendNumber(std::string& out, double value) {
    if (std::isnan(value)) {
        out += "NaN";
        return;
    }
    if (std::isinf(value)) {
        out += value > 0 ? "+Inf" : "-Inf";
        return;
    }
    constexpr double exact = 9e15;  // every whole number below it is one of the type
    std::array<char, 32> text{};
    const auto end = std::abs(value) < exact && value == std::trunc(value)
                         ? std::to_chars(text.data(), text.data() + text.size(),
                                         static_cast<std::int64_t>(value))
                         : std::to_chars(text.data(), text.data() + text.size(), value);
    out.append(text.data(), end.ptr);
}

std::string_view suffixOf(MetricFamily::Kind kind) noexcept {
    switch (kind) {
        case MetricFamily::Kind::counter:
            return "_total";
        case MetricFamily::Kind::info:
            return "_info";
        case MetricFamily::Kind::gauge:
        case MetricFamily::Kind::histogram:
            break;
    }
    return "";
}

std::string_view typeOf(MetricFamily::Kind kind, MetricsFormat format) noexcept {
    switch (kind) {
        case MetricFamily::Kind::counter:
            return "counter";
        case MetricFamily::Kind::histogram:
            return "histogram";
        case MetricFamily::Kind::info:
            // The text format does not know the type.
            return format == MetricsFormat::openMetrics ? "info" : "gauge";
        case MetricFamily::Kind::gauge:
            break;
    }
    return "gauge";
}

void appendFamily(std::string& out, const MetricFamily& family, MetricsFormat format) {
    const bool open = format == MetricsFormat::openMetrics;
    const std::string sampleName = family.name + std::string(suffixOf(family.kind));
    // In the text format the name of a family is that of its samples.
    const std::string& name = open ? family.name : sampleName;
    out += "# HELP " + name + ' ';
    // The text format has no escape for quotes here.
    appendEscaped(out, family.help, open);
    out += "\n# TYPE " + name + ' ' + std::string(typeOf(family.kind, format)) + '\n';
    if (open && !family.unit.empty()) {
        out += "# UNIT " + name + ' ' + family.unit + '\n';
    }
    for (const MetricFamily::Sample& sample : family.samples) {
        out += sampleName + sample.suffix;
        char before = '{';
        for (const auto& [label, value] : sample.labels) {
            out += before + label + "=\"";
            appendEscaped(out, value, true);
            out += '"';
            before = ',';
        }
        out += sample.labels.empty() ? " " : "} ";
        appendNumber(out, sample.value);
        out += '\n';
    }
}

}  // namespace

std::string labelText(std::string_view text) {
    constexpr std::size_t longest = 128;
    std::string result;
    while (!text.empty() && result.size() < longest) {
        const std::size_t length = visibleCharacter(text);
        const std::string_view character = length == 0 ? "?" : text.substr(0, length);
        if (result.size() + character.size() > longest) {
            break;
        }
        result += character;
        text.remove_prefix(std::max<std::size_t>(length, 1));
    }
    return result;
}

MetricsFormat metricsFormat(std::string_view accept) {
    double text = 0;
    double open = 0;
    while (!accept.empty()) {
        const Accepted each = readAccepted(nextPart(accept, ','));
        if (sameName(each.type, "application/openmetrics-text")) {
            if (each.version.empty() || each.version == "1.0.0") {
                open = std::max(open, each.quality);
            }
        } else if (sameName(each.type, "text/plain") &&
                   (each.version.empty() || each.version == "0.0.4")) {
            text = std::max(text, each.quality);
        }
    }
    return open > 0 && open >= text ? MetricsFormat::openMetrics : MetricsFormat::text;
}

std::string_view contentType(MetricsFormat format) noexcept {
    return format == MetricsFormat::openMetrics
               ? "application/openmetrics-text; version=1.0.0; charset=utf-8"
               : "text/plain; version=0.0.4; charset=utf-8";
}

std::string metricsText(const std::vector<MetricFamily>& families, MetricsFormat format) {
    std::string out;
    for (const MetricFamily& family : families) {
        if (!family.samples.empty()) {
            appendFamily(out, family, format);
        }
    }
    if (format == MetricsFormat::openMetrics) {
        out += "# EOF\n";
    }
    return out;
}

void DurationHistogram::add(std::chrono::duration<double> duration) {
    const double seconds = duration.count();
    const auto* const bound =
        std::find_if(bounds.begin(), bounds.end(),
                     [seconds](const Bound& each) { return seconds <= each.seconds; });
    const std::lock_guard lock(mutex_);
    ++counts_.at(static_cast<std::size_t>(bound - bounds.begin()));
    sum_ += seconds;
}

std::vector<MetricFamily::Sample> DurationHistogram::samples() const {
    std::vector<MetricFamily::Sample> samples;
    const std::lock_guard lock(mutex_);
    std::uint64_t count = 0;
    for (std::size_t at = 0; at < bounds.size(); ++at) {
        count += counts_.at(at);
        samples.push_back(
            {{{"le", std::string(bounds.at(at).text)}}, static_cast<double>(count), "_bucket"});
    }
    count += counts_.back();
    samples.push_back({{{"le", "+Inf"}}, static_cast<double>(count), "_bucket"});
    samples.push_back({{}, sum_, "_sum"});
    samples.push_back({{}, static_cast<double>(count), "_count"});
    return samples;
}

MetricFamily residentMemory(const std::string& prefix) {
    MetricFamily family{prefix + "_resident_memory_bytes",
                        MetricFamily::Kind::gauge,
                        "Memory of the process that is not swapped out.",
                        "bytes",
                        {}};
    std::ifstream pages("/proc/self/statm");
    double whole = 0;
    double resident = 0;
    if (pages >> whole >> resident) {
        family.add({}, resident * static_cast<double>(::sysconf(_SC_PAGESIZE)));
    }
    return family;
}

void ServerCounts::operationDone(std::string_view operation, unsigned cimStatus,
                                 std::chrono::duration<double> took) {
    durations_.add(took);
    const std::lock_guard lock(mutex_);
    ++operations_[{std::string(operation), cimStatus}];
}

void ServerCounts::responded(unsigned httpStatus) {
    const std::lock_guard lock(mutex_);
    ++responses_[httpStatus];
}

void ServerCounts::connectionOpened() noexcept {
    ++opened_;
    ++open_;
}

std::vector<MetricFamily> ServerCounts::families() const {
    using Kind = MetricFamily::Kind;
    const auto number = [](auto value) { return static_cast<double>(value); };
    MetricFamily requests{"cimdhcp_server_requests",
                          Kind::counter,
                          "CIM operations that were carried out, by their status.",
                          "",
                          {}};
    MetricFamily responses{"cimdhcp_server_http_responses",
                           Kind::counter,
                           "HTTP responses that were sent, by their status code.",
                           "",
                           {}};
    {
        const std::lock_guard lock(mutex_);
        for (const auto& [key, count] : operations_) {
            const auto& [operation, status] = key;
            requests.add({{"operation", operation},
                          {"status", status == 0 ? "OK" : std::string(cimStatusName(status))}},
                         number(count));
        }
        for (const auto& [status, count] : responses_) {
            responses.add({{"code", std::to_string(status)}}, number(count));
        }
    }
    std::vector<MetricFamily> families{std::move(requests), std::move(responses)};
    families.push_back({"cimdhcp_server_request_duration_seconds", Kind::histogram,
                        "How long CIM operations took to carry out.", "seconds",
                        durations_.samples()});
    families.push_back({"cimdhcp_server_refusals",
                        Kind::counter,
                        "Requests that were refused for their credentials.",
                        "",
                        {{{}, number(refusals_.load()), ""}}});
    families.push_back({"cimdhcp_server_connections",
                        Kind::gauge,
                        "Connections that are open.",
                        "",
                        {{{}, number(open_.load()), ""}}});
    families.push_back({"cimdhcp_server_connections_opened",
                        Kind::counter,
                        "Connections that were opened.",
                        "",
                        {{{}, number(opened_.load()), ""}}});
    families.push_back(residentMemory("cimdhcp_server"));
    return families;
}

}  // namespace cimom::wbem
