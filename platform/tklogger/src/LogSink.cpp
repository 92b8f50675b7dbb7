#include "LogSink.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>

#include "LogLine.h"
#include "zrcommon/File.h"
#include "zrcommon/LogLevel.h"

namespace TKLog {

namespace {

/// Failures are errors to an administrator, flow is not.
int priorityOf(int level) {
    if (level >= ZR::LogLevel::failure) {
        return LOG_ERR;
    }
    return level >= ZR::LogLevel::flow ? LOG_INFO : LOG_DEBUG;
}

void toSyslog(const TKLogger::Line& line) {
    // The identity (openlog) is the host process' own and is left alone.
    ::syslog(LOG_DAEMON | priorityOf(line.level), "%s", formatSyslog(line).c_str());
}

/// One call writes the line whole, but for a pipe in whose way a signal comes: its
/// rest follows. What does not fit on a full disk is lost, as there is no other place
/// to report it.
void writeWhole(int fd, std::string_view text) {
    while (!text.empty()) {
        const ssize_t written = ::write(fd, text.data(), text.size());
        if (written > 0) {
            text.remove_prefix(static_cast<std::size_t>(written));
        } else if (written == 0 || errno != EINTR) {
            return;
        }
    }
}

}  // namespace

LogSink::LogSink(std::string_view name) {
    constexpr std::string_view file = "file:";
    if (name == "stderr") {
        kind_ = Kind::standardError;
    } else if (name == "syslog") {
        kind_ = Kind::syslog;
    } else if (name.starts_with(file)) {
        kind_ = Kind::file;
        path_ = name.substr(file.size());
    }
}

void LogSink::write(const TKLogger::Line& line) {
    switch (kind_) {
        case Kind::none:
            return;
        case Kind::standardError:
            writeWhole(STDERR_FILENO, formatLine(line, std::chrono::system_clock::now()));
            return;
        case Kind::syslog:
            toSyslog(line);
            return;
        case Kind::file:
            writeFile(line);
            return;
    }
}

bool LogSink::isStillNamed() const {
    struct stat named {};
    struct stat open {};
    return fd_ && ::stat(path_.c_str(), &named) == 0 && ::fstat(fd_.get(), &open) == 0 &&
           named.st_dev == open.st_dev && named.st_ino == open.st_ino;
}

void LogSink::writeFile(const TKLogger::Line& line) {
    const std::string text = formatLine(line, std::chrono::system_clock::now());
    const std::lock_guard lock(mutex_);
    // A rotated file keeps its descriptor but loses its name.
    if (!isStillNamed()) {
        fd_.reset(
            ::open(path_.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOCTTY, 0640));
    }
    if (fd_) {
        failed_ = false;
        writeWhole(fd_.get(), text);
        return;
    }
    // The line is not lost: syslog takes it, after being told once why.
    if (!failed_) {
        failed_ = true;
        ::syslog(LOG_DAEMON | LOG_ERR, "log file %s: %s", path_.c_str(),
                 ZR::reasonOf(errno).c_str());
    }
    toSyslog(line);
}

}  // namespace TKLog
