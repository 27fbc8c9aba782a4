// Reads hostile packages of growing size into a fixed tree and reports the time per byte, which
// must stay flat: a reader whose cost grows with the square of the text would take the engine
// down on one hand-edited file.
#include <chrono>
#include <cstdio>
#include <string>
#include <vector>

#include "host/callback_channel.h"
#include "host/channel_library.h"
#include "host/value_channel.h"
#include "plugin/data_package.h"

namespace {

using Link = Lum_DataPackage::Link;

// Top directory D, with a value, a text and two nested sub-directories S and T that the hostile
// texts leave out, so that every entry of D searches for them.
class HostileTree {
 public:
  explicit HostileTree(const ChannelLibrary& directories, const ChannelLibrary& texts) {
    top_ = Directory(directories, texts, "D");
    Lum_DataPackage* sub = Directory(directories, texts, "S");
    Lum_DataPackage* subSub = Directory(directories, texts, "T");
    top_->AttachChild(Link::kCountLink, &count_);
    top_->AttachChild(Link::kDataLink, &value_);
    value_.SetChannelName("x");
    text_ = texts.CreateChannel();
    text_->SetChannelName("t");
    top_->AttachChild(Link::kDataLink, text_.get());
    top_->AttachChild(Link::kSubDirectoriesLink, sub);
    sub->AttachChild(Link::kSubDirectoriesLink, subSub);
    top_->AttachChild(Link::kCallEachIterationLink, &callEachIteration_);
    callEachIteration_.SetCallback([this] { ++entries_; });
  }

  Lum_DataPackage& Top() { return *top_; }
  int Entries() const { return entries_; }

 private:
  Lum_DataPackage* Directory(const ChannelLibrary& directories, const ChannelLibrary& texts,
                             const char* name) {
    owned_.push_back(directories.CreateChannel());
    auto* directory = static_cast<Lum_DataPackage*>(owned_.back().get());
    owned_.push_back(texts.CreateChannel());
    static_cast<Lum_StringChannel*>(owned_.back().get())->SetString(name);
    directory->AttachChild(Link::kTagLink, owned_.back().get());
    return directory;
  }

  std::vector<ChannelHandle> owned_;
  Lum_DataPackage* top_ = nullptr;
  ChannelHandle text_;
  Lum_ValueChannel count_;
  Lum_ValueChannel value_;
  Lum_CallbackChannel callEachIteration_;
  int entries_ = 0;
};

struct Shape {
  const char* name;
  std::string (*entry)(int index, std::size_t size);
};

// Entries of D whose sub-directories are missing, padded with tags that are not theirs.
std::string MissingSubDirectories(int index, std::size_t size) {
  std::string entry = "\n<D id=\"" + std::to_string(index) + "\">\n\t<x Type=\"Val\"> 1 </x>";
  while (entry.size() + 30 < size)
    entry += "\n\t<p>a</p><q Type=\"Txt\"> b </q>";
  return entry + "\n</D>";
}

// Entries whose data elements are missing, with no "Type=" after them to stop the search.
std::string MissingData(int index, std::size_t size) {
  std::string entry = "\n<D id=\"" + std::to_string(index) + "\">";
  while (entry.size() + 20 < size)
    entry += "\n\t<p> a </p>";
  return entry + "\n</D>";
}

// Long runs of whitespace before a far delimiter.
std::string Whitespace(int index, std::size_t size) {
  std::string entry = "\n<D id=\"" + std::to_string(index) + "\">\n<x ";
  entry.append(size > 40 ? size - 40 : 1, ' ');
  return entry + "\n</D>";
}

double SecondsToRead(HostileTree& tree, std::string& text) {
  const auto start = std::chrono::steady_clock::now();
  tree.Top().ReadFromBuffer(text.data(), static_cast<int>(text.size()), true, false);
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

}  // namespace

// Sizes in MB may be given; 1 and 16 by default.
int main(int argc, char** argv) {
  std::string error;
  const auto directories = ChannelLibrary::Open(ExecutableFolder(), kDataDirectoryGuid, error);
  const auto texts = ChannelLibrary::Open(ExecutableFolder(), kStringChannelGuid, error);
  if (!directories || !texts) {
    std::fprintf(stderr, "adversarial_read: %s\n", error.c_str());
    return 1;
  }
  const Shape shapes[] = {{"missing sub-directories", MissingSubDirectories},
                          {"missing data elements", MissingData},
                          {"long whitespace runs", Whitespace}};
  std::vector<std::size_t> sizes;
  for (int i = 1; i < argc; ++i)
    sizes.push_back(std::stoul(argv[i]) << 20);
  if (sizes.empty()) sizes = {1u << 20, 16u << 20};
  std::printf("%-26s %8s %8s %10s %12s\n", "hostile text", "MB", "entries", "seconds",
              "ns per byte");
  for (const Shape& shape : shapes) {
    for (std::size_t size : sizes) {
      const int entries = Lum_DataPackage::kMaxReadEntries;
      std::string text;
      for (int i = 0; i < entries; ++i)
        text += shape.entry(i, size / entries);
      HostileTree tree(*directories, *texts);
      const double seconds = SecondsToRead(tree, text);
      std::printf("%-26s %8.1f %8d %10.3f %12.2f\n", shape.name,
                  static_cast<double>(text.size()) / (1 << 20), tree.Entries(), seconds,
                  seconds * 1e9 / static_cast<double>(text.size()));
      std::fflush(stdout);
    }
  }
  return 0;
}
