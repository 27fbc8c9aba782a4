// The constructor walk and the atexit table of one module, shared by the program and DLL entry
// points.
#include "msvc/startup/startup.h"

// The compiler lists the constructors of static objects in .CRT$XCU; the linker sorts the
// sections by name, so these two bracket that list.
#pragma section(".CRT$XCA", long, read)
#pragma section(".CRT$XCZ", long, read)
__declspec(allocate(".CRT$XCA")) static const StartupFunction constructorsBegin = nullptr;
__declspec(allocate(".CRT$XCZ")) static const StartupFunction constructorsEnd = nullptr;

static StartupFunction exitFunctions[128];
static int exitFunctionCount;

extern "C" int __cdecl atexit(StartupFunction function) {
  if (exitFunctionCount == sizeof(exitFunctions) / sizeof(exitFunctions[0])) return -1;
  exitFunctions[exitFunctionCount++] = function;
  return 0;
}

void RunConstructors() {
  const StartupFunction* function = &constructorsBegin;
  const StartupFunction* end = &constructorsEnd;
  // Two distinct objects to the optimiser, one table to the linker.
  __asm__ volatile("" : "+r"(function), "+r"(end));
  for (++function; function < end; ++function) {
    if (*function) (*function)();
  }
}

void RunExitFunctions() {
  while (exitFunctionCount > 0)
    exitFunctions[--exitFunctionCount]();
}

// Referenced by every object that uses floating point.
extern "C" int _fltused = 0x9875;
