// The two channel plug-ins the tool needs, loaded as the engine loads them: DataDirectories and the
// texts they hold.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "host/channel_library.h"

class Lum_DataPackage;

namespace datapack {

// The plug-ins, and the package codec's entry points in the one that was loaded: the program does
// not link the plug-ins, so that it starts wherever they are and finds them where it is told.
struct Plugins {
  std::shared_ptr<ChannelLibrary> directories;
  std::shared_ptr<ChannelLibrary> texts;

  int WriteToBuffer(Lum_DataPackage& directory, char* buffer, int size, bool newlineChoice,
                    bool scramble) const {
    return write(&directory, buffer, size, newlineChoice, scramble);
  }
  int ReadFromBuffer(Lum_DataPackage& directory, char* buffer, int size, bool newlineChoice,
                     bool unscramble) const {
    return read(&directory, buffer, size, newlineChoice, unscramble);
  }
  // Scrambling is a member too, though it uses no directory's state: any directory serves.
  void Encrypt(char* data, int length) const { encrypt(Scrambler(), data, length); }
  void Decrypt(char* data, int length) const { decrypt(Scrambler(), data, length); }
  Lum_DataPackage* Scrambler() const;

  int (*write)(Lum_DataPackage*, char*, int, bool, bool) = nullptr;
  int (*read)(Lum_DataPackage*, char*, int, bool, bool) = nullptr;
  void (*encrypt)(Lum_DataPackage*, char*, int) = nullptr;
  void (*decrypt)(Lum_DataPackage*, char*, int) = nullptr;
  mutable std::shared_ptr<Vorn_Channel> scrambler{};  // made by the plug-in when first needed
};

// Where plug-ins are looked for, in order: beside the program's real path, the install layout's
// library folder, then `pluginDir` (from --plugin-dir or DATAPACK_PLUGIN_DIR) when given.
std::vector<std::string> PluginFolders(const std::string& pluginDir);

// Throws InputError naming the library that could not be found or loaded.
Plugins LoadPlugins(const std::string& pluginDir);

}  // namespace datapack
