#pragma once

#include <chrono>
#include <functional>
#include <string>
#include <vector>

#include "zrcommon/LogLevel.h"

namespace ZR {

/// The settings of the platform: read once per process from the file that the
/// environment variable ZR_CONFIG names, else from the default file; a setting KEY is overridden by
/// the environment variable ZR_KEY.
struct PlatformSettings {
    static constexpr const char* defaultFile = "/etc/zr/platform.conf";
    static constexpr int defaultLevel = LogLevel::failure;

    /// The product's own: no shell and no network script reads what lies there.
    static constexpr const char* defaultDataDir = "/var/lib/dhcp-client-provider/";

    std::string dataDir = defaultDataDir;  ///< DATA_DIR; always ends with "/"
    std::string instrumentationTree;       ///< INSTRUMENTATION_TREE; empty: the live machine
    int logLevel = defaultLevel;           ///< LOG_LEVEL: lines of this level or above are kept
    int traceLevel = defaultLevel;         ///< TRACE_LEVEL
    std::string logSink = "syslog";        ///< LOG_SINK: none, stderr, syslog, file:PATH
    std::string traceSink = "none";        ///< TRACE_SINK
    /// SERVICE_PROCESSOR_WAIT: how long the first reading of a process may wait for what a
    /// service processor responds.
    std::chrono::milliseconds serviceProcessorWait{0};
    /// READ_ONCE: the live machine is what it was at the first request of the process, and is
    /// not watched for changes.
    bool readOnce = false;

    /// What could not be used, one text each with its file and line or its
    /// variable; the setting then has its default.
    std::vector<std::string> diagnostics;

    bool operator==(const PlatformSettings&) const = default;

    /// The settings of this process. Read at the first call; safe on any thread.
    static const PlatformSettings& process();

    /// Looks up an environment variable: null when it is not set.
    using Environment = std::function<const char*(const char*)>;

    /// Reads the settings as process() does, from the environment given.
    [[nodiscard]] static PlatformSettings read(const Environment& environment);
};

}  // namespace ZR
