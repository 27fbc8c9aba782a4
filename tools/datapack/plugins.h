// The two channel plug-ins the tool needs, loaded as the engine loads them: DataDirectories and the
// texts they hold.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "host/channel_library.h"

namespace datapack {

struct Plugins {
  std::shared_ptr<ChannelLibrary> directories;
  std::shared_ptr<ChannelLibrary> texts;
};

// Where plug-ins are looked for, in order: beside the program's real path, the install layout's
// library folder, then `pluginDir` (from --plugin-dir or DATAPACK_PLUGIN_DIR) when given.
std::vector<std::string> PluginFolders(const std::string& pluginDir);

// Throws InputError naming the library that could not be found or loaded.
Plugins LoadPlugins(const std::string& pluginDir);

}  // namespace datapack
