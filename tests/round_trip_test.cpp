#include <gtest/gtest.h>

#include <clocale>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "tests/allocation_counter.h"
#include "tests/test_tree.h"

namespace {

// One entry's values as the "Call each iteration" channel hands them out or collects them.
struct Entry {
  std::string text;
  float value;
  D3DXVECTOR3 vector;
  D3DXMATRIX matrix;
  std::vector<std::string> subTexts;  // one per entry of the sub-directory
  bool operator==(const Entry& other) const {
    return text == other.text && value == other.value && vector == other.vector &&
           matrix == other.matrix && subTexts == other.subTexts;
  }
};

// A directory with every kind of data and a repeating sub-directory inside each entry.
struct Catalogue {
  TestTree tree;
  Lum_DataPackage* top = tree.Directory("Catalogue");
  Lum_ValueChannel* count = tree.Count(top, 0);
  Lum_ValueChannel* index = tree.CurrentIndex(top);
  Lum_StringChannel* text = tree.Text(top, "Title");
  Lum_ValueChannel* value = tree.Value(top, "Price");
  Lum_VectorChannel* vector = tree.Vector(top, "Place");
  Lum_MatrixChannel* matrix = tree.Matrix(top, "Pose");
  Lum_DataPackage* sub = tree.SubDirectory(top, "Tags");
  Lum_ValueChannel* subCount = tree.Count(sub, 0);
  Lum_ValueChannel* subIndex = tree.CurrentIndex(sub);
  Lum_StringChannel* subText = tree.Text(sub, "Tag");
  std::vector<Entry> entries;
  std::vector<std::string> subTexts;  // of the entry being read

  // Supplies `entries` when writing.
  void Supply() {
    count->SetValue(static_cast<float>(entries.size()));
    tree.CallEachIteration(top, [this] {
      const Entry& entry = entries[static_cast<std::size_t>(index->GetValue())];
      text->SetString(entry.text.c_str());
      value->SetValue(entry.value);
      vector->SetVector(entry.vector);
      matrix->SetMatrix(entry.matrix);
      subCount->SetValue(static_cast<float>(entry.subTexts.size()));
    });
    tree.CallEachIteration(sub, [this] {
      const Entry& entry = entries[static_cast<std::size_t>(index->GetValue())];
      subText->SetString(entry.subTexts[static_cast<std::size_t>(subIndex->GetValue())].c_str());
    });
  }

  // Collects into `entries` when reading.
  void Collect() {
    tree.CallEachIteration(sub, [this] { subTexts.push_back(subText->GetString()); });
    tree.CallEachIteration(top, [this] {
      entries.push_back({text->GetString(), value->GetValue(), vector->GetVector(),
                         matrix->GetMatrix(), subTexts});
      subTexts.clear();
    });
  }
};

std::vector<Entry> SampleEntries() {
  return {
      {"first", 12.5f, {1, 2.5f, -3}, MatrixOf(0.25f, 0.5f), {"a", "b", "c"}},
      {"Second one", -0.001f, {1e-7f, 3e12f, 0}, MatrixOf(-1000, 333), {"only"}},
      {"x<y>z & w", 1234560.0f, {0, -0.0f, 7}, MatrixOf(1, 0), {}},
      {"", 0, {}, {}, {"", "line\nbreak"}},
  };
}

TEST(RoundTripTest, EveryKindComesBackWithBothNewlinesScrambledOrNot) {
  for (bool lineFeeds : {true, false}) {
    for (bool scramble : {false, true}) {
      Catalogue writer;
      writer.entries = SampleEntries();
      writer.Supply();
      const std::string package = WritePackage(*writer.top, lineFeeds, scramble);

      Catalogue reader;
      reader.Collect();
      ReadPackage(*reader.top, package, scramble);
      EXPECT_EQ(reader.entries.size(), 4u);
      EXPECT_TRUE(reader.entries == SampleEntries())
          << "lineFeeds " << lineFeeds << " scramble " << scramble;
      EXPECT_EQ(reader.count->GetValue(), 4.0f);
    }
  }
}

TEST(RoundTripTest, NumbersIgnoreTheHostsLocale) {
  // A decimal-comma locale must exist here: the set-up installs one.
  const char* const locales[] = {"de_DE.UTF-8", "de_DE.utf8", "German_Germany.1252"};
  const char* chosen = nullptr;
  for (const char* name : locales) {
    if (std::setlocale(LC_ALL, name)) {
      chosen = name;
      break;
    }
  }
  ASSERT_NE(chosen, nullptr) << "no decimal-comma locale installed";
  char probe[16];
  std::snprintf(probe, sizeof(probe), "%g", 12.5);
  EXPECT_STREQ(probe, "12,5") << chosen;

  Catalogue writer;
  writer.entries = SampleEntries();
  writer.Supply();
  const std::string package = WritePackage(*writer.top);
  Catalogue reader;
  reader.Collect();
  ReadPackage(*reader.top, package);
  std::setlocale(LC_ALL, "C");
  EXPECT_NE(package.find("> 12.5 <"), std::string::npos);
  EXPECT_TRUE(reader.entries == SampleEntries());
}

TEST(RoundTripTest, ReadsAPackageWithoutNulAtTheEndOfItsAllocation) {
  Catalogue writer;
  writer.entries = SampleEntries();
  writer.Supply();
  const std::string package = WritePackage(*writer.top);
  // Every cut leaves a text that ends without a NUL exactly where its allocation ends.
  for (std::size_t cut : {package.size(), package.size() - 1, package.size() / 2, std::size_t{1}}) {
    Catalogue reader;
    reader.Collect();
    const int advanced = ReadPackage(*reader.top, package.substr(0, cut));
    EXPECT_LE(advanced, static_cast<int>(cut));
  }
}

TEST(RoundTripTest, PackageOperationsAllocateNothing) {
  Catalogue writer;
  for (int i = 0; i < 500; ++i) {
    writer.entries.push_back({"entry text number " + std::to_string(i),
                              static_cast<float>(i) / 7,
                              {1, 2, 3},
                              MatrixOf(static_cast<float>(i), 0.5f),
                              {"sub text that is long enough to need the heap", "b"}});
  }
  writer.Supply();
  const int size = writer.top->WriteToBuffer(nullptr, 0, true, false);
  std::vector<char> buffer(static_cast<std::size_t>(size));
  writer.top->WriteToBuffer(buffer.data(), size, true, true);  // warms the channels up
  const std::size_t beforeWrite = allocation_counter::Count();
  writer.top->WriteToBuffer(buffer.data(), size, true, true);
  EXPECT_EQ(allocation_counter::Count() - beforeWrite, 0u);

  // Reading a second time: the channels' own storage has grown to its size already.
  std::vector<char> copy = buffer;
  writer.top->ReadFromBuffer(copy.data(), size, true, true);
  const std::size_t beforeRead = allocation_counter::Count();
  writer.top->ReadFromBuffer(buffer.data(), size, true, true);
  EXPECT_EQ(allocation_counter::Count() - beforeRead, 0u);
}

}  // namespace
