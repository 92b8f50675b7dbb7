#include "arguments/OptionRules.h"

#include <gtest/gtest.h>

#include "arguments/CommandLine.h"
#include "kit/Refusal.h"
#include "text/Failure.h"

namespace cimdhcp {
namespace {

CommandLine line(const std::vector<std::string>& arguments) {
    return std::get<CommandLine>(readCommandLine(arguments));
}

std::string refusal(const std::vector<std::string>& arguments) {
    return test::refusalOf([&arguments] { return readCommandLine(arguments); }, ExitStatus::usage);
}

TEST(OptionRules, NamesServers) {
    Options options;
    options.connect = {"a", "https://b"};
    options.hosts = "-";
    options.parallel = 256;
    options.timeout = std::chrono::seconds(5);
    options.credentials = "c";
    options.caCertificate = "ca";
    options.insecure = true;
    EXPECT_EQ(
        line({"--connect", "a", "show", "--connect", "https://b", "--hosts", "-", "--parallel",
              "256", "--timeout", "5", "--credentials", "c", "--cacert", "ca", "--insecure"}),
        (CommandLine{options, ShowCommand{}}));
    EXPECT_TRUE(options.remote());
    EXPECT_FALSE(Options{}.remote());
}

TEST(OptionRules, SaysHowToWatch) {
    WatchCommand watch;
    EXPECT_EQ(line({"watch"}).command, Command(watch));
    watch.interfaces = {"eth0", "eth1"};
    watch.poll = std::chrono::seconds(5);
    EXPECT_EQ(line({"watch", "eth0", "--poll", "5", "eth1"}).command, Command(watch));
    watch = {};
    watch.listen = "192.0.2.9";
    EXPECT_EQ(line({"--connect", "h", "watch", "--listen", "192.0.2.9"}).command, Command(watch));
    EXPECT_EQ(line({"profiles"}).command, Command(ProfilesCommand{}));
    for (const char* option :
         {"--poll=0", "--poll=86401", "--poll=x", "--sort=STATE", "--count", "--format=mof"}) {
        EXPECT_NE(refusal({"watch", option}), "accepted") << option;
    }
    const std::string forServers =
        "--listen is for servers that tell of changes: with --connect or --hosts, and without "
        "--poll";
    EXPECT_EQ(refusal({"watch", "--listen", "::1"}), forServers);
    EXPECT_EQ(refusal({"--connect", "h", "watch", "--poll", "1", "--listen", "::1"}), forServers);
    EXPECT_NE(refusal({"profiles", "--format", "mof"}), "accepted");
    EXPECT_EQ(line({"profiles", "--sort", "version"}).options.sort, "version");
}

TEST(OptionRules, AnAddressInBracketsKeepsThem) {
    const std::vector<std::string> servers{"[::1]", "[::1]:5988", "[a,b]"};
    EXPECT_EQ(line({"--connect", "[::1]", "--connect=[::1]:5988", "--connect=[a,b]", "show"})
                  .options.connect,
              servers);
}

TEST(OptionRules, SaysHowTheResultIsShown) {
    Options options;
    options.noHeader = true;
    options.sort = "STATE";
    options.count = true;
    options.time = true;
    options.color = ColorMode::always;
    EXPECT_EQ(
        line({"show", "--no-header", "--sort", "STATE", "--count", "--time", "--color", "always"}),
        (CommandLine{options, ShowCommand{}}));
    EXPECT_EQ(line({"show", "--color=never"}).options.color, ColorMode::never);
    EXPECT_EQ(line({"show", "--color=auto"}).options.color, ColorMode::automatic);
}

TEST(OptionRules, RefusesWhatServersCannotBeAsked) {
    for (const std::vector<std::string>& command :
         {std::vector<std::string>{"tree"}, {"serve"}, {"user", "add", "--users", "f", "a"}}) {
        std::vector<std::string> arguments{"--connect", "h"};
        arguments.insert(arguments.end(), command.begin(), command.end());
        EXPECT_EQ(refusal(arguments),
                  "this command is about this machine alone; --connect and --hosts are not for it");
    }
    EXPECT_EQ(line({"--connect", "h", "check"}).command, Command(CheckCommand{}));
    EXPECT_EQ(refusal({"--connect", "h", "rename", "--create", "eth0", "x"}),
              "--create cannot make files on other machines");
    EXPECT_EQ(refusal({"--hosts", "f", "--tree", "t", "show"}),
              "--tree and --data-dir are about this machine; they cannot be given with --connect "
              "or --hosts");
    for (const char* option : {"--credentials=c", "--cacert=c", "--insecure"}) {
        EXPECT_NE(refusal({option, "show"}), "accepted");
    }
    for (const char* option : {"--parallel=0", "--parallel=257", "--timeout=0", "--timeout=-1",
                               "--timeout=x", "--timeout=86401", "--color=red"}) {
        EXPECT_NE(refusal({"--connect", "h", option, "show"}), "accepted") << option;
    }
}

TEST(OptionRules, RefusesToSortAndCountWhatIsNoList) {
    EXPECT_EQ(refusal({"graph", "--count"}),
              "the result of this command is not a list: there is nothing to count");
    EXPECT_EQ(refusal({"rename", "a", "b", "--sort", "x"}),
              "the result of this command is not a list: there is nothing to sort");
    EXPECT_NE(refusal({"get", "P", "--count"}), "accepted");
    EXPECT_NE(refusal({"serve", "--count"}), "accepted");
}

}  // namespace
}  // namespace cimdhcp
