#include "text/Columns.h"

#include <gtest/gtest.h>

#include "text/Failure.h"

namespace cimdhcp {
namespace {

struct Row {
    std::string name;
    int size = 0;
};

const std::vector<Column<Row>> columns{
    {"NAME", [](const Row& row) { return row.name; }},
    {"SIZE", [](const Row& row) { return std::to_string(row.size); }}};

TEST(Columns, MakeATable) {
    EXPECT_EQ(tableOf(columns, std::vector<Row>{{"a", 10}, {"b", 9}}).text(std::nullopt),
              "NAME  SIZE\n"
              "a     10\n"
              "b     9\n");
}

TEST(Columns, SortByWhatTheyShow) {
    std::vector<Row> rows{{"b", 10}, {"a", 9}, {"c", 10}};
    sortBy("size", columns, rows);
    EXPECT_EQ(tableOf(columns, rows).text(std::nullopt, {false, false}),
              "a  9\n"
              "b  10\n"
              "c  10\n");
    EXPECT_THROW(sortBy("other", columns, rows), Failure);
}

TEST(Columns, SortByAKeyOfTheirOwn) {
    const std::vector<Column<Row>> keyed{{"SIZE",
                                          [](const Row& /*row*/) { return std::string("much"); },
                                          [](const Row& row) { return std::to_string(row.size); }}};
    std::vector<Row> rows{{"b", 10}, {"a", 9}};
    sortBy("SIZE", keyed, rows);
    EXPECT_EQ(rows.front().name, "a");
}

TEST(ColumnName, MayBeWrittenAsOptionsAre) {
    const std::vector<std::string> names{"STATE", "CONFIGURATION NAME"};
    EXPECT_EQ(columnNamed("state", names), 0U);
    EXPECT_EQ(columnNamed("configuration-name", names), 1U);
    EXPECT_EQ(columnNamed("Configuration_Name", names), 1U);
}

TEST(ColumnName, IsToldWhatThereIsWhenItIsWrong) {
    try {
        static_cast<void>(columnNamed("size", {"STATE", "ADDRESS"}));
        ADD_FAILURE() << "accepted";
    } catch (const Failure& failure) {
        EXPECT_EQ(failure.status(), ExitStatus::usage);
        EXPECT_STREQ(failure.what(),
                     "--sort: there is no column \"size\"; there are: STATE, ADDRESS");
    }
}

}  // namespace
}  // namespace cimdhcp
