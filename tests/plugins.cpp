#include "tests/plugins.h"

#include <cstdio>
#include <cstdlib>
#include <string>

namespace plugins {
namespace {

std::shared_ptr<ChannelLibrary> OpenOrDie(const GUID& type) {
  std::string error;
  auto library = ChannelLibrary::Open(ExecutableFolder(), type, error);
  if (!library) {
    std::fprintf(stderr, "%s\n", error.c_str());
    std::abort();
  }
  return library;
}

}  // namespace

const std::shared_ptr<ChannelLibrary>& DataDirectoryLibrary() {
  static const auto library = OpenOrDie(kDataDirectoryGuid);
  return library;
}

const std::shared_ptr<ChannelLibrary>& StringChannelLibrary() {
  static const auto library = OpenOrDie(kStringChannelGuid);
  return library;
}

Directory NewDirectory() { return Directory{DataDirectoryLibrary()->CreateChannel()}; }

}  // namespace plugins
