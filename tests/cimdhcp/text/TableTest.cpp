// Tables, and the columns that are chosen of them.
#include <gtest/gtest.h>

#include <stdexcept>

#include "text/Columns.h"
#include "text/Failure.h"
#include "text/Table.h"

namespace cimdhcp {
namespace {

Table sample() {
    Table table({"NAME", "VALUE"});
    table.add({"a", "short"});
    table.add({"longer", "a rather long value"});
    return table;
}

TEST(Table, AlignsColumnsAndLeavesNoBlanksAtLineEnds) {
    EXPECT_EQ(sample().text(std::nullopt),
              "NAME    VALUE\n"
              "a       short\n"
              "longer  a rather long value\n");
}

TEST(Table, MayBeWithoutHeadings) {
    EXPECT_EQ(Table({"A LONG HEADING", "B"}).text(std::nullopt, {false, false}), "");
    Table table({"A LONG HEADING", "B"});
    table.add({"a", "b"});
    EXPECT_EQ(table.text(std::nullopt, {false, false}), "a  b\n");
}

TEST(Table, ColorsItsHeadings) {
    EXPECT_EQ(sample().text(20, {true, true}),
              "\x1B[1mNAME    VALUE\x1B[0m\n"
              "a       short\n"
              "longer  a rather lo…\n");
}

TEST(Table, CutsTheWidestColumnToFit) {
    EXPECT_EQ(sample().text(20),
              "NAME    VALUE\n"
              "a       short\n"
              "longer  a rather lo…\n");
}

TEST(Table, KeepsFourColumnsHoweverNarrowTheTerminal) {
    EXPECT_EQ(sample().text(1),
              "NAME  VAL…\n"
              "a     sho…\n"
              "lon…  a r…\n");
}

TEST(Table, AlignsBehindWideCharacters) {
    Table table({"A", "B"});
    table.add({"東", "x"});
    EXPECT_EQ(table.text(std::nullopt), "A   B\n東  x\n");
}

TEST(Table, MakesCellsPrintable) {
    Table table({"A"});
    table.add({"x\ny"});
    EXPECT_EQ(table.text(std::nullopt), "A\nx\\x0Ay\n");
}

TEST(Table, RefusesRowsOfAnotherLength) {
    Table table({"A", "B"});
    EXPECT_THROW(table.add({"x"}), std::invalid_argument);
    EXPECT_THROW(Table({}), std::invalid_argument);
}

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
