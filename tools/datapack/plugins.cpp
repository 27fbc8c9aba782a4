#include "tools/datapack/plugins.h"

#include <filesystem>
#include <type_traits>

#include "plugin/data_package.h"

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
  Plugins plugins{Open(folders, kDataDirectoryGuid), Open(folders, kStringChannelGuid)};
#if defined(_WIN32)
  // Windows finds the DLLs the program links beside it, and calls members its own way.
  plugins.write = [](Lum_DataPackage* directory, char* buffer, int size, bool newline,
                     bool scramble) {
    return directory->WriteToBuffer(buffer, size, newline, scramble);
  };
  plugins.read = [](Lum_DataPackage* directory, char* buffer, int size, bool newline,
                    bool unscramble) {
    return directory->ReadFromBuffer(buffer, size, newline, unscramble);
  };
  plugins.encrypt = [](Lum_DataPackage* directory, char* data, int length) {
    directory->Encrypt(data, length);
  };
  plugins.decrypt = [](Lum_DataPackage* directory, char* data, int length) {
    directory->Decrypt(data, length);
  };
#else
  // A member function takes its object as a first argument in this ABI.
  const auto find = [&](auto& entry, const char* name) {
    void* symbol = plugins.directories->Symbol(name);
    if (!symbol) {
      throw InputError("channel plug-in " + plugins.directories->Path() + " does not export " +
                       name);
    }
    entry = reinterpret_cast<std::remove_reference_t<decltype(entry)> >(symbol);
  };
  find(plugins.write, "_ZN15Lum_DataPackage13WriteToBufferEPcibb");
  find(plugins.read, "_ZN15Lum_DataPackage14ReadFromBufferEPcibb");
  find(plugins.encrypt, "_ZN15Lum_DataPackage7EncryptEPci");
  find(plugins.decrypt, "_ZN15Lum_DataPackage7DecryptEPci");
#endif
  return plugins;
}

Lum_DataPackage* Plugins::Scrambler() const {
  if (!scrambler) scrambler = std::shared_ptr<Vorn_Channel>(directories->CreateChannel());
  return static_cast<Lum_DataPackage*>(scrambler.get());
}

}  // namespace datapack
