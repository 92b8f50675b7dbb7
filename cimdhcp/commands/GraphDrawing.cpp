#include "commands/Graph.h"

#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <string_view>
#include <system_error>

#include "commands/MemoryFile.h"
#include "text/Failure.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

namespace {

void rewind(int file) {
    if (::lseek(file, 0, SEEK_SET) != 0) {
        throw std::system_error(errno, std::generic_category(), "lseek");
    }
}

/// What a new process gets for its standard input and output.
class FileActions {
  public:
    FileActions(int input, int output) {
        if (::posix_spawn_file_actions_init(&actions_) != 0) {
            throw std::bad_alloc();
        }
        if (::posix_spawn_file_actions_adddup2(&actions_, input, STDIN_FILENO) != 0 ||
            ::posix_spawn_file_actions_adddup2(&actions_, output, STDOUT_FILENO) != 0) {
            ::posix_spawn_file_actions_destroy(&actions_);
            throw std::bad_alloc();
        }
    }
    ~FileActions() { ::posix_spawn_file_actions_destroy(&actions_); }
    FileActions(const FileActions&) = delete;
    FileActions& operator=(const FileActions&) = delete;

    [[nodiscard]] const posix_spawn_file_actions_t* get() const noexcept { return &actions_; }

  private:
    posix_spawn_file_actions_t actions_{};
};

/// The wait status of the program when it has ended.
int runDot(int input, int output) {
    std::string program = "dot";
    std::string format = "-Tsvg";
    const std::array<char*, 3> arguments{program.data(), format.data(), nullptr};
    const FileActions actions(input, output);
    pid_t child = 0;
    const int error =
        ::posix_spawnp(&child, "dot", actions.get(), nullptr, arguments.data(), environ);
    if (error == ENOENT) {
        throw Failure(ExitStatus::notLoaded,
                      "drawing needs the program \"dot\": install the package graphviz, or draw "
                      "the output of \"cimdhcp graph\" elsewhere");
    }
    if (error != 0) {
        throw std::system_error(error, std::generic_category(), "dot cannot be started");
    }
    int status = 0;
    while (::waitpid(child, &status, 0) < 0) {
        if (errno != EINTR) {
            throw std::system_error(errno, std::generic_category(), "waitpid");
        }
    }
    return status;
}

}  // namespace

std::string drawSvg(const std::string& graphviz) {
    // Files in place of pipes: whatever the sizes, neither program ever waits for the other
    // to read.
    const ZR::UniqueFd input = memoryFile("graph");
    const ZR::UniqueFd output = memoryFile("picture");
    writeWhole(input.get(), graphviz);
    rewind(input.get());
    const int status = runDot(input.get(), output.get());
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        throw Failure(ExitStatus::notLoaded, "the program \"dot\" failed to draw the graph");
    }
    rewind(output.get());
    return readWhole(output.get());
}

}  // namespace cimdhcp
