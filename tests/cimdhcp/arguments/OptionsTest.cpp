// What options say, which of them go together, and what is told of them.
#include <gtest/gtest.h>
#include <CLI/CLI.hpp>

#include <algorithm>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "arguments/CommandLine.h"
#include "arguments/OptionGroups.h"
#include "client/InterfaceState.h"
#include "kit/Files.h"
#include "kit/Refusal.h"
#include "text/Failure.h"

namespace cimdhcp {
namespace {

using Meanings = std::vector<std::pair<std::string, std::string>>;

CommandLine line(const std::vector<std::string>& arguments) {
    return std::get<CommandLine>(readCommandLine(arguments));
}

std::string lineRefusal(const std::vector<std::string>& arguments) {
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
        EXPECT_NE(lineRefusal({"watch", option}), "accepted") << option;
    }
    const std::string forServers =
        "--listen is for servers that tell of changes: with --connect or --hosts, and without "
        "--poll";
    EXPECT_EQ(lineRefusal({"watch", "--listen", "::1"}), forServers);
    EXPECT_EQ(lineRefusal({"--connect", "h", "watch", "--poll", "1", "--listen", "::1"}),
              forServers);
    EXPECT_NE(lineRefusal({"profiles", "--format", "mof"}), "accepted");
    EXPECT_EQ(line({"profiles", "--sort", "version"}).options.sort, "version");
}

TEST(OptionRules, SaysWhereMetricsAre) {
    const auto metrics = [](const std::vector<std::string>& arguments) {
        return std::get<ServeCommand>(line(arguments).command).metrics;
    };
    EXPECT_EQ(metrics({"serve"}), std::nullopt);
    EXPECT_EQ(metrics({"serve", "--metrics"}), "");
    EXPECT_EQ(metrics({"serve", "--metrics", "--read-only"}), "");
    EXPECT_EQ(metrics({"serve", "--metrics", "[::1]:9", "--read-only"}), "[::1]:9");
    EXPECT_EQ(metrics({"serve", "--metrics=[::1]"}), "[::1]");
    EXPECT_EQ(line({"metrics"}).command, Command(MetricsCommand{}));
    EXPECT_EQ(line({"--connect", "h", "metrics", "--output", "f"}).command,
              Command(MetricsCommand{"f"}));
    for (const char* option : {"--count", "--sort=STATE", "--format=json", "--format=mof"}) {
        EXPECT_NE(lineRefusal({"metrics", option}), "accepted") << option;
    }
    ExporterCommand exporter;
    exporter.config = "c";
    exporter.server.listen = "[::1]:9";
    exporter.check = true;
    EXPECT_EQ(line({"exporter", "--check", "--config", "c", "--listen", "[::1]:9"}).command,
              Command(exporter));
    EXPECT_NE(lineRefusal({"exporter"}), "accepted");
    EXPECT_NE(lineRefusal({"exporter", "--config", "c", "--connect", "h"}), "accepted");
}

TEST(OptionRules, AnAddressInBracketsKeepsThem) {
    const std::vector<std::string> servers{"[::1]", "[::1]:5988", "[a,b]"};
    EXPECT_EQ(line({"--connect", "[::1]", "--connect=[::1]:5988", "--connect=[a,b]", "show"})
                  .options.connect,
              servers);
}

TEST(OptionRules, SaysHowTheResultIsShown) {
    Options options;
    options.table.noHeader = true;
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
        EXPECT_EQ(lineRefusal(arguments),
                  "this command is about this machine alone; --connect and --hosts are not for it");
    }
    EXPECT_EQ(line({"--connect", "h", "check"}).command, Command(CheckCommand{}));
    EXPECT_EQ(lineRefusal({"--connect", "h", "rename", "--create", "eth0", "x"}),
              "--create cannot make files on other machines");
    EXPECT_EQ(lineRefusal({"--hosts", "f", "--tree", "t", "show"}),
              "--tree and --data-dir are about this machine; they cannot be given with --connect "
              "or --hosts");
    for (const char* option : {"--credentials=c", "--cacert=c", "--insecure"}) {
        EXPECT_NE(lineRefusal({option, "show"}), "accepted");
    }
    for (const char* option : {"--parallel=0", "--parallel=257", "--timeout=0", "--timeout=-1",
                               "--timeout=x", "--timeout=86401", "--color=red"}) {
        EXPECT_NE(lineRefusal({"--connect", "h", option, "show"}), "accepted") << option;
    }
}

