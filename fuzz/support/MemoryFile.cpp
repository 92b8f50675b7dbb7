#include "MemoryFile.h"

#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include "Input.h"

namespace fuzz {

MemoryFile::MemoryFile()
    : fd_(::memfd_create("fuzz", MFD_CLOEXEC)),
      path_("/proc/self/fd/" + std::to_string(fd_.get())) {
    require(static_cast<bool>(fd_), "there is a file in memory");
}

void MemoryFile::put(std::string_view content) const {
    const auto size = static_cast<ssize_t>(content.size());
    require(::ftruncate(fd_.get(), 0) == 0 &&
                ::pwrite(fd_.get(), content.data(), content.size(), 0) == size,
            "a file in memory can be written");
}

std::string MemoryFile::content() const {
    struct stat status {};
    require(::fstat(fd_.get(), &status) == 0, "a file in memory has a size");
    std::string content(static_cast<std::size_t>(status.st_size), '\0');
    const auto size = static_cast<ssize_t>(content.size());
    require(::pread(fd_.get(), content.data(), content.size(), 0) == size,
            "a file in memory can be read");
    return content;
}

}  // namespace fuzz
