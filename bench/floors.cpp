#include "bench/floors.h"

#include <charconv>
#include <cstring>

namespace bench {

std::size_t FormatNumbers(const Workload& workload, char* out) {
  char* end = out;
  for (int l = 0; l < static_cast<int>(workload.levels.size()); ++l) {
    const Level& level = workload.levels[static_cast<std::size_t>(l)];
    const std::size_t count = level.entries * static_cast<std::size_t>(level.floatsPerEntry);
    if (count == 0) continue;
    const float* floats = workload.source.Floats(l, 0);
    for (std::size_t i = 0; i < count; ++i) {
      end = std::to_chars(end, end + 16, floats[i], std::chars_format::general, 6).ptr;
      *end++ = ' ';
    }
  }
  return static_cast<std::size_t>(end - out);
}

std::size_t ParseNumbers(const Workload& workload, const char* text, std::size_t length,
                         Values& output) {
  const char* at = text;
  const char* const last = text + length;
  std::size_t read = 0;
  for (int l = 0; l < static_cast<int>(workload.levels.size()); ++l) {
    const Level& level = workload.levels[static_cast<std::size_t>(l)];
    const std::size_t count = level.entries * static_cast<std::size_t>(level.floatsPerEntry);
    if (count == 0) continue;
    float* floats = output.Floats(l, 0);
    for (std::size_t i = 0; i < count && at < last; ++i, ++read) {
      at = std::from_chars(at, last, floats[i]).ptr + 1;
    }
  }
  return read;
}

void CopyTexts(const Workload& workload, Values& output) {
  for (int l = 0; l < static_cast<int>(workload.levels.size()); ++l) {
    const Level& level = workload.levels[static_cast<std::size_t>(l)];
    for (std::size_t entry = 0; entry < level.entries; ++entry) {
      for (int text = 0; text < level.textsPerEntry; ++text)
        output.SetText(l, entry, text, workload.source.Text(l, entry, text));
    }
  }
}

std::size_t CountTags(const char* text, std::size_t length) {
  std::size_t tags = 0;
  const char* const last = text + length;
  for (const char* at = text;
       (at = static_cast<const char*>(std::memchr(at, '<', static_cast<std::size_t>(last - at))));
       ++at) {
    ++tags;
  }
  return tags;
}

}  // namespace bench
