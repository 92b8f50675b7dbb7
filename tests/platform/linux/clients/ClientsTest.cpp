#include "clients/Clients.h"

#include <gtest/gtest.h>

#include <set>

#include "LinuxSupport.h"
#include "clients/Processes.h"

namespace ZR::Live {
namespace {

TEST(ClientSources, ProcessesAreReadFirst) {
    ASSERT_FALSE(clientSources().empty());
    EXPECT_EQ(clientSources().front().read, &readProcesses);
}

TEST(ClientSources, EachPlaceIsAnAbsoluteDirectoryAndStandsOnce) {
    std::set<std::pair<std::string_view, std::string_view>> places;
    for (const ClientSource& source : clientSources()) {
        for (const ClientPlace& place : source.places) {
            EXPECT_TRUE(place.directory.starts_with('/')) << place.directory;
            EXPECT_FALSE(place.directory.ends_with('/')) << place.directory;
            EXPECT_TRUE(places.emplace(place.directory, place.namePrefix).second)
                << place.directory;
        }
    }
    EXPECT_FALSE(places.empty());
}

TEST(ClientSources, OnAnEmptyMachineTheyFindNothing) {
    const TemporaryDirectory root;
    std::filesystem::create_directories(root.path("/proc/thread-self/ns"));
    ClientFacts facts;
    for (const ClientSource& source : clientSources()) {
        source.read({.files = root.path(), .proc = root.path("/proc")}, facts);
    }
    EXPECT_EQ(facts, ClientFacts{});
}

}  // namespace
}  // namespace ZR::Live
