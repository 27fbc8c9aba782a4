// The appends that write a package, inline so that an element's pieces are summed and copied
// without a loop, and pieces of a size known when compiling copy as fixed-size moves.
#pragma once

#include <algorithm>
#include <array>
#include <climits>
#include <concepts>
#include <cstring>
#include <string_view>

#include "plugin/data_package.h"

namespace package_output {

constexpr int kMaxTabs = Lum_DataPackage::kMaxTabs;

// "\r\n", every tab an indentation can have, and a NUL: line starts and indentations are views
// into it, so no tab is ever written out before it is copied.
inline constexpr auto kLineStarts = [] {
  std::array<char, kMaxTabs + 3> run{};
  run[0] = '\r';
  run[1] = '\n';
  for (int i = 2; i < kMaxTabs + 2; ++i)
    run[static_cast<std::size_t>(i)] = '\t';
  run.back() = '\0';
  return run;
}();

inline std::size_t TabCount(int depth) {
  return static_cast<std::size_t>(std::clamp(depth, 0, kMaxTabs));
}

// Ends where the run's NUL stands.
inline std::string_view Tabs(int depth) {
  const std::size_t tabs = TabCount(depth);
  return {kLineStarts.data() + kLineStarts.size() - 1 - tabs, tabs};
}

// The newline that ends the previous line and the indentation of the next, as one piece.
inline std::string_view LineStart(bool lineFeeds, int depth) {
  const std::size_t newline = lineFeeds ? 1 : 2;
  return {kLineStarts.data() + 2 - newline, newline + TabCount(depth)};
}

// Most pieces are a few bytes long: copied by fixed-size moves, which need no call, that overlap
// where the piece is shorter than two of them.
inline char* CopyPiece(std::string_view piece, char* out) {
  const char* in = piece.data();
  const std::size_t size = piece.size();
  if (size >= 16) {
    std::memcpy(out, in, size);
  } else if (size >= 8) {
    std::memcpy(out, in, 8);
    std::memcpy(out + size - 8, in + size - 8, 8);
  } else if (size >= 4) {
    std::memcpy(out, in, 4);
    std::memcpy(out + size - 4, in + size - 4, 4);
  } else if (size > 0) {
    out[0] = in[0];
    out[size / 2] = in[size / 2];
    out[size - 1] = in[size - 1];
  }
  return out + size;
}

// The package's buffer and cursor, lent by the members that own them.
struct Output {
  const char* start;
  const char* end;
  int& cursor;
  int& required;

  // Pieces are appended as one: copied whole with a NUL after them when they fit together with
  // that NUL, otherwise not at all. Either way they are counted, so that a first pass into a
  // small buffer measures the package. Counts stop at INT_MAX, which no buffer of an int size
  // reaches. Reserve counts and says where the pieces go, or null when they do not fit.
  char* Reserve(long long length) {
    const long long after = cursor + length;
    // The caller's buffer, writable: the member is const for the readers' sake.
    char* out = after < end - start ? const_cast<char*>(start) + cursor : nullptr;
    cursor = static_cast<int>(std::min<long long>(after, INT_MAX - 1));
    required = static_cast<int>(std::min<long long>(required + length, INT_MAX));
    return out;
  }

  template <class... Pieces>
  void Append(const Pieces&... pieces) {
    AppendViews(std::string_view(pieces)...);  // a char* name's length is taken once
  }

  void AppendViews(std::same_as<std::string_view> auto... pieces) {
    if (char* out = Reserve((static_cast<long long>(pieces.size()) + ...))) {
      ((out = CopyPiece(pieces, out)), ...);
      *out = '\0';
    }
  }
};

}  // namespace package_output
