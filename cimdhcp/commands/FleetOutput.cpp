#include "commands/FleetOutput.h"

#include <algorithm>
#include <cstdint>
#include <ostream>
#include <sstream>

#include "text/DisplayText.h"
#include "text/JsonText.h"
#include "text/Times.h"

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
      progress_(outputs.err, outputs.errWidth, servers.size()) {
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

}  // namespace cimdhcp
