# Reads a channel plug-in's tables as the engine relies on them: GetType and InitDLL must stand in
# the export table under exactly those names, since that is what GetProcAddress is asked for. Each
# of REQUIRED_IMPORTS must be imported; that tells, say, that our DllMain was linked and not the
# runtime's default one.
# cmake -DOBJDUMP=<objdump> -DLIBRARY=<dll> [-DREQUIRED_IMPORTS=<a;b>] -P CheckPluginExports.cmake
cmake_minimum_required(VERSION 3.25)

execute_process(COMMAND ${OBJDUMP} -p ${LIBRARY} OUTPUT_VARIABLE dump RESULT_VARIABLE result)
if(result)
  message(FATAL_ERROR "${OBJDUMP} cannot read ${LIBRARY}")
endif()
get_filename_component(file ${LIBRARY} NAME)

# "[Ordinal/Name Pointer] Table" lists one "[   n] name" a line, up to a blank line.
string(FIND "${dump}" "[Ordinal/Name Pointer] Table" start)
if(start EQUAL -1)
  message(FATAL_ERROR "${file} exports nothing by name")
endif()
string(SUBSTRING "${dump}" ${start} -1 exports)
string(FIND "${exports}" "\n" start)
string(FIND "${exports}" "\n\n" end)
math(EXPR length "${end} - ${start} - 1")
math(EXPR start "${start} + 1")
string(SUBSTRING "${exports}" ${start} ${length} exports)
# Brackets would upset CMake's lists: strip "[   n] " before splitting into lines.
string(REGEX REPLACE "[ \t]*\\[ *[0-9]+\\] " "" exports "${exports}")
string(REPLACE "\n" ";" entries "${exports}")
set(names)
foreach(name IN LISTS entries)
  # C++ members of exported classes are listed too; only the C names matter here.
  if(NOT name MATCHES "^_Z")
    list(APPEND names "${name}")
  endif()
endforeach()
message("${file} exports ${names}")

foreach(entry_point GetType InitDLL)
  if(NOT entry_point IN_LIST names)
    message(FATAL_ERROR "${file} does not export ${entry_point} under that name")
  endif()
endforeach()
foreach(name IN LISTS names)
  if(name MATCHES "^_*(GetType|InitDLL)" AND NOT name MATCHES "^(GetType|InitDLL)$")
    message(FATAL_ERROR "${file} exports the decorated name ${name}")
  endif()
endforeach()

string(FIND "${dump}" "The Import Tables" start)
string(FIND "${dump}" "There is an export table" end)
if(start EQUAL -1 OR end LESS start)
  set(imports "")
else()
  math(EXPR length "${end} - ${start}")
  string(SUBSTRING "${dump}" ${start} ${length} imports)
endif()
foreach(import IN LISTS REQUIRED_IMPORTS)
  if(NOT imports MATCHES "[ \t]${import}\n")
    message(FATAL_ERROR "${file} does not import ${import}")
  endif()
endforeach()
