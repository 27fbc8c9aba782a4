// Windows only. GoogleTest hands every failed or skipped check to a debugger as well, through
// OutputDebugStringA, which raises an exception for the debugger to see. Under Wine running
// 32-bit code through an emulator that kills the test program at the first such check, taking
// every later result with it. Stdout carries the same text, so the call is made a no-op.
#include <cstring>

#include "tests/import_table.h"

namespace {

void WINAPI Discard(LPCSTR) {}

struct DiscardDebugOutput {
  DiscardDebugOutput() {
    for (HMODULE module : import_table::LoadedModules()) {
      import_table::ForEachImport(module, [](const char* name, void** slot) {
        if (std::strcmp(name, "OutputDebugStringA") == 0) {
          import_table::WriteSlot(slot, reinterpret_cast<void*>(&Discard));
        }
      });
    }
  }
} discardDebugOutput;

}  // namespace
