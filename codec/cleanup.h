// Shared state that a package operation sets must be restored however the operation ends: a
// channel it calls may throw, and the exception then passes through the codec to the caller.
#pragma once

// Runs `body`, then `cleanup`, also when an exception passes through `body`. Where C++ frames
// unwind, a destructor does it; the build in the engine's ABI has no C++ runtime and no C++
// unwinding of its own, so there a structured __finally does, which every exception passing
// through runs, the engine's C++ ones included.
template <class Body, class Cleanup>
void RunThenCleanUp(const Body& body, const Cleanup& cleanup) {
#if defined(_MSC_VER)
  __try {
    body();
  } __finally {
    cleanup();
  }
#else
  struct Finally {
    const Cleanup& cleanup;
    ~Finally() { cleanup(); }
  } finally{cleanup};
  body();
#endif
}
