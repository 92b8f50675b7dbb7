#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "LinuxSupport.h"
#include "formats/Files.h"
#include "formats/Trust.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST(Files, AbsentFilesAndDirectoriesGiveNoDiagnostic) {
    const TemporaryDirectory root;
    std::vector<ZR::Diagnostic> diagnostics;
    EXPECT_EQ(readOptionalFile(root.path("/none"), diagnostics), std::nullopt);
    EXPECT_THAT(listOptionalDirectory(root.path("/none/there"), diagnostics), IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty());
}

TEST(Files, NamesAreSortedAndHalfWrittenFilesLeftOut) {
    const TemporaryDirectory root;
    for (const char* name : {"/b", "/.#b1234", "/a"}) {
        root.write(name, "");
    }
    std::vector<ZR::Diagnostic> diagnostics;
    EXPECT_THAT(listOptionalDirectory(root.path(), diagnostics), ElementsAre("a", "b"));
}

TEST(Files, WhatMayNotBeReadIsADiagnostic) {
    constexpr uid_t nobody = 65534;
    const TemporaryDirectory root;
    root.write("/file", "x");
    std::filesystem::create_directories(root.path("/directory"));
    ASSERT_EQ(::chmod(root.path().c_str(), 0755), 0);
    ASSERT_EQ(::chmod(root.path("/file").c_str(), 0), 0);
    ASSERT_EQ(::chmod(root.path("/directory").c_str(), 0), 0);
    const uid_t user = ::geteuid();
    if (user == 0) {  // who may read everything
        ASSERT_EQ(::seteuid(nobody), 0);
    }
    std::vector<ZR::Diagnostic> diagnostics;
    const auto content = readOptionalFile(root.path("/file"), diagnostics);
    const auto names = listOptionalDirectory(root.path("/directory"), diagnostics);
    ASSERT_EQ(::seteuid(user), 0);
    ASSERT_EQ(::chmod(root.path("/directory").c_str(), 0700), 0);  // else it could not be removed
    EXPECT_EQ(content, std::nullopt);
    EXPECT_THAT(names, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(diagnostics),
                ElementsAre("cannot read " + root.path("/file") + ": Permission denied",
                            "cannot read " + root.path("/directory") + ": Permission denied"));
}

TEST(Files, AFileBeyondAllMeasureIsADiagnostic) {
    const TemporaryDirectory root;
    root.write("/large", std::string((std::size_t{4} << 20U) + 1, 'x'));
    std::vector<ZR::Diagnostic> diagnostics;
    EXPECT_EQ(readOptionalFile(root.path("/large"), diagnostics), std::nullopt);
    EXPECT_EQ(diagnostics.size(), 1U);
}

constexpr uid_t nobody = 65534;

/// Files below a directory that every user may enter.
class TrustTest : public testing::Test {
  protected:
    TrustTest() {
        root_.write("/state/leases", "x");
        for (const char* path : {"", "/state"}) {
            mode(path, 0755);
        }
        mode("/state/leases", 0644);
    }
    void mode(const std::string& path, mode_t bits) const {
        ASSERT_EQ(::chmod(root_.path(path).c_str(), bits), 0) << path;
    }
    void give(const std::string& path, uid_t user) const {
        ASSERT_EQ(::lchown(root_.path(path).c_str(), user, user), 0) << path;
    }
    /// Why a file is not trusted; empty when it is.
    [[nodiscard]] std::string doubt(std::vector<uid_t> writers = {},
                                    const std::string& path = "/state/leases") const {
        std::vector<Diagnostic> diagnostics;
        const bool trusted = isTrusted(root_.path(path), writers, diagnostics);
        EXPECT_EQ(trusted, diagnostics.empty());
        if (diagnostics.empty()) {
            return {};
        }
        EXPECT_EQ(diagnostics[0].kind, Diagnostic::Kind::Untrusted);
        const std::string start = root_.path(path) + " is not trusted: ";
        EXPECT_TRUE(diagnostics[0].text.starts_with(start)) << diagnostics[0].text;
        return diagnostics[0].text.substr(start.size());
    }

    TemporaryDirectory root_;
};

#define ZR_NEEDS_ROOT()                                     \
    do {                                                    \
        if (::geteuid() != 0) {                             \
            GTEST_SKIP() << "giving files away needs root"; \
        }                                                   \
    } while (false)

TEST_F(TrustTest, WhatNobodyElseMayWriteIsTrusted) {
    EXPECT_EQ(doubt(), "");
    std::vector<Diagnostic> diagnostics;
    EXPECT_EQ(readTrustedFile(root_.path("/state/leases"), {}, diagnostics), "x");
    EXPECT_THAT(diagnostics, IsEmpty());
}

TEST_F(TrustTest, WhatIsNotThereIsNeitherTrustedNorWorthAWord) {
    std::vector<Diagnostic> diagnostics;
    for (const char* path : {"/none", "/state/none/there", "/state/leases/below"}) {
        EXPECT_FALSE(isTrusted(root_.path(path), {}, diagnostics)) << path;
        EXPECT_EQ(readTrustedFile(root_.path(path), {}, diagnostics), std::nullopt) << path;
    }
    EXPECT_THAT(diagnostics, IsEmpty());
}

