#include "sources/JsonTreeSource.h"

#include <gmock/gmock.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include "kit/Diagnostics.h"
#include "kit/HostNameFake.h"
#include "kit/LogCapture.h"
#include "kit/ZrclientSupport.h"
#include "zrclient/Instrumentation.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/SystemName.h"

namespace ZR::Testing {
namespace {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;

std::string computer(const std::string& description) {
    return R"({"nodes": [{"type": "ComputerSystem", "description": ")" + description + "\"}]}\n";
}

/// What a request sees that begins now: the process' service on a file.
class JsonTreeSourceTest : public testing::Test {
  protected:
    void use(const std::string& path) {
        InstrumentationService::process().useSource(std::make_unique<JsonTreeSource>(path));
    }

    void TearDown() override {
        InstrumentationService::process().useSource(
            std::make_unique<HandSource>(std::make_shared<HandSource::State>()));
    }

    static std::string shown() {
        Instrumentation cursor;
        if (!cursor.selectNode(NodeType::ComputerSystem)) {
            return "nothing";
        }
        std::string description;
        EXPECT_TRUE(cursor.getNodeDescription(description));
        return description;
    }

    static std::uint64_t readings() { return InstrumentationService::process().readings(); }

    const LogCapture log_{LogLevel::failure};
    const TemporaryDirectory directory_;
    const std::string path_ = directory_ / "tree.json";
};

TEST_F(JsonTreeSourceTest, ShowsTheFile) {
    writeFile(path_, computer("Computer"));
    use(path_);
    EXPECT_EQ(shown(), "Computer");
    EXPECT_THAT(log_.logMessages(), IsEmpty());
}

TEST_F(JsonTreeSourceTest, PutsInTheNameOfThisHost) {
    ASSERT_FALSE(getSystemName().empty());
    writeFile(path_, computer("at ${HOSTNAME}"));
    use(path_);
    EXPECT_EQ(shown(), "at " + getSystemName());
}

TEST_F(JsonTreeSourceTest, AMachineThatDoesNotTellItsNameKeepsItsNodes) {
    writeFile(path_, R"({"nodes": [{"type": "ComputerSystem", "description": "Computer",
        "properties": {"Name": "${HOSTNAME}"}, "children": [
        {"type": "NetworkInterface", "properties": {"Name": "eth0"}}]}]})");
    use(path_);
    Instrumentation cursor;
    std::string name = "as it was";
    {
        const HostNameFails failing;
        errno = EPERM;
        ASSERT_TRUE(cursor.selectNode(NodeType::ComputerSystem));
        EXPECT_FALSE(cursor.getProperty(Properties::Name, name));
        EXPECT_EQ(name, "as it was");
        bool readOnly = true;
        EXPECT_TRUE(cursor.isPropertyReadOnly(Properties::Name, readOnly)) << "it is there";
        ASSERT_TRUE(cursor.selectNode(NodeType::NetworkInterface));
        EXPECT_TRUE(cursor.getProperty(Properties::Name, name));
        EXPECT_EQ(name, "eth0");
        const std::uint64_t before = readings();
        EXPECT_EQ(shown(), "Computer");
        EXPECT_EQ(readings(), before) << "a file that did not change is not read again";
    }
    ASSERT_TRUE(cursor.selectNode(NodeType::ComputerSystem));
    EXPECT_TRUE(cursor.getProperty(Properties::Name, name)) << "told by now";
    EXPECT_EQ(name, getSystemName());
    const std::uint64_t before = readings();
    EXPECT_EQ(shown(), "Computer");
    EXPECT_EQ(readings(), before);
    EXPECT_THAT(log_.logMessages(),
                ElementsAre(EndsWith("the system does not tell its name: Bad address")));
}

TEST_F(JsonTreeSourceTest, ARelativePathStaysWhereItWas) {
    const auto before = std::filesystem::current_path();
    std::filesystem::current_path(directory_ / ".");
    use("tree.json");
    std::filesystem::current_path(before);
    EXPECT_EQ(shown(), "nothing");
    writeFile(path_, computer("Computer"));
    EXPECT_EQ(shown(), "Computer");
}

TEST_F(JsonTreeSourceTest, ReadsAnUnchangedFileOnce) {
    writeFile(path_, computer("Computer"));
    use(path_);
    EXPECT_EQ(shown(), "Computer");
    const std::uint64_t before = readings();
    for (int round = 0; round < 1000; ++round) {
        ASSERT_EQ(shown(), "Computer");
    }
    EXPECT_EQ(readings(), before);
}

