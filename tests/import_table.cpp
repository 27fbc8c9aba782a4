#include "tests/import_table.h"

// windows.h first: psapi.h needs its types.
#include <psapi.h>

namespace import_table {

std::vector<HMODULE> LoadedModules() {
  std::vector<HMODULE> modules(64);
  DWORD needed = 0;
  for (;;) {
    const DWORD size = static_cast<DWORD>(modules.size() * sizeof(HMODULE));
    if (!EnumProcessModules(GetCurrentProcess(), modules.data(), size, &needed)) return {};
    if (needed <= size) break;
    modules.resize(needed / sizeof(HMODULE));
  }
  modules.resize(needed / sizeof(HMODULE));
  return modules;
}

void WriteSlot(void** slot, void* value) {
  DWORD protection;
  VirtualProtect(slot, sizeof(void*), PAGE_READWRITE, &protection);
  *slot = value;
  VirtualProtect(slot, sizeof(void*), protection, &protection);
}

}  // namespace import_table
