#include "commands/FleetOutput.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <filesystem>
#include <ostream>
#include <sstream>
#include <system_error>

#include "commands/MemoryFile.h"
#include "text/DisplayText.h"
#include "text/JsonText.h"
#include "text/Times.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

namespace {

/// The text with something at the beginning of each line.
std::string prefixed(const std::string& text, const std::string& prefix) {
    std::istringstream lines(text);
    std::string result;
    for (std::string line; std::getline(lines, line);) {
        result += line.empty() ? "\n" : prefix + line + '\n';
    }
    return result;
}

}  // namespace

FleetOutput::FleetOutput(const std::vector<ServerUrl>& servers, Presentation presentation,
                         bool showTime, const Outputs& outputs, const Style& errorStyle)
    : servers_(servers),
      presentation_(std::move(presentation)),
      showTime_(showTime),
      outputs_(outputs),
      errorStyle_(errorStyle),
      progress_(outputs.err, outputs.errWidth, servers.size()),
      done_(servers.size()) {
    progress_.show(0, 0);
}

std::string FleetOutput::nameOf(const ServerReport& report) const {
    return printable(servers_[report.server].given);
}

std::string FleetOutput::textOf(const ServerReport& report) const {
    const std::string& text = report.outcome.text;
    if (text.empty() && report.outcome.failure) {
        return {};
    }
    const std::string name = nameOf(report);
    const std::string took = showTime_ ? " (" + durationText(report.took) + ')' : std::string();
    if (presentation_.comments) {
        return "// " + name + took + '\n' + text;
    }
    if (!presentation_.style.header || presentation_.count) {
        return prefixed(text, name + '\t' + (showTime_ ? durationText(report.took) + '\t' : ""));
    }
    return presentation_.style.strong("== " + name) + took + '\n' + text + '\n';
}

std::string FleetOutput::jsonOf(const ServerReport& report) const {
    const auto& failure = report.outcome.failure;
    const ExitStatus exit = failure ? failure->status() : ExitStatus::ok;
    JsonMembers object{
        {"host", servers_[report.server].given},
        {"status", JsonMembers{{"exit", std::int64_t{static_cast<int>(exit)}},
                               {"message", failure ? Json(failure->what()) : Json(nullptr)}}}};
    if (showTime_) {
        object.emplace_back("seconds", report.took.count());
    }
    const std::string& result = report.outcome.text;
    object.emplace_back("result", result.empty() ? Json(nullptr) : Json(JsonDocument{result}));
    return jsonLine(object);
}

void FleetOutput::show(ServerReport&& report) {
    progress_.hide();
    ++arrived_;
    outputs_.out << (presentation_.json() ? jsonOf(report) : textOf(report)) << std::flush;
    std::istringstream lines(report.outcome.diagnostics);
    for (std::string line; std::getline(lines, line);) {
        say(line, nameOf(report), diagnostics_);
    }
    if (report.outcome.failure) {
        failures_.emplace_back(report.server, report.outcome.failure->what());
    } else {
        done_[report.server] = true;
    }
    progress_.show(arrived_, failures_.size());
}

ExitStatus FleetOutput::finish(bool interrupted) {
    progress_.hide();
    std::sort(failures_.begin(), failures_.end());
    const std::string total = std::to_string(servers_.size());
    for (Said& each : diagnostics_) {
        std::sort(each.subjects.begin(), each.subjects.end());
        const std::size_t count = each.subjects.size();
        outputs_.err << (count > mostTold ? std::to_string(count) + " servers"
                                          : shortList(each.subjects))
                     << ": " << each.what << '\n';
    }
    if (!failures_.empty()) {
        outputs_.err << errorStyle_.alarming("cimdhcp:") << ' ' << failures_.size() << " of "
                     << total << " servers failed:\n";
        for (const auto& [server, message] : failures_) {
            outputs_.err << "  " << printable(servers_[server].given) << ": " << message << '\n';
        }
    }
    if (interrupted) {
        outputs_.err << errorStyle_.alarming("cimdhcp:") << " interrupted; "
                     << servers_.size() - arrived_ << " of " << total
                     << " servers were not asked\n";
        return ExitStatus::interrupted;
    }
    return failures_.empty() ? ExitStatus::ok : ExitStatus::notAllDone;
}

std::vector<ServerUrl> FleetOutput::notDone() const {
    std::vector<ServerUrl> servers;
    for (std::size_t server = 0; server < servers_.size(); ++server) {
        if (!done_[server]) {
            servers.push_back(servers_[server]);
        }
    }
    return servers;
}

void writeServers(const std::string& file, const std::vector<ServerUrl>& servers) {
    std::string text;
    for (const ServerUrl& server : servers) {
        text += server.given + '\n';
    }
    // What is not a file, such as a pipe, cannot be replaced.
    std::error_code error;
    const std::filesystem::file_type type = std::filesystem::status(file, error).type();
    const bool replaced = type == std::filesystem::file_type::regular ||
                          type == std::filesystem::file_type::not_found;
    const std::string written = replaced ? file + ".new" : file;
    constexpr mode_t readable = 0666;  // less what the umask takes away
    try {
        const ZR::UniqueFd fd{
            ::open(written.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, readable)};
        if (!fd) {
            throw std::system_error(errno, std::generic_category());
        }
        writeWhole(fd.get(), text);
        if (replaced) {
            std::filesystem::rename(written, file);
        }
    } catch (const std::system_error& failed) {
        throw Failure(ExitStatus::notLoaded,
                      "--failed " + printable(file) + ": " + failed.code().message());
    }
}

}  // namespace cimdhcp
