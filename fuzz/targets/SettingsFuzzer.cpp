// The settings of the platform: lines of platform.conf, and behind a zero byte each
// the environment's variables.
#include <climits>
#include <map>

#include "Input.h"
#include "support/MemoryFile.h"
#include "zrcommon/PlatformSettings.h"
#include "zrcommon/PropertyFile.h"

namespace {

using Variables = std::map<std::string, std::string>;

int levelOf(std::string_view text) {
    const bool negative = text.starts_with('-');
    text.remove_prefix(negative ? 1 : 0);
    long long number = 0;
    if (text.empty()) {
        return ZR::PlatformSettings::defaultLevel;
    }
    for (const char digit : text) {
        if (digit < '0' || digit > '9' || number > INT_MAX) {
            return ZR::PlatformSettings::defaultLevel;
        }
        number = number * 10 + (digit - '0');
    }
    const bool fits = number <= INT_MAX && !(negative && number != 0);
    return fits ? static_cast<int>(number) : ZR::PlatformSettings::defaultLevel;
}

/// What the last of several lines and the environment make of a level.
int expectedLevel(const std::vector<ZR::PropertyLine>& lines, const Variables& variables,
                  const std::string& key) {
    int level = ZR::PlatformSettings::defaultLevel;
    for (const ZR::PropertyLine& line : lines) {
        if (line.key == key) {
            level = levelOf(line.value);
        }
    }
    const auto variable = variables.find("ZR_" + key);
    return variable == variables.end() ? level : levelOf(variable->second);
}

bool isSink(const std::string& sink) {
    return sink == "none" || sink == "stderr" || sink == "syslog" ||
           (sink.starts_with("file:") && sink.size() > 5);
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto parts = fuzz::fields(fuzz::text(data, size));
    static const fuzz::MemoryFile file;
    file.put(parts.front());
    Variables variables;
    for (std::size_t i = 1; i < parts.size(); ++i) {
        const std::size_t equals = parts[i].find('=');
        if (equals != std::string_view::npos) {
            variables.emplace(parts[i].substr(0, equals), parts[i].substr(equals + 1));
        }
    }
    variables["ZR_CONFIG"] = file.path();
    const ZR::PlatformSettings::Environment environment = [&variables](const char* name) {
        const auto found = variables.find(name);
        return found == variables.end() ? nullptr : found->second.c_str();
    };
    const auto settings = ZR::PlatformSettings::read(environment);
    fuzz::require(settings.dataDir.ends_with('/'), "a directory ends with its separator");
    fuzz::require(isSink(settings.logSink) && isSink(settings.traceSink), "a sink is one");
    const auto lines = ZR::parsePropertyLines(parts.front());
    fuzz::require(settings.logLevel == expectedLevel(lines, variables, "LOG_LEVEL") &&
                      settings.traceLevel == expectedLevel(lines, variables, "TRACE_LEVEL"),
                  "the last level that is one counts, else the default");
    fuzz::require(settings.diagnostics.size() <= lines.size() + variables.size(),
                  "each line and variable has one diagnostic at most");
    fuzz::require(ZR::PlatformSettings::read(environment) == settings,
                  "reading again gives the same");
    return 0;
}
