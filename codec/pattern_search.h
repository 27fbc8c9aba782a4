// Finding the reader's delimiters, sixteen bytes at a step where the processor has SSE2 (every
// x86 target the plug-in is built for), a byte at a step elsewhere.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

#include "codec/white_space.h"

#if defined(__SSE2__) || defined(_M_X64) || (defined(_M_IX86_FP) && _M_IX86_FP >= 2)
#define PACKAGE_SEARCH_SSE2 1
#include <emmintrin.h>
#if defined(_MSC_VER) && !defined(__clang__)
#include <intrin.h>
#endif
#endif

// Keeps a rare path's registers and set-up out of the common path that calls it.
#if defined(__GNUC__) || defined(__clang__)
#define PACKAGE_SEARCH_NOINLINE __attribute__((noinline))
#elif defined(_MSC_VER)
#define PACKAGE_SEARCH_NOINLINE __declspec(noinline)
#else
#define PACKAGE_SEARCH_NOINLINE
#endif

namespace pattern_search {

#if defined(PACKAGE_SEARCH_SSE2)

inline unsigned LowestBit(unsigned mask) {
#if defined(_MSC_VER) && !defined(__clang__)
  unsigned long index;
  _BitScanForward(&index, mask);
  return static_cast<unsigned>(index);
#else
  return static_cast<unsigned>(__builtin_ctz(mask));
#endif
}

#endif

inline const char* SkipWhiteSpace(const char* p, const char* end) {
  while (p < end && IsWhiteSpaceChar(*p))
    ++p;
  return p;
}

// SkipWhiteSpace for runs that are seldom short, such as the newline and tabs before an element:
// sixteen bytes at a step.
inline const char* SkipIndentation(const char* p, const char* end) {
#if defined(PACKAGE_SEARCH_SSE2)
  while (end - p >= 16) {
    const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p));
    const __m128i white = _mm_or_si128(_mm_or_si128(_mm_cmpeq_epi8(block, _mm_set1_epi8(' ')),
                                                    _mm_cmpeq_epi8(block, _mm_set1_epi8('\t'))),
                                       _mm_or_si128(_mm_cmpeq_epi8(block, _mm_set1_epi8('\n')),
                                                    _mm_cmpeq_epi8(block, _mm_set1_epi8('\r'))));
    const unsigned other = ~static_cast<unsigned>(_mm_movemask_epi8(white)) & 0xffffu;
    if (other != 0) return p + LowestBit(other);
    p += 16;
  }
#endif
  return SkipWhiteSpace(p, end);
}

// The bytes after the first one match the rest of the pattern.
inline bool RestMatches(const char* p, std::string_view pattern) {
  for (std::size_t i = 1; i < pattern.size(); ++i) {
    if (p[i] != pattern[i]) return false;
  }
  return true;
}

// The first occurrence starting in [p, end) when it may lie far ahead: the C library's memchr
// outruns any loop here over long stretches. The pattern must end before the text does.
inline const char* FindFar(const char* p, const char* end, std::string_view pattern) {
  while (p < end) {
    p = static_cast<const char*>(std::memchr(p, pattern[0], static_cast<std::size_t>(end - p)));
    if (!p || RestMatches(p, pattern)) return p;
    ++p;
  }
  return nullptr;
}

// The first occurrence of `pattern` starting in [p, end), or null. Every byte of an occurrence
// that starts before `end` lies before `readable`, and nothing at or after `readable` is read:
// callers pass end <= readable - pattern.size() + 1.
inline const char* Find(const char* p, const char* end, const char* readable,
                        std::string_view pattern) {
#if defined(PACKAGE_SEARCH_SSE2)
  const __m128i first = _mm_set1_epi8(pattern[0]);
  while (p < end && readable - p >= 16) {
    const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p));
    unsigned mask = static_cast<unsigned>(_mm_movemask_epi8(_mm_cmpeq_epi8(block, first)));
    if (end - p < 16) mask &= (1u << (end - p)) - 1;
    while (mask != 0) {
      const char* candidate = p + LowestBit(mask);
      if (RestMatches(candidate, pattern)) return candidate;
      mask &= mask - 1;
    }
    p += 16;
  }
  for (; p < end; ++p) {
    if (*p == pattern[0] && RestMatches(p, pattern)) return p;
  }
  return nullptr;
