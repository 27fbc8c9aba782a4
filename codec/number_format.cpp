#include "codec/number_format.h"

#include <bit>
#include <charconv>
#include <cstdint>
#include <cstring>

namespace numbers {
namespace {

constexpr int kPrecision = 6;  // what "%g" uses without an explicit precision

// Lays out `count` significant digits (no trailing zeros) whose first has decimal exponent
// `exp10` the way "%g" does. Works in fixed-size chunks, writing up to 14 bytes at `local`, scratch
// past the returned length; `digits` must stay readable for eight bytes past each copy start.
std::size_t LayOut(const char* digits, int count, int exp10, char* local) {
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

// The six-digit rounding read off the float's exact decimal expansion, ties to even as printf
// rounds: slow, but right for every value, subnormals and values next to a tie included.
[[gnu::noinline]] std::size_t FormatExactly(std::uint32_t magnitude, char* local) {
  std::uint32_t mantissa = magnitude & 0x7fffffu;
  int exp2 = static_cast<int>(magnitude >> 23);
  if (exp2 == 0) {
    exp2 = 1;  // subnormal
  } else {
    mantissa |= 0x800000u;
  }
  exp2 -= 150;  // the value is mantissa * 2^exp2

  // mantissa * 2^exp2, or mantissa * 5^-exp2 when the value is that times 10^exp2, in base 10^9,
  // least significant limb first: at most 112 digits.
  constexpr std::uint32_t kLimb = 1000000000u;
  std::uint32_t limbs[14] = {mantissa % kLimb, mantissa / kLimb};
  int size = 2;
  const auto multiply = [&](std::uint32_t factor) {
    std::uint64_t carry = 0;
    for (int i = 0; i < size; ++i) {
      const std::uint64_t product = std::uint64_t{limbs[i]} * factor + carry;
      limbs[i] = static_cast<std::uint32_t>(product % kLimb);
      carry = product / kLimb;
    }
    if (carry) limbs[size++] = static_cast<std::uint32_t>(carry);
  };
  for (int left = exp2; left > 0; left -= 29)
    multiply(1u << (left < 29 ? left : 29));
  for (int left = -exp2; left > 0; --left)
    multiply(5);

  char digits[128];
  int count = 0;
  while (size > 1 && limbs[size - 1] == 0)
    --size;
  for (int i = size - 1; i >= 0; --i) {
    char limb[9];
    for (int j = 8; j >= 0; --j, limbs[i] /= 10)
      limb[j] = static_cast<char>('0' + limbs[i] % 10);
    int first = 0;
    if (count == 0) {
      while (first < 8 && limb[first] == '0')
        ++first;
    }
    std::memcpy(digits + count, limb + first, static_cast<std::size_t>(9 - first));
    count += 9 - first;
  }
  int exp10 = count - 1 + (exp2 < 0 ? exp2 : 0);

  if (count > kPrecision) {
    const char next = digits[kPrecision];
    bool rest = false;
    for (int i = kPrecision + 1; i < count && !rest; ++i)
      rest = digits[i] != '0';
    const bool up = next > '5' || (next == '5' && (rest || (digits[kPrecision - 1] - '0') % 2));
    count = kPrecision;
    if (up) {
      int i = kPrecision - 1;
      while (i >= 0 && digits[i] == '9')
        digits[i--] = '0';
      if (i < 0) {
        digits[0] = '1';
        ++exp10;
      } else {
        ++digits[i];
      }
    }
  }
  while (digits[count - 1] == '0')
    --count;
  std::memset(digits + count, '0', 16);  // LayOut reads in chunks of eight
  return LayOut(digits, count, exp10, local);
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
    return static_cast<std::size_t>(p - out) + LayOut(digits, count, six_exp10, p);
  }
  return static_cast<std::size_t>(p - out) + FormatExactly(magnitude, p);
}

std::size_t FormatInt(int value, char* out) {
  return static_cast<std::size_t>(std::to_chars(out, out + 11, value).ptr - out);
}

}  // namespace numbers
