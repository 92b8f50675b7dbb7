#include "commands/rename/RenameFiles.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <utility>
#include <vector>

#include "text/Failure.h"
#include "zrcommon/File.h"
#include "zrcommon/InterfaceFile.h"
#include "zrcommon/PropertyFile.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

namespace {

constexpr mode_t directoryMode = 0755;
constexpr mode_t fileMode = 0644;

[[noreturn]] void fail(const std::string& what, int error) {
    throw Failure(ExitStatus::notDone, what + ": " + std::strerror(error));
}

std::string nameLine(const std::string& name) {
    return std::string(ZR::InterfaceFile::configurationName) + '=' + name + '\n';
}

/// 0, or the error number.
int writeAll(int fd, std::string_view content) {
    while (!content.empty()) {
        const ssize_t written = ::write(fd, content.data(), content.size());
        if (written < 0 && errno == EINTR) {
            continue;
        }
        if (written < 0) {
            return errno;
        }
        content.remove_prefix(static_cast<std::size_t>(written));
    }
    return 0;
}

}  // namespace

bool canBeConfigurationName(const std::string& name) {
    // Control characters are refused by the object manager, too.
    const bool control = std::any_of(name.begin(), name.end(), [](char letter) {
        const auto byte = static_cast<std::uint8_t>(letter);
        return byte < 0x20 || byte == 0x7F;
    });
    const std::vector<ZR::PropertyLine> lines = ZR::parsePropertyLines(nameLine(name));
    return !control && lines.size() == 1 && lines.front().value == name;
}

bool createDataDirectory(const std::string& dataDir) {
    if (::mkdir(dataDir.c_str(), directoryMode) == 0) {
        return true;
    }
    if (errno != EEXIST) {
        fail("cannot make the directory " + dataDir, errno);
    }
    return false;
}

void createConfigurationFile(const std::string& path, const std::string& interfaceName,
                             const std::string& name) {
    const ZR::UniqueFd fd{
        ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC | O_NOCTTY, fileMode)};
    if (!fd) {
        fail("cannot make the file " + path, errno);
    }
    const std::string content = "DEVICE=" + interfaceName + "\n" + nameLine(name);
    int error = writeAll(fd.get(), content);
    // Readable for all even where the umask is narrower: the file has no secrets,
    // and object managers do not always run as its owner.
    if (error == 0 && ::fchmod(fd.get(), fileMode) != 0) {
        error = errno;
    }
    if (error != 0) {
        ::unlink(path.c_str());
        fail("cannot write the file " + path, error);
    }
}

void endLastLine(const std::string& path) {
    const ZR::UniqueFd fd{::open(path.c_str(), O_WRONLY | O_APPEND | O_CLOEXEC | O_NOCTTY)};
    const int error = fd ? writeAll(fd.get(), "\n") : errno;
    if (error != 0) {
        fail("cannot end the last line of " + path, error);
    }
}

std::string whyUnchanged(const std::string& path) {
    if (auto obstacle = ZR::InterfaceFile::obstacle(path)) {
        return std::move(obstacle->text);
    }
    return path + " was not changed; the system log may tell why";
}

std::string nameInFile(const std::string& path) {
    const auto content = ZR::File::read(path);
    if (!content) {
        return path + " cannot be read (" + std::strerror(errno) + ")";
    }
    return path + " now holds " + namesIn(*content);
}

}  // namespace cimdhcp