TEST_F(JsonTreeSourceTest, TheVeryNextRequestSeesARewrittenFile) {
    writeFile(path_, computer("v0"));
    use(path_);
    EXPECT_EQ(shown(), "v0");
    for (int version = 1; version <= 100; ++version) {
        const std::string name = "v" + std::to_string(version);
        writeFile(path_, computer(name));
        ASSERT_EQ(shown(), name);
    }
}

TEST_F(JsonTreeSourceTest, TheVeryNextRequestSeesAReplacedFile) {
    writeFile(path_, computer("v0"));
    use(path_);
    EXPECT_EQ(shown(), "v0");
    for (int version = 1; version <= 100; ++version) {
        const std::string name = "v" + std::to_string(version);
        renameOver(path_, computer(name));
        ASSERT_EQ(shown(), name);
    }
}

TEST_F(JsonTreeSourceTest, TheVeryNextRequestSeesAFileGoAndComeBack) {
    writeFile(path_, computer("Computer"));
    use(path_);
    EXPECT_EQ(shown(), "Computer");
    ASSERT_TRUE(std::filesystem::remove(path_));
    EXPECT_EQ(shown(), "nothing");
    EXPECT_EQ(shown(), "nothing");
    EXPECT_THAT(log_.logMessages(), SizeIs(1)) << "one line per reading, not per request";
    writeFile(path_, computer("again"));
    EXPECT_EQ(shown(), "again");
    std::filesystem::rename(path_, path_ + ".away");
    EXPECT_EQ(shown(), "nothing");
    std::filesystem::rename(path_ + ".away", path_);
    EXPECT_EQ(shown(), "again");
}

TEST_F(JsonTreeSourceTest, TheVeryNextRequestSeesAFileAppearInANewDirectory) {
    use(directory_ / "not/yet/tree.json");
    EXPECT_EQ(shown(), "nothing");
    const std::uint64_t before = readings();
    EXPECT_EQ(shown(), "nothing");
    EXPECT_EQ(readings(), before) << "the missing directory is watched for, not looked for";
    std::filesystem::create_directories(directory_ / "not/yet");
    EXPECT_EQ(shown(), "nothing");
    writeFile(directory_ / "not/yet/tree.json", computer("here"));
    EXPECT_EQ(shown(), "here");
}

TEST_F(JsonTreeSourceTest, ATornFileIsReadAgainWhenItIsWhole) {
    const std::string whole = computer("Computer");
    std::ofstream file(path_, std::ios::binary);
    file << whole.substr(0, 20) << std::flush;
    use(path_);
    EXPECT_EQ(shown(), "nothing");
    file << whole.substr(20) << std::flush;
    EXPECT_EQ(shown(), "Computer") << "though the writer has not closed it";
}

TEST_F(JsonTreeSourceTest, AFileThatCannotBeReadIsLoggedOnce) {
    use(path_);
    EXPECT_EQ(shown(), "nothing");
    EXPECT_EQ(shown(), "nothing");
    const auto lines = log_.log();
    ASSERT_THAT(lines, SizeIs(1));
    EXPECT_EQ(lines[0].level, 6000);
    EXPECT_EQ(lines[0].category, "ZR.Instrumentation");
    EXPECT_EQ(lines[0].message, path_ + ": No such file or directory");
}

TEST_F(JsonTreeSourceTest, AFaultIsLoggedOnceWithItsPlace) {
    writeFile(path_, "{\"nodes\": [\n  {\"type\": 40}]}");
    use(path_);
    EXPECT_EQ(shown(), "nothing");
    EXPECT_EQ(shown(), "nothing");
    const auto lines = log_.log();
    ASSERT_THAT(lines, SizeIs(1));
    EXPECT_EQ(lines[0].level, 6000);
    EXPECT_EQ(lines[0].category, "ZR.Instrumentation");
    EXPECT_EQ(lines[0].message, path_ + ":2:12: \"type\" must be a text");
    // Another reading is another line.
    writeFile(path_, "{}");
    EXPECT_EQ(shown(), "nothing");
    EXPECT_THAT(log_.logMessages(),
                ElementsAre(lines[0].message, EndsWith(path_ + ":1:1: \"nodes\" is missing")));
}