TEST(OptionRules, RefusesToSortAndCountWhatIsNoList) {
    EXPECT_EQ(lineRefusal({"graph", "--count"}),
              "the result of this command is not a list: there is nothing to count");
    EXPECT_EQ(lineRefusal({"rename", "a", "b", "--sort", "x"}),
              "the result of this command is not a list: there is nothing to sort");
    EXPECT_NE(lineRefusal({"get", "P", "--count"}), "accepted");
    EXPECT_NE(lineRefusal({"serve", "--count"}), "accepted");
}

/// What the options read into a command that had its defaults.
ServeCommand read(std::vector<std::string> arguments) {
    CLI::App app;
    ServeCommand serve;
    addServeOptions(app, serve);
    // The parser takes them from the end.
    std::reverse(arguments.begin(), arguments.end());
    app.parse(arguments);
    return serve;
}

TEST(ServeOptions, LeaveTheDefaultsAlone) {
    EXPECT_EQ(read({}), ServeCommand());
}

TEST(ServeOptions, SayWhereToListenAndWhoMayAsk) {
    ServeCommand serve;
    serve.listen = "[::1]:5989";
    serve.tlsCertificate = "c";
    serve.tlsKey = "k";
    serve.users = "u";
    serve.readOnly = true;
    EXPECT_EQ(read({"--listen", "[::1]:5989", "--tls-cert", "c", "--tls-key", "k", "--users", "u",
                    "--read-only"}),
              serve);
}

TEST(ServeOptions, EachLimitIsItsOwn) {
    ServeCommand serve;
    serve.limits.headerLine = 1;
    serve.limits.headers = 2;
    serve.limits.body = 3;
    serve.limits.depth = 4;
    serve.limits.connections = 5;
    serve.limits.waiting = 6;
    serve.limits.sessions.sessions = 7;
    serve.limits.result = 8;
    serve.limits.workers = 9;
    serve.limits.stuck = 10;
    serve.limits.ioThreads = 11;
    serve.limits.request = std::chrono::seconds(12);
    serve.limits.response = std::chrono::seconds(13);
    serve.limits.sessions.defaultTimeout = std::chrono::seconds(14);
    serve.limits.sessions.longestTimeout = std::chrono::seconds(15);
    serve.limits.connectionsEach = 16;
    serve.limits.connectionRate = 17;
    serve.limits.checksEach = 18;
    serve.limits.refusalsEach = 19;
    serve.limits.memory = 20;
    serve.limits.sessions.each = 21;
    serve.limits.head = std::chrono::seconds(22);
    std::vector<std::string> arguments;
    for (const char* option : {"--max-header-line",
                               "--max-headers",
                               "--max-body",
                               "--max-depth",
                               "--max-connections",
                               "--max-waiting",
                               "--max-enumerations",
                               "--max-result",
                               "--workers",
                               "--max-stuck",
                               "--io-threads",
                               "--request-timeout",
                               "--answer-timeout",
                               "--enumeration-timeout",
                               "--max-enumeration-timeout",
                               "--max-connections-each",
                               "--max-connection-rate",
                               "--max-checks-each",
                               "--max-refusals-each",
                               "--max-memory",
                               "--max-enumerations-each",
                               "--head-timeout"}) {
        arguments.emplace_back(option);
        arguments.push_back(std::to_string(arguments.size() / 2 + 1));
    }
    EXPECT_EQ(read(arguments), serve);
}

