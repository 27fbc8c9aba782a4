#pragma once

#include <cstddef>

namespace numbers {

inline constexpr std::size_t kMaxFloatText = 16;  // room FormatFloat needs at `out`

// Writes `value` widened to double exactly as printf("%g") prints it in the "C" locale
// (six significant digits, trailing zeros and trailing point dropped, exponent form when the
// decimal exponent is < -4 or >= 6, exponent with at least two digits, "inf", "-inf", "nan", "-nan"
// as glibc prints them). Returns the text's length; writes no NUL, and may leave scratch after the
// text within kMaxFloatText bytes of `out`, which spares it a copy.
std::size_t FormatFloat(float value, char* out);

// Writes `value` as printf("%i") prints it. Returns the length; no NUL. out needs 11 chars.
std::size_t FormatInt(int value, char* out);

}  // namespace numbers
