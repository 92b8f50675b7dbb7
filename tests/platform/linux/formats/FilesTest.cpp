#include "formats/Files.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "LinuxSupport.h"
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

}  // namespace
}  // namespace ZR::Live
