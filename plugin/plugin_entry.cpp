// The library's exports. The engine reads the type record through GetType and creates every
// DataDirectory through InitDLL.
#include <cstring>
#include <new>

#include "host/channel_type.h"
#include "host/guid.h"
#include "plugin/data_package.h"

#if defined(_WIN32)
#include <windows.h>
#endif

namespace {

// Built once at load by the engine's constructor; only the four fields below are ever ours.
ChannelType typeRecord;

}  // namespace

extern "C" {

VORN_EXPORT ChannelType* GetType() {
  std::memcpy(typeRecord.typeName, "DataDirectory", sizeof("DataDirectory"));
  typeRecord.typeCode = 1;
  typeRecord.typeGuid = kDataDirectoryGuid;
  typeRecord.baseTypeGuid = kStringChannelGuid;
  return &typeRecord;
}

VORN_EXPORT Vorn_Channel* InitDLL() { return new (std::nothrow) Lum_DataPackage; }

}  // extern "C"

#if defined(_WIN32)
// The runtime's DLL entry point calls DllMain by its C name, or an empty one of its own. A
// DataDirectory keeps no per-thread state, so thread notifications are switched off.
extern "C" BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
  if (reason == DLL_PROCESS_ATTACH) DisableThreadLibraryCalls(instance);
  return TRUE;
}
#endif
