#include "kit/Tree.h"

#include <unistd.h>

#include <array>
#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "kit/Files.h"

namespace test {

namespace {

struct Places {
    ZR::Testing::TemporaryDirectory directory;
    std::string tree = directory / "tree.json";
    std::string data = directory.path().string() + "/data/";

    Places() {
        std::filesystem::create_directory(data);
        ::setenv("ZR_INSTRUMENTATION_TREE", tree.c_str(), 1);
        ::setenv("ZR_DATA_DIR", data.c_str(), 1);
        ::setenv("ZR_LOG_SINK", "none", 0);
    }
};

Places& places() {
    static Places instance;
    return instance;
}

// Before main, and so before the settings are read.
[[maybe_unused]] const Places& prepared = places();

}  // namespace

void TreeTest::setTree(const std::vector<Json>& nodes) {
    const std::string next = places().tree + ".next";
    std::ofstream(next) << Json{{"nodes", nodes}}.dump();
    std::filesystem::rename(next, places().tree);
    // Selecting by type is what looks for changes.
    std::filesystem::remove_all(places().data);
    std::filesystem::create_directory(places().data);
}

const std::string& TreeTest::dataDirectory() {
    return places().data;
}

std::string TreeTest::hostName() {
    std::array<char, 256> name{};
    EXPECT_EQ(::gethostname(name.data(), name.size()), 0);
    return name.data();
}

}  // namespace test
