#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "tests/data_package_access.h"

namespace {

using Access = DataPackageTestAccess;

// Appends pieces of the given lengths ('a', 'b', ... in turn) into a buffer of `size` bytes.
std::string AppendInto(int size, std::initializer_list<int> lengths) {
  std::string buffer(static_cast<std::size_t>(size), '#');
  Access::StartWriting(size ? buffer.data() : nullptr, static_cast<unsigned int>(size));
  char fill = 'a';
  for (int length : lengths) {
    std::memset(Access::Tmp(), fill++, static_cast<std::size_t>(length));
    EXPECT_EQ(Access::BufferAppend(length), length);
  }
  return buffer;
}

TEST(BufferAppendTest, PiecesAreCopiedWholeOrNotAtAllAndAlwaysCounted) {
  struct Case {
    int size;
    std::initializer_list<int> pieces;
    std::string buffer;  // afterwards
    int required;
  };
  const Case cases[] = {
      {0, {5, 3}, "", 9},
      {1, {0}, std::string("\0", 1), 1},
      {9, {5, 3}, std::string("aaaaabbb\0", 9), 9},  // exactly the required size
      {8, {5, 3}, std::string("aaaaa\0##", 8), 9},   // one byte short: the last piece is missing
      {10, {5, 100, 3}, std::string("aaaaa\0####", 10), 109},
      {4, {5}, "####", 6},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(AppendInto(c.size, c.pieces), c.buffer) << "size " << c.size;
    EXPECT_EQ(Access::RequiredSize(), c.required) << "size " << c.size;
    EXPECT_EQ(Access::Cursor(), c.required - 1) << "size " << c.size;
  }
}

TEST(BufferAppendTest, NegativeAndOversizedLengthsChangeNothing) {
  std::string buffer(16, '#');
  Access::StartWriting(buffer.data(), 16);
  EXPECT_EQ(Access::BufferAppend(-1), 0);
  EXPECT_EQ(Access::BufferAppend(Lum_DataPackage::kTextLength), 0);
  EXPECT_EQ(Access::RequiredSize(), 1);
  EXPECT_EQ(Access::Cursor(), 0);
  EXPECT_EQ(buffer, std::string(16, '#'));
}

TEST(IndentationTest, TabsFollowTheDepthWithinTheirBuffer) {
  const struct {
    int depth;
    std::size_t tabs;
  } cases[] = {{0, 0}, {1, 1}, {3, 3}, {1023, 1023}, {1024, 1023}, {5000, 1023}, {-1, 0}};
  for (const auto& c : cases) {
    Access::TreeDepth() = c.depth;
    EXPECT_EQ(std::string(Access::GetTabs()), std::string(c.tabs, '\t')) << c.depth;
  }
  Access::TreeDepth() = 0;
}

TEST(IndentationTest, NewlineFollowsTheChoiceAtEveryCall) {
  Access::LineFeeds() = false;
  EXPECT_STREQ(Access::GetNewline(), "\r\n");
  Access::LineFeeds() = true;
  EXPECT_STREQ(Access::GetNewline(), "\n");
}

}  // namespace
