#include "codec/number_scan.h"

#include <bit>
#include <charconv>
#include <cstdint>
#include <system_error>

#include <fast_float/fast_float.h>

namespace numbers {
namespace {

constexpr std::uint32_t kSignBit = 0x80000000u;
constexpr std::uint32_t kInfinityBits = 0x7f800000u;
constexpr std::uint32_t kNanBits = 0x7fc00000u;       // the NaN glibc's strtof returns for "nan"
constexpr std::int64_t kExponentCap = 1'000'000'000;  // far outside float range, safe to add to

// The text ends at `last` or at its first NUL; both read as '\0' here.
char At(const char* p, const char* last) { return p != last ? *p : '\0'; }

bool IsSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }
bool IsDigit(char c) { return static_cast<unsigned char>(c - '0') < 10; }

// Folds ASCII letters to lower case; other characters never fold onto a letter.
char Lower(char c) { return static_cast<char>(c | 0x20); }

int HexValue(char c) {
  if (IsDigit(c)) return c - '0';
  const char lower = Lower(c);
  return lower >= 'a' && lower <= 'f' ? lower - 'a' + 10 : -1;
}

const char* SkipSpace(const char* p, const char* last) {
  while (p != last && IsSpace(*p))
    ++p;
  return p;
}

// Case-insensitive match of the lower-case `word` at p.
bool MatchWord(const char* p, const char* last, std::string_view word) {
  for (const char w : word) {
    if (Lower(At(p++, last)) != w) return false;
  }
  return true;
}

// Reads an exponent ("e", "p", then an optional sign and digits) starting at p, clamped to
// kExponentCap. A marker without digits counts as no exponent, as strtof treats it.
std::int64_t ReadExponent(const char* p, const char* end) {
  if (p == end) return 0;
  ++p;
  bool negative = false;
  if (p != end && (*p == '+' || *p == '-')) negative = *p++ == '-';
  std::int64_t exponent = 0;
  for (; p != end && IsDigit(*p); ++p) {
    if (exponent < kExponentCap) exponent = exponent * 10 + (*p - '0');
  }
  return negative ? -exponent : exponent;
}

// std::from_chars for floats, which not every C++ library the plug-in is built with provides:
// correctly rounded, with the same results and errors on every build. A value beyond the float
// range, or a nonzero one below it, is out of range, and the value is then left alone.
std::from_chars_result FloatFromChars(const char* first, const char* last, float& value) {
  float parsed;
  const auto [end, error] = fast_float::from_chars(first, last, parsed);
  if (error != std::errc()) return {end, error};
  const auto magnitude = std::bit_cast<std::uint32_t>(parsed) & 0x7fffffffu;
  bool outOfRange = magnitude == 0x7f800000u;
  if (magnitude == 0) {
    for (const char* p = first; p != end && Lower(*p) != 'e'; ++p)
      outOfRange = outOfRange || (*p >= '1' && *p <= '9');
  }
  if (outOfRange) return {end, std::errc::result_out_of_range};
  value = parsed;
  return {end, error};
}

// For a decimal that from_chars found out of range: true when it is huge rather than tiny.
bool IsHuge(const char* p, const char* end) {
  std::int64_t lead = 0;  // the value lies in [10^(lead - 1), 10^lead) before the exponent
  bool seen_nonzero = false;
  bool dot = false;
  for (; p != end && Lower(*p) != 'e'; ++p) {
    if (*p == '.') {
      dot = true;
    } else if (seen_nonzero || *p != '0') {
      seen_nonzero = true;
      if (!dot) ++lead;
    } else if (dot) {
      --lead;
    }
  }
  return lead + ReadExponent(p, end) > 0;
}

// Fixed-size unsigned integer, just enough for IsDroppedBitTie.
constexpr int kBigLimbs = 13;
constexpr int kBigMaxDigits = 120;  // 10^120 < 2^(32 * kBigLimbs)

void MulAdd(std::uint32_t (&limbs)[kBigLimbs], std::uint32_t factor, std::uint32_t addend) {
  std::uint64_t carry = addend;
  for (std::uint32_t& limb : limbs) {
    const std::uint64_t t = std::uint64_t{limb} * factor + carry;
    limb = static_cast<std::uint32_t>(t);
    carry = t >> 32;
  }
}

// glibc's strtof loses one bit when the result is a subnormal whose leading bit would be 2^-127:
// it reads (4r - 1) * 2^-151 as a tie and rounds to the even r - 1, not to r. Only the exact
// decimal of that value tells; its digits are (4r - 1) * 5^151, the last one at 10^-151.
bool IsDroppedBitTie(const char* p, const char* end, std::uint32_t r) {
  std::uint32_t digits[kBigLimbs] = {};
  std::int64_t count = 0;
  std::int64_t pending_zeros = 0;
  std::int64_t scale = 0;  // the value is digits * 10^scale
  bool dot = false;
  for (; p != end && Lower(*p) != 'e'; ++p) {
    if (*p == '.') {
      dot = true;
      continue;
    }
    if (dot) --scale;
    if (*p == '0') {
      if (count != 0) ++pending_zeros;
      continue;
    }
    if (count + pending_zeros >= kBigMaxDigits) return false;
    for (; pending_zeros != 0; --pending_zeros, ++count)
      MulAdd(digits, 10, 0);
    MulAdd(digits, 10, static_cast<std::uint32_t>(*p - '0'));
    ++count;
  }
  if (scale + pending_zeros + ReadExponent(p, end) != -151) return false;

  std::uint32_t target[kBigLimbs] = {4 * r - 1};
  for (int i = 0; i < 11; ++i)
    MulAdd(target, 1220703125u, 0);  // 5^13
  MulAdd(target, 390625u, 0);        // 5^8
  for (int i = 0; i < kBigLimbs; ++i) {
    if (digits[i] != target[i]) return false;
  }
  return true;
}

bool InDroppedBitBand(std::uint32_t magnitude) {
  return (magnitude & 1) != 0 && magnitude > 0x00400000u && magnitude < 0x00800000u;
}

// Converts an unsigned decimal as strtof does: the longest valid prefix of [p, end).
bool DecimalToBits(const char* p, const char* end, std::uint32_t& bits) {
  float value;
  const auto [parsed_end, error] = FloatFromChars(p, end, value);
  if (error == std::errc::invalid_argument) return false;
  if (error == std::errc::result_out_of_range) {
    bits = IsHuge(p, parsed_end) ? kInfinityBits : 0;
    return true;
  }
  bits = std::bit_cast<std::uint32_t>(value);
  if (InDroppedBitBand(bits) && IsDroppedBitTie(p, parsed_end, bits)) --bits;
  return true;
}

// Converts the hexadecimal digits after "0x" (with optional point and 'p' exponent) as glibc's
// strtof does. Written out rather than left to from_chars because glibc rounds subnormals without
// the 25th significant bit, e.g. 0x1.000001p-150 reads as 0, not as the smallest subnormal.
std::uint32_t HexToBits(const char* p, const char* end) {
  std::uint64_t mantissa = 0;  // the first significant bits; value = mantissa * 2^exponent
  std::int64_t exponent = 0;
  bool sticky = false;  // a nonzero digit beyond what mantissa holds
  bool dot = false;
  for (; p != end; ++p) {
    if (*p == '.') {
      dot = true;
      continue;
    }
    const int digit = HexValue(*p);
    if (digit < 0) break;
    if (mantissa >> 56 == 0) {
      mantissa = mantissa << 4 | static_cast<std::uint64_t>(digit);
      if (dot) exponent -= 4;
    } else {
      sticky |= digit != 0;
      if (!dot) exponent += 4;
    }
  }
  if (mantissa == 0) return 0;
  exponent += ReadExponent(p, end);

  const int width = 64 - std::countl_zero(mantissa);
  std::int64_t lead = exponent + width - 1;  // binary exponent of the leading bit
  if (lead > 127) return kInfinityBits;
  if (lead < -150) return 0;

  std::uint32_t top;  // the leading 24 bits
  bool bit25 = false;
  bool below = sticky;  // anything under bit 25
  if (width > 24) {
    const int shift = width - 24;
    top = static_cast<std::uint32_t>(mantissa >> shift);
    bit25 = (mantissa >> (shift - 1) & 1) != 0;
    below |= (mantissa & ((std::uint64_t{1} << (shift - 1)) - 1)) != 0;
  } else {
    top = static_cast<std::uint32_t>(mantissa << (24 - width));
  }

  if (lead >= -126) {
    if (bit25 && (below || (top & 1) != 0)) {
      if (++top == 1u << 24) {
        top >>= 1;
        if (++lead > 127) return kInfinityBits;
      }
    }
    return static_cast<std::uint32_t>(lead + 127) << 23 | (top & 0x7fffffu);
  }
  // Subnormal: round at `shift`, leaving bit 25 out as glibc does. A carry into bit 23 yields the
  // smallest normal's encoding by itself.
  const int shift = static_cast<int>(-126 - lead);  // 1..24
  std::uint32_t result = top >> shift;
  const bool half = (top >> (shift - 1) & 1) != 0;
  below |= (top & ((1u << (shift - 1)) - 1)) != 0;
  if (half && (below || (result & 1) != 0)) ++result;
  return result;
}

// The general route, p at the first non-space character. glibc's scanf first collects characters
// by its own rules with a single character of pushback, then hands them to strtof. So it may
// consume more than strtof reads ("1e+" is consumed whole and reads as 1) and fails outright
// where it would have to give back several characters ("infinit", "0x").
const char* ScanSlow(const char* p, const char* last, float& value) {
  char c = At(p, last);
  std::uint32_t sign = 0;
  if (c == '-' || c == '+') {
    if (c == '-') sign = kSignBit;
    c = At(++p, last);
  }
  if (c == '\0') return nullptr;

  if (Lower(c) == 'n') {
    // Only "nan"; scanf leaves a "(...)" payload unread.
    if (!MatchWord(p + 1, last, "an")) return nullptr;
    value = std::bit_cast<float>(sign | kNanBits);
    return p + 3;
  }
  if (Lower(c) == 'i') {
    if (!MatchWord(p + 1, last, "nf")) return nullptr;
    p += 3;
    if (Lower(At(p, last)) == 'i') {  // now it must be "infinity"
      if (!MatchWord(p + 1, last, "nity")) return nullptr;
      p += 5;
    }
    value = std::bit_cast<float>(sign | kInfinityBits);
    return p;
  }

  const char* const start = p;
  const bool hex = c == '0' && Lower(At(p + 1, last)) == 'x';
  if (hex) c = At(p += 2, last);
  const char exponent_marker = hex ? 'p' : 'e';
  bool got_digit = false;
  bool got_dot = false;
  bool got_exponent = false;
  bool after_marker = false;
  for (;; c = At(++p, last)) {
    if (IsDigit(c) || (hex && !got_exponent && HexValue(c) >= 0)) {
      got_digit = true;
      after_marker = false;
    } else if (after_marker && (c == '+' || c == '-')) {
      after_marker = false;
    } else if (got_digit && !got_exponent && Lower(c) == exponent_marker) {
      got_exponent = got_dot = after_marker = true;
    } else if (!got_dot && c == '.') {
      got_dot = true;
    } else {
      break;
    }
  }
  if (p == start || (hex && p == start + 2)) return nullptr;

  std::uint32_t bits;
  if (hex) {
    bits = HexToBits(start + 2, p);  // "0x." reads as the "0" before the x
  } else if (!DecimalToBits(start, p, bits)) {
    return nullptr;
  }
  value = std::bit_cast<float>(sign | bits);
  return p;
}

// Powers of ten that a float holds exactly.
constexpr float kExactPowers[] = {1e0f, 1e1f, 1e2f, 1e3f, 1e4f, 1e5f,
                                  1e6f, 1e7f, 1e8f, 1e9f, 1e10f};
constexpr int kLargestExactPower = 10;
constexpr std::uint32_t kExactSignificand = 1u << 24;

// Short decimals, as packages hold them, p at the first digit or point. When all digits make an
// integer that a float holds exactly and the power of ten is one too, one correctly rounded
// multiplication or division gives what strtof gives. Returns null for anything else, including
// a dangling exponent or a hexadecimal prefix, whose reading scanf decides its own way.
const char* ScanShortDecimal(const char* p, const char* last, bool negative, float& value) {
  std::uint32_t significand = 0;
  int power = 0;
  bool digits = false;
  char c = At(p, last);
  for (; IsDigit(c); c = At(++p, last)) {
    significand = significand * 10 + static_cast<std::uint32_t>(c - '0');
    if (significand > kExactSignificand) return nullptr;
    digits = true;
  }
  if (c == '.') {
    for (c = At(++p, last); IsDigit(c); c = At(++p, last)) {
      significand = significand * 10 + static_cast<std::uint32_t>(c - '0');
      if (significand > kExactSignificand) return nullptr;
      --power;
      digits = true;
    }
  }
  if (!digits || Lower(c) == 'x') return nullptr;
  if (Lower(c) == 'e') {
    c = At(++p, last);
    const bool negativeExponent = c == '-';
    if (c == '-' || c == '+') c = At(++p, last);
    if (!IsDigit(c)) return nullptr;
    int exponent = 0;
    for (; IsDigit(c) && exponent <= kLargestExactPower * 4; c = At(++p, last)) {
      exponent = exponent * 10 + (c - '0');
    }
    if (IsDigit(c)) return nullptr;
    power += negativeExponent ? -exponent : exponent;
  }
  if (power < -kLargestExactPower || power > kLargestExactPower) return nullptr;
  float magnitude = static_cast<float>(significand);
  magnitude = power < 0 ? magnitude / kExactPowers[-power] : magnitude * kExactPowers[power];
  value = negative ? -magnitude : magnitude;
  return p;
}

// ScanShortDecimal for the plainest decimals, an optional sign, digits and a point, with room for
// them before the text ends: nothing is checked against `last` byte by byte. Null for anything
// else, an exponent included, which the checked routes take in turn.
constexpr std::ptrdiff_t kPlainRoom = 24;

const char* ScanPlainDecimal(const char* p, float& value) {
  const char* const stop = p + kPlainRoom - 1;  // leaves room for the byte after the last digit
  const bool negative = *p == '-';
  if (*p == '-' || *p == '+') ++p;
  const char* const begin = p;
  std::uint32_t significand = 0;
  for (; IsDigit(*p) && p < stop; ++p)
    significand = significand * 10 + static_cast<std::uint32_t>(*p - '0');
  if (p == stop) return nullptr;
  const char* const point = p;
  if (*p == '.') {
    for (++p; IsDigit(*p) && p < stop; ++p)
      significand = significand * 10 + static_cast<std::uint32_t>(*p - '0');
  }
  const std::ptrdiff_t fraction = *point == '.' ? p - point - 1 : 0;  // at most 8, as digits are
  const std::ptrdiff_t digits = p - begin - (*point == '.');
  if (digits == 0 || digits > 8 || significand > kExactSignificand || p == stop) return nullptr;
  const char next = Lower(*p);
  if (next == 'e' || next == 'x') return nullptr;
  const float magnitude = static_cast<float>(significand) / kExactPowers[fraction];
  value = negative ? -magnitude : magnitude;
  return p;
}

}  // namespace

