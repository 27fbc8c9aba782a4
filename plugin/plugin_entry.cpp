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

// Nothing may leave an extern "C" export: an exhausted allocator, here or in a base constructor
// of the engine's, shows as null and frees what was taken.
VORN_EXPORT Vorn_Channel* InitDLL() {
  void* memory = ::operator new(sizeof(Lum_DataPackage), std::nothrow);
  if (!memory) return nullptr;
  Lum_DataPackage* channel = nullptr;
#if defined(_MSC_VER)
  // No C++ runtime here: a C++ exception is the structured exception with this code.
  constexpr unsigned long kCppException = 0xE06D7363;
  __try {
    channel = new (memory) Lum_DataPackage;
  } __except (GetExceptionCode() == kCppException ? EXCEPTION_EXECUTE_HANDLER
                                                  : EXCEPTION_CONTINUE_SEARCH) {
    channel = nullptr;
  }
#else
  try {
    channel = new (memory) Lum_DataPackage;
  } catch (...) {
    channel = nullptr;
  }
#endif
  if (!channel) ::operator delete(memory);
  return channel;
}

}  // extern "C"

#if defined(_WIN32)
// The runtime's DLL entry point calls DllMain by its C name, or an empty one of its own. A
// DataDirectory keeps no per-thread state, so thread notifications are switched off.
extern "C" BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
  if (reason == DLL_PROCESS_ATTACH) DisableThreadLibraryCalls(instance);
  return TRUE;
}
#endif
