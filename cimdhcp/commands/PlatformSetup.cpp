#include "commands/PlatformSetup.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <optional>
#include <ostream>
#include <string_view>
#include <system_error>
#include <utility>

#include "commands/MemoryFile.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "zrclient/InstrumentationService.h"
#include "zrclient/Snapshot.h"
#include "zrclient/TreeFile.h"
#include "zrcommon/PlatformSettings.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

namespace {

void setVariable(const char* name, const std::optional<std::string>& value) {
    if (value && ::setenv(name, value->c_str(), 1) != 0) {
        throw Failure(ExitStatus::notLoaded, std::string(name) + ": " + std::strerror(errno));
    }
}

constexpr const char* treeVariable = "ZR_INSTRUMENTATION_TREE";

/// How long the service processor may take, in milliseconds: a program that ends after one
/// request has no later one to tell of it.
constexpr const char* waitVariable = "ZR_SERVICE_PROCESSOR_WAIT";
constexpr const char* processorWait = "1000";
/// Of this the environment says nothing: a server that never looked again would be no use.
constexpr const char* onceVariable = "ZR_READ_ONCE";
constexpr std::size_t largestTree = std::size_t{10} << 20U;  // as large as the platform reads

struct Tree {
    std::string name;     ///< what a person knows it by
    ZR::UniqueFd memory;  ///< of what could be read only once; kept open for all who read it
};

Tree& tree() {
    static Tree tree;
    return tree;
}

[[noreturn]] void failWith(int error) {
    throw Failure(ExitStatus::notLoaded, tree().name + ": " + std::strerror(error));
}

/// A file in memory with what can be read only once.
std::string keepInMemory(int fd) {
    try {
        ZR::UniqueFd memory = memoryFile("tree");
        writeWhole(memory.get(), readWhole(fd, largestTree));
        std::string path = "/proc/self/fd/" + std::to_string(memory.get());
        tree().memory = std::move(memory);
        return path;
    } catch (const std::system_error& error) {
        failWith(error.code().value());
    }
}

/// Pipes, and devices such as terminals: what is read from them is gone.
bool isReadOnce(const std::string& path) {
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 &&
           (S_ISFIFO(status.st_mode) || S_ISCHR(status.st_mode) || S_ISSOCK(status.st_mode));
}

/// Makes the tree one that every copy of the platform can read, and names it to them.
void handOverTree(const std::optional<std::string>& option) {
    if (option == "-") {
        tree().name = "standard input";
        setVariable(treeVariable, keepInMemory(STDIN_FILENO));
        return;
    }
    tree().name = option ? *option : ZR::PlatformSettings::read([](const char* name) {
                                         return std::getenv(name);
                                     }).instrumentationTree;
    if (isReadOnce(tree().name)) {
        const ZR::UniqueFd fd{::open(tree().name.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY)};
        if (!fd) {
            failWith(errno);
        }
        setVariable(treeVariable, keepInMemory(fd.get()));
    } else {
        setVariable(treeVariable, option);
    }
}

/// With an unusable file the platform goes on with an empty tree, and logs why. A person
/// would be misled by an empty result: here it is a failure.
void checkTree(const std::string& path) {
    auto& service = ZR::InstrumentationService::process();
    service.useSource(ZR::openTreeFile(path, tree().name));
    const auto snapshot = service.current();
    if (snapshot->nodes().empty() && !snapshot->diagnostics().empty()) {
        throw Failure(ExitStatus::notLoaded, printable(snapshot->diagnostics().front().text));
    }
}

}  // namespace

void setUpPlatform(const Options& options, Look look, std::ostream& err) {
    handOverTree(options.tree);
    setVariable("ZR_DATA_DIR", options.dataDir);
    if (std::getenv(waitVariable) == nullptr) {
        setVariable(waitVariable, processorWait);
    }
    setVariable(onceVariable, look == Look::once ? "yes" : "no");
    const ZR::PlatformSettings& settings = ZR::PlatformSettings::process();
    for (const std::string& diagnostic : settings.diagnostics) {
        err << "cimdhcp: warning: " << printable(diagnostic) << '\n';
    }
    if (!settings.instrumentationTree.empty()) {
        checkTree(settings.instrumentationTree);
    }
    // The setting itself ends with a separator, which a file's name cannot.
    std::error_code error;
    if (options.dataDir && std::filesystem::exists(*options.dataDir, error) &&
        !std::filesystem::is_directory(*options.dataDir, error)) {
        throw Failure(ExitStatus::notLoaded, *options.dataDir + ": is not a directory");
    }
}

void requireDataDirectory(const Options& options) {
    std::error_code error;
    if (options.dataDir && !std::filesystem::exists(*options.dataDir, error)) {
        throw Failure(ExitStatus::notLoaded, "--data-dir " + printable(*options.dataDir) +
                                                 ": there is no such directory; mkdir makes it");
    }
}

const std::string& treeName() {
    return tree().name;
}

}  // namespace cimdhcp
