// What the package format counts as whitespace between and inside tags.
#pragma once

// Exactly these four: form feed, vertical tab and NUL are not whitespace here. One bit test, not
// four comparisons: whitespace is tested at nearly every byte a read looks at. Each byte's bit
// sits one place down, so that space fits a 32-bit word (a 64-bit shift takes several
// instructions on the engine's 32-bit platform) and NUL wraps around out of range.
constexpr bool IsWhiteSpaceChar(char c) {
  constexpr unsigned kWhiteSpace =
      1u << ('\t' - 1) | 1u << ('\n' - 1) | 1u << ('\r' - 1) | 1u << (' ' - 1);
  const unsigned place = static_cast<unsigned char>(c) - 1u;
  return place < 32 && (kWhiteSpace >> place & 1) != 0;
}
