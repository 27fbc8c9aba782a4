#pragma once

#include <string_view>

namespace numbers {

// Reads one number from the text [first, last) exactly as sscanf(text, "%f", &value) does in the
// "C" locale on a NUL-terminated copy of that text. The text also ends at the first NUL before
// `last`; nothing at or after `last` is ever read. Returns the end of what the conversion consumed,
// or nullptr on a matching/input failure (then `value` is left unchanged).
const char* ScanFloat(const char* first, const char* last, float& value);

// Like sscanf(text, format, &values[0], &values[1], ...) on a NUL-terminated copy of [first, last)
// (again ending at the first NUL), for formats made only of "%f" directives, whitespace (matches
// any amount of whitespace, including none) and other literal characters (must match exactly).
// Returns how many values were stored (never EOF: 0 when none). Values after the first failure are
// untouched. A '%' followed by anything but 'f' stops the scan there.
int ScanFloats(const char* first, const char* last, std::string_view format, float* values);

// ScanFloats for the formats of `count` "%f" separated by spaces, with a comma directly after
// every `group`-th but the last: "%f", "%f %f %f" (group 3) and the matrix's sixteen in rows of
// four. The same values and count, without reading the format; `end` receives where the scan
// stopped: past everything the format matched.
int ScanFloatGroups(const char* first, const char* last, int count, int group, float* values,
                    const char** end);

}  // namespace numbers
