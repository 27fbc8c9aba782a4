#include <gtest/gtest.h>

#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "tests/data_package_access.h"
#include "tests/test_tree.h"

namespace {

using Access = DataPackageTestAccess;

// The Players tree: two entries whose Name and Score come from the "Call each iteration" channel.
struct Players {
  TestTree tree;
  Lum_DataPackage* directory = tree.Directory("Players");
  Lum_ValueChannel* index = tree.CurrentIndex(directory);
  Lum_StringChannel* name = tree.Text(directory, "Name");
  Lum_ValueChannel* score = tree.Value(directory, "Score");

  Players() {
    tree.Count(directory, 2);
    tree.CallEachIteration(directory, [this] {
      const bool first = index->GetValue() == 0.0f;
      name->SetString(first ? "Ann" : "Bob");
      score->SetValue(first ? 12.5f : 7.0f);
    });
  }
};

constexpr char kPlayersPackage[] =
    "\n<Players id=\"0\">\n\t<Name Type=\"Txt\"> Ann </Name>\n\t<Score Type=\"Val\"> 12.5 </Score>"
    "\n</Players>\n<Players id=\"1\">\n\t<Name Type=\"Txt\"> Bob </Name>"
    "\n\t<Score Type=\"Val\"> 7 </Score>\n</Players>";

std::string WithCrLf(std::string text) {
  for (std::size_t at = text.find('\n'); at != std::string::npos; at = text.find('\n', at + 2)) {
    text.insert(at, 1, '\r');
  }
  return text;
}

TEST(EntryPointsTest, WritesThePlayersPackage) {
  Players players;
  std::vector<char> buffer(512, '#');
  EXPECT_EQ(players.directory->WriteToBuffer(buffer.data(), 512, true, false), 184);
  EXPECT_STREQ(buffer.data(), kPlayersPackage);
  EXPECT_EQ(players.directory->WriteToBuffer(buffer.data(), 512, false, false), 192);
  EXPECT_EQ(std::string(buffer.data()), WithCrLf(kPlayersPackage));
}

TEST(EntryPointsTest, ReportsTheSizeAndKeepsWholeAppendsWhenTooSmall) {
  TestTree tree;
  Lum_DataPackage* empty = tree.Directory();
  char one[1] = {'#'};
  EXPECT_EQ(empty->WriteToBuffer(one, 1, true, false), 20);
  EXPECT_EQ(one[0], '\0');
  EXPECT_EQ(empty->WriteToBuffer(one, 1, false, false), 22);

  Players players;
  const struct {
    int size;
    std::string text;
  } cases[] = {
      {184, kPlayersPackage},
      {183, std::string(kPlayersPackage, 183 - 11)},  // the last closing tag is missing whole
      {18, std::string(kPlayersPackage, 17)},
      {17, ""},  // only the empty header fitted
  };
  for (const auto& c : cases) {
    std::string buffer(static_cast<std::size_t>(c.size), '#');
    EXPECT_EQ(players.directory->WriteToBuffer(buffer.data(), c.size, true, false), 184);
    EXPECT_EQ(std::string(buffer.c_str()), c.text) << c.size;
  }

  // No buffer, or a negative size, only measures.
  std::string untouched(8, '#');
  EXPECT_EQ(players.directory->WriteToBuffer(nullptr, 100, true, false), 184);
  EXPECT_EQ(players.directory->WriteToBuffer(untouched.data(), -5, true, true), 184);
  EXPECT_EQ(untouched, std::string(8, '#'));
}

TEST(EntryPointsTest, HeaderIsWrittenVerbatimWhenItFits) {
  TestTree tree;
  Lum_DataPackage* directory = tree.Directory("D");
  const std::string fits(2047, 'h');
  directory->SetString(fits.c_str());
  EXPECT_EQ(WritePackage(*directory), fits + "\n<D>\n</D>");
  directory->SetString((fits + "h").c_str());
  EXPECT_EQ(WritePackage(*directory), "\n<D>\n</D>");
  directory->SetString("<?head?>\r\n");
  EXPECT_EQ(WritePackage(*directory), "<?head?>\r\n\n<D>\n</D>");
}

TEST(EntryPointsTest, ReadingReportsHowFarItAdvanced) {
  Players players;
  const std::string package = WritePackage(*players.directory);
  std::string buffer = package + '\0';
  const int requiredBefore = Access::RequiredSize();
  EXPECT_EQ(players.directory->ReadFromBuffer(buffer.data(), 185, true, false), 184 - 1);
  EXPECT_EQ(Access::RequiredSize(), requiredBefore);

  // An empty top element is not taken: reading stops on its "<".
  TestTree tree;
  Lum_DataPackage* empty = tree.Directory();
  std::string crlf = WritePackage(*empty, false);
  EXPECT_EQ(empty->ReadFromBuffer(crlf.data(), static_cast<int>(crlf.size()), true, false), 2);

  EXPECT_EQ(players.directory->ReadFromBuffer(nullptr, 50, true, true), 0);
  EXPECT_EQ(players.directory->ReadFromBuffer(buffer.data(), -1, true, true), 0);
  EXPECT_EQ(buffer, package + '\0');
}

// k(i) in 64-bit arithmetic, wrapped to 32 bits where the package's rule wraps.
int Amount(std::int64_t i) {
  const auto square = static_cast<std::int32_t>(static_cast<std::uint32_t>(i * i + 5));
  return static_cast<int>(square % static_cast<std::int32_t>(i + 3) - i);
}

TEST(ScramblingTest, AmountsFollowTheWrappingRule) {
  EXPECT_EQ((std::vector<int>{Amount(0), Amount(1), Amount(2), Amount(3), Amount(4), Amount(5),
                              Amount(6), Amount(7), Amount(8), Amount(9), Amount(10), Amount(11)}),
            (std::vector<int>{2, 1, 2, -1, -4, 1, -1, -3, -5, -7, -9, -11}));

  const int length = 200000;
  std::vector<char> zeros(length, 0);
  Access::Any().Encrypt(zeros.data(), length);
  for (int i = 0; i < length; ++i) {
    ASSERT_EQ(static_cast<std::uint8_t>(zeros[i]), static_cast<std::uint8_t>(Amount(i))) << i;
    if (i >= 12 && i <= 46340) {
      ASSERT_EQ(Amount(i), 14 - i);
    }
  }

  char abc[] = "abc";
  Access::Any().Encrypt(abc, 3);
  EXPECT_STREQ(abc, "cce");
  Access::Any().Encrypt(abc, 0);
  Access::Any().Encrypt(abc, -4);
  EXPECT_STREQ(abc, "cce");
}

TEST(ScramblingTest, DecryptUndoesEncryptAtEveryLength) {
  std::mt19937 random(7);
  for (int length : {0, 1, 12, 46340, 46341, 46342, 100000, 131073}) {
    std::vector<char> original(static_cast<std::size_t>(length));
    for (char& c : original)
      c = static_cast<char>(random());
    std::vector<char> data = original;
    Access::Any().Encrypt(data.data(), length);
    if (length > 0) {
      EXPECT_NE(data, original) << length;
    }
    Access::Any().Decrypt(data.data(), length);
    EXPECT_EQ(data, original) << length;
  }
}

TEST(ScramblingTest, ScrambledPackagesReadBackWithUnscrambling) {
  Players players;
  std::vector<char> buffer(400, 'x');
  const int size = players.directory->WriteToBuffer(buffer.data(), 400, true, true);
  ASSERT_EQ(size, 184);
  EXPECT_NE(std::string(buffer.data(), 183), kPlayersPackage);

  std::vector<std::string> names;
  Players reader;
  reader.directory->SetChildAtLinkPosition(
      Lum_DataPackage::kCallEachIterationLink, 0,
      reader.tree.Make<Lum_CallbackChannel>([&] { names.push_back(reader.name->GetString()); }));
  // Unscrambling a larger span changes the bytes after the package too.
  EXPECT_EQ(reader.directory->ReadFromBuffer(buffer.data(), 190, true, true), 183);
  EXPECT_EQ(std::string(buffer.data()), kPlayersPackage);
  EXPECT_EQ(names, (std::vector<std::string>{"Ann", "Bob"}));
  for (int i = 184; i < 190; ++i) {
    EXPECT_EQ(static_cast<std::uint8_t>(buffer[i]), static_cast<std::uint8_t>('x' - Amount(i)));
  }
}

TEST(EntryPointsTest, OperationsStartedInsideAnotherChangeNothing) {
  Players players;
  std::string inner(300, '#');
  int innerWrite = -1;
  int innerRead = -1;
  players.tree.CallEachIteration(players.directory, {});
  players.directory->SetChildAtLinkPosition(
      Lum_DataPackage::kCallEachIterationLink, 0, players.tree.Make<Lum_CallbackChannel>([&] {
        players.name->SetString("Ann");
        players.score->SetValue(12.5f);
        innerWrite = players.directory->WriteToBuffer(inner.data(), 300, true, true);
        innerRead = players.directory->ReadFromBuffer(inner.data(), 300, true, true);
      }));
  const std::string package = WritePackage(*players.directory);
  EXPECT_EQ(innerWrite, 0);
  EXPECT_EQ(innerRead, 0);
  EXPECT_EQ(inner, std::string(300, '#'));
  std::string expected = kPlayersPackage;
  expected.replace(expected.find("Bob"), 3, "Ann");
  expected.replace(expected.find("> 7 <"), 5, "> 12.5 <");
  EXPECT_EQ(package, expected);
}

// A channel's exception passes through the walk to the caller, and every later operation works
// as if it had never happened.
TEST(EntryPointsTest, AnExceptionFromAChannelLeavesLaterOperationsWhole) {
  Players players;
  Lum_DataPackage* sub = players.tree.SubDirectory(players.directory, "Sub");
  players.tree.Text(sub, "Note", "deep");
  bool throwing = true;
  players.tree.CallEachIteration(sub, [&] {
    if (throwing) throw 42;
  });
  std::string buffer(4096, '\0');
  EXPECT_THROW(players.directory->WriteToBuffer(buffer.data(), 4096, true, false), int);
  throwing = false;
  const std::string package = WritePackage(*players.directory);
  EXPECT_NE(package.find("<Note Type=\"Txt\"> deep </Note>"), std::string::npos);

  throwing = true;
  EXPECT_THROW(ReadPackage(*players.directory, package), int);
  throwing = false;
  EXPECT_EQ(ReadPackage(*players.directory, package), static_cast<int>(package.size()));
  EXPECT_EQ(WritePackage(*players.directory), package);
}

}  // namespace
