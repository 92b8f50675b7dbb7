#include "text/Table.h"

#include <gtest/gtest.h>

#include <stdexcept>

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

}  // namespace
}  // namespace cimdhcp
