#include "commands/MemoryFile.h"

#include <sys/mman.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <system_error>

namespace cimdhcp {

ZR::UniqueFd memoryFile(const char* name) {
    ZR::UniqueFd file(::memfd_create(name, MFD_CLOEXEC));
    if (!file) {
        throw std::system_error(errno, std::generic_category(), "memfd_create");
    }
    return file;
}

void writeWhole(int file, std::string_view text) {
    while (!text.empty()) {
        const ssize_t written = ::write(file, text.data(), text.size());
        if (written < 0 && errno != EINTR) {
            throw std::system_error(errno, std::generic_category(), "write");
        }
        text.remove_prefix(written < 0 ? 0 : static_cast<std::size_t>(written));
    }
}

std::string readWhole(int file, std::size_t largest) {
    std::string text;
    std::array<char, 65536> piece{};
    for (;;) {
        const ssize_t got = ::read(file, piece.data(), piece.size());
        if (got < 0 && errno != EINTR) {
            throw std::system_error(errno, std::generic_category(), "read");
        }
        if (got == 0) {
            return text;
        }
        text.append(piece.data(), got < 0 ? 0 : static_cast<std::size_t>(got));
        if (text.size() > largest) {
            throw std::system_error(EFBIG, std::generic_category(), "read");
        }
    }
}

}  // namespace cimdhcp
