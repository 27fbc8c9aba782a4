# The Windows build in the engine's own ABI (preset msvc): import libraries for msvcrt.dll and
# KERNEL32.dll, and the start-up code every program and DLL links in place of Microsoft's runtime.
set(_import_libs "${CMAKE_BINARY_DIR}/msvc-lib")
if(NOT EXISTS "${_import_libs}/msvcrt.lib" OR NOT EXISTS "${_import_libs}/kernel32.lib")
  execute_process(COMMAND "${PROJECT_SOURCE_DIR}/msvc/make-import-libs" "${_import_libs}"
                  COMMAND_ERROR_IS_FATAL ANY OUTPUT_QUIET)
endif()

# One library for programs and DLLs alike: the linker takes from it only what a module uses, the
# entry point deciding which start-up comes along.
add_library(msvc_startup STATIC
  ${PROJECT_SOURCE_DIR}/msvc/startup/default_dll_main.cpp
  ${PROJECT_SOURCE_DIR}/msvc/startup/dll_startup.cpp
  ${PROJECT_SOURCE_DIR}/msvc/startup/int64_division.cpp
  ${PROJECT_SOURCE_DIR}/msvc/startup/libcxx_support.cpp
  ${PROJECT_SOURCE_DIR}/msvc/startup/operator_new.cpp
  ${PROJECT_SOURCE_DIR}/msvc/startup/program_startup.cpp
  ${PROJECT_SOURCE_DIR}/msvc/startup/stack_probe.cpp
  ${PROJECT_SOURCE_DIR}/msvc/startup/standard_streams.cpp
  ${PROJECT_SOURCE_DIR}/msvc/startup/startup.cpp)
target_include_directories(msvc_startup PRIVATE ${PROJECT_SOURCE_DIR})
link_libraries(msvc_startup)

# No C++ runtime to support RTTI or C++ exception handling (see the entry points for how a
# channel's exception passing through a package operation is met).
add_compile_options(/GR- /EHs-c-)
