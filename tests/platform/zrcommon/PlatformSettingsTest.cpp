#include "zrcommon/PlatformSettings.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <map>
#include <string>
#include <vector>

#include "kit/ChildProcess.h"
#include "kit/Files.h"
#include "kit/PrivateNamespace.h"
#include "zrcommon/PlatformUtilities.h"

namespace ZR {

namespace {

using Testing::inChild;
using Testing::TemporaryDirectory;
using Testing::writeFile;

using Diagnostics = std::vector<std::string>;

class PlatformSettingsTest : public testing::Test {
  protected:
    /// The settings of a file of this content, with `variables_` as the environment.
    PlatformSettings readContent(std::string_view content) {
        writeFile(file_, content);
        variables_["ZR_CONFIG"] = file_;
        return read();
    }

    PlatformSettings read() const {
        return PlatformSettings::read([this](const char* name) {
            const auto found = variables_.find(name);
            return found == variables_.end() ? nullptr : found->second.c_str();
        });
    }

    TemporaryDirectory directory_;
    std::string file_ = directory_ / "platform.conf";
    std::map<std::string, std::string> variables_;
};

TEST_F(PlatformSettingsTest, EveryKeyOfTheFileIsTaken) {
    PlatformSettings expected;
    expected.dataDir = "/srv/net/";
    expected.instrumentationTree = "/srv/tree.json";
    expected.logLevel = 3000;
    expected.traceLevel = 0;
    expected.logSink = "stderr";
    expected.traceSink = "file:/srv/trace log";
    expected.serviceProcessorWait = std::chrono::milliseconds(1500);
    expected.readOnce = true;
    EXPECT_EQ(readContent("# The platform\n"
                          "DATA_DIR = /srv/net/\n"
                          "INSTRUMENTATION_TREE=\"/srv/tree.json\"\n"
                          "\n"
                          "LOG_LEVEL=3000\n"
                          "TRACE_LEVEL=0\n"
                          "LOG_SINK=stderr\n"
                          "TRACE_SINK='file:/srv/trace log'\n"
                          "SERVICE_PROCESSOR_WAIT=1500\n"
                          "READ_ONCE=yes\n"),
              expected);
}

TEST_F(PlatformSettingsTest, EmptyFileGivesTheDefaults) {
    const PlatformSettings settings = readContent("");
    EXPECT_EQ(settings.logLevel, 6000);
    EXPECT_EQ(settings.traceLevel, 6000);
    EXPECT_EQ(settings.logSink, "syslog");
    EXPECT_EQ(settings.traceSink, "none");
    EXPECT_EQ(settings.serviceProcessorWait, std::chrono::milliseconds(0));
    EXPECT_EQ(settings.instrumentationTree, "");
    EXPECT_EQ(settings.diagnostics, Diagnostics{});
}

TEST_F(PlatformSettingsTest, EveryKeyIsOverriddenByItsVariable) {
    variables_ = {{"ZR_DATA_DIR", "/env"},
                  {"ZR_INSTRUMENTATION_TREE", "/env.json"},
                  {"ZR_LOG_LEVEL", "1"},
                  {"ZR_TRACE_LEVEL", "2"},
                  {"ZR_LOG_SINK", "file:/env"},
                  {"ZR_TRACE_SINK", "syslog"},
                  {"ZR_SERVICE_PROCESSOR_WAIT", "60000"}};
    PlatformSettings expected;
    expected.dataDir = "/env/";
    expected.instrumentationTree = "/env.json";
    expected.logLevel = 1;
    expected.traceLevel = 2;
    expected.logSink = "file:/env";
    expected.traceSink = "syslog";
    expected.serviceProcessorWait = std::chrono::seconds(60);
    EXPECT_EQ(readContent("DATA_DIR=/file\nINSTRUMENTATION_TREE=/file.json\nLOG_LEVEL=10\n"
                          "TRACE_LEVEL=20\nLOG_SINK=none\nTRACE_SINK=stderr\n"),
              expected);
}

TEST_F(PlatformSettingsTest, VariableCanTakeTheTreeAway) {
    variables_ = {{"ZR_INSTRUMENTATION_TREE", ""}};
    EXPECT_EQ(readContent("INSTRUMENTATION_TREE=/file.json\n").instrumentationTree, "");
}

TEST_F(PlatformSettingsTest, LastOfEqualKeysCounts) {
    EXPECT_EQ(readContent("LOG_LEVEL=1\nLOG_LEVEL=2\n").logLevel, 2);
}

TEST_F(PlatformSettingsTest, SinksAndLevelsOfEveryFormAreTaken) {
    for (const std::string sink : {"none", "stderr", "syslog", "file:x", "file:/a b"}) {
        const PlatformSettings settings = readContent("LOG_SINK=" + sink + "\n");
        EXPECT_EQ(settings.logSink, sink);
        EXPECT_EQ(settings.diagnostics, Diagnostics{}) << sink;
    }
    for (const int level : {0, 1, 6000, 2147483647}) {
        const PlatformSettings settings = readContent("LOG_LEVEL=" + std::to_string(level));
        EXPECT_EQ(settings.logLevel, level);
        EXPECT_EQ(settings.diagnostics, Diagnostics{}) << level;
    }
}

TEST_F(PlatformSettingsTest, UnusableValuesAreDiagnosticsWithFileAndLine) {
    PlatformSettings expected;
    expected.dataDir = "/d/";
    expected.diagnostics = {
        file_ + ":2: LOG_LEVEL=\"high\": not a level (a number from 0)",
        file_ + ":3: TRACE_LEVEL=\"-1\": not a level (a number from 0)",
        file_ + ":4: LOG_SINK=\"console\": not a sink (none, stderr, syslog or file:PATH)",
        file_ + ":5: TRACE_SINK=\"file:\": not a sink (none, stderr, syslog or file:PATH)",
        file_ + ":7: LOG_LEVELS=\"1\": no such setting",
        file_ + ":8: log_level=\"1\": no such setting",
        file_ + ":9: not a KEY=value line: \"LOG_LEVEL 1\"",
        file_ + ":10: not a KEY=value line: \"=1\"",
    };
    EXPECT_EQ(readContent("# diagnostics begin\n"
                          "LOG_LEVEL=high\n"
                          "TRACE_LEVEL=-1\n"
                          "LOG_SINK=console\n"
                          "TRACE_SINK=file:\n"
                          "\n"
                          "LOG_LEVELS=1\n"
                          "log_level=1\n"
                          "LOG_LEVEL 1\n"
                          "=1\n"
                          "DATA_DIR=/d\n"),
              expected);
}

TEST_F(PlatformSettingsTest, LevelsThatAreNoWholeNumberAreDiagnostics) {
    for (const std::string value : {"", "6000x", "0x10", "1.5", "+1", "2147483648", "1 2"}) {
        const PlatformSettings settings = readContent("LOG_LEVEL=" + value + "\n");
        EXPECT_EQ(settings.logLevel, 6000) << value;
        EXPECT_EQ(settings.diagnostics, Diagnostics{file_ + ":1: LOG_LEVEL=\"" + value +
                                                    "\": not a level (a number from 0)"});
    }
}

TEST_F(PlatformSettingsTest, EmptyDataDirIsADiagnostic) {
    const PlatformSettings settings = readContent("DATA_DIR=/d\nDATA_DIR=\n");
    EXPECT_EQ(settings.diagnostics,
              Diagnostics{file_ + ":2: DATA_DIR=\"\": not a directory (empty)"});
    EXPECT_NE(settings.dataDir, "/d/");
}

TEST_F(PlatformSettingsTest, UnusableValueGivesTheDefaultAndNotAnEarlierValue) {
    const PlatformSettings inFile = readContent(
        "LOG_LEVEL=1\nLOG_LEVEL=x\nTRACE_LEVEL=1\nTRACE_LEVEL=x\n"
        "LOG_SINK=none\nLOG_SINK=x\nTRACE_SINK=stderr\nTRACE_SINK=x\n");
    EXPECT_EQ(inFile.logLevel, 6000);
    EXPECT_EQ(inFile.traceLevel, 6000);
    EXPECT_EQ(inFile.logSink, "syslog");
    EXPECT_EQ(inFile.traceSink, "none");
    EXPECT_EQ(inFile.diagnostics.size(), 4U);

    variables_ = {{"ZR_LOG_LEVEL", "x"}};
    EXPECT_EQ(readContent("LOG_LEVEL=1\n").logLevel, 6000);
}

TEST_F(PlatformSettingsTest, UnusableVariablesAreDiagnosticsWithTheirName) {
    variables_ = {{"ZR_LOG_LEVEL", "x"}, {"ZR_TRACE_SINK", ""}, {"ZR_DATA_DIR", ""}};
    EXPECT_EQ(readContent("").diagnostics,
              (Diagnostics{"ZR_DATA_DIR=\"\": not a directory (empty)",
                           "ZR_LOG_LEVEL=\"x\": not a level (a number from 0)",
                           "ZR_TRACE_SINK=\"\": not a sink (none, stderr, syslog or file:PATH)"}));
}

TEST_F(PlatformSettingsTest, FileThatCannotBeReadIsADiagnostic) {
    variables_ = {{"ZR_CONFIG", directory_ / "missing"}};
    EXPECT_EQ(read().diagnostics, Diagnostics{directory_ / "missing: No such file or directory"});

    variables_["ZR_CONFIG"] = directory_.path().string();
    EXPECT_EQ(read().diagnostics, Diagnostics{directory_.path().string() + ": Is a directory"});

    ASSERT_EQ(::mkfifo(file_.c_str(), 0600), 0);
    variables_["ZR_CONFIG"] = file_;
    EXPECT_EQ(read().diagnostics, Diagnostics{file_ + ": Invalid argument"});
}

TEST_F(PlatformSettingsTest, FileThatCannotBeReadLeavesTheVariablesInForce) {
    variables_ = {{"ZR_CONFIG", directory_ / "missing"}, {"ZR_LOG_LEVEL", "1"}};
    EXPECT_EQ(read().logLevel, 1);
}

TEST_F(PlatformSettingsTest, EmptyNameOfTheFileIsADiagnostic) {
    variables_ = {{"ZR_CONFIG", ""}};
    EXPECT_EQ(read().diagnostics, Diagnostics{"ZR_CONFIG=\"\": not a file (empty)"});
}

TEST_F(PlatformSettingsTest, DataDirGetsItsEndSeparator) {
    EXPECT_EQ(readContent("DATA_DIR=/d").dataDir, "/d/");
    EXPECT_EQ(readContent("DATA_DIR=/d/").dataDir, "/d/");
    EXPECT_EQ(readContent("DATA_DIR=d//").dataDir, "d//");
    EXPECT_EQ(readContent("DATA_DIR=/").dataDir, "/");
}

/// With directories of the system replaced by empty ones.
class SystemSettingsTest : public testing::Test {
  protected:
    void SetUp() override {
        if (!Testing::canEnterNamespaces()) {
            GTEST_SKIP() << "needs a mount name space of its own";
        }
    }

