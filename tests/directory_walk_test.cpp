#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <limits>
#include <string>
#include <vector>

#include "tests/data_package_access.h"
#include "tests/test_tree.h"

namespace {

using Link = Lum_DataPackage::Link;

std::size_t Occurrences(const std::string& text, const std::string& pattern) {
  std::size_t count = 0;
  for (std::size_t at = text.find(pattern); at != std::string::npos;
       at = text.find(pattern, at + 1)) {
    ++count;
  }
  return count;
}

TEST(DirectoryWalkTest, CountDecidesHowEntriesAreWritten) {
  const float nan = std::numeric_limits<float>::quiet_NaN();
  const float inf = std::numeric_limits<float>::infinity();
  const struct {
    float count;  // NaN-free sentinel 99 means "no Count child"
    const char* package;
    float indexAfter;
  } cases[] = {
      {99.0f, "\n<D>\n\t<V Type=\"Val\"> 1 </V>\n</D>", 0.0f},
      {2.9f,
       "\n<D id=\"0\">\n\t<V Type=\"Val\"> 1 </V>\n</D>\n<D id=\"1\">\n\t<V Type=\"Val\"> 1 "
       "</V>\n</D>",
       1.0f},
      {1.0f, "\n<D>\n\t<V Type=\"Val\"> 1 </V>\n</D>", 0.0f},
      {-3.0f, "\n<D>\n\t<V Type=\"Val\"> 1 </V>\n</D>", 0.0f},
      {0.0f, "\n<D>\n</D>", -1.0f},
      {0.9f, "\n<D>\n</D>", -1.0f},
      {-0.5f, "\n<D>\n</D>", -1.0f},
      {nan, "\n<D>\n\t<V Type=\"Val\"> 1 </V>\n</D>", 0.0f},
      {-inf, "\n<D>\n\t<V Type=\"Val\"> 1 </V>\n</D>", 0.0f},
  };
  for (const auto& c : cases) {
    TestTree tree;
    Lum_DataPackage* directory = tree.Directory("D");
    if (c.count != 99.0f) tree.Count(directory, c.count);
    Lum_ValueChannel* index = tree.CurrentIndex(directory);
    tree.Value(directory, "V", 1.0f);
    EXPECT_EQ(WritePackage(*directory), c.package) << c.count;
    EXPECT_EQ(index->GetValue(), c.indexAfter) << c.count;
  }
}

TEST(DirectoryWalkTest, ChildrenShapeTheElement) {
  TestTree tree;
  Lum_DataPackage* unnamed = tree.Directory();
  EXPECT_EQ(WritePackage(*unnamed), "\n<Noname>\n</Noname>");

  // A Tag text too long for the name field is cut to what it holds, alike in both directions.
  const std::string longTag(3000, 'L');
  Lum_DataPackage* longNamed = tree.Directory(longTag.c_str());
  const std::string name(2047, 'L');
  EXPECT_EQ(WritePackage(*longNamed), "\n<" + name + ">\n</" + name + ">");

  // Channels of no packed kind are skipped, and so are empty positions.
  Lum_DataPackage* skipping = tree.Directory("S");
  tree.Attach(skipping, Link::kDataLink, tree.Make<Lum_CallbackChannel>());
  skipping->SetChildAtLinkPosition(Link::kDataLink, 2, nullptr);
  tree.Text(skipping, "T", "t");
  EXPECT_EQ(WritePackage(*skipping), "\n<S>\n\t<T Type=\"Txt\"> t </T>\n</S>");

  // A DataDirectory on the Data link is a text: its own string.
  Lum_DataPackage* nested = tree.Directory("N");
  Lum_DataPackage* asData = tree.Directory("ignored");
  asData->SetChannelName("Header");
  asData->SetString("h");
  tree.Attach(nested, Link::kDataLink, asData);
  EXPECT_EQ(WritePackage(*nested), "\n<N>\n\t<Header Type=\"Txt\"> h </Header>\n</N>");
}

TEST(DirectoryWalkTest, MissingStringsReadAsEmpty) {
  struct NullText : Lum_StringChannel {
    const char* GetString() override { return nullptr; }
  };
  struct NullHeader : Lum_DataPackage {
    const char* GetString() override { return nullptr; }
  };
  TestTree tree;
  auto* directory = tree.Make<NullHeader>();
  tree.Attach(directory, Link::kTagLink, tree.Make<NullText>());
  auto* text = tree.Attach(directory, Link::kDataLink, tree.Make<NullText>());
  text->SetChannelName("T");
  EXPECT_EQ(WritePackage(*directory), "\n<Noname>\n\t<T Type=\"Txt\">  </T>\n</Noname>");
}

TEST(DirectoryWalkTest, OverlongNamesAndTextsAreWrittenWholeButNotReadBack) {
  TestTree tree;
  Lum_DataPackage* directory = tree.Directory("D");
  const std::string fits(2047, 'f');
  const std::string tooLong(2048, 'x');
  Lum_StringChannel* fitting = tree.Text(directory, fits.c_str(), fits.c_str());
  Lum_StringChannel* longText = tree.Text(directory, "Long", tooLong.c_str());
  Lum_ValueChannel* longName = tree.Value(directory, tooLong.c_str(), 5);
  Lum_ValueChannel* after = tree.Value(directory, "After", 6);
  const std::string package = WritePackage(*directory);
  EXPECT_NE(package.find("> " + tooLong + " </Long>"), std::string::npos);
  EXPECT_NE(package.find("<" + tooLong + " Type=\"Val\"> 5 </" + tooLong + ">"), std::string::npos);

  fitting->SetString("");
  after->SetValue(0);
  ReadPackage(*directory, package);
  EXPECT_EQ(fitting->GetString(), fits);
  EXPECT_STREQ(longText->GetString(), "");
  EXPECT_EQ(longName->GetValue(), 0.0f);
  EXPECT_EQ(after->GetValue(), 0.0f);  // the unread element stands in its way
}

TEST(DirectoryWalkTest, CountsBeyondAnyBufferStopOnceTheSizeSaturates) {
  TestTree tree;
  Lum_DataPackage* directory = tree.Directory("D");
  tree.Count(directory, std::numeric_limits<float>::infinity());
  Lum_ValueChannel* index = tree.CurrentIndex(directory);
  const std::string megabyte(1 << 20, 'm');
  tree.Text(directory, "T", megabyte.c_str());
  EXPECT_EQ(directory->WriteToBuffer(nullptr, 0, true, false), 2147483647);
  EXPECT_EQ(index->GetValue(), 2047.0f);
}

TEST(DirectoryWalkTest, SubDirectoriesRepeatInsideEveryEntry) {
  TestTree tree;
  Lum_DataPackage* top = tree.Directory("Top");
  tree.Count(top, 2);
  Lum_DataPackage* sub = tree.SubDirectory(top, "Sub");
  tree.Value(sub, "V", 3);
  tree.SubDirectory(top, "Empty");
  tree.Count(tree.SubDirectory(sub, "Deep"), 0);
  const std::string entry =
      "\n\t<Sub>\n\t\t<V Type=\"Val\"> 3 </V>\n\t\t<Deep>\n\t\t</Deep>\n\t</Sub>"
      "\n\t<Empty>\n\t</Empty>";
  EXPECT_EQ(WritePackage(*top),
            "\n<Top id=\"0\">" + entry + "\n</Top>\n<Top id=\"1\">" + entry + "\n</Top>");
}

// Records what the walk does to the channels, in order.
struct Journal {
  std::vector<std::string> events;

