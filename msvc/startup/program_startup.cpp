// The entry point of a console program: arguments from msvcrt.dll, static objects around main.
#include "msvc/startup/startup.h"

extern "C" int __cdecl __getmainargs(int* argc, char*** argv, char*** environment, int wildcards,
                                     void* startupInfo);
extern "C" __declspec(noreturn) void __cdecl exit(int status);

int main(int argc, char** argv);

extern "C" void __cdecl mainCRTStartup() {
  int argc = 0;
  char** argv = nullptr;
  char** environment = nullptr;
  int startupInfo = 0;
  __getmainargs(&argc, &argv, &environment, 0, &startupInfo);
  RunConstructors();
  const int status = main(argc, argv);
  RunExitFunctions();
  exit(status);
}
