#include "tools/datapack/plugins.h"

#include <filesystem>

#include "tools/datapack/input_error.h"

namespace datapack {
namespace {

namespace fs = std::filesystem;

std::shared_ptr<ChannelLibrary> Open(const std::vector<std::string>& folders, const GUID& type) {
  const std::string file = ChannelLibraryFileName(type);
  std::string looked;
  for (const std::string& folder : folders) {
    std::error_code error;
    if (!fs::exists(fs::path(folder) / file, error)) {
      looked += (looked.empty() ? "" : ", ") + folder;
      continue;
    }
    std::string reason;
    auto library = ChannelLibrary::Open(folder, type, reason);
    if (!library) throw InputError(reason);
    return library;
  }
  throw InputError("cannot find channel plug-in " + file + " in " + looked +
                   "; --plugin-dir or DATAPACK_PLUGIN_DIR says where it is");
}

}  // namespace

std::vector<std::string> PluginFolders(const std::string& pluginDir) {
  const fs::path program = ExecutableFolder();
  std::vector<std::string> folders = {program.string(),
                                      (program.parent_path() / "lib" / "datapack").string()};
  if (!pluginDir.empty()) folders.push_back(pluginDir);
  return folders;
}

Plugins LoadPlugins(const std::string& pluginDir) {
  const std::vector<std::string> folders = PluginFolders(pluginDir);
  return {Open(folders, kDataDirectoryGuid), Open(folders, kStringChannelGuid)};
}

}  // namespace datapack
