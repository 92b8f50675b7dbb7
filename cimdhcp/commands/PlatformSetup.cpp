#include "commands/PlatformSetup.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <nlohmann/json.hpp>
#include <ostream>
#include <system_error>

#include "text/DisplayText.h"
#include "text/Failure.h"
#include "zrclient/InstrumentationService.h"
#include "zrcommon/File.h"
#include "zrcommon/PlatformSettings.h"

namespace cimdhcp {

namespace {

void setVariable(const char* name, const std::optional<std::string>& value) {
    if (value && ::setenv(name, value->c_str(), 1) != 0) {
        throw Failure(ExitStatus::notLoaded, std::string(name) + ": " + std::strerror(errno));
    }
}

/// "line 2, column 13: ..." of a parser's message, which has its own number in front
/// and the text around the place at its end.
std::string placeAndReason(const std::string& message) {
    const std::size_t start = message.find("line ");
    const std::size_t end = message.rfind("; last read:");
    return printable(start == std::string::npos ? message : message.substr(start, end - start));
}

/// With an unusable file the platform goes on with an empty tree, and logs why. A person
/// would be misled by an empty result: here it is a failure.
void checkTree(const std::string& file) {
    const auto content = ZR::File::read(file);
    if (!content) {
        throw Failure(ExitStatus::notLoaded, file + ": " + std::strerror(errno));
    }
    nlohmann::json tree;
    try {
        tree = nlohmann::json::parse(*content);
    } catch (const nlohmann::json::parse_error& error) {
        throw Failure(ExitStatus::notLoaded, file + ": " + placeAndReason(error.what()));
    }
    const bool empty = tree.is_object() && tree.contains("nodes") && tree["nodes"].is_array() &&
                       tree["nodes"].empty();
    if (!empty && ZR::InstrumentationService::process().current()->nodes().empty()) {
        throw Failure(ExitStatus::notLoaded,
                      file +
                          ": this JSON is not an instrumentation tree (the system log has the "
                          "line and the reason); \"cimdhcp tree\" prints an example");
    }
}

}  // namespace

void setUpPlatform(const Options& options, std::ostream& err) {
    setVariable("ZR_INSTRUMENTATION_TREE", options.tree);
    setVariable("ZR_DATA_DIR", options.dataDir);
    const ZR::PlatformSettings& settings = ZR::PlatformSettings::process();
    for (const std::string& diagnostic : settings.diagnostics) {
        err << "cimdhcp: warning: " << printable(diagnostic) << '\n';
    }
    if (!settings.instrumentationTree.empty()) {
        checkTree(settings.instrumentationTree);
    }
    // A directory that is missing is one without files. (The setting itself ends
    // with a separator, which a file's name cannot.)
    std::error_code error;
    if (options.dataDir && std::filesystem::exists(*options.dataDir, error) &&
        !std::filesystem::is_directory(*options.dataDir, error)) {
        throw Failure(ExitStatus::notLoaded, *options.dataDir + ": is not a directory");
    }
}

}  // namespace cimdhcp
