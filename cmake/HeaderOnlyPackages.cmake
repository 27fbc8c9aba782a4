# CLI11 and nlohmann-json, both header-only, from Debian's packages. A cross build cannot find
# them in its target's root, so it takes the build machine's headers, copied into the build tree:
# adding /usr/include itself would put the build machine's C library before the target's.
if(NOT CMAKE_CROSSCOMPILING)
  find_package(CLI11 CONFIG REQUIRED)
  find_package(nlohmann_json 3.11 REQUIRED)
  return()
endif()

set(staged_headers ${CMAKE_BINARY_DIR}/build-machine-headers)
foreach(folder IN ITEMS CLI nlohmann)
  if(NOT IS_DIRECTORY /usr/include/${folder})
    message(FATAL_ERROR "/usr/include/${folder} is missing: run scripts/install-deps")
  endif()
  file(COPY /usr/include/${folder} DESTINATION ${staged_headers})
endforeach()
foreach(target IN ITEMS CLI11::CLI11 nlohmann_json::nlohmann_json)
  add_library(${target} INTERFACE IMPORTED GLOBAL)
  set_target_properties(${target} PROPERTIES INTERFACE_INCLUDE_DIRECTORIES ${staged_headers})
endforeach()
