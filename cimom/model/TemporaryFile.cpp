#include "cimom/TemporaryFile.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <system_error>

namespace cimom {

namespace {

[[noreturn]] void fail(int error, const std::string& what) {
    throw std::system_error(error, std::generic_category(), what);
}

int openNameless(const std::string& directory) {
    const int fd = ::open(directory.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600);
    if (fd >= 0) {
        return fd;
    }
    // Not every file system supports files without a name.
    std::string name = directory + "/cimdhcp.XXXXXX";
    const int named = ::mkostemp(name.data(), O_CLOEXEC);
    if (named >= 0) {
        // If this fails, the file stays behind, and can be used all the same.
        static_cast<void>(::unlink(name.c_str()));
    }
    return named;
}

}  // namespace

TemporaryFile::TemporaryFile() {
    const char* const named = std::getenv("TMPDIR");
    const std::string directory = named == nullptr || *named == '\0' ? "/tmp" : named;
    fd_ = openNameless(directory);
    if (fd_ < 0) {
        fail(errno, "no temporary file in " + directory);
    }
}

TemporaryFile::~TemporaryFile() {
    ::close(fd_);
}

// What is written belongs to the object, whatever the descriptor is.
// NOLINTNEXTLINE(readability-make-member-function-const)
void TemporaryFile::write(std::size_t position, const char* bytes, std::size_t size) {
    std::size_t written = 0;
    while (written < size) {
        const ssize_t now =
            ::pwrite(fd_, bytes + written, size - written, static_cast<off_t>(position + written));
        if (now < 0 && errno != EINTR) {
            fail(errno, "cannot write a temporary file");
        }
        written += now < 0 ? 0 : static_cast<std::size_t>(now);
    }
}

void TemporaryFile::read(std::size_t position, std::size_t size, std::string& out) const {
    const std::size_t before = out.size();
    out.resize(before + size);
    std::size_t got = 0;
    while (got < size) {
        const ssize_t now =
            ::pread(fd_, out.data() + before + got, size - got, static_cast<off_t>(position + got));
        if (now == 0 || (now < 0 && errno != EINTR)) {
            fail(now == 0 ? EIO : errno, "cannot read a temporary file");
        }
        got += now < 0 ? 0 : static_cast<std::size_t>(now);
    }
}

// NOLINTNEXTLINE(readability-make-member-function-const): as above
void* TemporaryFile::map(std::size_t position, std::size_t size) noexcept {
    // With room set aside now, no later write into the mapping can meet a full disk,
    // which would end the process.
    if (::posix_fallocate(fd_, static_cast<off_t>(position), static_cast<off_t>(size)) != 0) {
        return nullptr;
    }
    void* const memory = ::mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED, fd_,
                                static_cast<off_t>(position));
    return memory == MAP_FAILED ? nullptr : memory;
}

}  // namespace cimom
