// The program with a provider of another maker beside its own.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>

#include "ProgramRun.h"

namespace {

namespace fs = std::filesystem;
using test::Ended;

class StrangerBesideOurs : public test::ProgramTest {
  protected:
    StrangerBesideOurs() {
        const fs::path source = ZR_SOURCE_DIR;
        const fs::path stranger = source / "tests/kit/providers/stranger";
        fs::copy(source / "schema", schema_, fs::copy_options::recursive);
        fs::copy(stranger / "schema/Stranger.mof", schema_ / "20-stranger.mof");
        fs::copy(stranger / "stranger.reg", schema_ / "stranger.registration");
    }

    /// With the libraries of both.
    Ended runBoth(const std::vector<std::string>& arguments) const {
        std::vector<std::string> all{"--schema-dir",   schema_,
                                     "--provider-dir", fs::path(PROVIDER_LIBRARY).parent_path(),
                                     "--provider-dir", MANY_PROVIDER_DIRECTORY};
        all.insert(all.end(), arguments.begin(), arguments.end());
        return run(all);
    }

  private:
    const fs::path schema_ = fs::path(directory() / "schema");
};

TEST_F(StrangerBesideOurs, IsServedFromADirectoryOfItsOwn) {
    EXPECT_EQ(runBoth({"names", "QVXZR_DHCPCapabilities"}),
              (Ended{0, "root/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\"\n", ""}));
    const std::string link =
        "root/test:Stranger_Link.Near=\"root/test:Stranger_Left.Id=\\\"l2\\\"\","
        "Far=\"root/test:Stranger_Right.Id=\\\"r2\\\"\"\n";
    EXPECT_EQ(
        runBoth({"--namespace", "root/test", "references", "--names", "Stranger_Left.Id=\"l2\""}),
        (Ended{0, link, ""}));
}

TEST_F(StrangerBesideOurs, IsServedOverAWholeSchema) {
    const std::vector<std::string> jobs{"names", "CIM_Job"};
    EXPECT_THAT(runBoth(jobs).err, testing::HasSubstr("no class \"CIM_Job\""));
    std::vector<std::string> full{"--cim-schema", ZR_SOURCE_DIR "/tests/schema/cim-2.41"};
    full.insert(full.end(), jobs.begin(), jobs.end());
    EXPECT_EQ(runBoth(full), (Ended{0, "", ""}));
    full = {"--cim-schema", ZR_SOURCE_DIR "/tests/schema/cim-2.41", "names",
            "CIM_DHCPCapabilities"};
    EXPECT_EQ(runBoth(full),
              (Ended{0, "root/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\"\n", ""}));
}

}  // namespace
