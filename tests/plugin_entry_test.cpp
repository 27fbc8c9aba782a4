#include <gtest/gtest.h>

#include <cstring>
#include <set>
#include <vector>

#include "host/engine_trace.h"
#include "tests/allocation_counter.h"
#include "tests/plugins.h"

namespace {

ChannelType* DataDirectoryType() { return plugins::DataDirectoryLibrary()->GetTypeEntry()(); }

TEST(TypeRecordTest, EveryCallFillsTheSameRecord) {
  ChannelType* first = DataDirectoryType();
  std::vector<unsigned char> bytes(sizeof(ChannelType));
  std::memcpy(bytes.data(), first, sizeof(ChannelType));
  for (int i = 0; i < 1000; ++i)
    ASSERT_EQ(DataDirectoryType(), first);
  EXPECT_EQ(std::memcmp(bytes.data(), first, sizeof(ChannelType)), 0);

  EXPECT_STREQ(first->typeName, "DataDirectory");
  EXPECT_TRUE(SameGuid(first->typeGuid, kDataDirectoryGuid));
  EXPECT_TRUE(SameGuid(first->baseTypeGuid, kStringChannelGuid));
  EXPECT_EQ(first->typeCode, 1);

  const ChannelType engineDefaults;
  EXPECT_EQ(std::memcmp(first->engineData, engineDefaults.engineData, 8), 0);
  EXPECT_EQ(std::memcmp(first->engineFlags, engineDefaults.engineFlags, 8), 0);
}

TEST(TypeRecordTest, RewritesItsFieldsAfterACallerOverwroteThem) {
  ChannelType* record = DataDirectoryType();
  std::memset(record->typeName, 'X', sizeof(record->typeName));
  std::memset(&record->typeGuid, 0, sizeof(GUID));
  record->typeCode = 77;
  DataDirectoryType();
  EXPECT_STREQ(record->typeName, "DataDirectory");
  EXPECT_TRUE(SameGuid(record->typeGuid, kDataDirectoryGuid));
  EXPECT_EQ(record->typeCode, 1);
}

TEST(TypeRecordTest, StringChannelLibraryReportsTheTextType) {
  const ChannelType& type = plugins::StringChannelLibrary()->Type();
  EXPECT_STREQ(type.typeName, "Text");
  EXPECT_TRUE(SameGuid(type.typeGuid, kStringChannelGuid));
  EXPECT_TRUE(SameGuid(type.baseTypeGuid, kStringChannelGuid));
}

TEST(GuidTest, HeldInTheWindowsLayoutAndNamedInUpperCase) {
  struct Case {
    GUID guid;
    unsigned char bytes[16];
    const char* text;
  };
  const Case cases[] = {
      {kDataDirectoryGuid,
       {0x42, 0x9C, 0x1A, 0x3F, 0x05, 0x7B, 0x2E, 0x4D, 0xA6, 0xC3, 0x58, 0xE0, 0xB9, 0x1D, 0x47,
        0xF6},
       "3F1A9C42-7B05-4D2E-A6C3-58E0B91D47F6"},
      {kStringChannelGuid,
       {0xB1, 0xE5, 0x24, 0x8C, 0xD3, 0x19, 0x7F, 0x4A, 0xB0, 0x52, 0xE6, 0x71, 0x9A, 0x3C, 0x0D,
        0x85},
       "8C24E5B1-19D3-4A7F-B052-E6719A3C0D85"},
      {kMatrixChannelGuid,
       {0xF4, 0x12, 0x9D, 0x6B, 0x7A, 0xE3, 0x05, 0x4C, 0x9A, 0x81, 0xD4, 0xF2, 0x60, 0x7C, 0x5E,
        0xB3},
       "6B9D12F4-E37A-4C05-9A81-D4F2607C5EB3"},
      {kAllSupportedTypesGuid,
       {0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11,
        0x11},
       "11111111-1111-1111-1111-111111111111"},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(std::memcmp(&c.guid, c.bytes, 16), 0) << c.text;
    EXPECT_EQ(GuidToString(c.guid), c.text);
  }
}

TEST(InitDllTest, EveryCallCreatesANewDataDirectory) {
  const InitDllFunction initDll = plugins::DataDirectoryLibrary()->InitDllEntry();
  std::set<Vorn_Channel*> created;
  for (int i = 0; i < 5; ++i) {
    Vorn_Channel* channel = initDll();
    ASSERT_NE(dynamic_cast<Lum_DataPackage*>(channel), nullptr);
    EXPECT_STREQ(channel->GetChannelName(), "DataDirectory");
    created.insert(channel);
  }
  EXPECT_EQ(created.size(), 5u);
  for (Vorn_Channel* channel : created)
    delete channel;
}

TEST(InitDllTest, FailedAllocationGivesNullAndRunsNoConstructor) {
  const InitDllFunction initDll = plugins::DataDirectoryLibrary()->InitDllEntry();
  const int liveBefore = Vorn_Channel::GetLiveChannelCount();
  int engineCalls = 0;
  SetEngineTrace([&](const Vorn_Channel&, std::string_view, int) { ++engineCalls; });
  Vorn_Channel* channel;
  {
    allocation_counter::FailNothrowAllocations failing;
    channel = initDll();
  }
  SetEngineTrace({});
  EXPECT_EQ(channel, nullptr);
  EXPECT_EQ(Vorn_Channel::GetLiveChannelCount(), liveBefore);
  EXPECT_EQ(engineCalls, 0);
}

// The engine's constructors throw when memory runs out; InitDLL must not let that through.
TEST(InitDllTest, ConstructorsRunningOutOfMemoryGiveNullAndLeaveNothingBehind) {
  const InitDllFunction initDll = plugins::DataDirectoryLibrary()->InitDllEntry();
  int nulls = 0;
  for (long successes = 0;; ++successes) {
    const int liveBefore = Vorn_Channel::GetLiveChannelCount();
    const std::size_t bytesBefore = allocation_counter::LiveBytes();
    Vorn_Channel* channel;
    {
      allocation_counter::FailAllocationsAfter failing(successes);
      channel = initDll();
    }
    if (channel) {
      delete channel;
      break;
    }
    ++nulls;
    EXPECT_EQ(Vorn_Channel::GetLiveChannelCount(), liveBefore) << successes;
    EXPECT_EQ(allocation_counter::LiveBytes(), bytesBefore) << successes;
  }
  EXPECT_GE(nulls, 3);  // its own allocation, then the engine's, then the string channel's
}

}  // namespace
