#include "IndicationQueue.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>

#include "kit/Files.h"

namespace cimom::wbem {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

class IndicationQueues : public testing::Test {
  protected:
    IndicationQueue queue(IndicationQueue::Bounds bounds = {}) {
        return {file_, bounds, [this](const std::string& line) { log_.push_back(line); }};
    }

    /// What waits, as NUMBER:TEXT; it does not wait any more then.
    static std::vector<std::string> drained(IndicationQueue& queue) {
        std::vector<std::string> all;
        while (const IndicationQueue::Entry* const entry = queue.front()) {
            all.push_back(std::to_string(entry->number) + ':' + entry->text);
            queue.pop();
        }
        return all;
    }

    ZR::Testing::TemporaryDirectory directory_;
    const std::string file_ = directory_ / "queue";
    std::vector<std::string> log_;
};

TEST_F(IndicationQueues, KeepTheirOrderAndCount) {
    IndicationQueue made = queue();
    for (const char* text : {"a", "b\nwith a line", "c"}) {
        EXPECT_EQ(made.push(text, false), 0U);
    }
    EXPECT_THAT(drained(made), ElementsAre("0:a", "1:b\nwith a line", "2:c"));
    made.push("d", false);
    EXPECT_THAT(drained(made), ElementsAre("3:d"));
}

TEST_F(IndicationQueues, LeaveWhatWaitsToTheNextProcessWithNewNumbers) {
    {
        IndicationQueue first = queue();
        for (const char* text : {"a", "b\n", "Q 7 1\n", ""}) {
            first.push(text, false);
        }
        first.pop();
    }
    {
        IndicationQueue second = queue();
        second.push("e", false);
        second.pop();
    }
    IndicationQueue third = queue();
    EXPECT_THAT(drained(third), ElementsAre("0:Q 7 1\n", "1:", "2:e"));
    EXPECT_THAT(log_, IsEmpty());
}

TEST_F(IndicationQueues, LoseTheOldestWhenTheyAreFull) {
    IndicationQueue made = queue({3, 1000});
    for (const char* text : {"a", "b", "c"}) {
        EXPECT_EQ(made.push(text, false), 0U);
    }
    EXPECT_EQ(made.push("d", false), 1U);
    EXPECT_EQ(made.push("e", true), 1U) << "not the one that is on its way";
    EXPECT_THAT(drained(made), ElementsAre("1:b", "3:d", "4:e"));
}

TEST_F(IndicationQueues, AreBoundedInBytes) {
    IndicationQueue made = queue({100, 10});
    made.push("aaaa", false);
    made.push("bbbb", false);
    EXPECT_EQ(made.push("ccccc", false), 1U);
    EXPECT_EQ(made.push("12345678901", false), 1U) << "the new one itself is too large";
    EXPECT_EQ(made.push("1234567890", false), 2U);
    EXPECT_THAT(drained(made), ElementsAre("4:1234567890"));
}

TEST_F(IndicationQueues, AProcessKilledAtAnyByteLeavesWholeIndications) {
    {
        IndicationQueue made = queue();
        made.push("first", false);
        made.push("second\nQ 9", false);
        made.pop();
        made.push("third", false);
    }
    const std::string whole = ZR::Testing::readFile(file_);
    std::size_t longest = 0;
    for (std::size_t size = 0; size <= whole.size(); ++size) {
        ZR::Testing::writeFile(file_, whole.substr(0, size));
        IndicationQueue left = queue();
        const std::vector<std::string> all = drained(left);
        longest = std::max(longest, all.size());
        for (std::string each : all) {
            each.erase(0, each.find(':') + 1);
            EXPECT_TRUE(each == "first" || each == "second\nQ 9" || each == "third") << each;
        }
    }
    EXPECT_EQ(longest, 2U);
    EXPECT_THAT(log_, IsEmpty());
}

TEST_F(IndicationQueues, FilesThatAreNoneAreKeptAside) {
    for (const char* text : {"not a queue\n", "Q x 1\na\n", "Q 1\n", "Q 1 1\nabc\n", "D\n",
                             "Q 1 99999999999999999999\n"}) {
        log_.clear();
        ZR::Testing::writeFile(file_, text);
        IndicationQueue made = queue();
        EXPECT_EQ(made.front(), nullptr) << text;
        EXPECT_THAT(log_, ElementsAre(HasSubstr("kept as " + file_ + ".bad"))) << text;
        EXPECT_EQ(ZR::Testing::readFile(file_ + ".bad"), text);
    }
}

TEST_F(IndicationQueues, DoNotKeepTheirHistory) {
    const std::string text(10000, 'x');
    IndicationQueue made = queue();
    made.push(text, false);
    for (int time = 0; time < 500; ++time) {
        made.push(text, false);
        made.pop();
        EXPECT_LT(std::filesystem::file_size(file_), 400000U);
    }
    made.pop();
    EXPECT_EQ(std::filesystem::file_size(file_), 0U);
}

TEST_F(IndicationQueues, WorkWithoutADiskAndTellIt) {
    std::vector<std::string> log;
    IndicationQueue made(directory_ / "none" + "/queue", {},
                         [&log](const std::string& line) { log.push_back(line); });
    made.push("a", false);
    made.push("b", false);
    EXPECT_THAT(drained(made), ElementsAre("0:a", "1:b"));
    EXPECT_THAT(log, ElementsAre(HasSubstr("No such file or directory; what waits is in memory")));
}

TEST_F(IndicationQueues, EndWithTheirFile) {
    IndicationQueue made = queue();
    made.push("a", false);
    made.push("b", false);
    EXPECT_EQ(made.discard(), 2U);
    EXPECT_FALSE(std::filesystem::exists(file_));
}

}  // namespace
}  // namespace cimom::wbem
