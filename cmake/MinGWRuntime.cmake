# The C++ runtime ships as DLLs beside our binaries instead of being linked into each of them.
# std::string, std::function and std::shared_ptr cross the engine's API, channels made in one DLL
# are deleted from another, and an exception thrown in one module may be caught in another: all of
# that needs one runtime per process. A static runtime per DLL gives each module its own operator
# new and, with DWARF unwinding on 32-bit, its own unwinder that cannot unwind other modules'
# frames.
set(MINGW_RUNTIME_DLLS libstdc++-6.dll libgcc_s_dw2-1.dll libwinpthread-1.dll)

set(runtime_paths)
foreach(dll IN LISTS MINGW_RUNTIME_DLLS)
  execute_process(
    COMMAND ${CMAKE_CXX_COMPILER} -print-file-name=${dll}
    OUTPUT_VARIABLE path
    OUTPUT_STRIP_TRAILING_WHITESPACE)
  # The compiler echoes the bare name for a file it does not have.
  if(NOT IS_ABSOLUTE "${path}" OR NOT EXISTS "${path}")
    message(FATAL_ERROR "${CMAKE_CXX_COMPILER} has no ${dll}")
  endif()
  file(REAL_PATH "${path}" path)
  list(APPEND runtime_paths "${path}")
endforeach()

add_custom_target(mingw_runtime
  COMMAND ${CMAKE_COMMAND} -E make_directory ${CMAKE_RUNTIME_OUTPUT_DIRECTORY}
  COMMAND ${CMAKE_COMMAND} -E copy_if_different ${runtime_paths} ${CMAKE_RUNTIME_OUTPUT_DIRECTORY}
  COMMENT "Copying the C++ runtime DLLs beside the binaries"
  VERBATIM)
