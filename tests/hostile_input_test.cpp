// What the tree holds after reading or writing what no well-behaved caller hands over.
#include <gtest/gtest.h>

#include <limits>
#include <random>
#include <string>
#include <vector>

#include "tests/test_tree.h"

namespace {

// A directory of named entries, each with a score and a sub-directory of two tags.
struct Roster {
  TestTree tree;
  Lum_DataPackage* top = tree.Directory("Roster");
  Lum_ValueChannel* count = tree.Count(top, 3);
  Lum_ValueChannel* index = tree.CurrentIndex(top);
  Lum_StringChannel* name = tree.Text(top, "Name", "untouched");
  Lum_ValueChannel* score = tree.Value(top, "Score", -1);
  Lum_DataPackage* tags = tree.SubDirectory(top, "Tags");
  Lum_ValueChannel* tagCount = tree.Count(tags, 2);
  Lum_StringChannel* tag = tree.Text(tags, "Tag", "t");
  std::vector<std::pair<std::string, float>> read;

  Roster() {
    tree.CallEachIteration(top, [this] {
      const int i = static_cast<int>(index->GetValue());
      name->SetString(("player " + std::to_string(i)).c_str());
      score->SetValue(static_cast<float>(i) + 0.5f);
    });
  }
  void CollectInstead() {
    top->SetChildAtLinkPosition(Lum_DataPackage::kCallEachIterationLink, 0,
                                tree.Make<Lum_CallbackChannel>([this] {
                                  read.emplace_back(name->GetString(), score->GetValue());
                                }));
  }
};

TEST(HostileInputTest, PackageCutAtEveryByte) {
  Roster writer;
  const std::string package = WritePackage(*writer.top);
  for (std::size_t cut = 0; cut <= package.size(); ++cut) {
    Roster reader;
    reader.CollectInstead();
    const int advanced = ReadPackage(*reader.top, package.substr(0, cut));
    const std::string kept = package.substr(0, cut);
    // An entry counts once its opening tag is whole; it has all its values once it is closed.
    std::size_t opened = 0;
    std::size_t closed = 0;
    for (std::size_t at = kept.find("<Roster id="); at != std::string::npos;
         at = kept.find("<Roster id=", at + 1)) {
      if (kept.find('>', at) != std::string::npos) ++opened;
    }
    for (std::size_t at = kept.find("</Roster>"); at != std::string::npos;
         at = kept.find("</Roster>", at + 1)) {
      ++closed;
    }
    ASSERT_LE(advanced, static_cast<int>(cut));
    ASSERT_EQ(reader.count->GetValue(), static_cast<float>(opened)) << "cut at " << cut;
    ASSERT_EQ(reader.read.size(), opened) << "cut at " << cut;
    for (std::size_t i = 0; i < closed; ++i) {
      ASSERT_EQ(reader.read[i].first, "player " + std::to_string(i)) << "cut at " << cut;
      ASSERT_EQ(reader.read[i].second, static_cast<float>(i) + 0.5f) << "cut at " << cut;
    }
  }
}

TEST(HostileInputTest, RandomBytesFindNoDirectory) {
  std::mt19937 random(3);
  std::string noise(1 << 20, '\0');
  for (char& c : noise)
    c = static_cast<char>(random());
  for (bool unscramble : {false, true}) {
    Roster reader;
    reader.CollectInstead();
    EXPECT_EQ(ReadPackage(*reader.top, noise, unscramble), 0);
    EXPECT_EQ(reader.count->GetValue(), 0.0f);
    EXPECT_EQ(reader.index->GetValue(), 0.0f);
    EXPECT_STREQ(reader.name->GetString(), "untouched");
    EXPECT_TRUE(reader.read.empty());
  }
}

TEST(HostileInputTest, ScramblingMismatchedBetweenWriterAndReader) {
  Roster writer;
  for (bool scrambled : {false, true}) {
    const std::string package = WritePackage(*writer.top, true, scrambled);
    Roster reader;
    reader.CollectInstead();
    ReadPackage(*reader.top, package, !scrambled);
    EXPECT_EQ(reader.count->GetValue(), 0.0f) << scrambled;
    EXPECT_STREQ(reader.name->GetString(), "untouched") << scrambled;
    EXPECT_TRUE(reader.read.empty()) << scrambled;
  }
}

TEST(HostileInputTest, HundredThousandCharacterNamesTextsAndHeaders) {
  const std::string huge(100000, 'h');
  Roster writer;
  writer.top->SetString(huge.c_str());
  writer.name->SetChannelName(huge.c_str());
  writer.tag->SetString(huge.c_str());
  writer.CollectInstead();  // keeps the name channel's huge name from being renamed
  const std::string package = WritePackage(*writer.top);
  EXPECT_EQ(package.find(huge + "\n"), std::string::npos);            // no header
  EXPECT_NE(package.find("<" + huge + " Type="), std::string::npos);  // the name, whole
  EXPECT_NE(package.find("> " + huge + " </Tag>"), std::string::npos);

  Roster reader;
  reader.name->SetChannelName(huge.c_str());
  reader.CollectInstead();
  ReadPackage(*reader.top, package);
  EXPECT_EQ(reader.count->GetValue(), 3.0f);
  ASSERT_EQ(reader.read.size(), 3u);
  EXPECT_EQ(reader.read[0].first, "");        // a name that long never matches: the default
  EXPECT_EQ(reader.read[0].second, 0.0f);     // its element stands before the score's
  EXPECT_STREQ(reader.tag->GetString(), "");  // a text that long reads as empty
  EXPECT_EQ(reader.tagCount->GetValue(), 2.0f);
}

TEST(HostileInputTest, CountsThatNoIntHolds) {
  const float inf = std::numeric_limits<float>::infinity();
  const std::string megabyte(1 << 20, 'm');
  const int oneEntry =
      static_cast<int>(sizeof("\n<D>\n\t<T Type=\"Txt\">  </T>\n</D>") + megabyte.size());
  const struct {
    float count;
    int required;  // of a directory holding a 1 MB text
    float indexAfter;
  } cases[] = {
      {std::numeric_limits<float>::quiet_NaN(), oneEntry, 0},
      {-inf, oneEntry, 0},
      {-1e12f, oneEntry, 0},
      {inf, 2147483647, 2047},
      {1e12f, 2147483647, 2047},
  };
  for (const auto& c : cases) {
    TestTree tree;
    Lum_DataPackage* directory = tree.Directory("D");
    Lum_ValueChannel* count = tree.Count(directory, c.count);
    Lum_ValueChannel* index = tree.CurrentIndex(directory);
    tree.Text(directory, "T", megabyte.c_str());
    EXPECT_EQ(directory->WriteToBuffer(nullptr, 0, true, false), c.required) << c.count;
    EXPECT_EQ(index->GetValue(), c.indexAfter) << c.count;

    // Reading sets Count to what it found, whatever it held.
    ReadPackage(*directory, "<D><T Type=\"Txt\"> x </T></D>");
    EXPECT_EQ(count->GetValue(), 1.0f) << c.count;
  }
}

}  // namespace
