#include <gtest/gtest.h>

#include "host/callback_channel.h"
#include "host/matrix_channel.h"
#include "host/value_channel.h"
#include "host/vector_channel.h"
#include "tests/plugins.h"

namespace {

using Link = Lum_DataPackage::Link;

int PositionCounts(Vorn_Channel& channel) {
  int total = 0;
  for (int link = -1; link < 8; ++link)
    total += channel.GetChildLinkPositionCount(link);
  return total;
}

TEST(AttachTest, LinksTakeOnlyWhatTheirRecordsAdmit) {
  plugins::Directory directory = plugins::NewDirectory();
  plugins::Directory subDirectory = plugins::NewDirectory();
  Lum_StringChannel text;
  Lum_ValueChannel value;
  Lum_VectorChannel vector;
  Lum_MatrixChannel matrix;
  Lum_CallbackChannel callback;
  Lum_DataPackage unloaded;  // created outside the loader: reports the string channel's type

  struct Case {
    const char* what;
    int link;
    Vorn_Channel* child;
    bool accepted;
  };
  const Case cases[] = {
      {"null child", Link::kDataLink, nullptr, false},
      {"link never declared", 6, &value, false},
      {"negative link", -1, &value, false},
      {"value on Tag", Link::kTagLink, &value, false},
      {"directory on Count", Link::kCountLink, subDirectory.get(), false},
      {"text on Sub-Directories", Link::kSubDirectoriesLink, &text, false},
      {"value on Sub-Directories", Link::kSubDirectoriesLink, &value, false},
      {"unregistered directory on Sub-Directories", Link::kSubDirectoriesLink, &unloaded, false},
      {"text on Tag", Link::kTagLink, &text, true},
      {"value on Count", Link::kCountLink, &value, true},
      {"value on currrent index", Link::kCurrentIndexLink, &value, true},
      {"vector on Data", Link::kDataLink, &vector, true},
      {"matrix on Data", Link::kDataLink, &matrix, true},
      {"directory on Data", Link::kDataLink, subDirectory.get(), true},
      {"directory on Sub-Directories", Link::kSubDirectoriesLink, subDirectory.get(), true},
      {"callback on Call each iteration", Link::kCallEachIterationLink, &callback, true},
  };
  for (const Case& c : cases) {
    const int positions = PositionCounts(*directory);
    EXPECT_EQ(directory->AttachChild(c.link, c.child), c.accepted) << c.what;
    EXPECT_EQ(PositionCounts(*directory), positions + (c.accepted ? 1 : 0)) << c.what;
    EXPECT_EQ(directory->SetChildAtLinkPosition(c.link, 9, c.child), c.accepted || !c.child)
        << c.what;
    if (c.accepted || (!c.child && c.link == Link::kDataLink)) {
      EXPECT_EQ(directory->GetChildFromLinkPosition(c.link, 9), c.child) << c.what;
      directory->SetChildAtLinkPosition(c.link, 9, nullptr);
    }
  }
}

TEST(AttachTest, PositionsGrowEmptyAndCanBeEmptied) {
  plugins::Directory directory = plugins::NewDirectory();
  Lum_ValueChannel first;
  Lum_ValueChannel second;
  ASSERT_TRUE(directory->AttachChild(Link::kDataLink, &first));
  ASSERT_TRUE(directory->SetChildAtLinkPosition(Link::kDataLink, 3, &second));
  EXPECT_EQ(directory->GetChildLinkPositionCount(Link::kDataLink), 4);
  EXPECT_EQ(directory->GetChildFromLinkPosition(Link::kDataLink, 0), &first);
  EXPECT_EQ(directory->GetChildFromLinkPosition(Link::kDataLink, 1), nullptr);
  EXPECT_EQ(directory->GetChildFromLinkPosition(Link::kDataLink, 3), &second);
  EXPECT_EQ(directory->GetChildFromLinkPosition(Link::kDataLink, 4), nullptr);
  EXPECT_EQ(directory->GetChildFromLinkPosition(Link::kDataLink, -1), nullptr);

  EXPECT_FALSE(directory->SetChildAtLinkPosition(Link::kDataLink, -1, &first));
  EXPECT_TRUE(directory->SetChildAtLinkPosition(Link::kDataLink, 0, nullptr));
  EXPECT_EQ(directory->GetChild(Link::kDataLink), nullptr);
  EXPECT_EQ(directory->GetChildLinkPositionCount(Link::kDataLink), 4);

  ASSERT_TRUE(directory->AttachChild(Link::kDataLink, &first));
  EXPECT_EQ(directory->GetChildFromLinkPosition(Link::kDataLink, 4), &first);
}

TEST(AttachTest, RecordsBeyondTheDeclaredCountAreKept) {
  Vorn_Channel channel;
  channel.SetChildCreationCount(1);
  ChildCreation record;
  record.childType.typeGuid = kValueChannelGuid;
  channel.SetChildCreateType(record, 3);
  Lum_ValueChannel value;
  Lum_VectorChannel vector;
  EXPECT_EQ(channel.GetChildCreateType(0), nullptr);
  EXPECT_FALSE(channel.AttachChild(0, &value));
  EXPECT_TRUE(channel.AttachChild(3, &value));
  EXPECT_FALSE(channel.AttachChild(3, &vector));
}

}  // namespace
