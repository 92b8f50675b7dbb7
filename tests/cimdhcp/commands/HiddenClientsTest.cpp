#include "commands/HiddenClients.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include "kit/ChildProcess.h"
#include "kit/FileContent.h"
#include "kit/TemporaryDirectory.h"

namespace cimdhcp {

TEST(HiddenProcesses, AreToldToOthersThanRoot) {
    const ZR::Testing::TemporaryDirectory proc;
    std::filesystem::permissions(proc.path(), std::filesystem::perms::all);
    const auto hidden = [&proc] {
        const ZR::Testing::ChildResult result = ZR::Testing::inChild([&proc]() -> std::string {
            constexpr uid_t nobody = 65534;
            if (::geteuid() == 0 && ::seteuid(nobody) != 0) {
                return "seteuid";
            }
            return areProcessesHidden(proc.path()) ? "hidden" : "seen";
        });
        return result.output;
    };
    EXPECT_EQ(hidden(), "hidden");
    std::filesystem::create_directories(proc / "1");
    ZR::Testing::writeFile(proc / "1/comm", "init\n");
    EXPECT_EQ(hidden(), "seen");
}

TEST(HiddenProcesses, AreNotWhereThereIsNoProcessFileSystem) {
    const ZR::Testing::TemporaryDirectory proc;
    EXPECT_FALSE(areProcessesHidden(proc.path() / "nowhere"));
}

}  // namespace cimdhcp
