#include "ServedProgram.h"

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <stdexcept>
#include <system_error>

namespace test {

ServedProgram::ServedProgram(const std::string& program, const std::vector<std::string>& arguments,
                             const std::vector<std::string>& environment) {
    std::array<int, 2> ends{};
    if (::pipe2(ends.data(), O_CLOEXEC) != 0) {
        throw std::system_error(errno, std::generic_category(), "pipe2");
    }
    output_.reset(ends[0]);
    ZR::UniqueFd input(ends[1]);
    std::vector<std::string> words{program};
    words.insert(words.end(), arguments.begin(), arguments.end());
    // The first of a name counts.
    std::vector<std::string> variables = environment;
    variables.push_back("STATE_DIRECTORY=" + state_.path().string());
    const auto pointers = [](std::vector<std::string>& texts) {
        std::vector<char*> result;
        for (std::string& text : texts) {
            result.push_back(text.data());
        }
        result.push_back(nullptr);
        return result;
    };
    const std::vector<char*> argv = pointers(words);
    const std::vector<char*> envp = pointers(variables);
    child_ = ::fork();
    if (child_ == 0) {
        ::dup2(input.get(), STDOUT_FILENO);
        ::dup2(input.get(), STDERR_FILENO);
        ::execve(program.c_str(), argv.data(), envp.data());
        ::_exit(127);
    }
    if (child_ < 0) {
        throw std::system_error(errno, std::generic_category(), "fork");
    }
    input.reset();
    const std::string text = line();
    const std::string before = "Listening on ";
    const std::size_t path = text.rfind('/');
    if (!text.starts_with(before) || path == std::string::npos) {
        end();
        throw std::runtime_error("the server has not started: " + text);
    }
    url_ = text.substr(before.size(), path - before.size());
}

std::string ServedProgram::line() {
    std::array<char, 1024> piece{};
    while (written_.find('\n') == std::string::npos) {
        const ssize_t got = ::read(output_.get(), piece.data(), piece.size());
        if (got <= 0) {
            end();
            throw std::runtime_error("the server has ended: " + written_);
        }
        written_.append(piece.data(), static_cast<std::size_t>(got));
    }
    const std::size_t length = written_.find('\n');
    std::string first = written_.substr(0, length);
    written_.erase(0, length + 1);
    return first;
}

ServedProgram::~ServedProgram() {
    end();
}

int ServedProgram::end() {
    if (child_ < 0) {
        return -1;
    }
    ::kill(child_, SIGTERM);
    int status = 0;
    while (::waitpid(child_, &status, 0) < 0 && errno == EINTR) {
    }
    child_ = -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
}

}  // namespace test
