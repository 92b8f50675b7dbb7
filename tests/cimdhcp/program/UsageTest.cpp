#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "ProgramRun.h"

namespace {

using test::Ended;
using testing::StartsWith;

class Usage : public test::ProgramTest {
  protected:
    Ended plain(const std::vector<std::string>& arguments,
                const test::Environment& extra = {}) const {
        return runAs(program(), arguments, extra);
    }
};

TEST_F(Usage, VersionIsPrinted) {
    EXPECT_EQ(plain({"--version"}), (Ended{0, "cimdhcp " CIMDHCP_VERSION "\n", ""}));
}

TEST_F(Usage, HelpIsPrintedAndFitsATerminal) {
    const Ended ended = plain({"--help"});
    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(ended.err, "");
    EXPECT_EQ(ended.out.substr(0, 35), "Usage: cimdhcp [OPTIONS] COMMAND\n\nS");
    std::size_t start = 0;
    for (std::size_t end = ended.out.find('\n'); end != std::string::npos;
         start = end + 1, end = ended.out.find('\n', start)) {
        EXPECT_LE(end - start, 86U) << ended.out.substr(start, end - start);
    }
}

TEST_F(Usage, MistakesAreStatusTwo) {
    const std::string hint = " (\"cimdhcp --help\" tells more)\n";
    EXPECT_EQ(plain({}), (Ended{2, "", "cimdhcp: a command is missing" + hint}));
    EXPECT_EQ(
        plain({"server"}),
        (Ended{2, "", "cimdhcp: there is no command \"server\"; did you mean serve?" + hint}));
    EXPECT_EQ(plain({"get"}), (Ended{2, "", "cimdhcp: PATH is required" + hint}));
    EXPECT_EQ(
        plain({"--format", "mof", "show"}),
        (Ended{2, "", "cimdhcp: this command has no MOF output; use --format table or json\n"}));
    EXPECT_EQ(plain({"names", "QVXZR_DHCPCapabilities.InstanceID=\"eth0\""}),
              (Ended{2, "",
                     "cimdhcp: \"QVXZR_DHCPCapabilities.InstanceID=\"eth0\"\" is the path of an "
                     "instance; give its class alone: QVXZR_DHCPCapabilities\n"}));
    EXPECT_EQ(plain({"get", "QVXZR_DHCPCapabilities.InstanceID=eth0"}).status, 2);
    EXPECT_EQ(plain({"references", "QVXZR_DHCPCapabilities"}).status, 2);
}

TEST_F(Usage, ATreeThatCannotBeReadIsStatusThree) {
    const std::string missing = directory() / "missing.json";
    EXPECT_EQ(plain({"--tree", missing, "show"}),
              (Ended{3, "", "cimdhcp: " + missing + ": No such file or directory\n"}));
    ZR::Testing::writeFile(tree(), "{\n  \"nodes\": [x]\n}");
    const Ended broken = run({"tree"});
    EXPECT_EQ(broken.status, 3);
    EXPECT_EQ(broken.out, "");
    EXPECT_THAT(broken.err,
                StartsWith("cimdhcp: " + tree() +
                           ":2:13: syntax error while parsing value - invalid literal"));
    ZR::Testing::writeFile(tree(), R"({"nodes": [{"type": 7}]})");
    EXPECT_EQ(run({"show"}),
              (Ended{3, "", "cimdhcp: " + tree() + ":1:21: \"type\" must be a text\n"}));
    // It does not matter how the tree was named.
    EXPECT_EQ(plain({"show"}, {{"ZR_INSTRUMENTATION_TREE", missing}}).status, 3);
}

TEST_F(Usage, ATreeIsReadFromStandardInputAndPipes) {
    const Ended expected = run({"show"});
    const Ended classes = run({"names", "CIM_ManagedElement"});
    ASSERT_EQ(expected.status, 0);
    const auto inShell = [this](const std::string& before, const std::string& file,
                                const std::string& command, const std::string& after) {
        return runAs("/bin/bash", {"-c", before + program() + " --tree " + file + " --data-dir " +
                                             dataDir() + " " + command + after});
    };
    for (const std::string command : {"show", "names CIM_ManagedElement"}) {
        const Ended& wanted = command == "show" ? expected : classes;
        EXPECT_EQ(inShell("cat " + tree() + " | ", "-", command, ""), wanted);
        EXPECT_EQ(inShell("", "-", command, " <" + tree()), wanted);
        EXPECT_EQ(inShell("cat " + tree() + " | ", "/dev/stdin", command, ""), wanted);
        EXPECT_EQ(inShell("", "/dev/stdin", command, " <" + tree()), wanted);
        EXPECT_EQ(inShell("", "<(cat " + tree() + ")", command, ""), wanted);
        const std::string fifo = directory() / "fifo";
        EXPECT_EQ(inShell("rm -f " + fifo + "; mkfifo " + fifo + "; cat " + tree() + " >" + fifo +
                              " & while ! test -p " + fifo + "; do :; done; ",
                          fifo, command, ""),
                  wanted);
    }
}

TEST_F(Usage, ATreeFromStandardInputIsToldOfUnderThatName) {
    const auto given = [this](const std::string& text, const std::string& command) {
        ZR::Testing::writeFile(directory() / "input", text);
        return runAs("/bin/sh", {"-c", "cat " + (directory() / "input") + " | " + program() +
                                           " --tree - --data-dir " + dataDir() + " " + command});
    };
    EXPECT_EQ(given("{}", "show"),
              (Ended{3, "", "cimdhcp: standard input:1:1: \"nodes\" is missing\n"}));
    EXPECT_EQ(given(R"({"nodes": [{"type": "computersystem", "description": ""}]})", "tree").err,
              "cimdhcp: standard input:1:21: the type \"computersystem\" is not known, "
              "\"ComputerSystem\" is\n");
    EXPECT_THAT(given(R"({"nodes": []})", "check").out,
                testing::HasSubstr("machine: tree standard input has 0 interfaces"));
    EXPECT_THAT(given(std::string((10U << 20U) + 1, ' '), "show").err,
                "cimdhcp: standard input: File too large\n");
}

TEST_F(Usage, ADataDirectoryThatIsNoneIsStatusThree) {
    EXPECT_EQ(plain({"--data-dir", tree(), "show"}),
              (Ended{3, "", "cimdhcp: " + tree() + ": is not a directory\n"}));
    const std::string slip = directory() / "slip";
    for (const std::vector<std::string>& command :
         {std::vector<std::string>{"show"}, {"rename", "eth0", "office", "--create"}}) {
        std::vector<std::string> arguments{"--tree", tree(), "--data-dir", slip};
        arguments.insert(arguments.end(), command.begin(), command.end());
        EXPECT_EQ(plain(arguments), (Ended{3, "",
                                           "cimdhcp: --data-dir " + slip +
                                               ": there is no such directory; mkdir makes it\n"}));
        EXPECT_FALSE(std::filesystem::exists(slip));
    }
}

TEST_F(Usage, UnusableSettingsAreTold) {
    const Ended ended = run({"names", "QVXZR_DHCPCapabilities"}, {{"ZR_TRACE_LEVEL", "high"}});
    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(ended.err,
              "cimdhcp: warning: ZR_TRACE_LEVEL=\"high\": not a level (a number from 0)\n");
}

TEST_F(Usage, OutputThatCannotBeWrittenIsStatusThree) {
    // A shell does the redirection; /dev/full is a disk without room.
    EXPECT_EQ(runAs("/bin/sh", {"-c", "exec \"$0\" --version >/dev/full", program()}),
              (Ended{3, "", "cimdhcp: the output cannot be written\n"}));
}

}  // namespace
