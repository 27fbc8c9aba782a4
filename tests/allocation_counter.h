// Counts the global allocations of the whole process, and can make nothrow allocations fail, so
// that tests see what a plug-in allocates and how it copes when memory runs out.
#pragma once

#include <cstddef>

namespace allocation_counter {

// Allocations made through any global operator new since the process started. On Windows the C++
// runtime DLL's calls within itself are not seen; with C++20 the string and container code that
// allocates is compiled into our own modules, and those calls are.
std::size_t Count();

// While alive, every nothrow allocation fails.
class FailNothrowAllocations {
 public:
  FailNothrowAllocations();
  ~FailNothrowAllocations();
  FailNothrowAllocations(const FailNothrowAllocations&) = delete;
  FailNothrowAllocations& operator=(const FailNothrowAllocations&) = delete;
};

}  // namespace allocation_counter