  struct Value : Lum_ValueChannel {
    Journal* journal = nullptr;
    std::string label;
    float GetValue() override {
      journal->events.push_back("get " + label);
      return Lum_ValueChannel::GetValue();
    }
    void SetValue(float value) override {
      journal->events.push_back(label + "=" + std::to_string(static_cast<int>(value)));
      Lum_ValueChannel::SetValue(value);
    }
  };

  Value* Make(TestTree& tree, Lum_DataPackage* directory, int link, std::string label) {
    auto* value = tree.Attach(directory, link, tree.Make<Value>());
    value->journal = this;
    value->label = std::move(label);
    value->SetChannelName(value->label.c_str());
    return value;
  }
};

TEST(DirectoryWalkTest, EffectsComeInEntryOrder) {
  Journal journal;
  TestTree tree;
  Lum_DataPackage* top = tree.Directory("Top");
  tree.Count(top, 2);
  journal.Make(tree, top, Link::kCurrentIndexLink, "index");
  tree.CallEachIteration(top, [&] { journal.events.push_back("call"); });
  journal.Make(tree, top, Link::kDataLink, "data");
  Lum_DataPackage* sub = tree.SubDirectory(top, "Sub");
  journal.Make(tree, sub, Link::kCurrentIndexLink, "subindex");

  std::string package(200, '\0');
  journal.events.clear();
  top->WriteToBuffer(package.data(), 200, true, false);
  package.resize(package.find('\0'));
  const std::vector<std::string> written = {
      "index=0", "call", "get data", "subindex=0", "index=1", "call", "get data", "subindex=0",
  };
  EXPECT_EQ(journal.events, written);

  journal.events.clear();
  ReadPackage(*top, package);
  // The sub-directory's entries hold nothing, so each reads as an empty element.
  const std::vector<std::string> read = {
      "index=0", "data=0",     "subindex=0", "call",    "index=1",
      "data=0",  "subindex=0", "call",       "index=2",
  };
  EXPECT_EQ(journal.events, read);
}

TEST(DirectoryWalkTest, OnlyTheFirstPositionOfCallEachIterationIsCalled) {
  TestTree tree;
  Lum_DataPackage* directory = tree.Directory("D");
  int first = 0;
  int second = 0;
  tree.CallEachIteration(directory, [&] { ++first; });
  tree.CallEachIteration(directory, [&] { ++second; });
  directory->WriteToBuffer(nullptr, 0, true, false);
  EXPECT_EQ(first, 1);
  EXPECT_EQ(second, 0);

  directory->SetChildAtLinkPosition(Link::kCallEachIterationLink, 0, nullptr);
  directory->WriteToBuffer(nullptr, 0, true, false);
  EXPECT_EQ(first + second, 1);
}

TEST(DirectoryWalkTest, ReadingFillsEntriesAndCountsThem) {
  TestTree tree;
  Lum_DataPackage* directory = tree.Directory("D");
  Lum_ValueChannel* count = tree.Count(directory, 5);
  Lum_ValueChannel* index = tree.CurrentIndex(directory);
  Lum_ValueChannel* first = tree.Value(directory, "A");
  Lum_ValueChannel* second = tree.Value(directory, "B");
  std::vector<std::pair<float, float>> entries;
  tree.CallEachIteration(directory,
                         [&] { entries.emplace_back(first->GetValue(), second->GetValue()); });

  const struct {
    const char* package;
    std::vector<std::pair<float, float>> entries;
  } cases[] = {
      // A Value element without a number takes what the previous one of the entry received.
      {"<D id=\"0\"><A Type=\"Val\"> 5 </A><B Type=\"Val\"> x </B></D>"
       "<D id=\"0\"><A Type=\"Val\"> y </A><B Type=\"Val\"> 2 </B></D>",
       {{5, 5}, {0, 2}}},
      // Missing elements get defaults; ids are not read; a later entry needs an id.
      {"<D id=\"7\"><B Type=\"Val\"> 1 </B></D><D id=\"7\"><A Type=\"Val\"> 3 </A></D><D></D>",
       {{0, 1}, {3, 0}}},
      // An extra element gives the channels after it their defaults.
      {"<D><X Type=\"Val\"> 9 </X><A Type=\"Val\"> 4 </A><B Type=\"Val\"> 6 </B></D>", {{0, 0}}},
      {"no directory here", {}},
      {"<D>\n</D>", {}},
  };
  for (const auto& c : cases) {
    entries.clear();
    first->SetValue(-1);
    ReadPackage(*directory, c.package);
    EXPECT_EQ(entries, c.entries) << c.package;
    EXPECT_EQ(count->GetValue(), static_cast<float>(c.entries.size())) << c.package;
    EXPECT_EQ(index->GetValue(), static_cast<float>(c.entries.size())) << c.package;
  }
}

TEST(DirectoryWalkTest, ReadingLooksAtWhatEndsAnEntryAndStartsEachEntryAfresh) {
  TestTree tree;
  Lum_DataPackage* directory = tree.Directory("Sub");
  Lum_ValueChannel* count = tree.Count(directory, 0);
  Lum_ValueChannel* subtotal = tree.Value(directory, "xSubtotal");
  Lum_VectorChannel* vector = tree.Vector(directory, "P");
  Lum_MatrixChannel* matrix = tree.Matrix(directory, "M");
  std::vector<D3DXVECTOR3> vectors;
  std::vector<D3DXMATRIX> matrices;
  tree.CallEachIteration(directory, [&] {
    vectors.push_back(vector->GetVector());
    matrices.push_back(matrix->GetMatrix());
  });
  ReadPackage(*directory,
              "<Sub id=\"0\"><xSubtotal Type=\"Val\"> 3 </xSubtotal>"
              "<P Type=\"Vec\"> 1 2 3 </P><M Type=\"Mat\"> 1 2 3 4, 5 6 7 8, 9 8 7 6, 5 4 3 2 </M>"
              "</Sub><Sub id=\"1\"><P Type=\"Vec\"> 4 </P><M Type=\"Mat\"> 9 </M></Sub>");
  // A first element whose name holds the directory's name is data, not the end of the entry.
  EXPECT_EQ(count->GetValue(), 2.0f);
  EXPECT_EQ(subtotal->GetValue(), 0.0f);  // the second entry has none
  ASSERT_EQ(vectors.size(), 2u);
  // What an element leaves unread is zero, not what the entry before held.
  EXPECT_EQ(vectors[1], (D3DXVECTOR3{4, 0, 0}));
  D3DXMATRIX nine{};
  nine.m[0][0] = 9;
  EXPECT_EQ(matrices[1], nine);
}

TEST(DirectoryWalkTest, ReadingStopsAt9999Entries) {
  TestTree tree;
  Lum_DataPackage* directory = tree.Directory("D");
  tree.Count(directory, 10000);
  tree.Value(directory, "V", 1);
  const std::string package = WritePackage(*directory);

  TestTree readTree;
  Lum_DataPackage* reader = readTree.Directory("D");
  Lum_ValueChannel* count = readTree.Count(reader, 0);
  Lum_ValueChannel* index = readTree.CurrentIndex(reader);
  int calls = 0;
  readTree.CallEachIteration(reader, [&] { ++calls; });
  const int advanced = ReadPackage(*reader, package);
  EXPECT_EQ(count->GetValue(), 9999.0f);
  EXPECT_EQ(index->GetValue(), 9998.0f);
  EXPECT_EQ(calls, 9999);
  EXPECT_EQ(package.substr(static_cast<std::size_t>(advanced), 12), "\n<D id=\"9999");
}

TEST(DirectoryWalkTest, QuirksThatStoredPackagesRelyOn) {
  TestTree tree;
  Lum_DataPackage* top = tree.Directory("Top");
  Lum_DataPackage* first = tree.SubDirectory(top, "Same");
  Lum_DataPackage* second = tree.SubDirectory(top, "Same");
  Lum_ValueChannel* firstCount = tree.Count(first, 2);
  Lum_ValueChannel* secondCount = tree.Count(second, 3);
  tree.Value(first, "V", 1);
  tree.Value(second, "V", 2);
  const std::string package = WritePackage(*top);
  ReadPackage(*top, package);
  // Same-named siblings with several entries merge: ids are not read.
  EXPECT_EQ(firstCount->GetValue(), 5.0f);
  EXPECT_EQ(secondCount->GetValue(), 0.0f);

  // A header holding a "<" without ">" hides the first entry.
  Lum_DataPackage* hidden = tree.Directory("H");
  Lum_ValueChannel* hiddenCount = tree.Count(hidden, 3);
  hidden->SetString("header <");
  const std::string withHeader = WritePackage(*hidden);
  ReadPackage(*hidden, withHeader);
  EXPECT_EQ(hiddenCount->GetValue(), 2.0f);
}

TEST(DirectoryWalkTest, CyclesAndDeepChainsEndWithinTheNestingBound) {
  TestTree tree;
  Lum_DataPackage* top = tree.Directory("A");
  Lum_DataPackage* child = tree.SubDirectory(top, "B");
  tree.Attach(child, Link::kSubDirectoriesLink, top);    // an ancestor
  tree.Attach(child, Link::kSubDirectoriesLink, child);  // itself
  tree.Value(child, "V", 1);
  const std::string package = WritePackage(*top);
  EXPECT_EQ(package, "\n<A>\n\t<B>\n\t\t<V Type=\"Val\"> 1 </V>\n\t</B>\n</A>");
  EXPECT_EQ(ReadPackage(*top, package), static_cast<int>(package.size()));

  // A chain deeper than the indentation can show is walked down to its bound.
  Lum_DataPackage* chain = tree.Directory("C");
  Lum_DataPackage* link = chain;
  for (int i = 0; i < 10000; ++i)
    link = tree.SubDirectory(link, "C");
  const std::string deep = WritePackage(*chain);
  const int bound = Lum_DataPackage::kMaxNesting;
  EXPECT_EQ(Occurrences(deep, "<C>"), static_cast<std::size_t>(bound));
  EXPECT_EQ(deep.substr(deep.size() - 4), "</C>");
  EXPECT_NE(deep.find("\n" + std::string(bound - 1, '\t') + "<C>"), std::string::npos);
  EXPECT_EQ(deep.find("\n" + std::string(bound, '\t') + "<C>"), std::string::npos);
  // The deepest directory walked has an entry without content: it reads as an empty element, so
  // its closing tag closes its parent and the last one stays unread.
  EXPECT_EQ(ReadPackage(*chain, deep), static_cast<int>(deep.size() - std::strlen("\n</C>")));
}

}  // namespace
