#include "tools/datapack/plugins.h"

#include "tools/datapack/input_error.h"

namespace datapack {
namespace {

std::shared_ptr<ChannelLibrary> Open(const GUID& type) {
  std::string error;
  auto library = ChannelLibrary::Open(ExecutableFolder(), type, error);
  if (!library) throw InputError(error);
  return library;
}

}  // namespace

Plugins LoadPlugins() { return {Open(kDataDirectoryGuid), Open(kStringChannelGuid)}; }

}  // namespace datapack
