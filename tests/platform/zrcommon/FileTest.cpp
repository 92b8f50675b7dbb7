#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <string>
#include <utility>

#include "kit/ChildProcess.h"
#include "kit/Files.h"
#include "zrcommon/File.h"
#include "zrcommon/InterfaceFile.h"
#include "zrcommon/Strings.h"
#include "zrcommon/UniqueFd.h"

namespace ZR {

namespace {

using Testing::inChild;
using Testing::TemporaryDirectory;
using Testing::writeFile;

/// Reads a file that must be refused; returns why it was.
int reasonOf(const std::string& path, std::size_t limit = 1U << 20U) {
    errno = 0;
    const auto content = File::read(path, limit);
    const int reason = errno;
    EXPECT_FALSE(content.has_value());
    return reason;
}

class FileTest : public testing::Test {
  protected:
    TemporaryDirectory directory_;
    std::string path_ = directory_ / "file";
};

TEST_F(FileTest, ReadsEveryByte) {
    std::string bytes;
    for (int i = 0; i < 70000; ++i) {
        bytes.push_back(static_cast<char>(i * 7));
    }
    writeFile(path_, bytes);
    EXPECT_EQ(File::read(path_), bytes);
}

TEST_F(FileTest, ReadsSizesAroundThatOfItsFirstPiece) {
    for (const std::size_t size : {0U, 1U, 4095U, 4096U, 4097U, 8191U, 8192U}) {
        const std::string bytes(size, 'x');
        writeFile(path_, bytes);
        EXPECT_EQ(File::read(path_), bytes) << size;
    }
}

TEST_F(FileTest, LimitIsTheLargestSizeThatIsRead) {
    writeFile(path_, std::string(5000, 'x'));
    EXPECT_EQ(File::read(path_, 5000), std::string(5000, 'x'));
    EXPECT_EQ(reasonOf(path_, 4999), EFBIG);
    writeFile(path_, "");
    EXPECT_EQ(File::read(path_, 0), "");
}

TEST_F(FileTest, FileThatIsTooLargeCostsNoMemory) {
    {
        const UniqueFd fd{::open(path_.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600)};
        ASSERT_TRUE(fd);
        if (::ftruncate(fd.get(), off_t{1} << 40U) != 0) {
            GTEST_SKIP() << "no sparse files here: " << std::strerror(errno);
        }
    }
    EXPECT_EQ(reasonOf(path_), EFBIG);
}

TEST_F(FileTest, LimitHoldsForFilesThatTellNoSize) {
    EXPECT_EQ(reasonOf("/proc/self/maps", 10), EFBIG);
}

TEST_F(FileTest, ReadsFilesOfTheKernelWhole) {
    const auto status = File::read("/proc/self/status");
    ASSERT_TRUE(status.has_value());
    EXPECT_EQ(status->substr(0, 6), "Name:\t");
    EXPECT_EQ(status->back(), '\n');

    // Longer than the first piece.
    const auto symbols = File::read("/proc/kallsyms");
    if (symbols && symbols->size() > 8192) {
        EXPECT_EQ(symbols->back(), '\n');
    }
}

TEST_F(FileTest, MissingFileIsNotRead) {
    EXPECT_EQ(reasonOf(path_), ENOENT);
}

TEST_F(FileTest, DirectoryIsNotRead) {
    EXPECT_EQ(reasonOf(directory_.path().string()), EISDIR);
}

TEST_F(FileTest, PipeWithoutAWriterDoesNotHang) {
    ASSERT_EQ(::mkfifo(path_.c_str(), 0600), 0);
    ::alarm(20);  // ends the program, should the call hang
    EXPECT_EQ(reasonOf(path_), EINVAL);
    ::alarm(0);
}

TEST_F(FileTest, DeviceIsNotRead) {
    EXPECT_EQ(reasonOf("/dev/zero"), EINVAL);
}

TEST_F(FileTest, SocketIsNotRead) {
    const UniqueFd fd{::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)};
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    ASSERT_LT(path_.size(), sizeof address.sun_path);
    std::memcpy(address.sun_path, path_.c_str(), path_.size() + 1);
    ASSERT_EQ(::bind(fd.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
    EXPECT_EQ(reasonOf(path_), ENXIO);
}

TEST_F(FileTest, FileWithoutPermissionIsNotRead) {
    writeFile(path_, "secret");
    ASSERT_EQ(::chmod(path_.c_str(), 0), 0);
    const auto result = inChild([this] {
        // The root user may read everything; the user nobody may not.
        if (::geteuid() == 0 && (::chmod(directory_.path().c_str(), 0755) != 0 ||
                                 ::setresuid(65534, 65534, 65534) != 0)) {
            return std::string("cannot become nobody");
        }
        return std::string(std::strerror(reasonOf(path_)));
    });
    EXPECT_EQ(result.output, "Permission denied");
}

TEST_F(FileTest, NothingButTheWholeNameNamesAFile) {
    writeFile(path_, "x");
    const std::string cut = path_ + '\0' + "y";
    EXPECT_EQ(reasonOf(cut), ENOENT);
    EXPECT_FALSE(File::exists(make_wstring(cut)));
}

TEST_F(FileTest, ReadingLeavesNoDescriptorOpen) {
    writeFile(path_, "x");
    const auto next = [] { return UniqueFd{::open("/dev/null", O_RDONLY | O_CLOEXEC)}.get(); };
    const int before = next();
    for (int i = 0; i < 3; ++i) {
        EXPECT_TRUE(File::read(path_).has_value());
        EXPECT_EQ(reasonOf(directory_.path().string()), EISDIR);
        EXPECT_EQ(reasonOf("/proc/self/maps", 10), EFBIG);
    }
    EXPECT_EQ(next(), before);
}

TEST_F(FileTest, WhateverHasTheNameExists) {
    writeFile(path_, "");
    EXPECT_TRUE(File::exists(make_wstring(path_)));
    EXPECT_TRUE(File::exists(make_wstring(directory_.path().string())));
    EXPECT_TRUE(File::exists(L"/dev/null"));
    EXPECT_FALSE(File::exists(make_wstring(directory_ / "missing")));
    EXPECT_FALSE(File::exists(make_wstring(path_ + "/below a file")));
    EXPECT_FALSE(File::exists(L""));
}

TEST_F(FileTest, LinkThatLeadsNowhereDoesNotExist) {
    ASSERT_EQ(::symlink("missing", path_.c_str()), 0);
    EXPECT_FALSE(File::exists(make_wstring(path_)));
}

TEST_F(FileTest, NamesNeedNotBeText) {
    const std::string name = directory_ / "a\xFF\xC3";
    writeFile(name, "x");
    EXPECT_TRUE(File::exists(make_wstring(name)));
    EXPECT_EQ(File::read(name), "x");
}

}  // namespace

namespace {

int openOne() {
    return ::open("/dev/null", O_RDONLY | O_CLOEXEC);
}
bool isOpen(int fd) {
    return ::fcntl(fd, F_GETFD) >= 0;
}

TEST(UniqueFd, ClosesAtItsEnd) {
    int number = -1;
    {
        const UniqueFd fd{openOne()};
        number = fd.get();
        EXPECT_TRUE(fd);
        EXPECT_TRUE(isOpen(number));
    }
    EXPECT_FALSE(isOpen(number));
}

TEST(UniqueFd, HoldsNothingAtFirst) {
    const UniqueFd fd;
    EXPECT_FALSE(fd);
    EXPECT_EQ(fd.get(), -1);
}

TEST(UniqueFd, DescriptorZeroIsOneLikeAnyOther) {
    const auto result = Testing::inChild([] {
        ::close(STDIN_FILENO);
        UniqueFd fd{openOne()};
        const bool held = fd.get() == 0 && static_cast<bool>(fd);
        fd.reset();
        return std::string(held && !isOpen(0) ? "yes" : "no");
    });
    EXPECT_EQ(result.output, "yes");
}

TEST(UniqueFd, MovingHandsTheDescriptorOver) {
    UniqueFd one{openOne()};
    const int number = one.get();
    UniqueFd other{std::move(one)};
    EXPECT_EQ(one.get(), -1);  // NOLINT(bugprone-use-after-move): what it is left with
    EXPECT_EQ(other.get(), number);
    EXPECT_TRUE(isOpen(number));
}

TEST(UniqueFd, AssignmentClosesWhatWasHeld) {
    UniqueFd one{openOne()};
    UniqueFd other{openOne()};
    const int kept = one.get();
    const int closed = other.get();
    other = std::move(one);
    EXPECT_EQ(other.get(), kept);
    EXPECT_TRUE(isOpen(kept));
    EXPECT_FALSE(isOpen(closed));
}

TEST(UniqueFd, AssignmentToItselfKeepsTheDescriptor) {
    UniqueFd fd{openOne()};
    const int number = fd.get();
    UniqueFd& same = fd;
    fd = std::move(same);
    EXPECT_EQ(fd.get(), number);
    EXPECT_TRUE(isOpen(number));
}

TEST(UniqueFd, ResetClosesAndTakesAnother) {
    UniqueFd fd{openOne()};
    const int first = fd.get();
    const int second = openOne();
    fd.reset(second);
    EXPECT_FALSE(isOpen(first));
    EXPECT_EQ(fd.get(), second);
    fd.reset();
    EXPECT_FALSE(fd);
    EXPECT_FALSE(isOpen(second));
}

}  // namespace

}  // namespace ZR

namespace ZR {
namespace {

TEST(InterfaceFile, IsNamedAfterItsInterface) {
    EXPECT_EQ(InterfaceFile::path("/data/", "eth0"), "/data/ifcfg-eth0");
    EXPECT_EQ(InterfaceFile::path("/data/", "eth0.7"), "/data/ifcfg-eth0.7");
    for (const char* name : {"", ".", "..", "a/b", "a\nb", "a\x7F"}) {
        EXPECT_EQ(InterfaceFile::path("/data/", name), std::nullopt) << name;
    }
}

}  // namespace
}  // namespace ZR
