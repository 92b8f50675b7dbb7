#include "StateReaders.h"

#include <gtest/gtest.h>

#include <set>

#include "LinuxSupport.h"
#include "clients/Processes.h"

namespace ZR::Live {
namespace {

TEST(StateReaders, ProcessesAreReadFirst) {
    ASSERT_FALSE(stateReaders().empty());
    EXPECT_EQ(stateReaders().front().read, &readProcesses);
}

TEST(StateReaders, EachPlaceIsAnAbsoluteDirectoryAndStandsOnce) {
    std::set<std::pair<std::string_view, std::string_view>> places;
    for (const StateReader& reader : stateReaders()) {
        for (const StatePlace& place : reader.places) {
            EXPECT_TRUE(place.directory.starts_with('/')) << place.directory;
            EXPECT_FALSE(place.directory.ends_with('/')) << place.directory;
            EXPECT_TRUE(places.emplace(place.directory, place.namePrefix).second)
                << place.directory;
        }
    }
    EXPECT_FALSE(places.empty());
}

TEST(StateReaders, OnAnEmptyMachineTheyFindNothing) {
    const TemporaryDirectory root;
    std::filesystem::create_directories(root.path("/proc/thread-self/ns"));
    ClientFacts facts;
    for (const StateReader& reader : stateReaders()) {
        reader.read({.files = root.path(), .proc = root.path("/proc")}, facts);
    }
    EXPECT_EQ(facts, ClientFacts{});
}

}  // namespace
}  // namespace ZR::Live
