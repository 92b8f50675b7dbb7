// What the exporter is configured with, and what it is asked to probe: the first line is the
// configuration, the second one the request line, and each further one an argument or a header
// of it ("NAME=VALUE", "NAME: VALUE").
#include "commands/Exporter.h"

#include <algorithm>
#include <optional>

#include "Input.h"
#include "cimom/Names.h"
#include "cimxml/Errors.h"
#include "http/HttpHead.h"
#include "text/Failure.h"

namespace {

using cimdhcp::ExporterSettings;

bool isOneLine(const char* text) {
    return std::string_view(text).find_first_of("\r\n") == std::string_view::npos;
}

std::optional<ExporterSettings> settingsOf(const std::string& json) {
    try {
        ExporterSettings settings = cimdhcp::readExporterSettings(json, {});
        fuzz::require(!settings.targets.empty(), "a configuration has a target");
        return settings;
    } catch (const cimdhcp::Failure& failure) {
        fuzz::require(isOneLine(failure.what()), "what is wrong is told in one line");
        return std::nullopt;
    }
}

/// By what the page about the exporter says: trying each length for each sign.
bool matches(std::string_view pattern, std::string_view host) {
    if (pattern.empty()) {
        return host.empty();
    }
    if (pattern.front() != '*') {
        return !host.empty() && cimom::sameName(pattern.substr(0, 1), host.substr(0, 1)) &&
               matches(pattern.substr(1), host.substr(1));
    }
    constexpr std::string_view letters =
        "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-";
    for (std::size_t length = 1;
         length <= host.size() && letters.find(host[length - 1]) != std::string_view::npos;
         ++length) {
        if (matches(pattern.substr(1), host.substr(length))) {
            return true;
        }
    }
    return false;
}

/// The host of a target as the configuration writes it.
std::string hostOf(const std::string& given) {
    const std::size_t scheme = given.find("://");
    const std::size_t start = scheme == std::string::npos ? 0 : scheme + 3;
    return given.substr(start, given.find_first_of(":/", start) - start);
}

void checkProbe(const cimdhcp::Probe& probe) {
    const cimdhcp::ServerUrl& allowed = probe.target.url;
    fuzz::require(probe.url.encrypted == allowed.encrypted && probe.url.port == allowed.port &&
                      probe.url.path == allowed.path,
                  "all but the host is as configured");
    fuzz::require(probe.time.count() >= 0 && probe.time <= probe.target.timeout,
                  "a probe has as much time as configured at most");
    const std::string pattern = hostOf(allowed.given);
    // The model takes long where there are many signs, and knows nothing of brackets.
    if (std::count(pattern.begin(), pattern.end(), '*') <= 3 && pattern.find('[') != 0) {
        fuzz::require(matches(pattern, probe.url.host), "the host is of the pattern");
    }
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto lines = fuzz::fields(fuzz::text(data, size), '\n');
    const auto settings = settingsOf(std::string(lines.front()));
    if (lines.size() < 2) {
        return 0;
    }
    const auto words = fuzz::fields(lines[1], ' ');
    cimom::wbem::HttpHead head;
    head.method = words[0];
    head.target = words.size() > 1 ? words[1] : "";
    head.version = words.size() > 2 ? words[2] : "";
    cimom::wbem::PageArguments arguments;
    for (std::size_t line = 2; line < lines.size(); ++line) {
        const std::size_t end = lines[line].find_first_of("=:");
        const std::string name(lines[line].substr(0, end));
        if (end == std::string_view::npos || lines[line][end] == '=') {
            arguments.emplace_back(
                name, end == std::string_view::npos ? "" : lines[line].substr(end + 1));
        } else {
            std::string_view value = lines[line].substr(end + 1);
            value.remove_prefix(std::min(value.find_first_not_of(' '), value.size()));
            head.headers.emplace_back(name, value);
        }
    }
    if (!arguments.empty()) {
        head.target += '?';  // as libmicrohttpd takes a query off
    }
    try {
        const auto request = cimom::wbem::readPageHead(head, arguments, {});
        if (settings) {
            checkProbe(cimdhcp::readProbe(request, *settings));
        }
    } catch (const cimom::wbem::HttpFailure& failure) {
        fuzz::require(failure.status >= 400 && failure.status < 600,
                      "a refusal has a status of HTTP");
    } catch (const cimdhcp::Failure& failure) {
        fuzz::require(isOneLine(failure.what()) && std::string_view(failure.what()).size() < 80,
                      "a refusal repeats nothing");
    }
    return 0;
}
