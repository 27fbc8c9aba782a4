// Counts the global allocations of the whole process, and can make nothrow allocations fail, so
// that tests see what a plug-in allocates and how it copes when memory runs out.
#pragma once

#include <cstddef>

namespace allocation_counter {

// Allocations made through any global operator new since the process started. On Windows the C++
// runtime DLL's calls within itself are not seen; with C++20 the string and container code that
// allocates is compiled into our own modules, and those calls are.
std::size_t Count();

// Heap bytes those allocations hold now, and the most they held since the last ResetPeak(), each
// block counted at the size the C library reserved for it. Exact where every block is released
// through these replacements too, as on ELF systems.
std::size_t LiveBytes();
std::size_t PeakBytes();
void ResetPeak();

// Counted as operator new and delete are, for libraries that take a pair of C allocation
// functions.
void* Allocate(std::size_t size);
void Release(void* block);

// While alive, every nothrow allocation fails.
class FailNothrowAllocations {
 public:
  FailNothrowAllocations();
  ~FailNothrowAllocations();
  FailNothrowAllocations(const FailNothrowAllocations&) = delete;
  FailNothrowAllocations& operator=(const FailNothrowAllocations&) = delete;
};

// While alive, allocations after the first `successes` fail, plain ones by throwing bad_alloc:
// memory running out in the middle of a constructor.
class FailAllocationsAfter {
 public:
  explicit FailAllocationsAfter(long successes);
  ~FailAllocationsAfter();
  FailAllocationsAfter(const FailAllocationsAfter&) = delete;
  FailAllocationsAfter& operator=(const FailAllocationsAfter&) = delete;
};

}  // namespace allocation_counter
