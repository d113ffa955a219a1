#include "accountsctl/TextTable.h"

#include <gtest/gtest.h>

namespace accounts {
namespace {

using Lines = std::vector<std::string>;

Terminal ofWidth(std::size_t width) {
  return {.width = width, .isColoured = false};
}

TEST(TextTable, ColumnsAreAsWideAsTheirWidestCell) {
  TextTable table({"A", "Heading"});
  table.addRow({"long cell", "x"});
  table.addRow({"y", ""});

  EXPECT_EQ(table.text(ofWidth(80)),
            "A          Heading\n"
            "long cell  x\n"
            "y\n");
}

TEST(TextTable, WithoutHeadingsThereIsNoLineForThem) {
  TextTable table({"", ""});
  table.addRow({"a", "b"});

  EXPECT_EQ(table.text(ofWidth(80)), "a  b\n");
}

TEST(TextTable, TheWidestColumnGivesWayFirst) {
  TextTable table({"A", "B"});
  table.addRow({"short", "one two three four five"});

  EXPECT_EQ(table.text(ofWidth(20)),
            "A      B\n"
            "short  one two three\n"
            "       four five\n");
}

TEST(TextTable, NoLineIsWiderThanTheTerminal) {
  TextTable table({"First", "Second", "Third"});
  table.addRow({std::string(100, 'x'), std::string(50, 'y'), "z"});

  for (const std::size_t width : {40U, 80U, 120U}) {
    std::string text = table.text(ofWidth(width));
    while (!text.empty()) {
      const std::size_t length = text.find('\n');
      EXPECT_LE(length, width);
      text.erase(0, length + 1);
    }
  }
}

TEST(TextTable, ATerminalThatIsTooNarrowGetsSixColumnsForEachCell) {
  TextTable table({"", ""});
  table.addRow({"abcdefgh", "ij"});

  EXPECT_EQ(table.text(ofWidth(1)), "abcdef  ij\ngh\n");
}

TEST(TextTable, WideAndCombiningCharactersTakeTheirColumns) {
  EXPECT_EQ(displayWidth("abc"), 3U);
  EXPECT_EQ(displayWidth("\u4E2D\u6587"), 4U);
  EXPECT_EQ(displayWidth("e\u0301"), 1U);
  TextTable table({"", ""});
  table.addRow({"\u4E2D", "x"});
  table.addRow({"abc", "y"});

  EXPECT_EQ(table.text(ofWidth(80)), "\u4E2D   x\nabc  y\n");
}

TEST(TextTable, WhatATerminalMightObeyIsEscaped) {
  TextTable table({""});
  table.addRow({"a\x1B[2Jb\u202Ec\nd"});

  EXPECT_EQ(table.text(ofWidth(80)), "a\\u001b[2Jb\\u202ec\\nd\n");
}

TEST(TextTable, BytesThatAreNoTextAreEscaped) {
  TextTable table({""});
  table.addRow({"\xFF"});

  EXPECT_EQ(table.text(ofWidth(80)), "\\xff\n");
}

TEST(TextTable, HeadingsStandOutOnAColouredTerminal) {
  TextTable table({"A"});
  table.addRow({"a"});

  EXPECT_EQ(table.text({.width = 80, .isColoured = true}), "\033[1mA\033[0m\na\n");
}

TEST(TextTable, WithoutATerminalARowIsOneLineWithTabs) {
  TextTable table({"A", "B"}, LongCells::Cut);
  table.addRow({std::string(100, 'x'), "tab\there"});

  EXPECT_EQ(table.text({.width = 20, .isInteractive = false}),
            "A\tB\n" + std::string(100, 'x') + "\ttab\\there\n");
}

TEST(TextTable, CutCellsAreOneLineWithAMark) {
  TextTable table({"A", "B"}, LongCells::Cut);
  table.addRow({"short", "one two three four five"});

  EXPECT_EQ(table.text(ofWidth(20)),
            "A      B\n"
            "short  one two thre\u2026\n");
}

TEST(TextTable, AColumnThatIsKeptWholeIsNeitherCutNorBroken) {
  for (const LongCells longCells : {LongCells::Cut, LongCells::Wrapped}) {
    TextTable table({"A", "B"}, longCells);
    table.keepWhole(1);
    table.addRow({"1234567", "0123456789-0123456789"});

    const std::string text = table.text(ofWidth(20));

    EXPECT_NE(text.find("0123456789-0123456789\n"), std::string::npos) << text;
    EXPECT_EQ(text.find("\n1234567"), std::string::npos) << text;
  }
}

TEST(TextTable, ACutTextFitsItsWidth) {
  EXPECT_EQ(cut("abc", 3), "abc");
  EXPECT_EQ(cut("abcd", 3), "ab\u2026");
  EXPECT_EQ(cut("\u4E2D\u6587\u5B57", 4), "\u4E2D\u2026");
  EXPECT_EQ(cut("ab", 1), "\u2026");
}

TEST(TextTable, ATextIsBrokenBehindBlanksAndMarks) {
  EXPECT_EQ(wrapped("one two", 5), (Lines{"one", "two"}));
  EXPECT_EQ(wrapped("1234-5678", 6), (Lines{"1234-", "5678"}));
}

TEST(TextTable, ATextWithoutBlanksIsBrokenWhereTheLineEnds) {
  EXPECT_EQ(wrapped("abcdefg", 3), (Lines{"abc", "def", "g"}));
}

TEST(TextTable, AnEmptyTextIsOneEmptyLine) {
  EXPECT_EQ(wrapped("", 5), Lines{""});
}

TEST(TextTable, ACharacterWiderThanTheLineStandsAlone) {
  EXPECT_EQ(wrapped("\u4E2D\u6587", 1), (Lines{"\u4E2D", "\u6587"}));
}

}  // namespace
}  // namespace accounts
