#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "host/channel_library.h"
#include "tests/plugins.h"

namespace {

namespace fs = std::filesystem;

constexpr GUID kNowhereGuid = {0x0BADF00D, 0x0000, 0x4000, {0x80, 0, 0, 0, 0, 0, 0, 0x01}};

TEST(ChannelLibraryTest, LoadsAPlugInByItsGuidFileName) {
  std::string error;
  const auto library = ChannelLibrary::Open(ExecutableFolder(), kDataDirectoryGuid, error);
  ASSERT_NE(library, nullptr) << error;
  EXPECT_EQ(fs::path(library->Path()).filename().string(),
            ChannelLibraryFileName(kDataDirectoryGuid));
  EXPECT_EQ(fs::path(library->Path()).stem().string(), "3F1A9C42-7B05-4D2E-A6C3-58E0B91D47F6");
  EXPECT_STREQ(library->Type().typeName, "DataDirectory");
}

TEST(ChannelLibraryTest, MissingFileIsNamedInTheError) {
  std::string error;
  EXPECT_EQ(ChannelLibrary::Open(ExecutableFolder(), kNowhereGuid, error), nullptr);
  EXPECT_NE(error.find(ChannelLibraryFileName(kNowhereGuid)), std::string::npos) << error;
  EXPECT_NE(error.find("cannot load channel plug-in"), std::string::npos) << error;
}

TEST(ChannelLibraryTest, LibraryWithoutTheExportsIsRefused) {
  // The engine library itself is a loadable library without GetType and InitDLL.
  const fs::path folder = fs::temp_directory_path() / "channel_library_test";
  fs::create_directories(folder);
  const fs::path impostor = folder / ChannelLibraryFileName(kNowhereGuid);
  const std::string engineFile = std::string("Tessel") + fs::path(impostor).extension().string();
  fs::copy_file(fs::path(ExecutableFolder()) / engineFile, impostor,
                fs::copy_options::overwrite_existing);

  std::string error;
  EXPECT_EQ(ChannelLibrary::Open(folder.string(), kNowhereGuid, error), nullptr);
  EXPECT_NE(error.find(impostor.filename().string()), std::string::npos) << error;
  EXPECT_NE(error.find("does not export GetType"), std::string::npos) << error;
  fs::remove_all(folder);
}

TEST(ChannelLibraryTest, ChannelsKeepTheirLibraryLoaded) {
  std::string error;
  auto library = ChannelLibrary::Open(ExecutableFolder(), kDataDirectoryGuid, error);
  ASSERT_NE(library, nullptr) << error;
  const std::weak_ptr<ChannelLibrary> watch = library;
  ChannelHandle channel = library->CreateChannel();
  ASSERT_NE(channel, nullptr);
  library.reset();
  EXPECT_FALSE(watch.expired());
  const int live = Vorn_Channel::GetLiveChannelCount();
  channel.reset();
  EXPECT_EQ(Vorn_Channel::GetLiveChannelCount(), live - 1);
  EXPECT_TRUE(watch.expired());
}

TEST(ChannelLibraryTest, CreatedChannelsCarryTheLibrarysType) {
  const ChannelHandle directory = plugins::DataDirectoryLibrary()->CreateChannel();
  const ChannelHandle text = plugins::StringChannelLibrary()->CreateChannel();
  EXPECT_STREQ(directory->GetChannelType().typeName, "DataDirectory");
  EXPECT_TRUE(SameGuid(directory->GetChannelType().typeGuid, kDataDirectoryGuid));
  EXPECT_TRUE(SameGuid(directory->GetChannelType().baseTypeGuid, kStringChannelGuid));
  EXPECT_STREQ(text->GetChannelType().typeName, "Text");
}

}  // namespace
