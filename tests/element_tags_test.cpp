#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <string>

#include "tests/data_package_access.h"
#include "tests/test_tree.h"

namespace {

using Access = DataPackageTestAccess;

// What `write` appends at depth `depth` with the given newline choice.
std::string Written(const std::function<void()>& write, int depth = 1, bool lineFeeds = true) {
  std::string buffer(16384, '#');
  Access::StartWriting(buffer.data(), static_cast<unsigned int>(buffer.size()), lineFeeds);
  Access::TreeDepth() = depth;
  write();
  return buffer.substr(0, static_cast<std::size_t>(Access::Cursor()));
}

TEST(ElementTagsTest, WritesEveryElementForm) {
  char ann[] = "Ann";
  char empty[] = "";
  float score = 12.5f;
  float seven = 7.0f;
  float big = 1234567.0f;
  float tiny = 0.0001f;
  D3DXVECTOR3 position{1.0f, 2.5f, -3.0f};
  D3DXMATRIX identity{};
  for (int i = 0; i < 4; ++i)
    identity.m[i][i] = 1.0f;

  const struct {
    std::function<void()> write;
    const char* text;
  } cases[] = {
      {[] { Access::XML_OpeningTag("Items"); }, "\n\t<Items>"},
      {[] { Access::XML_OpeningIDTag("Items", 12); }, "\n\t<Items id=\"12\">"},
      {[] { Access::XML_OpeningIDTag("Items", -7); }, "\n\t<Items id=\"-7\">"},
      {[] { Access::XML_ClosingTag("Items"); }, "\n</Items>"},
      {[&] { Access::XML_StringTag("Name", ann); }, "\n\t<Name Type=\"Txt\"> Ann </Name>"},
      {[&] { Access::XML_StringTag("Name", empty); }, "\n\t<Name Type=\"Txt\">  </Name>"},
      {[&] { Access::XML_ValueTag("Score", score); }, "\n\t<Score Type=\"Val\"> 12.5 </Score>"},
      {[&] { Access::XML_ValueTag("Score", seven); }, "\n\t<Score Type=\"Val\"> 7 </Score>"},
      {[&] { Access::XML_ValueTag("V", big); }, "\n\t<V Type=\"Val\"> 1.23457e+06 </V>"},
      {[&] { Access::XML_ValueTag("V", tiny); }, "\n\t<V Type=\"Val\"> 0.0001 </V>"},
      {[&] { Access::XML_VectorTag("Pos", position); }, "\n\t<Pos Type=\"Vec\"> 1 2.5 -3 </Pos>"},
      {[&] { Access::XML_MatrixTag("M", identity); },
       "\n\t<M Type=\"Mat\"> 1 0 0 0, 0 1 0 0, 0 0 1 0, 0 0 0 1 </M>"},
  };
  for (const auto& c : cases)
    EXPECT_EQ(Written(c.write), c.text);

  EXPECT_EQ(Written([] { Access::XML_OpeningTag("Items"); }, 0, false), "\r\n<Items>");
}

TEST(ElementTagsTest, EveryLineStartsWithTheNewlineAndTheDepthsTabs) {
  const struct {
    int depth;
    std::size_t tabs;
  } cases[] = {{0, 0}, {1, 1}, {7, 7}, {1023, 1023}, {1024, 1023}, {5000, 1023}, {-3, 0}};
  for (const auto& c : cases) {
    for (const bool lineFeeds : {true, false}) {
      const std::string line = (lineFeeds ? "\n" : "\r\n") + std::string(c.tabs, '\t');
      float value = 1.0f;
      EXPECT_EQ(Written([] { Access::XML_OpeningIDTag("I", 3); }, c.depth, lineFeeds),
                line + "<I id=\"3\">")
          << c.depth << lineFeeds;
      EXPECT_EQ(Written([&] { Access::XML_ValueTag("V", value); }, c.depth, lineFeeds),
                line + "<V Type=\"Val\"> 1 </V>")
          << c.depth << lineFeeds;
      // A closing tag leaves its depth before it is written, and lines up with its opening tag.
      EXPECT_EQ(Written([] { Access::XML_ClosingTag("I"); }, c.depth + 1, lineFeeds), line + "</I>")
          << c.depth << lineFeeds;
    }
  }
}

TEST(ElementTagsTest, TagsMoveTheDepth) {
  Written([] {
    Access::XML_OpeningTag("A");
    EXPECT_EQ(Access::TreeDepth(), 2);
    Access::XML_OpeningIDTag("B", 0);
    EXPECT_EQ(Access::TreeDepth(), 3);
    Access::XML_ClosingTag("B");
    Access::XML_ClosingTag("A");
    EXPECT_EQ(Access::TreeDepth(), 1);
    char text[] = "t";
    float value = 1.0f;
    Access::XML_StringTag("T", text);
    Access::XML_ValueTag("V", value);
    EXPECT_EQ(Access::TreeDepth(), 1);
  });
}

TEST(ElementTagsTest, ElementsLongerThanTheScratchTextAreWrittenWhole) {
  const std::string name(3000, 'n');
  std::string text(5000, 't');
  const std::string element = "\n\t<" + name + " Type=\"Txt\"> " + text + " </" + name + ">";
  EXPECT_EQ(Written([&] { Access::XML_StringTag(name.c_str(), text.data()); }), element);

  // Counted in full, and not cut when it does not fit.
  std::string small(100, '#');
  Access::StartWriting(small.data(), 100);
  Access::TreeDepth() = 1;
  Access::XML_StringTag(name.c_str(), text.data());
  EXPECT_EQ(Access::RequiredSize(), static_cast<int>(element.size()) + 1);
  EXPECT_EQ(small, std::string(100, '#'));
}

struct ReadCase {
  const char* text;
  int cursor;  // afterwards
};

TEST(ElementTagsTest, ReadsValuesOfTheNamedElementOnly) {
  std::string text = "\n\t<Score Type=\"Val\"> 12.5 </Score>\n\t</Items>";
  Access::StartReading(text);
  float value = 3.0f;
  Access::XML_ValueTag("Score", value);
  EXPECT_EQ(value, 12.5f);
  EXPECT_EQ(text.substr(static_cast<std::size_t>(Access::Cursor())), "\n\t</Items>");

  text = "<Level Type=\"Val\"> 3 </Level>";
  Access::StartReading(text);
  Access::XML_ValueTag("Score", value);
  EXPECT_EQ(value, 0.0f);
  EXPECT_EQ(Access::Cursor(), 0);

  // A number that does not parse leaves the variable as it was.
  text = "<Score Type=\"Val\"> many </Score>";
  Access::StartReading(text);
  value = 4.0f;
  Access::XML_ValueTag("Score", value);
  EXPECT_EQ(value, 4.0f);
}

TEST(ElementTagsTest, ReadsTextsTrimmedWhateverTheirType) {
  const struct {
    const char* text;
    const char* name;
    const char* result;
  } cases[] = {
      {"<Name Type=\"Txt\">   spaced  out   </Name>", "Name", "spaced  out"},
      {"<Score Type=\"Val\"> 12.5 </Score>", "Score", "12.5"},
      {"<Name Type=\"Txt\"> a</b </Name>", "Name", "a"},
      {"<Name Type=\"Txt\"> a\n<b>c </Name>", "Name", "a\n<b>c"},
      {"<Other Type=\"Txt\"> x </Other>", "Name", ""},
      {"<NameX Type=\"Txt\"> x </NameX>", "Name", ""},
  };
  for (const auto& c : cases) {
    std::string text = c.text;
    Access::StartReading(text);
    char result[Lum_DataPackage::kTextLength] = "previous";
    Access::XML_StringTag(c.name, result);
    EXPECT_STREQ(result, c.result) << c.text;
  }
}

TEST(ElementTagsTest, ReadsVectorsAndMatricesAsFarAsTheirFormatMatches) {
  std::string text = "<Pos Type=\"Vec\"> 1 2.5 -3 </Pos>";
  Access::StartReading(text);
  D3DXVECTOR3 vector{9, 9, 9};
  Access::XML_VectorTag("Pos", vector);
  EXPECT_EQ(vector, (D3DXVECTOR3{1.0f, 2.5f, -3.0f}));

  text = "<Pos Type=\"Vec\"> 4 x </Pos>";
  Access::StartReading(text);
  Access::XML_VectorTag("Pos", vector);
  EXPECT_EQ(vector, (D3DXVECTOR3{4.0f, 2.5f, -3.0f}));

  text = "<M Type=\"Mat\"> 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 </M>";
  Access::StartReading(text);
  D3DXMATRIX matrix = MatrixOf(-1.0f, -1.0f);
  Access::XML_MatrixTag("M", matrix);
  D3DXMATRIX expected = MatrixOf(-1.0f, -1.0f);
  for (int i = 0; i < 4; ++i)
    expected.m[0][i] = static_cast<float>(i + 1);
  EXPECT_EQ(matrix, expected);

  text = "<M Type=\"Mat\">1 2 3 4,5 6 7 8 ,9</M>";
  Access::StartReading(text);
  matrix = MatrixOf(-1.0f, -1.0f);
  Access::XML_MatrixTag("M", matrix);
  for (int i = 4; i < 8; ++i)
    expected.m[1][i - 4] = static_cast<float>(i + 1);
  EXPECT_EQ(matrix, expected);

  text = "<Other Type=\"Mat\"> 1 </Other>";
  Access::StartReading(text);
  Access::XML_MatrixTag("M", matrix);
  EXPECT_EQ(matrix, D3DXMATRIX{});
}

TEST(ElementTagsTest, OpeningIdTagSearchesOnlyForTheFirstEntry) {
  std::string text = "<Other><Items id=\"5\">";
  Access::StartReading(text);
  EXPECT_TRUE(Access::XML_OpeningIDTag("Items", 0));
  EXPECT_EQ(Access::Cursor(), static_cast<int>(text.size()));
  EXPECT_EQ(Access::TreeDepth(), 1);

  Access::StartReading(text);
  EXPECT_FALSE(Access::XML_OpeningIDTag("Items", 1));
  EXPECT_EQ(Access::Cursor(), 0);
  EXPECT_EQ(Access::TreeDepth(), 0);
}

TEST(ElementTagsTest, ClosingAndOpeningTagsPassOverWhatTheyDoNotWant) {
  const struct {
    const char* text;
    bool opening;
    int cursor;
  } cases[] = {
      {"</Name></Sub></Items>tail", false, 21},
      {"</Name></Sub>", false, 13},  // no such tag: the search ends at the text's end
      {"<A><B><Items id=\"2\">tail", true, 20},
      {"<A>", true, 3},
  };
  for (const auto& c : cases) {
    std::string text = c.text;
    Access::StartReading(text);
    if (c.opening) {
      EXPECT_TRUE(Access::XML_OpeningTag("Items"));
    } else {
      Access::XML_ClosingTag("Items");
    }
    EXPECT_EQ(Access::Cursor(), c.cursor) << c.text;
  }
}

}  // namespace