    /// Runs a function where /etc and /var/lib are empty.
    template <typename Function>
    static std::string onBareMachine(const Function& function) {
        return inChild([&function] {
                   Testing::enterNamespaces(CLONE_NEWNS);
                   Testing::mountEmpty("/etc");
                   Testing::mountEmpty("/var/lib");
                   return function();
               })
            .output;
    }

    static PlatformSettings readWithoutVariables() {
        return PlatformSettings::read([](const char*) -> const char* { return nullptr; });
    }

    static std::string dataDirWith(const std::vector<std::string>& directories) {
        return onBareMachine([&directories] {
            for (const std::string& directory : directories) {
                std::filesystem::create_directories(directory);
            }
            return readWithoutVariables().dataDir;
        });
    }
};

constexpr const char* networkScripts = "/etc/sysconfig/network-scripts/";
constexpr const char* network = "/etc/sysconfig/network/";
constexpr const char* own = "/var/lib/dhcp-client-provider/";

TEST_F(SystemSettingsTest, DataDirIsOurOwnWhateverOtherDirectoriesThereAre) {
    // What lies in those is read by shells and network scripts.
    EXPECT_EQ(dataDirWith({networkScripts, network, own}), own);
    EXPECT_EQ(dataDirWith({networkScripts, network}), own);
    EXPECT_EQ(dataDirWith({}), own);
}

TEST_F(SystemSettingsTest, FileOfTheSystemIsReadWhenNoneIsNamed) {
    EXPECT_EQ(onBareMachine([] {
                  std::filesystem::create_directories("/etc/zr");
                  writeFile("/etc/zr/platform.conf", "LOG_LEVEL=17\n");
                  return std::to_string(readWithoutVariables().logLevel);
              }),
              "17");
}

TEST_F(SystemSettingsTest, FileOfTheSystemNeedNotExist) {
    EXPECT_EQ(
        onBareMachine([] { return std::to_string(readWithoutVariables().diagnostics.size()); }),
        "0");
}

TEST_F(SystemSettingsTest, FileOfTheSystemThatCannotBeReadIsADiagnostic) {
    EXPECT_EQ(onBareMachine([] {
                  std::filesystem::create_directories("/etc/zr/platform.conf");
                  return readWithoutVariables().diagnostics.at(0);
              }),
              "/etc/zr/platform.conf: Is a directory");
}

TEST_F(SystemSettingsTest, FileOfTheSystemIsNotReadWhenAnotherIsNamed) {
    EXPECT_EQ(onBareMachine([] {
                  std::filesystem::create_directories("/etc/zr");
                  writeFile("/etc/zr/platform.conf", "LOG_LEVEL=17\nTRACE_LEVEL=17\n");
                  writeFile("/etc/own.conf", "LOG_LEVEL=18\n");
                  const PlatformSettings settings =
                      PlatformSettings::read([](const char* name) -> const char* {
                          return std::string_view(name) == "ZR_CONFIG" ? "/etc/own.conf" : nullptr;
                      });
                  return std::to_string(settings.logLevel) + " " +
                         std::to_string(settings.traceLevel);
              }),
              "18 6000");
}

TEST(ProcessSettings, AreReadOnceFromTheEnvironment) {
    TemporaryDirectory directory;
    writeFile(directory / "conf", "LOG_LEVEL=17\n");
    const auto result = inChild([&directory] {
        ::setenv("ZR_CONFIG", (directory / "conf").c_str(), 1);
        ::setenv("ZR_DATA_DIR", "/first", 1);
        const std::string first = PlatformUtilities::getKestraDataDir();
        ::setenv("ZR_DATA_DIR", "/second", 1);
        return first + " " + PlatformUtilities::getKestraDataDir() + " " +
               std::to_string(PlatformSettings::process().logLevel);
    });
    EXPECT_EQ(result.output, "/first/ /first/ 17");
}

}  // namespace

}  // namespace ZR
