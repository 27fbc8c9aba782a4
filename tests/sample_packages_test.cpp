// The stored sample packages: this build must write them byte for byte and read them back. The
// Windows build in the engine's ABI checks the same files, so all builds write the same bytes.
// DATADIRECTORY_WRITE_SAMPLES=1 writes the files anew instead, after a deliberate format change.
#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "tests/engine/sample_trees.h"
#include "tests/plugins.h"

namespace {

Vorn_Channel* NewDirectory() { return plugins::DataDirectoryLibrary()->CreateChannel().release(); }
Vorn_Channel* NewText() { return plugins::StringChannelLibrary()->CreateChannel().release(); }
const samples::Factories kFactories = {NewDirectory, NewText};

std::string PackagePath(const samples::Sample& sample) {
  return std::string(SAMPLE_PACKAGES_DIR) + "/" + sample.name + ".pkg";
}

TEST(SamplePackagesTest, WriteAsStoredAndReadBack) {
  const bool rewrite = std::getenv("DATADIRECTORY_WRITE_SAMPLES") != nullptr;
  for (std::size_t i = 0; i < samples::kSampleCount; ++i) {
    const samples::Sample& sample = samples::kSamples[i];
    SCOPED_TRACE(sample.name);
    samples::Tree writer(sample, kFactories);
    auto& top = *static_cast<Lum_DataPackage*>(writer.Top());
    const int size = top.WriteToBuffer(nullptr, 0, sample.lineFeeds, sample.scramble);
    std::vector<char> package(static_cast<std::size_t>(size));
    writer.Supply();
    ASSERT_EQ(top.WriteToBuffer(package.data(), size, sample.lineFeeds, sample.scramble), size);

    if (rewrite) {
      std::ofstream(PackagePath(sample), std::ios::binary).write(package.data(), size);
    }
    std::ifstream file(PackagePath(sample), std::ios::binary);
    const std::vector<char> stored{std::istreambuf_iterator<char>(file), {}};
    EXPECT_EQ(package, stored);

    samples::Tree reader(sample, kFactories);
    reader.Collect();
    auto& readTop = *static_cast<Lum_DataPackage*>(reader.Top());
    EXPECT_EQ(readTop.ReadFromBuffer(package.data(), size, sample.lineFeeds, sample.scramble),
              size - 1);
    const char* problem = "";
    EXPECT_TRUE(reader.Received(writer, problem)) << problem;
  }
  EXPECT_EQ(std::ifstream(std::string(SAMPLE_PACKAGES_DIR) + "/players.pkg", std::ios::ate).tellg(),
            184);
}

}  // namespace
