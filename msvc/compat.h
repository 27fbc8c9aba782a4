// Force-included into every file built for i686-pc-windows-msvc. With -fgnuc-version, these make
// MinGW-w64's C headers and libc++'s headers take the branches written for GCC on MinGW, which are
// complete; code generation and the C++ ABI stay Microsoft's, as the target decides.
#ifndef DATADIRECTORY_MSVC_COMPAT_H
#define DATADIRECTORY_MSVC_COMPAT_H
#define _X86_ 1                     /* the C headers key 32-bit x86 on this */
#define __MINGW32__ 1               /* libc++: the C library is MinGW-w64's view of msvcrt */
#define __USE_MINGW_ANSI_STDIO 0    /* printf and friends straight from msvcrt.dll */
#define __declspec(x) __declspec(x) /* the C headers test whether __declspec is a macro */
#endif
