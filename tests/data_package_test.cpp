#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "host/engine_trace.h"
#include "tests/data_package_access.h"
#include "tests/plugins.h"

namespace {

struct TracedCall {
  std::string operation;
  int argument;
  bool operator==(const TracedCall&) const = default;
};

std::vector<TracedCall> TraceWhile(const std::function<void()>& action) {
  std::vector<TracedCall> calls;
  SetEngineTrace([&](const Vorn_Channel&, std::string_view operation, int argument) {
    calls.push_back({std::string(operation), argument});
  });
  action();
  SetEngineTrace({});
  return calls;
}

ChildCreation ExpectedLink(const char* typeName, const GUID& typeGuid, int linkCode,
                           const char* linkName, int linkMode) {
  ChildCreation record;
  std::strcpy(record.childType.typeName, typeName);
  record.childType.typeGuid = typeGuid;
  record.linkCode = linkCode;
  std::strcpy(record.linkName, linkName);
  record.linkMode = linkMode;
  return record;
}

TEST(DataPackageTest, NewDirectoryDeclaresItsSixLinksAfterItsName) {
  plugins::Directory directory;
  const auto calls = TraceWhile([&] { directory = plugins::NewDirectory(); });
  const std::vector<TracedCall> expected = {
      {"SetChannelName", 0},     {"SetChildCreationCount", 4}, {"SetChildCreateType", 0},
      {"SetChildCreateType", 1}, {"SetChildCreateType", 2},    {"SetChildCreateType", 3},
      {"SetChildCreateType", 4}, {"SetChildCreateType", 5},    {"SetString", 0},
  };
  EXPECT_EQ(calls, expected);

  EXPECT_STREQ(directory->GetChannelName(), "DataDirectory");
  EXPECT_STREQ(directory->GetString(), "");
  EXPECT_EQ(directory->GetChildCreationCount(), 4);

  const ChildCreation links[] = {
      ExpectedLink("Text", kStringChannelGuid, 0, "Tag", 1),
      ExpectedLink("Value", kValueChannelGuid, 1, "Count", 1),
      ExpectedLink("Value", kValueChannelGuid, 2, "currrent index", 2),
      ExpectedLink("All supported Types", kAllSupportedTypesGuid, -1, "Data", 2),
      ExpectedLink("DataDirectory", kDataDirectoryGuid, -1, "Sub-Directories", 2),
      ExpectedLink("All supported Types", kAllSupportedTypesGuid, 5, "Call each iteration", 2),
  };
  for (int link = 0; link < 6; ++link) {
    const ChildCreation* declared = directory->GetChildCreateType(link);
    ASSERT_NE(declared, nullptr) << "link " << link;
    EXPECT_EQ(std::memcmp(declared, &links[link], sizeof(ChildCreation)), 0) << "link " << link;
  }
  EXPECT_EQ(directory->GetChildCreateType(6), nullptr);
}

TEST(DataPackageTest, CopiesCarryTheWholeTagNameAndMakeNoEngineCalls) {
  plugins::Directory source = plugins::NewDirectory();
  char* sourceName = DataPackageTestAccess::TagName(*source);
  for (int i = 0; i < Lum_DataPackage::kTextLength; ++i)
    sourceName[i] = static_cast<char>(i * 7);
  sourceName[3] = '\0';  // bytes after the terminator are copied too
  source->SetString("header");

  std::vector<TracedCall> calls;
  calls = TraceWhile([&] {
    Lum_DataPackage copy(*source);
    EXPECT_EQ(std::memcmp(DataPackageTestAccess::TagName(copy), sourceName, 2048), 0);
    EXPECT_STREQ(copy.GetString(), "header");
  });
  EXPECT_TRUE(calls.empty());

  plugins::Directory target = plugins::NewDirectory();
  *target = *source;
  EXPECT_EQ(std::memcmp(DataPackageTestAccess::TagName(*target), sourceName, 2048), 0);
  EXPECT_STREQ(target->GetString(), "header");
  Lum_DataPackage& self = *target;
  EXPECT_EQ(&(self = *target), target.get());
  EXPECT_EQ(std::memcmp(DataPackageTestAccess::TagName(*target), sourceName, 2048), 0);
}

TEST(DataPackageTest, DestroyedThroughTheChannelBase) {
  const int live = Vorn_Channel::GetLiveChannelCount();
  Vorn_Channel* channel = new Lum_DataPackage;
  Vorn_Channel* copy = new Lum_DataPackage(*static_cast<Lum_DataPackage*>(channel));
  EXPECT_EQ(Vorn_Channel::GetLiveChannelCount(), live + 2);
  delete channel;
  delete copy;
  EXPECT_EQ(Vorn_Channel::GetLiveChannelCount(), live);
}

TEST(StringChannelTest, CopiesTextsOfAnyLengthAndReadsNullAsEmpty) {
  Lum_StringChannel channel;
  const std::string longText(100000, 'q');
  std::string scratch = longText;
  channel.SetString(scratch.c_str());
  scratch.assign(scratch.size(), 'z');  // callers reuse their buffer at once
  EXPECT_EQ(channel.GetString(), longText);
  channel.SetString(nullptr);
  EXPECT_STREQ(channel.GetString(), "");
}

}  // namespace