TEST(ServeOptions, SayHowListenersAreServed) {
    ServeCommand serve;
    serve.subscriptions = "dir";
    serve.delivery.caCertificates = "ca.pem";
    serve.subscriptionLimits.filters = 1;
    serve.subscriptionLimits.listeners = 2;
    serve.subscriptionLimits.subscriptions = 3;
    serve.delivery.queued = 4;
    serve.delivery.retries = 0;
    serve.delivery.retryInterval = std::chrono::seconds(5);
    serve.delivery.patience = std::chrono::seconds(6);
    serve.delivery.removalTime = std::chrono::seconds(7);
    EXPECT_EQ(read({"--subscriptions",     "dir", "--listener-cacert", "ca.pem",
                    "--max-filters",       "1",   "--max-listeners",   "2",
                    "--max-subscriptions", "3",   "--max-queue",       "4",
                    "--delivery-retries",  "0",   "--retry-interval",  "5",
                    "--listener-timeout",  "6",   "--give-up-after",   "7"}),
              serve);
    for (const char* option :
         {"--max-filters", "--max-listeners", "--max-subscriptions", "--max-queue",
          "--retry-interval", "--listener-timeout", "--give-up-after"}) {
        EXPECT_THROW(static_cast<void>(read({option, "0"})), CLI::ParseError) << option;
        EXPECT_THROW(static_cast<void>(read({option, "-1"})), CLI::ParseError) << option;
    }
}

TEST(ServeOptions, RefuseWhatIsNotANumber) {
    EXPECT_THROW(static_cast<void>(read({"--max-body", "much"})), CLI::ParseError);
    EXPECT_THROW(static_cast<void>(read({"--answer-timeout", "x"})), CLI::ParseError);
}

// The help and the manual page tell the same words and exit statuses, which are those of the
// program.

std::string helpOf(const std::string& command) {
    return std::get<Information>(readCommandLine({command, "--help"})).text;
}

/// The list of a help text below a line: words in a column of their own.
Meanings listBelow(const std::string& line, const std::string& help) {
    Meanings list;
    const std::size_t start = help.find(line + '\n');
    if (start == std::string::npos) {
        return list;
    }
    std::istringstream lines(help.substr(start + line.size() + 1));
    for (std::string each; std::getline(lines, each) && each.starts_with("  ");) {
        const std::size_t end = each.find("  ", 2);
        const std::size_t meaning = each.find_first_not_of(' ', end);
        list.emplace_back(each.substr(2, end - 2), each.substr(meaning));
    }
    return list;
}

/// The list of the manual page that begins in the line behind the given one.
Meanings listOfPageBelow(const std::string& line) {
    const std::string page = ZR::Testing::readFile(MANUAL_PAGE);
    Meanings list;
    const std::size_t start = page.find(line + "\n.RS\n");
    if (start == std::string::npos) {
        return list;
    }
    std::istringstream lines(page.substr(start + line.size() + 5));
    std::string tag;
    std::string word;
    std::string meaning;
    while (std::getline(lines, tag) && tag == ".TP" && std::getline(lines, word) &&
           std::getline(lines, meaning)) {
        list.emplace_back(word.substr(std::string(".B ").size()), meaning);
    }
    return list;
}

TEST(ManualPage, TellsTheWordsOfStateAsTheHelpDoes) {
    Meanings words;
    for (const StateWord& each : stateWords) {
        words.emplace_back(each.word, each.meaning);
    }
    EXPECT_EQ(listBelow("STATE is that of the interface's DHCP client:", helpOf("show")), words);
    EXPECT_EQ(listOfPageBelow("The network interfaces and their DHCP clients. STATE is that of the "
                              "interface's DHCP client:"),
              words);
}

TEST(ManualPage, TellsTheExitStatusesOfTheCheckAsTheHelpDoes) {
    const Meanings statuses = listBelow("Exit status:", helpOf("check"));
    EXPECT_EQ(statuses.size(), 4U);
    EXPECT_EQ(listOfPageBelow("with \"BAD\" (wrong). The exit status is"), statuses);
}

}  // namespace
}  // namespace cimdhcp