TEST_F(JsonTreeSourceTest, ASnapshotTellsWhyItsFileCannotBeUsed) {
    JsonTreeSource source(path_, "my tree");
    EXPECT_THAT(textsOf(source.read()->diagnostics()),
                ElementsAre("my tree: No such file or directory"));
    writeFile(path_, "{\"nodes\": [\n  {\"type\": 40}]}");
    EXPECT_THAT(textsOf(source.read()->diagnostics()),
                ElementsAre("my tree:2:12: \"type\" must be a text"));
    EXPECT_THAT(log_.logMessages(), ElementsAre(EndsWith(path_ + ": No such file or directory"),
                                                EndsWith(path_ + ":2:12: \"type\" must be a text")))
        << "the log has the file's own name";
}

TEST_F(JsonTreeSourceTest, ASnapshotTellsOfSlipsInItsFileAndTheLogDoesNot) {
    writeFile(path_, R"({"nodes": [{"type": "NetworkInterfaces"}]})");
    JsonTreeSource source(path_);
    const auto snapshot = source.read();
    EXPECT_THAT(snapshot->nodes(), SizeIs(1));
    EXPECT_THAT(textsOf(snapshot->diagnostics()),
                ElementsAre(HasSubstr(path_ + ":1:21: the type ")));
    EXPECT_THAT(log_.logMessages(), IsEmpty());
}

TEST_F(JsonTreeSourceTest, ADirectoryOrPipeInPlaceOfTheFileIsUnreadable) {
    ASSERT_TRUE(std::filesystem::create_directory(path_));
    use(path_);
    EXPECT_EQ(shown(), "nothing");
    ASSERT_TRUE(std::filesystem::remove(path_));
    ASSERT_EQ(::mkfifo(path_.c_str(), 0600), 0);
    EXPECT_EQ(shown(), "nothing") << "and no writer is waited for";
    EXPECT_THAT(log_.logMessages(), SizeIs(2));
}

TEST_F(JsonTreeSourceTest, ATooLargeFileIsNotRead) {
    writeFile(path_, computer("Computer"));
    std::filesystem::resize_file(path_, (std::uintmax_t{10} << 20U) + 1);
    use(path_);
    EXPECT_EQ(shown(), "nothing");
    EXPECT_THAT(log_.logMessages(), ElementsAre(HasSubstr("File too large")));
}

/// The limit of descriptors, lowered so that none is left, for a while.
class NoDescriptors {
  public:
    NoDescriptors() {
        ::getrlimit(RLIMIT_NOFILE, &before_);
        rlimit none = before_;
        none.rlim_cur = 0;
        ::setrlimit(RLIMIT_NOFILE, &none);
    }
    NoDescriptors(const NoDescriptors&) = delete;
    NoDescriptors& operator=(const NoDescriptors&) = delete;
    ~NoDescriptors() { ::setrlimit(RLIMIT_NOFILE, &before_); }

  private:
    rlimit before_{};
};

TEST_F(JsonTreeSourceTest, WithoutAWatchEveryRequestReadsTheFile) {
    writeFile(path_, computer("Computer"));
    JsonTreeSource source(path_);
    {
        const NoDescriptors none;
        EXPECT_TRUE(source.read()->nodes().empty());
        EXPECT_TRUE(source.changed());
        EXPECT_TRUE(source.read()->nodes().empty());
        EXPECT_TRUE(source.changed());
    }
    EXPECT_EQ(source.read()->nodes().size(), 1U);
    EXPECT_FALSE(source.changed()) << "watched again as soon as it can be";
}

TEST_F(JsonTreeSourceTest, ALackOfDescriptorsIsOverByItself) {
    writeFile(path_, "{}");
    JsonTreeSource source(path_);
    EXPECT_TRUE(source.read()->nodes().empty());
    ASSERT_THAT(log_.logMessages(), SizeIs(1)) << "and the log has its descriptor";
    writeFile(path_, computer("Computer"));
    {
        const NoDescriptors none;
        for (int round = 0; round < 5; ++round) {
            EXPECT_TRUE(source.changed());
            EXPECT_TRUE(source.read()->nodes().empty());
        }
    }
    EXPECT_TRUE(source.changed());
    EXPECT_EQ(source.read()->nodes().size(), 1U);
    EXPECT_FALSE(source.changed());
    EXPECT_THAT(log_.logMessages(),
                ElementsAre(HasSubstr("is missing"), EndsWith("Too many open files")))
        << "one line for all five";
}

}  // namespace
}  // namespace ZR::Testing
