#pragma once

#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "sources/JsonTree.h"
#include "tklogger/TKLogger.h"
#include "zrclient/InstrumentationService.h"
#include "zrclient/Snapshot.h"
#include "zrclient/SnapshotSource.h"

namespace ZR::Testing {

/// A directory of one test's own.
class Directory {
  public:
    Directory() {
        std::string name = (std::filesystem::temp_directory_path() / "zrclient-XXXXXX").string();
        if (::mkdtemp(name.data()) == nullptr) {
            throw std::runtime_error("no temporary directory");
        }
        path_ = name;
    }
    Directory(const Directory&) = delete;
    Directory& operator=(const Directory&) = delete;
    ~Directory() {
        std::error_code ignored;  // a left-over directory is no reason to fail
        std::filesystem::remove_all(path_, ignored);
    }

    [[nodiscard]] std::string operator/(const std::string& name) const {
        return (path_ / name).string();
    }

  private:
    std::filesystem::path path_;
};

inline void writeInPlace(const std::string& path, const std::string& text) {
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    file << text;
    file.close();
    ASSERT_TRUE(file) << path;
}

inline void renameOver(const std::string& path, const std::string& text) {
    writeInPlace(path + ".new", text);
    std::filesystem::rename(path + ".new", path);
}

/// Sends the log to a file for the length of a test.
class LogFile {
  public:
    LogFile() { TKLog::TKLogger::configure({6000, "file:" + path_}, {0, "none"}); }
    LogFile(const LogFile&) = delete;
    LogFile& operator=(const LogFile&) = delete;
    ~LogFile() { TKLog::TKLogger::configure({6000, "stderr"}, {0, "none"}); }

    [[nodiscard]] std::vector<std::string> lines() const {
        std::vector<std::string> lines;
        std::ifstream file(path_);
        for (std::string line; std::getline(file, line);) {
            lines.push_back(line);
        }
        return lines;
    }

  private:
    Directory directory_;
    std::string path_ = directory_ / "log";
};

/// Stands in for a source where a test must hold its strings: which snapshot is
/// the present one, and when it changes. The real sources have their own tests.
class HandSource : public SnapshotSource {
  public:
    struct State {
        std::shared_ptr<const Snapshot> snapshot = SnapshotBuilder().build();
        std::atomic<bool> changed{true};
        std::atomic<int> polls{0};
        std::atomic<int> readings{0};
    };

    explicit HandSource(std::shared_ptr<State> state) : state_(std::move(state)) {}

    bool changed() override {
        ++state_->polls;
        return state_->changed;
    }
    std::shared_ptr<const Snapshot> read() override {
        ++state_->readings;
        state_->changed = false;
        return state_->snapshot;
    }

  private:
    std::shared_ptr<State> state_;
};

/// The snapshot of a JSON tree that is known to be good.
inline std::shared_ptr<const Snapshot> parsed(const std::string& text) {
    JsonTree tree = parseJsonTree(text, "testhost");
    if (const auto* fault = std::get_if<JsonTreeFault>(&tree)) {
        throw std::runtime_error(std::to_string(fault->line) + ":" + std::to_string(fault->column) +
                                 ": " + fault->reason);
    }
    return std::get<std::shared_ptr<const Snapshot>>(tree);
}

/// Lets the process' service, on which cursors stand, show JSON trees.
class TreeTest : public testing::Test {
  protected:
    void SetUp() override {
        InstrumentationService::process().useSource(std::make_unique<HandSource>(state_));
    }

    void show(const std::string& text) {
        state_->snapshot = parsed(text);
        state_->changed = true;
    }

    std::shared_ptr<HandSource::State> state_ = std::make_shared<HandSource::State>();
};

}  // namespace ZR::Testing