TEST_F(TrustTest, AFileThatOthersMayWriteIsNot) {
    mode("/state/leases", 0646);
    EXPECT_EQ(doubt(), "every user may change " + root_.path("/state/leases"));
    mode("/state/leases", 0664);
    EXPECT_EQ(doubt(), "group " + std::to_string(::getegid()) + " may change " +
                           root_.path("/state/leases"));
    std::vector<Diagnostic> diagnostics;
    EXPECT_EQ(readTrustedFile(root_.path("/state/leases"), {}, diagnostics), std::nullopt);
    EXPECT_EQ(diagnostics.size(), 1U);
}

TEST_F(TrustTest, NorIsOneInADirectoryThatOthersMayWrite) {
    mode("/state", 0777);
    EXPECT_EQ(doubt(), "every user may change " + root_.path("/state"));
    mode("/state", 0755);
    mode("", 0777);
    EXPECT_EQ(doubt(), "every user may change " + root_.path(""));
}

TEST_F(TrustTest, AStickyDirectoryIsAllRightForWhatOthersDoNotOwn) {
    mode("/state", 01777);
    EXPECT_EQ(doubt(), "");
    ZR_NEEDS_ROOT();
    give("/state/leases", nobody);
    EXPECT_EQ(doubt(), "user 65534 may change " + root_.path("/state/leases"));
    EXPECT_EQ(doubt({nobody}), "");
}

TEST_F(TrustTest, TheClientsOwnUserMayWrite) {
    ZR_NEEDS_ROOT();
    give("/state", nobody);
    give("/state/leases", nobody);
    EXPECT_EQ(doubt({7}), "user 65534 may change " + root_.path("/state"));
    EXPECT_EQ(doubt({7, nobody}), "");
}

TEST_F(TrustTest, WhatNobodyElseCanReachIsTrusted) {
    mode("/state", 0777);
    mode("/state/leases", 0666);
    mode("", 0700);
    EXPECT_EQ(doubt(), "");
    mode("", 0710);  // as of an access control list that lets someone in
    EXPECT_EQ(doubt(), "every user may change " + root_.path("/state"));
}

TEST_F(TrustTest, ALinkIsAsGoodAsItsDirectoryAndItsTarget) {
    ASSERT_EQ(::symlink("state", root_.path("/alias").c_str()), 0);
    ASSERT_EQ(::symlink(root_.path("/alias/leases").c_str(), root_.path("/absolute").c_str()), 0);
    ASSERT_EQ(::symlink("../alias/./leases", root_.path("/state/relative").c_str()), 0);
    const std::vector<std::string> links{"/alias/leases", "/absolute", "/state/relative"};
    for (const std::string& link : links) {
        EXPECT_EQ(doubt({}, link), "") << link;
        std::vector<Diagnostic> diagnostics;
        const auto found = findFile(root_.path(link), {}, diagnostics);
        ASSERT_TRUE(found) << link;
        EXPECT_TRUE(found->path.ends_with("/state/leases")) << found->path;
        EXPECT_TRUE(S_ISREG(found->status.st_mode));
    }
    mode("/state/leases", 0666);
    for (const std::string& link : links) {
        EXPECT_TRUE(doubt({}, link).starts_with("every user may change ")) << link;
    }
    mode("/state/leases", 0644);
    ZR_NEEDS_ROOT();
    // In a sticky directory every user may make links.
    mode("", 01777);
    give("/alias", nobody);
    EXPECT_EQ(doubt({}, "/alias/leases"), "user 65534 may change " + root_.path("/alias"));
}

TEST_F(TrustTest, LeavingAClosedDirectoryOpensTheWayAgain) {
    ASSERT_EQ(::mkdir(root_.path("/closed").c_str(), 0700), 0);
    ASSERT_EQ(::symlink("../state/leases", root_.path("/closed/link").c_str()), 0);
    mode("/state", 0777);
    EXPECT_EQ(doubt({}, "/closed/link"), "every user may change " + root_.path("/state"));
}

TEST_F(TrustTest, LinksInACircleAreADiagnostic) {
    ASSERT_EQ(::symlink("b", root_.path("/a").c_str()), 0);
    ASSERT_EQ(::symlink("a", root_.path("/b").c_str()), 0);
    std::vector<Diagnostic> diagnostics;
    EXPECT_FALSE(isTrusted(root_.path("/a"), {}, diagnostics));
    ASSERT_EQ(diagnostics.size(), 1U);
    EXPECT_EQ(diagnostics[0].text,
              "cannot read " + root_.path("/a") + ": Too many levels of symbolic links");
}

TEST_F(TrustTest, LinksOfAnotherRootBeginThere) {
    ASSERT_EQ(::symlink("/state/leases", root_.path("/link").c_str()), 0);
    ASSERT_EQ(::symlink("/../../state/leases", root_.path("/above").c_str()), 0);
    for (const char* path : {"/link", "/above"}) {
        std::vector<Diagnostic> diagnostics;
        const auto found = findFile(path, {}, diagnostics, root_.path(""));
        ASSERT_TRUE(found) << path;
        EXPECT_EQ(found->path, root_.path("/state/leases"));
        EXPECT_EQ(found->doubt, "");
        EXPECT_FALSE(findFile(root_.path(path), {}, diagnostics)) << path;
    }
}

}  // namespace
}  // namespace ZR::Live
