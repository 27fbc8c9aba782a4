#include "tests/guarded_buffer.h"

#include <cstdlib>
#include <cstring>

#if defined(_WIN32)
#include <windows.h>
#else
#include <sys/mman.h>
#include <unistd.h>
#endif

namespace {

std::size_t PageSize() {
#if defined(_WIN32)
  SYSTEM_INFO info;
  GetSystemInfo(&info);
  return info.dwPageSize;
#else
  return static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
#endif
}

char* Map(std::size_t size) {
#if defined(_WIN32)
  return static_cast<char*>(VirtualAlloc(nullptr, size, MEM_COMMIT | MEM_RESERVE, PAGE_READWRITE));
#else
  void* mapping = mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  return mapping == MAP_FAILED ? nullptr : static_cast<char*>(mapping);
#endif
}

bool Guard(char* page, std::size_t size) {
#if defined(_WIN32)
  DWORD previous;
  return VirtualProtect(page, size, PAGE_NOACCESS, &previous) != 0;
#else
  return mprotect(page, size, PROT_NONE) == 0;
#endif
}

void Unmap(char* mapping, std::size_t size) {
#if defined(_WIN32)
  (void)size;
  VirtualFree(mapping, 0, MEM_RELEASE);
#else
  munmap(mapping, size);
#endif
}

}  // namespace

GuardedBuffer::GuardedBuffer(std::string_view bytes) : size_(bytes.size()) {
  const std::size_t page = PageSize();
  const std::size_t usable = (bytes.size() + page - 1) / page * page;
  mappingSize_ = usable + page;
  mapping_ = Map(mappingSize_);
  if (!mapping_ || !Guard(mapping_ + usable, page)) std::abort();
  data_ = mapping_ + usable - bytes.size();
  if (!bytes.empty()) std::memcpy(data_, bytes.data(), bytes.size());
}

GuardedBuffer::~GuardedBuffer() { Unmap(mapping_, mappingSize_); }
