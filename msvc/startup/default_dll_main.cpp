// For DLLs without a DllMain of their own; the linker takes this only when nothing else
// defines one.
extern "C" int __stdcall DllMain(void*, unsigned long, void*) { return 1; }
