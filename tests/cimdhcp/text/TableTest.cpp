// Tables, and the columns that are chosen of them.
#include <gtest/gtest.h>

#include <stdexcept>

#include "text/Columns.h"
#include "text/Failure.h"
#include "text/Likeness.h"
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
              "longer  a rather\n"
              "        long value\n");
}

TEST(Table, FoldsTheWidestColumnToFit) {
    EXPECT_EQ(sample().text(20),
              "NAME    VALUE\n"
              "a       short\n"
              "longer  a rather\n"
              "        long value\n");
}

TEST(Table, BreaksNoWordHoweverNarrowTheTerminal) {
    EXPECT_EQ(sample().text(1),
              "NAME    VALUE\n"
              "a       short\n"
              "longer  a rather\n"
              "        long value\n");
    Table table({"A", "B"});
    table.add({"x", "an-unbreakable-word of length"});
    EXPECT_EQ(table.text(1),
              "A  B\n"
              "x  an-unbreakable-word\n"
              "   of length\n");
}

Table ranked() {
    Table table({"NAME", "A KIND", "SIZE", "WORDS"}, {{true, 0}, {true, 2}, {true, 1}, {false, 0}});
    table.add({"my name", "one of them", "12", "as long as this"});
    return table;
}

TEST(Table, FoldsBeforeItLeavesOutAndKeepsNamesWhole) {
    EXPECT_EQ(ranked().text(40),
              "NAME     A KIND       SIZE  WORDS\n"
              "my name  one of them  12    as long as\n"
              "                            this\n");
    EXPECT_EQ(ranked().text(30),
              "NAME     SIZE  WORDS\n"
              "my name  12    as long as this\n"
              "(without A KIND: --wide shows all)\n");
    EXPECT_EQ(ranked().text(10),
              "NAME     WORDS\n"
              "my name  as long as\n"
              "         this\n"
              "(without A KIND, SIZE: --wide shows all)\n");
    EXPECT_EQ(ranked().text(30, {false, false}), "my name  12  as long as this\n");
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
    EXPECT_EQ(columnNamed("--sort", "state", names), 0U);
    EXPECT_EQ(columnNamed("--sort", "configuration-name", names), 1U);
    EXPECT_EQ(columnNamed("--sort", "Configuration_Name", names), 1U);
}

TEST(ColumnName, IsToldWhatThereIsWhenItIsWrong) {
    try {
        static_cast<void>(columnNamed("--sort", "size", {"STATE", "ADDRESS"}));
        ADD_FAILURE() << "accepted";
    } catch (const Failure& failure) {
        EXPECT_EQ(failure.status(), ExitStatus::usage);
        EXPECT_STREQ(failure.what(),
                     "--sort: there is no column \"size\"; there are: STATE, ADDRESS");
    }
}

TEST(Columns, AreChosenByName) {
    const auto chosen = chosenOf(columns, {"size", "NAME", "size"});
    EXPECT_EQ(headingsOf(chosen), (std::vector<std::string>{"SIZE", "NAME", "SIZE"}));
    EXPECT_THROW(static_cast<void>(chosenOf(columns, {"color"})), Failure);
    std::vector<Column<Row>> ranked = columns;
    ranked[0].room = {true, 3};
    EXPECT_EQ(chosenOf(ranked, {"name"})[0].room, (ColumnRoom{true, 0}));
}

TEST(Tsv, HasOneValuePerColumn) {
    const std::vector<Row> rows{{"-", 1}, {"a b", 2}};
    EXPECT_EQ(tsvOf(columns, rows, true), "NAME\tSIZE\n\t1\na b\t2\n");
    EXPECT_EQ(tsvOf(columns, rows, false), "\t1\na b\t2\n");
    std::vector<Column<Row>> valued = columns;
    valued[0].value = [](const Row& row) { return row.name; };
    EXPECT_EQ(tsvOf(valued, rows, false), "-\t1\na b\t2\n");
}

TEST(Tsv, EscapesWhatWouldEndAValue) {
    EXPECT_EQ(tsvValue("a\tb\nc\rd\\e"), "a\\tb\\nc\\rd\\\\e");
    EXPECT_EQ(tsvValue(std::string("\x1B[2J\0\x7F", 6)), "\\x1B[2J\\x00\\x7F");
    EXPECT_EQ(tsvValue("Büro\xFF"), "Büro\xFF");
    EXPECT_EQ(tsvLine({"", "\t"}), "\t\\t\n");
}

TEST(Likeness, FindsWhatWasMeant) {
    const std::vector<std::string> names{"show", "classes", "references", "rename", "watch"};
    EXPECT_EQ(nearestTo("shwo", names), "show");
    EXPECT_EQ(nearestTo("CLASES", names), "classes");
    EXPECT_EQ(nearestTo("class", names), "classes");
    EXPECT_EQ(nearestTo("renam", names), "rename");
    EXPECT_EQ(nearestTo("refrence", names), "references");
    for (const char* other : {"", "x", "server", "zzzzzz", "tree"}) {
        EXPECT_EQ(nearestTo(other, names), std::nullopt) << other;
    }
    EXPECT_EQ(nearestTo(std::string(1000, 's'), names), std::nullopt);
    EXPECT_EQ(didYouMean("shwo", names), "; did you mean show?");
    EXPECT_EQ(didYouMean("tree", names), "");
}

}  // namespace
}  // namespace cimdhcp
