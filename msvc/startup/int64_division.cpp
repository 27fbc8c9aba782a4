// 64-bit division, which 32-bit code calls out for (__alldiv and kin); Microsoft's static runtime
// has them, msvcrt.dll does not export them. They take two 64-bit arguments on the stack, pop
// them, and return in edx:eax, as __stdcall does. Nothing here divides 64-bit numbers itself.
using U64 = unsigned long long;
using S64 = long long;

namespace {

U64 DivideUnsigned(U64 dividend, U64 divisor, U64& remainder) {
  const auto divisorHigh = static_cast<unsigned>(divisor >> 32);
  const auto divisorLow = static_cast<unsigned>(divisor);
  if (divisorHigh == 0) {
    if (divisorLow == 0) __builtin_trap();
    const auto dividendHigh = static_cast<unsigned>(dividend >> 32);
    const auto dividendLow = static_cast<unsigned>(dividend);
    const unsigned quotientHigh = dividendHigh / divisorLow;
    unsigned quotientLow;
    unsigned remainderLow;
    __asm__("divl %4"
            : "=a"(quotientLow), "=d"(remainderLow)
            : "a"(dividendLow), "d"(dividendHigh % divisorLow), "rm"(divisorLow));
    remainder = remainderLow;
    return (static_cast<U64>(quotientHigh) << 32) | quotientLow;
  }
  // A divisor of 2^32 or more leaves a quotient below 2^32: one bit at a time.
  U64 quotient = 0;
  U64 rest = 0;
  for (int bit = 63; bit >= 0; --bit) {
    rest = (rest << 1) | ((dividend >> bit) & 1);
    if (rest >= divisor) {
      rest -= divisor;
      quotient |= U64{1} << bit;
    }
  }
  remainder = rest;
  return quotient;
}

U64 Magnitude(S64 value) {
  return value < 0 ? 0 - static_cast<U64>(value) : static_cast<U64>(value);
}

}  // namespace

extern "C" {
U64 __stdcall UnsignedDivide(U64 a, U64 b) __asm__("__aulldiv");
U64 __stdcall UnsignedRemainder(U64 a, U64 b) __asm__("__aullrem");
S64 __stdcall SignedDivide(S64 a, S64 b) __asm__("__alldiv");
S64 __stdcall SignedRemainder(S64 a, S64 b) __asm__("__allrem");

U64 __stdcall UnsignedDivide(U64 a, U64 b) {
  U64 remainder;
  return DivideUnsigned(a, b, remainder);
}
U64 __stdcall UnsignedRemainder(U64 a, U64 b) {
  U64 remainder;
  DivideUnsigned(a, b, remainder);
  return remainder;
}
S64 __stdcall SignedDivide(S64 a, S64 b) {
  U64 remainder;
  const U64 quotient = DivideUnsigned(Magnitude(a), Magnitude(b), remainder);
  return (a < 0) != (b < 0) ? static_cast<S64>(0 - quotient) : static_cast<S64>(quotient);
}
// The remainder takes the dividend's sign.
S64 __stdcall SignedRemainder(S64 a, S64 b) {
  U64 remainder;
  DivideUnsigned(Magnitude(a), Magnitude(b), remainder);
  return a < 0 ? static_cast<S64>(0 - remainder) : static_cast<S64>(remainder);
}
}
