#include "codec/number_format.h"

#include <bit>
#include <charconv>
#include <cstdint>
#include <cstring>

namespace numbers {
namespace {

constexpr int kPrecision = 6;  // what "%g" uses without an explicit precision

char* Copy(const char* text, int count, char* out) {
  std::memcpy(out, text, static_cast<std::size_t>(count));
  return out + count;
}

// `digits` holds `count` significant digits without trailing zeros; `exp10` is the decimal exponent
// of the first one.
char* LayOut(const char* digits, int count, int exp10, char* out) {
  if (exp10 < -4 || exp10 >= kPrecision) {
    *out++ = digits[0];
    if (count > 1) {
      *out++ = '.';
      out = Copy(digits + 1, count - 1, out);
    }
    *out++ = 'e';
    *out++ = exp10 < 0 ? '-' : '+';
    // Normal floats stay within e-38..e+38, so two exponent digits always suffice.
    const int magnitude = exp10 < 0 ? -exp10 : exp10;
    *out++ = static_cast<char>('0' + magnitude / 10);
    *out++ = static_cast<char>('0' + magnitude % 10);
    return out;
  }
  if (exp10 < 0) {
    *out++ = '0';
    *out++ = '.';
    for (int i = -1; i > exp10; --i)
      *out++ = '0';
    return Copy(digits, count, out);
  }
  const int integer_digits = exp10 + 1;
  if (count <= integer_digits) {
    out = Copy(digits, count, out);
    for (int i = count; i < integer_digits; ++i)
      *out++ = '0';
    return out;
  }
  out = Copy(digits, integer_digits, out);
  *out++ = '.';
  return Copy(digits + integer_digits, count - integer_digits, out);
}

}  // namespace

std::size_t FormatFloat(float value, char* out) {
  const auto bits = std::bit_cast<std::uint32_t>(value);
  const std::uint32_t magnitude = bits & 0x7fffffffu;
  char* p = out;
  if (bits >> 31) *p++ = '-';  // glibc prints the sign of zeros and NaNs as well
  if (magnitude >= 0x7f800000u) {
    std::memcpy(p, magnitude == 0x7f800000u ? "inf" : "nan", 3);
    return static_cast<std::size_t>(p + 3 - out);
  }
  if (magnitude == 0) {
    *p++ = '0';
    return static_cast<std::size_t>(p - out);
  }
  const auto abs_value = std::bit_cast<float>(magnitude);

  // The shortest round-trip form S lies within half an ulp of the value, and no candidate with as
  // few digits is closer. A normal float's half ulp is below half a unit in the sixth digit, so an
  // S of up to six digits is already the six-digit rounding. A longer S rounds the same way as the
  // value: a rounding boundary (seven digits) strictly between them would have been a shorter or
  // closer candidate. That leaves S sitting exactly on a boundary, where only the exact value
  // decides, and subnormals, whose ulp is too coarse; both take the slow route.
  if (magnitude >= 0x00800000u) {
    char text[24];  // "d.dddddddde-XX"
    const char* const end =
        std::to_chars(text, text + sizeof text, abs_value, std::chars_format::scientific).ptr;
    char digits[12];
    int count = 0;
    const char* s = text;
    digits[count++] = *s++;
    if (*s == '.') {
      for (++s; *s != 'e'; ++s)
        digits[count++] = *s;
    }
    ++s;  // 'e'
    const bool negative_exponent = *s++ == '-';
    int exp10 = 0;
    for (; s != end; ++s)
      exp10 = exp10 * 10 + (*s - '0');
    if (negative_exponent) exp10 = -exp10;

    bool exact_tie = false;
    if (count > kPrecision) {
      const char next = digits[kPrecision];
      exact_tie = next == '5' && count == kPrecision + 1;
      count = kPrecision;
      if (next >= '5') {
        int i = kPrecision - 1;
        while (i >= 0 && digits[i] == '9')
          --i;  // the nines become dropped trailing zeros
        if (i < 0) {
          digits[0] = '1';
          count = 1;
          ++exp10;
        } else {
          ++digits[i];
          count = i + 1;
        }
      } else {
        while (digits[count - 1] == '0')
          --count;
      }
    }
    if (!exact_tie) return static_cast<std::size_t>(LayOut(digits, count, exp10, p) - out);
  }
  const char* const end = std::to_chars(p, out + kMaxFloatText, static_cast<double>(abs_value),
                                        std::chars_format::general, kPrecision)
                              .ptr;
  return static_cast<std::size_t>(end - out);
}

std::size_t FormatInt(int value, char* out) {
  return static_cast<std::size_t>(std::to_chars(out, out + 11, value).ptr - out);
}

}  // namespace numbers