#else
  (void)readable;
  return FindFar(p, end, pattern);
#endif
}

// The first occurrence of `pattern` starting among the sixteen bytes from p, or null when they
// hold none or the text ends before an occurrence starting there would.
inline const char* FindInNextSixteen(const char* p, const char* readable,
                                     std::string_view pattern) {
  if (readable - p < static_cast<std::ptrdiff_t>(15 + pattern.size())) return nullptr;
#if defined(PACKAGE_SEARCH_SSE2)
  const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p));
  unsigned mask =
      static_cast<unsigned>(_mm_movemask_epi8(_mm_cmpeq_epi8(block, _mm_set1_epi8(pattern[0]))));
  for (; mask != 0; mask &= mask - 1) {
    const char* const candidate = p + LowestBit(mask);
    if (RestMatches(candidate, pattern)) return candidate;
  }
  return nullptr;
#else
  return FindFar(p, p + 16, pattern);
#endif
}

// Whether [p, p + length) holds `text`.
inline bool SameBytes(const char* p, const char* text, std::size_t length) {
  for (std::size_t i = 0; i < length; ++i) {
    if (p[i] != text[i]) return false;
  }
  return true;
}

// strlen, one step for a short text in `field`, a fixed text field of at least sixteen bytes
// (names are short, and the reader measures them again at every element).
inline std::size_t TextLength(const char* text, const char* field) {
#if defined(PACKAGE_SEARCH_SSE2)
  if (text == field) {
    const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text));
    const unsigned nul =
        static_cast<unsigned>(_mm_movemask_epi8(_mm_cmpeq_epi8(block, _mm_setzero_si128())));
    if (nul != 0) return LowestBit(nul);
  }
#else
  (void)field;
#endif
  return std::strlen(text);
}

// Copies a text of fewer than sixteen bytes, and its NUL, to `field` as TextLength reads it: in one
// sixteen-byte store. A load that spans several smaller stores must wait until they reach the
// cache, while one that lies within a single store takes its bytes straight from it; the reader
// reads each data name just after the walk copies it. The bytes after the NUL become zeros.
inline void StoreShortText(char* field, const char* text, std::size_t length) {
#if defined(PACKAGE_SEARCH_SSE2)
  std::uint64_t low = 0;
  std::uint64_t high = 0;
  for (std::size_t i = 0; i < length; ++i) {
    const std::uint64_t byte = static_cast<unsigned char>(text[i]);
    if (i < 8) {
      low |= byte << 8 * i;
    } else {
      high |= byte << 8 * (i - 8);
    }
  }
  _mm_storeu_si128(reinterpret_cast<__m128i*>(field),
                   _mm_set_epi64x(static_cast<long long>(high), static_cast<long long>(low)));
#else
  for (std::size_t i = 0; i < length; ++i)
    field[i] = text[i];
  field[length] = '\0';
#endif
}

// SameBytes for at most eight bytes, where eight bytes are readable at both p and text: one
// comparison of the first eight, those past `length` left out.
inline bool SameFewBytes(const char* p, const char* text, std::size_t length) {
  if constexpr (std::endian::native == std::endian::little) {
    std::uint64_t a;
    std::uint64_t b;
    std::memcpy(&a, p, sizeof(a));
    std::memcpy(&b, text, sizeof(b));
    const std::uint64_t wanted =
        length >= 8 ? ~std::uint64_t{0} : (std::uint64_t{1} << 8 * length) - 1;
    return ((a ^ b) & wanted) == 0;
  } else {
    return SameBytes(p, text, length);
  }
}

}  // namespace pattern_search
