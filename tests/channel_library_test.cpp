#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <string>

#if defined(_WIN32)
#include <process.h>
#define WIN32_LEAN_AND_MEAN
#include <windows.h>
#else
#include <unistd.h>

#include <cerrno>
#include <cstring>
#endif

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

// The system's own words for a library file that is not there.
std::string MissingFileMessage() {
#if defined(_WIN32)
  char* text = nullptr;
  const DWORD length = FormatMessageA(
      FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS,
      nullptr, ERROR_MOD_NOT_FOUND, 0, reinterpret_cast<char*>(&text), 0, nullptr);
  std::string message(text, length);
  LocalFree(text);
  return message.substr(0, message.find_last_not_of("\r\n") + 1);
#else
  return std::strerror(ENOENT);
#endif
}

// A folder of the test's own, removed with everything in it when the test ends.
int ProcessId() {
#if defined(_WIN32)
  return _getpid();
#else
  return static_cast<int>(getpid());
#endif
}

class ScratchFolder {
 public:
  // One per test and process: ctest runs tests side by side, and one test's folder going with it
  // took the other's file away.
  ScratchFolder()
      : path_(fs::temp_directory_path() /
              ("channel_library_test_" +
               std::string(::testing::UnitTest::GetInstance()->current_test_info()->name()) + "_" +
               std::to_string(ProcessId()))) {
    fs::create_directories(path_);
  }
  ~ScratchFolder() { fs::remove_all(path_); }
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;
  const fs::path& Path() const { return path_; }

 private:
  fs::path path_;
};

TEST(ChannelLibraryTest, LoadFailuresNameTheFileAndGiveTheSystemsReason) {
  const ScratchFolder scratch;
  std::ofstream(scratch.Path() / ChannelLibraryFileName(kNowhereGuid)) << "no library";

  struct Case {
    const char* what;
    std::string folder;
    std::string reason;  // empty: whatever the system says
  };
  const Case cases[] = {
      {"missing file", ExecutableFolder(), MissingFileMessage()},
      {"not a library", scratch.Path().string(), ""},
  };
  for (const Case& c : cases) {
    std::string error;
    EXPECT_EQ(ChannelLibrary::Open(c.folder, kNowhereGuid, error), nullptr) << c.what;
    const std::string file = (fs::path(c.folder) / ChannelLibraryFileName(kNowhereGuid)).string();
    const std::string lead = "cannot load channel plug-in " + file + ": ";
    ASSERT_EQ(error.substr(0, lead.size()), lead) << c.what;
    const std::string reason = error.substr(lead.size());
    EXPECT_FALSE(reason.empty()) << c.what;
    EXPECT_NE(reason.find(c.reason), std::string::npos) << error;
    EXPECT_EQ(reason.find_first_of("\r\n"), std::string::npos) << error;  // one line in a log
    EXPECT_EQ(reason.find("%1"), std::string::npos) << error;  // the file put in, not a marker
  }
}

TEST(ChannelLibraryTest, LibraryWithoutTheExportsIsRefused) {
  // The engine library itself is a loadable library without GetType and InitDLL.
  const ScratchFolder scratch;
  const fs::path impostor = scratch.Path() / ChannelLibraryFileName(kNowhereGuid);
  const std::string engineFile = std::string("Tessel") + fs::path(impostor).extension().string();
  fs::copy_file(fs::path(ExecutableFolder()) / engineFile, impostor,
                fs::copy_options::overwrite_existing);

  std::string error;
  EXPECT_EQ(ChannelLibrary::Open(scratch.Path().string(), kNowhereGuid, error), nullptr);
  EXPECT_NE(error.find(impostor.filename().string()), std::string::npos) << error;
  EXPECT_NE(error.find("does not export GetType"), std::string::npos) << error;
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
