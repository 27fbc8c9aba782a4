// stdin, stdout and stderr: the C headers reach them through __acrt_iob_func, which newer
// runtimes export and msvcrt.dll does not. It exports the array of streams itself.
#include <cstdio>

extern "C" FILE* const importedStreams __asm__("__imp___iob");
extern "C" FILE* __cdecl StandardStream(unsigned index) __asm__("___acrt_iob_func");
// Callers declare the function as imported from the runtime and call it through this pointer.
extern "C" FILE* (*const standardStreamPointer)(unsigned)__asm__("__imp____acrt_iob_func");

extern "C" FILE* __cdecl StandardStream(unsigned index) { return importedStreams + index; }
extern "C" FILE* (*const standardStreamPointer)(unsigned) = StandardStream;
