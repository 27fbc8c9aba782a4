# Cross build in the engine's own C++ ABI: 32-bit Windows, Microsoft's name decoration, class
# layout and calling conventions, with clang in cl mode and lld-link from Debian. There is no
# Microsoft runtime here: the C headers are MinGW-w64's, the C++ headers libc++'s (headers only),
# the C runtime is the system's msvcrt.dll, and msvc/startup/ brings what a program or DLL needs
# to start.
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR X86)

set(MSVC_LLVM_BIN /usr/lib/llvm-19/bin)
get_filename_component(MSVC_SUPPORT_DIR "${CMAKE_CURRENT_LIST_DIR}/../msvc" ABSOLUTE)

# clang chooses its cl driver by the name it is started under; Debian ships no clang-cl for 19.
set(_tools "${CMAKE_BINARY_DIR}/msvc-tools")
file(MAKE_DIRECTORY "${_tools}")
file(CREATE_LINK "${MSVC_LLVM_BIN}/clang" "${_tools}/clang-cl" SYMBOLIC)
set(CMAKE_C_COMPILER "${_tools}/clang-cl")
set(CMAKE_CXX_COMPILER "${_tools}/clang-cl")
set(CMAKE_C_COMPILER_TARGET i686-pc-windows-msvc)
set(CMAKE_CXX_COMPILER_TARGET i686-pc-windows-msvc)
set(CMAKE_LINKER "${MSVC_LLVM_BIN}/lld-link")
set(CMAKE_AR /usr/lib/llvm-14/bin/llvm-lib)
set(CMAKE_RC_COMPILER /usr/lib/llvm-14/bin/llvm-rc)
set(CMAKE_MT /usr/lib/llvm-14/bin/llvm-mt)

execute_process(COMMAND "${MSVC_LLVM_BIN}/clang" -print-resource-dir
                OUTPUT_VARIABLE _resource_dir OUTPUT_STRIP_TRAILING_WHITESPACE)
# The C headers' GCC branches are complete, their Microsoft ones not: compat.h and the GNU version
# select them, while code generation and the ABI stay Microsoft's.
set(_headers "/X -nobuiltininc \
 -imsvc ${MSVC_SUPPORT_DIR}/libcxx \
 -imsvc /usr/lib/llvm-19/include/c++/v1 \
 -imsvc ${_resource_dir}/include \
 -imsvc /usr/share/mingw-w64/include \
 /FI${MSVC_SUPPORT_DIR}/compat.h -Xclang -fgnuc-version=4.2.1")
# No runtime library named in objects, no security cookie, no thread-safe statics (they need the
# runtime's TLS support), SSE2 floats as on every other build.
set(_abi "/Zl /GS- /Zc:threadSafeInit- /arch:SSE2 -fms-compatibility-version=19.29")
set(CMAKE_C_FLAGS_INIT "${_headers} ${_abi}")
set(CMAKE_CXX_FLAGS_INIT "${_headers} ${_abi}")

set(CMAKE_EXE_LINKER_FLAGS_INIT "/nodefaultlib /manifest:no /entry:mainCRTStartup")
set(CMAKE_SHARED_LINKER_FLAGS_INIT "/nodefaultlib /manifest:no")
set(MSVC_IMPORT_LIBS "${CMAKE_BINARY_DIR}/msvc-lib")
set(CMAKE_C_STANDARD_LIBRARIES "${MSVC_IMPORT_LIBS}/msvcrt.lib ${MSVC_IMPORT_LIBS}/kernel32.lib"
    CACHE STRING "")
set(CMAKE_CXX_STANDARD_LIBRARIES "${CMAKE_C_STANDARD_LIBRARIES}" CACHE STRING "")

# No program links before the start-up code is built: try-compile only.
set(CMAKE_TRY_COMPILE_TARGET_TYPE STATIC_LIBRARY)
