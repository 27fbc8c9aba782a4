#include "fuzz/fuzz_tree.h"

#include <cstdio>
#include <cstdlib>
#include <memory>

namespace {

const ChannelLibrary& Library(const GUID& type) {
  static std::shared_ptr<ChannelLibrary> directories;
  static std::shared_ptr<ChannelLibrary> texts;
  std::shared_ptr<ChannelLibrary>& library =
      SameGuid(type, kDataDirectoryGuid) ? directories : texts;
  if (!library) {
    std::string error;
    library = ChannelLibrary::Open(ExecutableFolder(), type, error);
    if (!library) Fail(error);
  }
  return *library;
}

}  // namespace

void Fail(const std::string& what) {
  std::fprintf(stderr, "finding: %s\n", what.c_str());
  std::fflush(stderr);
  std::abort();
}

Lum_DataPackage* FuzzTree::Directory(const char* tag) {
  owned_.push_back(Library(kDataDirectoryGuid).CreateChannel());
  auto* directory = static_cast<Lum_DataPackage*>(owned_.back().get());
  if (tag) Attach(directory, Link::kTagLink, Text("Tag"))->SetString(tag);
  return directory;
}

Lum_StringChannel* FuzzTree::Text(const std::string& name) {
  owned_.push_back(Library(kStringChannelGuid).CreateChannel());
  auto* text = static_cast<Lum_StringChannel*>(owned_.back().get());
  text->SetChannelName(name.c_str());
  return text;
}
