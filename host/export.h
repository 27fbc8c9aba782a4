// Symbol visibility for the engine library and the channel plug-ins. Each library defines its own
// *_BUILD macro while it is compiled, so that the same header exports there and imports elsewhere.
#pragma once

#if defined(_WIN32)
#define VORN_EXPORT __declspec(dllexport)
#define VORN_IMPORT __declspec(dllimport)
#else
#define VORN_EXPORT __attribute__((visibility("default")))
#define VORN_IMPORT __attribute__((visibility("default")))
#endif

#if defined(TESSEL_BUILD)
#define TESSEL_API VORN_EXPORT
#else
#define TESSEL_API VORN_IMPORT
#endif

// Whether the base classes keep room for the real engine's data. Only a build in the engine's own
// ABI (Microsoft's) can be loaded beside the real engine and the real string-channel plug-in;
// elsewhere the stand-ins are the engine, and the room would only cost every channel its size.
#if defined(_MSC_VER)
#define VORN_ENGINE_ROOM 1
#else
#define VORN_ENGINE_ROOM 0
#endif
