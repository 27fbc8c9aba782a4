#include "tests/allocation_counter.h"

#include <malloc.h>

#include <atomic>
#include <cstdlib>
#include <new>

#if defined(_WIN32)
#include <cstring>
#include <string>
#include <vector>

#include "tests/import_table.h"
#endif

namespace {

std::atomic<std::size_t> allocations{0};
std::atomic<std::size_t> liveBytes{0};
std::atomic<std::size_t> peakBytes{0};
std::atomic<bool> failNothrow{false};
std::atomic<long> successesLeft{-1};  // -1: no limit

bool Exhausted() {
  long left = successesLeft.load();
  while (left > 0 && !successesLeft.compare_exchange_weak(left, left - 1)) {
  }
  return left == 0;
}

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

struct ShareReplacementsWithLoadedLibraries {
  ShareReplacementsWithLoadedLibraries() {
    const std::vector<Replacement> replacements = Replacements();
    for (HMODULE module : import_table::LoadedModules()) {
      import_table::ForEachImport(module, [&](const char* name, void** slot) {
        for (const Replacement& replacement : replacements) {
          if (replacement.name == name) import_table::WriteSlot(slot, replacement.function);
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

FailAllocationsAfter::FailAllocationsAfter(long successes) { successesLeft = successes; }
FailAllocationsAfter::~FailAllocationsAfter() { successesLeft = -1; }

}  // namespace allocation_counter

// The program's replacements are the ones every library loaded into it uses as well.
void* operator new(std::size_t size) {
  if (void* block = Exhausted() ? nullptr : Allocate(size)) return block;
  throw std::bad_alloc();
}

void* operator new[](std::size_t size) { return ::operator new(size); }

void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  return failNothrow || Exhausted() ? nullptr : Allocate(size);
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
