// Counts the global allocations of the whole process, and can make nothrow allocations fail, so
// that tests see what a plug-in allocates and how it copes when memory runs out.
#pragma once

#include <cstddef>

namespace allocation_counter {

// Allocations made through any global operator new since the process started.
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
