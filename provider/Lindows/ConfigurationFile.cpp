#include "Lindows/ConfigurationFile.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <optional>
#include <string_view>

#include "zrcommon/File.h"
#include "zrcommon/InterfaceFile.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::DHCPClientProvider {

namespace {

constexpr std::size_t pieceSize = 511;

/// The piece at the start of the text: a line with its line feed, but at most 511 bytes.
std::string_view firstPiece(std::string_view text) {
    const std::string_view piece = text.substr(0, pieceSize);
    const std::size_t lineFeed = piece.find('\n');
    return lineFeed == std::string_view::npos ? piece : piece.substr(0, lineFeed + 1);
}

/// Whether the key occurs in a piece. What stands behind a zero byte does not count.
bool mentions(std::string_view piece, std::string_view key) {
    return piece.substr(0, piece.find('\0')).find(key) != std::string_view::npos;
}

std::string rewritten(std::string_view content, const std::string& key, const std::string& value) {
    const std::string line = key + "=" + value + "\n";
    std::string result;
    result.reserve(content.size() + line.size());
    bool found = false;
    while (!content.empty()) {
        const std::string_view piece = firstPiece(content);
        const bool replaced = mentions(piece, key);
        result += replaced ? std::string_view(line) : piece;
        found = found || replaced;
        content.remove_prefix(piece.size());
    }
    if (!found) {
        result += line;
    }
    return result;
}

bool writeAll(int fd, std::string_view content) {
    off_t offset = 0;
    while (!content.empty()) {
        const ssize_t written = ::pwrite(fd, content.data(), content.size(), offset);
        if (written < 0 && errno == EINTR) {
            continue;
        }
        if (written <= 0) {
            return false;
        }
        offset += written;
        content.remove_prefix(static_cast<std::size_t>(written));
    }
    return true;
}

/// Takes room for as many bytes; true also where the file system cannot promise any.
bool takeRoom(int fd, off_t size) {
    int result = 0;
    do {
        result = ::fallocate(fd, FALLOC_FL_KEEP_SIZE, 0, size);
    } while (result != 0 && errno == EINTR);
    return result == 0 || errno == EOPNOTSUPP || errno == ENOSYS;
}

/// Puts new content in the place of the old. Room for it is taken first, so that
/// a full disk is met before a byte has changed; where the file system cannot
/// promise room, the old content goes back over what was written.
bool replaceContent(int fd, const std::string& before, const std::string& after) {
    const auto size = static_cast<off_t>(after.size());
    if (!takeRoom(fd, std::max<off_t>(size, 1))) {
        return false;
    }
    if (writeAll(fd, after) && ::ftruncate(fd, size) == 0) {
        return true;
    }
    const int reason = errno;
    // The old bytes have their room already. Should even this fail, the message
    // about the first failure is all that can be done.
    if (writeAll(fd, before)) {
        [[maybe_unused]] const int done = ::ftruncate(fd, static_cast<off_t>(before.size()));
    }
    errno = reason;
    return false;
}

}  // namespace

std::string configurationFilePath(const std::string& directory, const std::string& interfaceName) {
    return InterfaceFile::path(directory, interfaceName).value_or("");
}

std::optional<std::string> rewriteValue(const std::string& path, const std::string& key,
                                        const std::string& value) {
    if (value.find_first_of(std::string_view("\n\r\0", 3)) != std::string::npos) {
        return "The value cannot be one line of the configuration file";
    }
    const std::optional<std::string> content = File::read(path);
    if (!content) {
        return std::nullopt;
    }
    // A file that may be read but not written stays as it is, without a word. A pipe
    // that took its place since must not hang the caller.
    const UniqueFd fd{::open(path.c_str(), O_WRONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY)};
    if (!fd || replaceContent(fd.get(), *content, rewritten(*content, key, value))) {
        return std::nullopt;
    }
    return path + ": " + std::strerror(errno);
}

}  // namespace ZR::DHCPClientProvider
