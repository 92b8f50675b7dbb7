#include "zrcommon/PlatformSettings.h"

#include <array>
#include <cerrno>
#include <charconv>
#include <cstdlib>
#include <string_view>

#include "zrcommon/File.h"
#include "zrcommon/PropertyFile.h"

namespace ZR {

namespace {

/// Takes a text into a setting; returns what is wrong with it, or null. The
/// setting has its default when something is: a value that cannot be used must not
/// leave an earlier one in force.
using Apply = const char* (*)(std::string_view value, PlatformSettings& settings);

template <auto setting>
void setDefault(PlatformSettings& settings) {
    settings.*setting = PlatformSettings{}.*setting;
}

template <auto level>
const char* applyLevel(std::string_view value, PlatformSettings& settings) {
    int number = 0;
    const auto [end, error] = std::from_chars(value.data(), value.data() + value.size(), number);
    if (error != std::errc{} || end != value.data() + value.size() || number < 0) {
        setDefault<level>(settings);
        return "not a level (a number from 0)";
    }
    settings.*level = number;
    return nullptr;
}

/// Longer than that no service processor takes to respond.
constexpr int longestWait = 60'000;

const char* applyWait(std::string_view value, PlatformSettings& settings) {
    int number = 0;
    const auto [end, error] = std::from_chars(value.data(), value.data() + value.size(), number);
    if (error != std::errc{} || end != value.data() + value.size() || number < 0 ||
        number > longestWait) {
        setDefault<&PlatformSettings::serviceProcessorWait>(settings);
        return "not a number of milliseconds (from 0 to 60000)";
    }
    settings.serviceProcessorWait = std::chrono::milliseconds(number);
    return nullptr;
}

template <auto sink>
const char* applySink(std::string_view value, PlatformSettings& settings) {
    constexpr std::string_view file = "file:";
    const bool plain = value == "none" || value == "stderr" || value == "syslog";
    if (!plain && !(value.starts_with(file) && value.size() > file.size())) {
        setDefault<sink>(settings);
        return "not a sink (none, stderr, syslog or file:PATH)";
    }
    settings.*sink = value;
    return nullptr;
}

const char* applyReadOnce(std::string_view value, PlatformSettings& settings) {
    settings.readOnce = value == "yes";
    return value == "yes" || value == "no" ? nullptr : R"(not "yes" or "no")";
}

const char* applyDataDir(std::string_view value, PlatformSettings& settings) {
    if (value.empty()) {
        setDefault<&PlatformSettings::dataDir>(settings);
        return "not a directory (empty)";
    }
    settings.dataDir = value;
    return nullptr;
}

const char* applyTree(std::string_view value, PlatformSettings& settings) {
    settings.instrumentationTree = value;
    return nullptr;
}

struct Setting {
    const char* key;
    const char* variable;
    Apply apply;
};

constexpr std::array<Setting, 8> settingTable{{
    {"DATA_DIR", "ZR_DATA_DIR", &applyDataDir},
    {"INSTRUMENTATION_TREE", "ZR_INSTRUMENTATION_TREE", &applyTree},
    {"LOG_LEVEL", "ZR_LOG_LEVEL", &applyLevel<&PlatformSettings::logLevel>},
    {"TRACE_LEVEL", "ZR_TRACE_LEVEL", &applyLevel<&PlatformSettings::traceLevel>},
    {"LOG_SINK", "ZR_LOG_SINK", &applySink<&PlatformSettings::logSink>},
    {"TRACE_SINK", "ZR_TRACE_SINK", &applySink<&PlatformSettings::traceSink>},
    {"SERVICE_PROCESSOR_WAIT", "ZR_SERVICE_PROCESSOR_WAIT", &applyWait},
    {"READ_ONCE", "ZR_READ_ONCE", &applyReadOnce},
}};

std::string quoted(const std::string& text) {
    return "\"" + text + "\"";
}

void readFile(const std::string& file, bool mustExist, PlatformSettings& settings) {
    const auto content = File::read(file);
    if (!content) {
        if (mustExist || errno != ENOENT) {
            settings.diagnostics.push_back(file + ": " + reasonOf(errno));
        }
        return;
    }
    for (const PropertyLine& line : parsePropertyLines(*content)) {
        const std::string place = file + ":" + std::to_string(line.line) + ": ";
        if (line.key.empty()) {
            settings.diagnostics.push_back(place + "not a KEY=value line: " + quoted(line.value));
            continue;
        }
        const char* fault = "no such setting";
        for (const Setting& setting : settingTable) {
            if (line.key == setting.key) {
                fault = setting.apply(line.value, settings);
            }
        }
        if (fault != nullptr) {
            settings.diagnostics.push_back(place + line.key + "=" + quoted(line.value) + ": " +
                                           fault);
        }
    }
}

}  // namespace

PlatformSettings PlatformSettings::read(const Environment& environment) {
    PlatformSettings settings;
    const char* file = environment("ZR_CONFIG");
    if (file != nullptr && *file == '\0') {
        settings.diagnostics.emplace_back("ZR_CONFIG=\"\": not a file (empty)");
    } else {
        readFile(file != nullptr ? file : defaultFile, file != nullptr, settings);
    }
    for (const Setting& setting : settingTable) {
        const char* value = environment(setting.variable);
        if (value == nullptr) {
            continue;
        }
        if (const char* fault = setting.apply(value, settings)) {
            settings.diagnostics.push_back(std::string(setting.variable) + "=" + quoted(value) +
                                           ": " + fault);
        }
    }
    if (settings.dataDir.back() != '/') {
        settings.dataDir += '/';
    }
    return settings;
}

const PlatformSettings& PlatformSettings::process() {
    static const PlatformSettings settings =
        read([](const char* name) { return std::getenv(name); });
    return settings;
}

}  // namespace ZR
