// The least that packing and reading a workload can cost: its number conversions alone
// (std::to_chars at six significant digits, std::from_chars), plus one pass over the package's
// bytes (copying them, or finding each "<" with memchr), plus, reading, one copy of every text.
#pragma once

#include <cstddef>

#include "bench/workload.h"

namespace bench {

// Every float of the workload's source, in Values order, each followed by a space. Returns the
// length; `out` needs room for 16 characters a float.
std::size_t FormatNumbers(const Workload& workload, char* out);

// Reads the numbers that FormatNumbers wrote into `output`'s floats, in the same order. Returns
// how many it read.
std::size_t ParseNumbers(const Workload& workload, const char* text, std::size_t length,
                         Values& output);

// Hands every text of the workload to `output`, one copy each, as a reader must.
void CopyTexts(const Workload& workload, Values& output);

// The "<" in the text, found one memchr at a time.
std::size_t CountTags(const char* text, std::size_t length);

}  // namespace bench
