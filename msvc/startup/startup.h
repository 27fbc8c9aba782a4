// What every program and DLL of the Windows build in the engine's ABI needs before and after its
// own code runs, in place of the Microsoft runtime's start-up objects. Each module links its own
// copy, as with that runtime's static form: its own constructor walk and its own atexit table.
#pragma once

using StartupFunction = void(__cdecl*)();

// Constructs the module's static objects, in the order the linker laid out their constructors.
void RunConstructors();
// Runs what atexit registered, last first: the static objects' destructors among them.
void RunExitFunctions();
