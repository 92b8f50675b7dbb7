#pragma once

#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdlib>
#include <exception>
#include <string>
#include <string_view>
#include <system_error>

namespace ZR::Testing {

/// How a child process ended, and what it wrote.
struct ChildResult {
    std::string output;
    int exitStatus = -1;  ///< -1 when a signal ended it
    int signal = 0;       ///< 0 when it ended by itself

    bool operator==(const ChildResult&) const = default;
};

/// Runs a function in a child process of its own: what the child changes (name
/// spaces, environment, working directory, user) ends with it. The function's
/// text is the output; an exception is exit status 1 with its text.
template <typename Function>
ChildResult inChild(const Function& function) {
    std::array<int, 2> ends{};
    if (::pipe(ends.data()) != 0) {
        throw std::system_error(errno, std::generic_category(), "pipe");
    }
    const pid_t child = ::fork();
    if (child < 0) {
        throw std::system_error(errno, std::generic_category(), "fork");
    }
    if (child == 0) {
        int status = 0;
        std::string output;
        try {
            output = function();
        } catch (const std::exception& exception) {
            output = exception.what();
            status = 1;
        }
        std::string_view rest = output;
        while (!rest.empty()) {
            const ssize_t written = ::write(ends[1], rest.data(), rest.size());
            if (written <= 0) {
                status = 2;
                break;
            }
            rest.remove_prefix(static_cast<std::size_t>(written));
        }
        // Neither the parent's exit handlers nor its buffers are the child's to run.
        ::_exit(status);
    }
    ::close(ends[1]);
    ChildResult result;
    std::array<char, 4096> piece{};
    ssize_t got = 0;
    while ((got = ::read(ends[0], piece.data(), piece.size())) > 0 || (got < 0 && errno == EINTR)) {
        if (got > 0) {
            result.output.append(piece.data(), static_cast<std::size_t>(got));
        }
    }
    ::close(ends[0]);
    int status = 0;
    while (::waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    result.exitStatus = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    result.signal = WIFSIGNALED(status) ? WTERMSIG(status) : 0;
    return result;
}

}  // namespace ZR::Testing
