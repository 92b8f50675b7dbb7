// The help and the manual page tell the same words and exit statuses, which are those of the
// program.
#include <gtest/gtest.h>

#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "arguments/CommandLine.h"
#include "client/InterfaceState.h"
#include "kit/FileContent.h"

namespace cimdhcp {
namespace {

using Meanings = std::vector<std::pair<std::string, std::string>>;

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
