// The reader's vocabulary: forward searches from the cursor over the text being read, which ends
// at bufferEnd or at a NUL before it. Nothing here looks at a byte outside that text.
#include <algorithm>
#include <cstring>

#include "plugin/data_package.h"

namespace {

constexpr std::string_view kIdAttribute = "id=\"";

bool StartsWith(std::string_view text, const char* prefix) {
  return text.substr(0, std::strlen(prefix)) == prefix;
}

}  // namespace

// The first occurrence at or after the cursor that lies wholly inside the text.
const char* Lum_DataPackage::Find(std::string_view pattern) {
  const char* from = bufferStart + bufferCursor;
  const std::string_view rest(from, static_cast<std::size_t>(textEnd - from));
  const std::size_t at = rest.find(pattern);
  return at == std::string_view::npos ? nullptr : from + at;
}

void Lum_DataPackage::MoveCursorAfter(const char* pattern) {
  const std::size_t length = std::strlen(pattern);
  if (const char* found = Find(std::string_view(pattern, length))) {
    bufferCursor = static_cast<int>(found - bufferStart + length);
  }
}

char* Lum_DataPackage::GetStringBefore(const char* delimiter) {
  CutStringBefore(delimiter, stringBeforeBuffer);
  return stringBeforeBuffer;
}

// Cuts out the trimmed text before the next delimiter into `text` (kTextLength chars). Text too
// long for it cuts out as the empty string, as does a missing delimiter.
void Lum_DataPackage::CutStringBefore(std::string_view delimiter, char* text) {
  text[0] = '\0';
  const char* end = Find(delimiter);
  if (!end) return;
  const char* begin = bufferStart + bufferCursor;
  while (begin < textEnd && IsWhiteSpace(*begin))
    ++begin;
  bufferCursor = static_cast<int>(begin - bufferStart);
  while (end > begin && IsWhiteSpace(end[-1]))
    --end;
  const std::size_t length = static_cast<std::size_t>(end - begin);
  if (length == 0 || length >= kTextLength) return;
  std::memcpy(text, begin, length);
  text[length] = '\0';
  bufferCursor = static_cast<int>(end - bufferStart);
}

bool Lum_DataPackage::IsWhiteSpace(char c) {
  return c == '\r' || c == '\n' || c == '\t' || c == ' ';
}

bool Lum_DataPackage::MoveCursorBeforeTag(const char* name) {
  const int start = bufferCursor;
  for (;;) {
    const int before = bufferCursor;
    MoveCursorAfter("<");
    if (bufferCursor == before || bufferStart + bufferCursor >= textEnd) {
      bufferCursor = start;
      return false;
    }
    const int tag = bufferCursor - 1;
    CutStringBefore(">", tmp2);
    bool found = std::strcmp(tmp2, name) == 0;
    if (!found) {
      if (char* id = std::strstr(tmp2, kIdAttribute.data())) {
        while (id > tmp2 && IsWhiteSpace(id[-1]))
          --id;
        *id = '\0';
        found = std::strcmp(tmp2, name) == 0;
      }
    }
    if (found) {
      bufferCursor = tag;
      return true;
    }
  }
}

int Lum_DataPackage::GetItemType(const char* name) {
  const int start = bufferCursor;
  const auto skipWhiteSpace = [] {
    while (bufferStart + bufferCursor < textEnd && IsWhiteSpace(bufferStart[bufferCursor])) {
      ++bufferCursor;
    }
  };
  const auto rest = [] {
    const char* here = bufferStart + bufferCursor;
    return std::string_view(here, static_cast<std::size_t>(textEnd - here));
  };
  const auto skip = [&](std::size_t count) {
    bufferCursor += static_cast<int>(std::min(count, rest().size()));
  };

  int type = 0;
  MoveCursorAfter("<");
  skipWhiteSpace();
  const std::size_t nameLength = std::strlen(name);
  if (StartsWith(rest(), name) && rest().size() > nameLength) {
    skip(nameLength);
    skipWhiteSpace();
    if (rest().starts_with("id")) {
      type = 2;
    } else {
      skip(1);  // the ">" that ends a well-formed tag
      skipWhiteSpace();
      type = 1;
      if (rest().starts_with("</")) {
        skip(2);
        CutStringBefore(">", tmp2);
        if (StartsWith(tmp2, name)) type = 3;
      }
    }
  }
  bufferCursor = start;
  return type;
}
