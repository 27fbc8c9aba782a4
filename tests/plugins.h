// The two channel plug-ins, loaded once per test program from the folder it runs in.
#pragma once

#include <memory>

#include "host/channel_library.h"
#include "plugin/data_package.h"

namespace plugins {

const std::shared_ptr<ChannelLibrary>& DataDirectoryLibrary();
const std::shared_ptr<ChannelLibrary>& StringChannelLibrary();

// A DataDirectory as the engine creates it: through the library, carrying the library's type.
struct Directory {
  ChannelHandle handle;
  Lum_DataPackage* operator->() const { return static_cast<Lum_DataPackage*>(handle.get()); }
  Lum_DataPackage& operator*() const { return *operator->(); }
  Lum_DataPackage* get() const { return operator->(); }
};
Directory NewDirectory();

}  // namespace plugins
