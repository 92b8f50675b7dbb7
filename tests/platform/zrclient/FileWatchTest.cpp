#include "sources/FileWatch.h"

#include <array>

#include "kit/ZrclientSupport.h"

namespace ZR::Testing {
namespace {

namespace fs = std::filesystem;

class FileWatchTest : public testing::Test {
  protected:
    /// Whether the watch tells of what was done since it was asked last.
    static bool noticed(FileWatch& watch) {
        const bool changed = watch.changed();
        EXPECT_FALSE(watch.isBlind());
        watch.subscribe();
        EXPECT_FALSE(watch.changed());
        return changed;
    }

    const TemporaryDirectory directory_;
    const std::string path_ = directory_ / "file";
};

TEST_F(FileWatchTest, SaysChangedBeforeItWatches) {
    FileWatch watch(path_);
    EXPECT_TRUE(watch.changed());
    EXPECT_TRUE(watch.changed());
    watch.subscribe();
    EXPECT_FALSE(watch.changed());
}

TEST_F(FileWatchTest, GoesOnSayingChangedUntilSubscribedAgain) {
    FileWatch watch(path_);
    watch.subscribe();
    writeFile(path_, "x");
    EXPECT_TRUE(watch.changed());
    EXPECT_TRUE(watch.changed());
    watch.subscribe();
    EXPECT_FALSE(watch.changed());
}

TEST_F(FileWatchTest, NoticesWhatHappensToTheFile) {
    FileWatch watch(path_);
    watch.subscribe();
    writeFile(path_, "created");
    EXPECT_TRUE(noticed(watch));
    writeFile(path_, "rewritten");
    EXPECT_TRUE(noticed(watch));
    renameOver(path_, "replaced");
    EXPECT_TRUE(noticed(watch));
    fs::permissions(path_, fs::perms::none);
    EXPECT_TRUE(noticed(watch));
    fs::permissions(path_, fs::perms::owner_all);
    EXPECT_TRUE(noticed(watch));
    fs::resize_file(path_, 1);
    EXPECT_TRUE(noticed(watch));
    fs::rename(path_, path_ + ".away");
    EXPECT_TRUE(noticed(watch));
    fs::create_hard_link(path_ + ".away", path_);
    EXPECT_TRUE(noticed(watch));
    fs::remove(path_);
    EXPECT_TRUE(noticed(watch));
}

TEST_F(FileWatchTest, DoesNotMindReadersAndNeighbours) {
    writeFile(path_, "x");
    FileWatch watch(path_);
    watch.subscribe();
    std::string content;
    std::ifstream(path_) >> content;
    EXPECT_EQ(content, "x");
    writeFile(path_ + "2", "a neighbour");
    writeFile(directory_ / "fil", "another");
    fs::remove(path_ + "2");
    EXPECT_FALSE(watch.changed());
}

TEST_F(FileWatchTest, FollowsTheDirectoriesOnItsPath) {
    fs::create_directories(directory_ / "a/b");
    FileWatch watch(directory_ / "a/b/file");
    watch.subscribe();
    writeFile(directory_ / "a/b/file", "x");
    EXPECT_TRUE(noticed(watch));
    fs::rename(directory_ / "a", directory_ / "c");
    EXPECT_TRUE(noticed(watch));
    writeFile(directory_ / "c/b/file", "no longer ours");
    EXPECT_FALSE(watch.changed());
    fs::create_directories(directory_ / "a/b");
    EXPECT_TRUE(noticed(watch));
    writeFile(directory_ / "a/b/file", "y");
    EXPECT_TRUE(noticed(watch));
    fs::remove_all(directory_ / "a");
    EXPECT_TRUE(noticed(watch));
}

TEST_F(FileWatchTest, FollowsSymbolicLinks) {
    fs::create_directories(directory_ / "releases/1");
    fs::create_directories(directory_ / "releases/2");
    fs::create_symlink("releases/1", directory_ / "current");
    fs::create_symlink(directory_ / "current/real", path_);
    writeFile(directory_ / "releases/1/real", "1");
    FileWatch watch(path_);
    watch.subscribe();
    writeFile(directory_ / "releases/1/real", "1 again");
    EXPECT_TRUE(noticed(watch));
    fs::create_symlink("releases/2", directory_ / "next");
    fs::rename(directory_ / "next", directory_ / "current");
    EXPECT_TRUE(noticed(watch));
    writeFile(directory_ / "releases/1/real", "no longer ours");
    EXPECT_FALSE(watch.changed());
    writeFile(directory_ / "releases/2/real", "2");
    EXPECT_TRUE(noticed(watch));
}

TEST_F(FileWatchTest, ACircleOfLinksIsWatchedUntilItIsBroken) {
    fs::create_symlink(directory_ / "other", path_);
    fs::create_symlink(path_, directory_ / "other");
    FileWatch watch(path_);
    watch.subscribe();
    EXPECT_FALSE(watch.changed());
    renameOver(directory_ / "other", "x");
    EXPECT_TRUE(noticed(watch));
    writeFile(path_, "y");
    EXPECT_TRUE(noticed(watch));
}

TEST_F(FileWatchTest, AFileInPlaceOfADirectoryIsWatchedUntilItGoes) {
    writeFile(path_, "no directory");
    FileWatch watch(path_ + "/below");
    watch.subscribe();
    EXPECT_FALSE(watch.changed());
    fs::remove(path_);
    EXPECT_TRUE(noticed(watch));
    fs::create_directory(path_);
    EXPECT_TRUE(noticed(watch));
}

TEST_F(FileWatchTest, ARelativePathStaysWhereItWas) {
    const fs::path before = fs::current_path();
    fs::current_path(directory_ / ".");
    FileWatch watch("./x/..//file");
    fs::current_path(before);
    fs::create_directory(directory_ / "x");
    watch.subscribe();
    writeFile(path_, "x");
    EXPECT_TRUE(noticed(watch));
}

TEST_F(FileWatchTest, AFloodOfEventsCountsAsAChange) {
    writeFile(path_, "x");
    FileWatch watch(path_);
    watch.subscribe();
    // More than the kernel keeps for one watcher; about two neighbours in turn,
    // as equal events in a row are merged.
    std::size_t limit = 0;
    std::ifstream("/proc/sys/fs/inotify/max_queued_events") >> limit;
    ASSERT_GT(limit, 0U);
    std::array<std::ofstream, 2> neighbours{std::ofstream(path_ + "2"), std::ofstream(path_ + "3")};
    for (std::size_t count = 0; count < limit + 10; ++count) {
        neighbours.at(count % 2) << 'x' << std::flush;
    }
    EXPECT_TRUE(noticed(watch));
}

}  // namespace
}  // namespace ZR::Testing
