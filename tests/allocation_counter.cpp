#include "tests/allocation_counter.h"

#include <malloc.h>

#include <atomic>
#include <cstdlib>
#include <new>

#if defined(_WIN32)
#include <cstring>
#include <string>
#include <vector>

#define WIN32_LEAN_AND_MEAN
#include <windows.h>
// windows.h first: psapi.h needs its types.
#include <psapi.h>
#endif

namespace {

std::atomic<std::size_t> allocations{0};
std::atomic<std::size_t> liveBytes{0};
std::atomic<std::size_t> peakBytes{0};
std::atomic<bool> failNothrow{false};

std::size_t BlockSize(void* block) {
#if defined(_WIN32)
  return _msize(block);
#else
  return malloc_usable_size(block);
#endif
}

void* Allocate(std::size_t size) {
  ++allocations;
  void* block = std::malloc(size ? size : 1);
  if (block) {
    const std::size_t live = liveBytes += BlockSize(block);
    std::size_t peak = peakBytes.load(std::memory_order_relaxed);
    while (live > peak && !peakBytes.compare_exchange_weak(peak, live)) {
    }
  }
  return block;
}

void Release(void* block) {
  if (block) liveBytes -= BlockSize(block);
  std::free(block);
}

#if defined(_WIN32)

// A DLL calls the operator new and delete of the runtime DLL it imports them from, never the
// program's replacements. So that the replacements serve every library here as they do on ELF
// systems, the import-table slots of the replaced forms in every module loaded with the program
// are pointed at them before main runs. Both sides allocate with the same CRT's malloc, so either
// may free a block of the other. Only the runtime's calls within itself stay its own.
struct Replacement {
  std::string name;
  void* function;
};

template <typename Function>
void* Address(Function function) {
  return reinterpret_cast<void*>(function);
}

std::vector<Replacement> Replacements() {
  // The runtime's export names: std::size_t is "j" on 32-bit Windows, "y" on 64-bit.
  const std::string size = sizeof(std::size_t) == 4 ? "j" : "y";
  const std::string nothrow = "RKSt9nothrow_t";
  using New = void* (*)(std::size_t);
  using NothrowNew = void* (*)(std::size_t, const std::nothrow_t&) noexcept;
  using Delete = void (*)(void*) noexcept;
  using SizedDelete = void (*)(void*, std::size_t) noexcept;
  using NothrowDelete = void (*)(void*, const std::nothrow_t&) noexcept;
  return {
      {"_Znw" + size, Address<New>(&::operator new)},
      {"_Zna" + size, Address<New>(&::operator new[])},
      {"_Znw" + size + nothrow, Address<NothrowNew>(&::operator new)},
      {"_Zna" + size + nothrow, Address<NothrowNew>(&::operator new[])},
      {"_ZdlPv", Address<Delete>(&::operator delete)},
      {"_ZdaPv", Address<Delete>(&::operator delete[])},
      {"_ZdlPv" + size, Address<SizedDelete>(&::operator delete)},
      {"_ZdaPv" + size, Address<SizedDelete>(&::operator delete[])},
      {"_ZdlPv" + nothrow, Address<NothrowDelete>(&::operator delete)},
      {"_ZdaPv" + nothrow, Address<NothrowDelete>(&::operator delete[])},
  };
}

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

void WriteSlot(void** slot, void* value) {
  DWORD protection;
  VirtualProtect(slot, sizeof(void*), PAGE_READWRITE, &protection);
  *slot = value;
  VirtualProtect(slot, sizeof(void*), protection, &protection);
}

struct ShareReplacementsWithLoadedLibraries {
  ShareReplacementsWithLoadedLibraries() {
    const std::vector<Replacement> replacements = Replacements();
    for (HMODULE module : LoadedModules()) {
      ForEachImport(module, [&](const char* name, void** slot) {
        for (const Replacement& replacement : replacements) {
          if (replacement.name == name) WriteSlot(slot, replacement.function);
        }
      });
    }
  }
} shareReplacementsWithLoadedLibraries;

#endif

}  // namespace

namespace allocation_counter {

std::size_t Count() { return allocations.load(); }
std::size_t LiveBytes() { return liveBytes.load(); }
std::size_t PeakBytes() { return peakBytes.load(); }
void ResetPeak() { peakBytes = liveBytes.load(); }
void* Allocate(std::size_t size) { return ::Allocate(size); }
void Release(void* block) { ::Release(block); }

FailNothrowAllocations::FailNothrowAllocations() { failNothrow = true; }
FailNothrowAllocations::~FailNothrowAllocations() { failNothrow = false; }

}  // namespace allocation_counter

// The program's replacements are the ones every library loaded into it uses as well.
void* operator new(std::size_t size) {
  if (void* block = Allocate(size)) return block;
  throw std::bad_alloc();
}

void* operator new[](std::size_t size) { return ::operator new(size); }

void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  return failNothrow ? nullptr : Allocate(size);
}

void* operator new[](std::size_t size, const std::nothrow_t& tag) noexcept {
  return ::operator new(size, tag);
}

void operator delete(void* block) noexcept { Release(block); }
void operator delete[](void* block) noexcept { Release(block); }
void operator delete(void* block, std::size_t) noexcept { Release(block); }
void operator delete[](void* block, std::size_t) noexcept { Release(block); }
void operator delete(void* block, const std::nothrow_t&) noexcept { Release(block); }
void operator delete[](void* block, const std::nothrow_t&) noexcept { Release(block); }
