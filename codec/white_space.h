// What the package format counts as whitespace between and inside tags.
#pragma once

// Exactly these four: form feed, vertical tab and NUL are not whitespace here. One bit test, not
// four comparisons: whitespace is tested at nearly every byte a read looks at.
constexpr bool IsWhiteSpaceChar(char c) {
  constexpr unsigned long long kWhiteSpace =
      1ull << '\t' | 1ull << '\n' | 1ull << '\r' | 1ull << ' ';
  const auto byte = static_cast<unsigned char>(c);
  return byte <= ' ' && (kWhiteSpace >> byte & 1) != 0;
}
