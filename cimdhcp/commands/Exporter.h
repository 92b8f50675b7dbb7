#pragma once

#include <atomic>
#include <chrono>
#include <iosfwd>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "arguments/Commands.h"
#include "client/ServerUrl.h"
#include "commands/ServerAccess.h"
#include "wbem/Pages.h"

namespace cimdhcp {

/// Machines that may be probed, and how.
struct ProbeTarget {
    ServerUrl url;  ///< its host may have signs for any text, as "*" of the configuration becomes
    Options options;
    std::chrono::milliseconds timeout{};
    std::optional<ServerAccess> access;  ///< once opened; borrows the options

    /// Each "*" of the host stands for at least one letter, digit or hyphen, but never for a dot:
    /// a pattern grants a level of names and nothing below it. The rest has to be the same.
    [[nodiscard]] bool allows(const ServerUrl& asked) const;
};

/// What the configuration of the exporter says. Its targets do not move.
struct ExporterSettings {
    std::vector<std::unique_ptr<ProbeTarget>> targets;
    std::chrono::milliseconds offset{500};  ///< before the scraper gives up

    /// Reads the files that the targets name. Throws Failure, which tells the target. Borrows
    /// `ending`.
    void open(const std::atomic<bool>& ending);
};

/// Reads a configuration and opens no file; `options` stand for what it does not say. Throws
/// Failure, without the name of the configuration.
[[nodiscard]] ExporterSettings readExporterSettings(const std::string& json,
                                                    const Options& options);

/// Which machine is to be asked, where, and for how long.
struct Probe {
    const ProbeTarget& target;  ///< of the settings
    ServerUrl url;
    std::chrono::milliseconds time{};
};

/// What a request wants probed. Throws Failure when that is not allowed, or not clear; its text
/// repeats nothing of the request. Borrows the settings.
[[nodiscard]] Probe readProbe(const cimom::wbem::PageRequest& request,
                              const ExporterSettings& settings);

/// Tells Prometheus of other machines until the process gets SIGTERM or SIGINT; reads its
/// configuration again at SIGHUP. Prints one line when it accepts connections. At most `parallel`
/// machines are asked at the same time. Throws Failure.
void serveExporter(const ExporterCommand& command, const Options& options, std::ostream& out);

}  // namespace cimdhcp
