#include "tests/allocation_counter.h"

#include <atomic>
#include <cstdlib>
#include <new>

namespace {

std::atomic<std::size_t> allocations{0};
std::atomic<bool> failNothrow{false};

void* Allocate(std::size_t size) {
  ++allocations;
  return std::malloc(size ? size : 1);
}

}  // namespace

namespace allocation_counter {

std::size_t Count() { return allocations.load(); }

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

void operator delete(void* block) noexcept { std::free(block); }
void operator delete[](void* block) noexcept { std::free(block); }
void operator delete(void* block, std::size_t) noexcept { std::free(block); }
void operator delete[](void* block, std::size_t) noexcept { std::free(block); }
void operator delete(void* block, const std::nothrow_t&) noexcept { std::free(block); }
void operator delete[](void* block, const std::nothrow_t&) noexcept { std::free(block); }
