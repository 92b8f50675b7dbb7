#pragma once

#include <gtest/gtest.h>

#include <atomic>
#include <filesystem>
#include <memory>
#include <stdexcept>
#include <string>
#include <utility>

#include "kit/Files.h"
#include "sources/JsonTree.h"
#include "zrclient/InstrumentationService.h"
#include "zrclient/Snapshot.h"
#include "zrclient/SnapshotSource.h"

namespace ZR::Testing {

/// Replaces a file as a careful author does.
inline void renameOver(const std::string& path, const std::string& text) {
    writeFile(path + ".new", text);
    std::filesystem::rename(path + ".new", path);
}

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
class SnapshotTreeTest : public testing::Test {
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
