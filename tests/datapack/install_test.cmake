# Installs the build into a fresh prefix and runs the installed program from there, and through a
# link from another folder, and with its plug-ins moved elsewhere. Arguments: -DBUILD=<build tree> -DPREFIX=<temporary prefix>.
file(REMOVE_RECURSE "${PREFIX}")
execute_process(COMMAND "${CMAKE_COMMAND}" --install "${BUILD}" --prefix "${PREFIX}"
  RESULT_VARIABLE status OUTPUT_QUIET)
if(NOT status EQUAL 0)
  message(FATAL_ERROR "cmake --install failed: ${status}")
endif()
foreach(file bin/datapack lib/datapack/Tessel.so
    lib/datapack/8C24E5B1-19D3-4A7F-B052-E6719A3C0D85.so
    lib/datapack/3F1A9C42-7B05-4D2E-A6C3-58E0B91D47F6.so)
  if(NOT EXISTS "${PREFIX}/${file}")
    message(FATAL_ERROR "not installed: ${file}")
  endif()
endforeach()
file(MAKE_DIRECTORY "${PREFIX}/elsewhere")
file(CREATE_LINK "${PREFIX}/bin/datapack" "${PREFIX}/elsewhere/datapack" SYMBOLIC)
foreach(program "${PREFIX}/bin/datapack" "${PREFIX}/elsewhere/datapack")
  execute_process(COMMAND "${program}" demo RESULT_VARIABLE status OUTPUT_VARIABLE out
    ERROR_VARIABLE err)
  if(NOT status EQUAL 0 OR NOT out MATCHES "lib/datapack/3F1A9C42-7B05-4D2E-A6C3-58E0B91D47F6.so"
     OR NOT out MATCHES "Count now 2")
    message(FATAL_ERROR "${program} demo: ${status}\n${out}${err}")
  endif()
endforeach()
# Plug-ins kept elsewhere are found where the option or the environment says, and only there.
file(MAKE_DIRECTORY "${PREFIX}/plug-ins")
foreach(guid 8C24E5B1-19D3-4A7F-B052-E6719A3C0D85 3F1A9C42-7B05-4D2E-A6C3-58E0B91D47F6)
  file(RENAME "${PREFIX}/lib/datapack/${guid}.so" "${PREFIX}/plug-ins/${guid}.so")
endforeach()
execute_process(COMMAND "${PREFIX}/bin/datapack" demo RESULT_VARIABLE status ERROR_VARIABLE err
  OUTPUT_QUIET)
if(status EQUAL 0 OR NOT err MATCHES "datapack: cannot find channel plug-in .*--plugin-dir")
  message(FATAL_ERROR "demo without its plug-ins: ${status}\n${err}")
endif()
foreach(how option environment)
  if(how STREQUAL option)
    set(command "${PREFIX}/bin/datapack" --plugin-dir "${PREFIX}/plug-ins" demo)
  else()
    set(command "${CMAKE_COMMAND}" -E env "DATAPACK_PLUGIN_DIR=${PREFIX}/plug-ins"
                "${PREFIX}/bin/datapack" demo)
  endif()
  execute_process(COMMAND ${command} RESULT_VARIABLE status OUTPUT_VARIABLE out ERROR_VARIABLE err)
  if(NOT status EQUAL 0 OR NOT out MATCHES "plug-ins/3F1A9C42-7B05-4D2E-A6C3-58E0B91D47F6.so")
    message(FATAL_ERROR "demo with the plug-ins named by ${how}: ${status}\n${out}${err}")
  endif()
endforeach()
file(REMOVE_RECURSE "${PREFIX}")
