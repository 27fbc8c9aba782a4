#include <gtest/gtest.h>

#include <climits>
#include <random>
#include <string>

#include "tests/data_package_access.h"

namespace {

using Access = DataPackageTestAccess;

TEST(ScannerTest, MoveCursorAfterPassesTheNextOccurrenceOrStays) {
  const struct {
    const char* text;
    const char* pattern;
    int cursor;
  } cases[] = {
      {"ab>cd", ">", 3}, {"abcd", ">", 0},   {"a</b>", "</", 3},
      {"ab<", "<", 3},   {"ab</", "</>", 0}, {"x\0>", ">", 0},  // stops at a NUL
  };
  for (const auto& c : cases) {
    std::string text(c.text, std::char_traits<char>::length(c.text) + (c.text[1] == '\0' ? 2 : 0));
    Access::StartReading(text);
    Access::MoveCursorAfter(c.pattern);
    EXPECT_EQ(Access::Cursor(), c.cursor) << c.text;
  }
}

TEST(ScannerTest, GetStringBeforeCutsTrimmedText) {
  const struct {
    std::string text;
    const char* delimiter;
    const char* result;
    int cursor;
  } cases[] = {
      {"  Items  >", ">", "Items", 7},
      {"   >", ">", "", 3},
      {" Hello world </Name>", "</", "Hello world", 12},
      {"no delimiter", ">", "", 0},
      {"\r\n\t x\t>", ">", "x", 5},
      {"a\fb >", ">", "a\fb", 3},  // form feed is not whitespace
      {std::string(2047, 'n') + ">", ">", nullptr, 2047},
      {"  " + std::string(2048, 'n') + ">", ">", "", 2},  // too long: cut out as empty
      {std::string("ab\0>", 4), ">", "", 0},              // the text ends at its NUL
  };
  for (const auto& c : cases) {
    std::string text = c.text;
    Access::StartReading(text);
    const std::string result = Access::GetStringBefore(c.delimiter);
    EXPECT_EQ(result, c.result ? c.result : std::string(2047, 'n')) << c.text.substr(0, 20);
    EXPECT_EQ(Access::Cursor(), c.cursor) << c.text.substr(0, 20);
  }
}

TEST(ScannerTest, WhiteSpaceIsExactlyFourCharacters) {
  for (int c = -128; c < 128; ++c) {
    const bool expected = c == 13 || c == 10 || c == 9 || c == 32;
    EXPECT_EQ(Access::IsWhiteSpace(static_cast<char>(c)), expected) << c;
  }
}

TEST(ScannerTest, MoveCursorBeforeTagFindsTheNameAloneOrWithAnId) {
  const struct {
    const char* text;
    bool found;
    int cursor;
  } cases[] = {
      {"<Items Type=\"Txt\"> a </Items><ItemsX><Items id=\"7\">", true, 37},
      {"<Items>", true, 0},
      {"header <Other>\n<  Items  >", true, 15},
      {"<Itemsid=\"3\">", true, 0},
      {"<Items\tid=\"3\">", true, 0},
      {"<Items class=\"3\">", false, 0},
      {"</Items><Item><Items", false, 0},
      {"no tag at all", false, 0},
      {"<", false, 0},
  };
  for (const auto& c : cases) {
    std::string text = c.text;
    Access::StartReading(text);
    EXPECT_EQ(Access::MoveCursorBeforeTag("Items"), c.found) << c.text;
    EXPECT_EQ(Access::Cursor(), c.cursor) << c.text;
  }
}

TEST(ScannerTest, GetItemTypeClassifiesTheNextTagWithoutMovingTheCursor) {
  const struct {
    const char* text;
    const char* name;
    int type;
  } cases[] = {
      {"<Items>\n\t</Items>", "Items", 3},
      {"<Items>\n\t<Name Type=\"Txt\"> a </Name>", "Items", 1},
      {"<Items id=\"1\">", "Items", 2},
      {"</Parent>", "Items", 0},
      {"<Other>", "Items", 0},
      {"<Items", "Items", 0},  // nothing after the name
      {"  < Items  id", "Items", 2},
      {"<ItemsX>", "Items", 1},  // a prefix is enough
      // The two characters passed over must be "</": a first element whose name, less its first
      // character, begins with the directory's name still holds data.
      {"<Sub>\n\t<xSubtotal Type=\"Val\"> 3 </xSubtotal>\n</Sub>", "Sub", 1},
      {"<Sub>\n\t<xSub Type=\"Val\"> 3 </xSub>\n</Sub>", "Sub", 1},
      {"<Sub></Sub>", "Sub", 3},
      {"<Sub></Other>", "Sub", 1},
  };
  for (const auto& c : cases) {
    std::string text = c.text;
    Access::StartReading(text);
    EXPECT_EQ(Access::GetItemType(c.name), c.type) << c.text;
    EXPECT_EQ(Access::Cursor(), 0) << c.text;
  }
}

TEST(ScannerTest, WhatFailedTagSearchesLearnChangesNoLaterSearch) {
  // Texts dense in tags, tags inside tag contents, near-names and ids.
  const std::string pieces[] = {"<",  ">", " ",       "I",  "Items", " id=\"1\"",
                                "</", "x", "<Items>", "\n", "<<",    "Type="};
  std::mt19937 random(11);
  for (int round = 0; round < 2000; ++round) {
    std::string text;
    const int length = static_cast<int>(random() % 40);
    for (int i = 0; i < length; ++i)
      text += pieces[random() % std::size(pieces)];
    int learnt = INT_MAX;
    for (int start = 0; start <= static_cast<int>(text.size()); ++start) {
      Access::StartReading(text);
      Access::Cursor() = start;
      int unknown = INT_MAX;
      const bool expected = Access::SearchTag("Items", unknown);
      const int expectedCursor = Access::Cursor();
      Access::Cursor() = start;
      ASSERT_EQ(Access::SearchTag("Items", learnt), expected) << text << " from " << start;
      ASSERT_EQ(Access::Cursor(), expectedCursor) << text << " from " << start;
    }
  }
}

}  // namespace