const char* ScanFloat(const char* first, const char* last, float& value) {
  const char* const p = SkipSpace(first, last);
  if (last - p >= kPlainRoom) {
    if (const char* end = ScanPlainDecimal(p, value)) return end;
  }
  // Plain decimals go straight through from_chars. Anything it stops short of on a letter that
  // scanf might still take ("1e", "0x"), out-of-range values and the one band where glibc rounds
  // differently are left to ScanSlow.
  const char* digits = p;
  char c = At(digits, last);
  if (c == '-' || c == '+') c = At(++digits, last);
  if (IsDigit(c) || c == '.') {
    if (const char* end = ScanShortDecimal(digits, last, *p == '-', value)) return end;
    float parsed;
    const auto [end, error] = FloatFromChars(digits, last, parsed);
    if (error == std::errc()) {
      const char stop = Lower(At(end, last));
      const auto bits = std::bit_cast<std::uint32_t>(parsed);
      if (stop != 'e' && stop != 'x' && !InDroppedBitBand(bits)) {
        value = std::bit_cast<float>(*p == '-' ? bits | kSignBit : bits);
        return end;
      }
    }
  }
  return ScanSlow(p, last, value);
}

int ScanFloats(const char* first, const char* last, std::string_view format, float* values) {
  int stored = 0;
  const char* p = first;
  for (std::size_t i = 0; i < format.size(); ++i) {
    const char directive = format[i];
    if (directive == '%') {
      if (i + 1 == format.size() || format[++i] != 'f') return stored;
      const char* const end = ScanFloat(p, last, values[stored]);
      if (end == nullptr) return stored;
      p = end;
      ++stored;
    } else if (IsSpace(directive)) {
      p = SkipSpace(p, last);
    } else if (directive == '\0' || At(p, last) != directive) {
      return stored;  // a NUL ends a C format string
    } else {
      ++p;
    }
  }
  return stored;
}

int ScanFloatGroups(const char* first, const char* last, int count, int group, float* values,
                    const char** end) {
  int stored = 0;
  int inGroup = 0;
  const char* p = first;
  for (;;) {
    // The plain path first, here, without the call: nearly every number of a package takes it.
    const char* const number = SkipSpace(p, last);
    const char* scanned =
        last - number >= kPlainRoom ? ScanPlainDecimal(number, values[stored]) : nullptr;
    if (!scanned) scanned = ScanFloat(p, last, values[stored]);
    if (!scanned) {
      if (stored > 0) p = number;  // the space before it matched the format's
      break;
    }
    p = scanned;
    if (++stored == count) break;
    if (++inGroup == group) {
      if (At(p, last) != ',') break;
      ++p;
      inGroup = 0;
    }
  }
  *end = p;
  return stored;
}

}  // namespace numbers
