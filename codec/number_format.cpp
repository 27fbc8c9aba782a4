#include "codec/number_format.h"

#include <bit>
#include <charconv>
#include <cstdint>
#include <cstring>

namespace numbers {
namespace {

constexpr int kPrecision = 6;  // what "%g" uses without an explicit precision

// Lays out `count` significant digits (no trailing zeros) whose first has decimal exponent
// `exp10` the way "%g" does. Works in fixed-size chunks inside `local`, which may hold scratch
// past the returned length; `digits` must stay readable for eight bytes past each copy start.
std::size_t LayOut(const char* digits, int count, int exp10, char (&local)[24]) {
  if (exp10 < -4 || exp10 >= kPrecision) {
    local[0] = digits[0];
    int length = 1;
    if (count > 1) {
      local[1] = '.';
      std::memcpy(local + 2, digits + 1, 8);
      length = count + 1;
    }
    // Normal floats stay within e-38..e+38, so two exponent digits always suffice.
    const int magnitude = exp10 < 0 ? -exp10 : exp10;
    local[length] = 'e';
    local[length + 1] = exp10 < 0 ? '-' : '+';
    local[length + 2] = static_cast<char>('0' + magnitude / 10);
    local[length + 3] = static_cast<char>('0' + magnitude % 10);
    return static_cast<std::size_t>(length + 4);
  }
  if (exp10 < 0) {
    std::memcpy(local, "0.000000", 8);
    std::memcpy(local + 1 - exp10, digits, 8);
    return static_cast<std::size_t>(1 - exp10 + count);
  }
  const int integer_digits = exp10 + 1;
  std::memcpy(local, digits, 8);
  if (count <= integer_digits) {
    std::memcpy(local + count, "00000000", 8);
    return static_cast<std::size_t>(integer_digits);
  }
  local[integer_digits] = '.';
  std::memcpy(local + integer_digits + 1, digits + integer_digits, 8);
  return static_cast<std::size_t>(count + 1);
}

// Whether the seven digits D (last one 5, first at `exp10`) are the float's exact value, i.e. a
// float holds D * 10^-j exactly. D is odd, so for j <= 0 that takes D * 5^-j < 2^24, and for j > 0
// it takes 5^j dividing D (the rest of D is then below 2^24 anyway).
bool IsExactTie(const char* digits, int exp10) {
  const int j = kPrecision - exp10;
  if (j > 10 || j < -2) return false;  // 5^11 exceeds seven digits; D * 5^3 exceeds 2^24
  std::uint32_t d = 0;
  for (int i = 0; i <= kPrecision; ++i)
    d = d * 10 + static_cast<std::uint32_t>(digits[i] - '0');
  if (j <= 0) {
    for (int i = 0; i < -j; ++i)
      d *= 5;
    return d < (1u << 24);
  }
  std::uint32_t power = 1;
  for (int i = 0; i < j; ++i)
    power *= 5;
  return d % power == 0;
}

constexpr char kDigitPairs[] =
    "00010203040506070809101112131415161718192021222324252627282930313233343536373839"
    "40414243444546474849505152535455565758596061626364656667686970717273747576777879"
    "8081828384858687888990919293949596979899";

// Powers of ten that a double holds exactly.
constexpr double kExactPowers[] = {1e0,  1e1,  1e2,  1e3,  1e4,  1e5,  1e6,  1e7,
                                   1e8,  1e9,  1e10, 1e11, 1e12, 1e13, 1e14, 1e15,
                                   1e16, 1e17, 1e18, 1e19, 1e20, 1e21, 1e22};
constexpr int kLargestExactPower = 22;

// value * 10^power in double precision, with at most two roundings.
double Scale(double value, int power) {
  if (power >= 0) {
    if (power > kLargestExactPower) {
      value *= kExactPowers[kLargestExactPower];
      power -= kLargestExactPower;
    }
    return value * kExactPowers[power];
  }
  if (-power > kLargestExactPower) {
    value /= kExactPowers[kLargestExactPower];
    power += kLargestExactPower;
  }
  return value / kExactPowers[-power];
}

// The six significant digits of a normal float, rounded as "%g" rounds them, found by scaling it
// into [10^5, 10^6). The scaling errs by a few units in the 16th digit, far below the half unit in
// the 7th that decides the rounding; only a value within that error of a tie is left to the
// caller, which then reports false.
bool SixDigits(float value, std::uint32_t& digits, int& exp10) {
  const int exp2 = static_cast<int>(std::bit_cast<std::uint32_t>(value) >> 23) - 127;
  exp10 = (exp2 * 78913) >> 18;  // floor(exp2 * log10(2)): the true exponent or one below it
  double scaled = Scale(value, kPrecision - 1 - exp10);
  if (scaled >= 1e6) {
    ++exp10;
    scaled = Scale(value, kPrecision - 1 - exp10);
  }
  const double whole = static_cast<double>(static_cast<std::uint32_t>(scaled));
  const double fraction = scaled - whole;
  if (fraction > 0.5 - 1e-7 && fraction < 0.5 + 1e-7) return false;
  digits = static_cast<std::uint32_t>(whole) + (fraction > 0.5 ? 1 : 0);
  if (digits == 1000000) {
    digits = 100000;
    ++exp10;
  }
  return digits >= 100000 && digits < 1000000;
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

  std::uint32_t six;
  int six_exp10;
  if (magnitude >= 0x00800000u && SixDigits(abs_value, six, six_exp10)) {
    // LayOut copies in chunks of eight from any digit on; the places after the sixth never show.
    char digits[16] = {'0', '0', '0', '0', '0', '0', '0', '0',
                       '0', '0', '0', '0', '0', '0', '0', '0'};
    int count = kPrecision;
    std::memcpy(digits, kDigitPairs + 2 * (six / 10000), 2);
    std::memcpy(digits + 2, kDigitPairs + 2 * (six / 100 % 100), 2);
    std::memcpy(digits + 4, kDigitPairs + 2 * (six % 100), 2);
    while (digits[count - 1] == '0')
      --count;
    char local[24];
    const std::size_t length = LayOut(digits, count, six_exp10, local);
    std::memcpy(p, local, length);
    return static_cast<std::size_t>(p - out) + length;
  }

  // The shortest round-trip form S lies within half an ulp of the value, and no candidate with as
  // few digits is closer. A normal float's half ulp is below half a unit in the sixth digit, so an
  // S of up to six digits is already the six-digit rounding. A longer S rounds the same way as the
  // value: a rounding boundary (seven digits) strictly between them would have been a shorter or
  // closer candidate. That leaves S sitting exactly on a boundary, where only the exact value
  // decides, and subnormals, whose ulp is too coarse; both take the slow route.
  if (magnitude >= 0x00800000u) {
    // "d[.dddddddd]e±XX" after one spare byte, so that moving the first digit onto the point
    // leaves all digits contiguous. A normal float's exponent always has two digits.
    char text[24];
    const char* const end =
        std::to_chars(text + 1, text + 16, abs_value, std::chars_format::scientific).ptr;
    int exp10 = (end[-2] - '0') * 10 + (end[-1] - '0');
    if (end[-3] == '-') exp10 = -exp10;
    char* digits = text + 1;
    int count = 1;
    if (end - text > 6) {
      text[2] = text[1];
      digits = text + 2;
      count = static_cast<int>(end - text) - 6;
    }

    bool exact_tie = false;
    if (count > kPrecision) {
      const char next = digits[kPrecision];
      bool up = next > '5' || (next == '5' && count > kPrecision + 1);
      if (next == '5' && count == kPrecision + 1) {
        // S sits on a rounding boundary; round half to even if it is the exact value, as printf
        // does, and otherwise let the exact value decide.
        exact_tie = !IsExactTie(digits, exp10);
        up = (digits[kPrecision - 1] - '0') % 2 != 0;
      }
      count = kPrecision;
      if (up) {
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
    if (!exact_tie) {
      char local[24];
      const std::size_t length = LayOut(digits, count, exp10, local);
      std::memcpy(p, local, length);
      return static_cast<std::size_t>(p - out) + length;
    }
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
