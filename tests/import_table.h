// Windows only: the import tables of the modules loaded with a test program, for pointing what
// they import at a replacement of the program's.
#pragma once

#include <vector>

#define WIN32_LEAN_AND_MEAN
#include <windows.h>

namespace import_table {

std::vector<HMODULE> LoadedModules();

// Calls visit(name, slot) for every import by name of the module.
template <typename Visit>
void ForEachImport(HMODULE module, Visit visit) {
  auto* base = reinterpret_cast<unsigned char*>(module);
  const auto* dos = reinterpret_cast<const IMAGE_DOS_HEADER*>(base);
  const auto* headers = reinterpret_cast<const IMAGE_NT_HEADERS*>(base + dos->e_lfanew);
  const IMAGE_DATA_DIRECTORY& directory =
      headers->OptionalHeader.DataDirectory[IMAGE_DIRECTORY_ENTRY_IMPORT];
  if (!directory.VirtualAddress) return;
  for (auto* library =
           reinterpret_cast<const IMAGE_IMPORT_DESCRIPTOR*>(base + directory.VirtualAddress);
       library->Name; ++library) {
    if (!library->OriginalFirstThunk) continue;  // no name table to go by
    auto* name = reinterpret_cast<const IMAGE_THUNK_DATA*>(base + library->OriginalFirstThunk);
    auto* slot = reinterpret_cast<IMAGE_THUNK_DATA*>(base + library->FirstThunk);
    for (; name->u1.AddressOfData; ++name, ++slot) {
      if (IMAGE_SNAP_BY_ORDINAL(name->u1.Ordinal)) continue;
      const auto* byName =
          reinterpret_cast<const IMAGE_IMPORT_BY_NAME*>(base + name->u1.AddressOfData);
      visit(reinterpret_cast<const char*>(byName->Name),
            reinterpret_cast<void**>(&slot->u1.Function));
    }
  }
}

void WriteSlot(void** slot, void* value);

}  // namespace import_table
