// The two channel plug-ins the tool needs, loaded from the program's own folder as the engine loads
// them: DataDirectories and the texts they hold.
#pragma once

#include <memory>
#include <string>

#include "host/channel_library.h"

namespace datapack {

struct Plugins {
  std::shared_ptr<ChannelLibrary> directories;
  std::shared_ptr<ChannelLibrary> texts;
};

// Throws InputError naming the library that could not be loaded.
Plugins LoadPlugins();

}  // namespace datapack
