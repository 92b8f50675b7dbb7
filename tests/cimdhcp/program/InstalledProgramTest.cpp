#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>

#include "ProgramRun.h"

namespace {

namespace fs = std::filesystem;
using test::Ended;
using ZR::Testing::writeFile;

/// Where the program finds its schema, registrations and libraries.
class Installation : public test::ProgramTest {
  protected:
    std::string emptyDirectory(const std::string& name) const {
        const std::string path = directory() / name;
        fs::create_directories(path);
        return path;
    }

    const std::vector<std::string> names_{"names", "QVXZR_DHCPCapabilities"};
    const Ended expected_{0, "root/cimv2:QVXZR_DHCPCapabilities.InstanceID=\"eth0\"\n", ""};

    Ended with(const std::string& option, const std::string& directory) const {
        return run({option, directory, names_[0], names_[1]});
    }
};

TEST_F(Installation, IsFoundBesideTheExecutable) {
    // The same files at another place, as an installation would put them there.
    const std::string prefix = emptyDirectory("prefix");
    fs::create_directories(prefix + "/bin");
    fs::create_directories(prefix + "/lib/cmpi");
    fs::create_directories(prefix + "/share/dhcp-client-provider");
    fs::copy(program(), prefix + "/bin/cimdhcp");
    fs::copy(PROVIDER_LIBRARY, prefix + "/lib/cmpi/libDHCPClient.so");
    const fs::path build = fs::path(program()).parent_path().parent_path();
    fs::copy(build / "share/dhcp-client-provider/schema",
             prefix + "/share/dhcp-client-provider/schema", fs::copy_options::recursive);
    const auto runThere = [&] {
        return runAs(prefix + "/bin/cimdhcp", {"--tree", tree(), names_[0], names_[1]});
    };
    EXPECT_EQ(runThere(), expected_);
    // It was this library indeed.
    fs::remove(prefix + "/lib/cmpi/libDHCPClient.so");
    EXPECT_EQ(runThere().status, 3);
}

TEST_F(Installation, ThatIsMissingIsTold) {
    const std::string bin = emptyDirectory("alone/bin");
    fs::copy(program(), bin + "/cimdhcp");
    const Ended ended = runAs(bin + "/cimdhcp", {"classes"});
    EXPECT_EQ(ended.status, 3);
    EXPECT_EQ(ended.out, "");
    const std::string start =
        "cimdhcp: no schema found in " + directory() / "alone/share/dhcp-client-provider/schema, /";
    EXPECT_EQ(ended.err.substr(0, start.size()), start);
}

TEST_F(Installation, CanBeNamedInTheEnvironment) {
    const fs::path build = fs::path(program()).parent_path().parent_path();
    const std::string schema = build / "share/dhcp-client-provider/schema";
    const std::string bin = emptyDirectory("alone/bin");
    fs::copy(program(), bin + "/cimdhcp");
    EXPECT_EQ(runAs(bin + "/cimdhcp", {"--tree", tree(), names_[0], names_[1]},
                    {{"CIMDHCP_SCHEMA_DIR", schema},
                     {"CIMDHCP_PROVIDER_DIR", fs::path(PROVIDER_LIBRARY).parent_path()}}),
              expected_);
}

TEST_F(Installation, WithoutTheLibraryIsStatusThree) {
    const std::string empty = emptyDirectory("empty");
    const Ended missing{3, "",
                        "cimdhcp: CIM_ERR_FAILED: libDHCPClient.so: not found in " + empty + "\n"};
    EXPECT_EQ(with("--provider-dir", empty), missing);
    EXPECT_EQ(run({"--provider-dir", empty, "show"}), missing);
    EXPECT_EQ(run({"--provider-dir", empty, "rename", "eth0", "x"}), missing);
    // What needs no provider does not ask for it.
    EXPECT_EQ(run({"--provider-dir", empty, "classes"}), run({"classes"}));
}

TEST_F(Installation, WithALibraryThatCannotBeLoadedIsStatusThree) {
    const std::string broken = emptyDirectory("broken");
    const std::string library = broken + "/libDHCPClient.so";
    writeFile(library, "this is no library");
    Ended ended = with("--provider-dir", broken);
    EXPECT_EQ(ended.status, 3);
    EXPECT_EQ(ended.out, "");
    EXPECT_EQ(ended.err.substr(0, 26 + library.size()),
              "cimdhcp: CIM_ERR_FAILED: " + library + ':');
    fs::remove(library);
    fs::copy(NO_PROVIDER_LIBRARY, library);
    ended = with("--provider-dir", broken);
    EXPECT_EQ(ended.status, 3);
    EXPECT_NE(ended.err.find(library + ": neither DHCPClientGateway_Create_InstanceMI nor"),
              std::string::npos)
        << ended.err;
}

TEST_F(Installation, WithABrokenSchemaIsStatusThree) {
    const std::string broken = emptyDirectory("broken");
    EXPECT_EQ(with("--schema-dir", directory() / "missing"),
              (Ended{3, "",
                     "cimdhcp: " + directory() / "missing" +
                         ": no such directory (from --schema-dir or CIMDHCP_SCHEMA_DIR)\n"}));
    writeFile(broken + "/a.registration",
              "[QVXZR_DHCPCapabilities]\nprovider: A\nlocation: A\ntype: instance\n"
              "namespace: root/cimv2\n");
    Ended ended = with("--schema-dir", broken);
    EXPECT_EQ(ended.status, 3);
    EXPECT_EQ(ended.err,
              "cimdhcp: class QVXZR_DHCPCapabilities of provider A is in none of the schema's "
              "files\n");
    writeFile(broken + "/a.mof", "class {");
    ended = with("--schema-dir", broken);
    EXPECT_EQ(ended.status, 3);
    EXPECT_EQ(ended.err.substr(0, broken.size() + 20), "cimdhcp: " + broken + "/a.mof:1:7:");
}

TEST_F(Installation, WithBrokenRegistrationsIsStatusThree) {
    const std::string broken = emptyDirectory("broken");
    EXPECT_EQ(with("--registration-dir", broken),
              (Ended{3, "", "cimdhcp: " + broken + ": no *.registration file is in it\n"}));
    writeFile(broken + "/a.registration", "nonsense\n");
    EXPECT_EQ(with("--registration-dir", broken).err.substr(0, broken.size() + 27),
              "cimdhcp: " + broken + "/a.registration:1:");
    EXPECT_EQ(with("--registration-dir", broken).status, 3);
}

// The program with a provider of another maker beside its own.

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
