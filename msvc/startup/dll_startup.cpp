// The entry point of a DLL: static objects are built at load and torn down at unload, around
// the DLL's own DllMain.
#include "msvc/startup/startup.h"

extern "C" int __stdcall DllMain(void* instance, unsigned long reason, void* reserved);

extern "C" int __stdcall _DllMainCRTStartup(void* instance, unsigned long reason, void* reserved) {
  constexpr unsigned long kProcessDetach = 0;
  constexpr unsigned long kProcessAttach = 1;
  if (reason == kProcessAttach) RunConstructors();
  const int result = DllMain(instance, reason, reserved);
  if (reason == kProcessDetach) RunExitFunctions();
  return result;
}
