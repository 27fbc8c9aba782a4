# Our own code builds warning-free; third-party code is never given these flags. Warnings become
# errors only where asked (our presets and CI do): a user's build with another compiler or
# configuration must not fail on a compiler's false warning.
option(DATADIRECTORY_WERROR "Treat warnings in our own code as errors" OFF)

function(project_warnings target)
  if(DATADIRECTORY_MSVC_ABI)
    # cl's /W4 is GCC's -Wall -Wextra; cl's own -Wall would be every warning clang has.
    # Its structured exceptions and declspecs are language extensions by nature.
    target_compile_options(${target} PRIVATE /W4 -Wpedantic -Wno-language-extension-token)
  else()
    target_compile_options(${target} PRIVATE -Wall -Wextra -Wpedantic)
  endif()
  if(DATADIRECTORY_WERROR)
    target_compile_options(${target} PRIVATE $<IF:$<BOOL:${DATADIRECTORY_MSVC_ABI}>,/WX,-Werror>)
  endif()
endfunction()

# A library of the engine or a plug-in: hidden symbols but for the exported API, no "lib" prefix, found beside the
# programs that load it.
function(vorn_library target output_name build_macro)
  set_target_properties(${target} PROPERTIES
    OUTPUT_NAME "${output_name}"
    PREFIX ""
    DEFINE_SYMBOL "${build_macro}"
    CXX_VISIBILITY_PRESET hidden
    VISIBILITY_INLINES_HIDDEN ON)
  # Exported members still call each other directly and inline: nothing replaces them at load.
  if(NOT WIN32)
    target_compile_options(${target} PRIVATE -fno-semantic-interposition)
  endif()
  project_warnings(${target})
endfunction()
