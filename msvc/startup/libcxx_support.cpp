// The out-of-line pieces of the C++ library that header-only use still reaches, normally in the
// library's own DLL, which nothing here ships.
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <string>

_LIBCPP_BEGIN_NAMESPACE_STD
// Where the library would throw, or finds a broken precondition.
void __libcpp_verbose_abort(const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  std::vfprintf(stderr, format, arguments);
  va_end(arguments);
  std::abort();
}
_LIBCPP_END_NAMESPACE_STD

// The library declares the narrow string an extern template; its members live here.
template class std::basic_string<char>;
