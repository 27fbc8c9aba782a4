# Header-only libraries from Debian's packages: fast_float for the codec's number reading, CLI11
# and nlohmann-json for the tools. A cross build cannot find them in its target's root, so it
# takes the build machine's headers, copied into the build tree: adding /usr/include itself would
# put the build machine's C library before the target's.
set(_packages FastFloat::fast_float fast_float)
if(NOT DATADIRECTORY_MSVC_ABI)
  list(APPEND _packages CLI11::CLI11 CLI nlohmann_json::nlohmann_json nlohmann)
endif()

if(NOT CMAKE_CROSSCOMPILING)
  find_package(FastFloat CONFIG REQUIRED)
  find_package(CLI11 CONFIG REQUIRED)
  find_package(nlohmann_json 3.11 REQUIRED)
  return()
endif()

set(staged_headers ${CMAKE_BINARY_DIR}/build-machine-headers)
while(_packages)
  list(POP_FRONT _packages target folder)
  if(NOT IS_DIRECTORY /usr/include/${folder})
    message(FATAL_ERROR "/usr/include/${folder} is missing: run scripts/install-deps")
  endif()
  file(COPY /usr/include/${folder} DESTINATION ${staged_headers})
  add_library(${target} INTERFACE IMPORTED GLOBAL)
  set_target_properties(${target} PROPERTIES INTERFACE_INCLUDE_DIRECTORIES ${staged_headers})
endwhile()
