#pragma once

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

#include "arguments/Commands.h"
#include "commands/DiagnosticText.h"
#include "commands/Fleet.h"
#include "text/Presentation.h"
#include "text/ProgressBar.h"

namespace cimdhcp {

/// Shows the results of several servers, each as soon as it is there.
///
/// Tables stand below a heading with the server's name, MOF and graphs below a comment
/// with it; without headings, and with numbers alone, the name stands at the beginning
/// of each line, with a tab behind it. JSON is one object per server, on a line of its
/// own: {"host", "status": {"exit", "message"}, "result"}, where "exit" is what the
/// program would have ended with had it asked that server alone, "message" is null when
/// that is 0, and "result" what it would have printed, null when that is nothing.
class FleetOutput {
  public:
    FleetOutput(const std::vector<ServerUrl>& servers, Presentation presentation, bool showTime,
                const Outputs& outputs, const Style& errorStyle);

    void show(ServerReport&& report);

    /// Lists the diagnostics, like ones of several servers once, and the failures; returns
    /// how the program ends. Servers that have not reported count as not asked.
    ExitStatus finish(bool interrupted);

    /// The servers that failed, and those that were not asked, in the order of the list.
    [[nodiscard]] std::vector<ServerUrl> notDone() const;

  private:
    [[nodiscard]] std::string textOf(const ServerReport& report) const;
    [[nodiscard]] std::string jsonOf(const ServerReport& report) const;
    [[nodiscard]] std::string nameOf(const ServerReport& report) const;

    const std::vector<ServerUrl>& servers_;
    Presentation presentation_;
    bool showTime_;
    const Outputs& outputs_;
    Style errorStyle_;
    ProgressBar progress_;
    std::size_t arrived_ = 0;
    std::vector<bool> done_;                                     ///< of each server
    std::vector<std::pair<std::size_t, std::string>> failures_;  ///< server and message
    std::vector<Said> diagnostics_;                              ///< of servers
};

/// Writes a file that --hosts reads, in one step; an empty one for no servers. Throws Failure.
void writeServers(const std::string& file, const std::vector<ServerUrl>& servers);

}  // namespace cimdhcp
