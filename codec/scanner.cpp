// The reader's vocabulary: forward searches from the cursor over the text being read, which ends
// at bufferEnd or at a NUL before it. Nothing here looks at a byte outside that text.
#include <algorithm>
#include <climits>
#include <cstring>

#include "codec/pattern_search.h"
#include "codec/white_space.h"
#include "plugin/data_package.h"

namespace {

constexpr std::string_view kIdAttribute = "id=\"";

bool StartsWith(std::string_view text, const char* prefix) {
  return text.substr(0, std::strlen(prefix)) == prefix;
}

// The rest of Find, out of line: the sixteen bytes ahead hold most delimiters, and their path
// then saves and restores no more than it uses.
template <typename Memo>
PACKAGE_SEARCH_NOINLINE const char* FindBeyondSixteen(std::string_view pattern, const char* from,
                                                      const char* textEnd, const char* bufferStart,
                                                      Memo* memo) {
  constexpr std::ptrdiff_t kNear = 16;
  if (static_cast<std::size_t>(textEnd - from) < pattern.size()) return nullptr;
  const char* const lastStart = textEnd - pattern.size() + 1;
  const int cursor = static_cast<int>(from - bufferStart);
  const char* const nearEnd = from + std::min(kNear, lastStart - from);
  // With room for the whole block, FindInNextSixteen has looked at these starts already.
  const bool nearSeen = textEnd - from >= static_cast<std::ptrdiff_t>(15 + pattern.size());
  if (!nearSeen) {
    if (const char* found = pattern_search::Find(from, nearEnd, textEnd, pattern)) return found;
  }

  if (memo && memo->from <= cursor && (memo->found < 0 || cursor <= memo->found)) {
    return memo->found < 0 ? nullptr : bufferStart + memo->found;
  }
  constexpr std::ptrdiff_t kFar = 256;
  const char* const farEnd = nearEnd + std::min(kFar, lastStart - nearEnd);
  const char* found = pattern_search::Find(nearEnd, farEnd, textEnd, pattern);
  if (!found) found = pattern_search::FindFar(farEnd, lastStart, pattern);
  if (memo) *memo = {cursor, found ? static_cast<int>(found - bufferStart) : -1};
  return found;
}

}  // namespace

// The memo of the delimiters the readers use; others go unremembered.
Lum_DataPackage::DelimiterMemo* Lum_DataPackage::MemoFor(std::string_view pattern) {
  switch (pattern.size()) {
    case 1:
      return pattern[0] == '<'   ? &delimiterMemo[0]
             : pattern[0] == '>' ? &delimiterMemo[1]
                                 : nullptr;
    case 2:
      return pattern == "</" ? &delimiterMemo[2] : nullptr;
    case 5:
      return pattern == "Type=" ? &delimiterMemo[3] : nullptr;
    default:
      return nullptr;
  }
}

// The first occurrence at or after the cursor that lies wholly inside the text. Most delimiters
// stand a few bytes ahead. Beyond that, readers search for the same few delimiters from cursors
// that mostly move forward; remembering the last answer for each keeps a missing or far delimiter
// from being searched for over and over.
const char* Lum_DataPackage::Find(std::string_view pattern) {
  const char* const from = bufferStart + bufferCursor;
  if (const char* found = pattern_search::FindInNextSixteen(from, textEnd, pattern)) return found;
  return FindBeyondSixteen(pattern, from, textEnd, bufferStart, MemoFor(pattern));
}

// A new text, or a new end to it, makes everything learnt about the old one wrong.
void Lum_DataPackage::ForgetSearches() {
  for (DelimiterMemo& memo : delimiterMemo)
    memo.from = INT_MAX;
  ++readSerial;
}

void Lum_DataPackage::MoveCursorAfter(const char* pattern) { MovePast(pattern); }

void Lum_DataPackage::MovePast(std::string_view pattern) {
  if (const char* found = Find(pattern)) {
    bufferCursor = static_cast<int>(found - bufferStart + pattern.size());
  }
}

char* Lum_DataPackage::GetStringBefore(const char* delimiter) {
  CutStringBefore(delimiter, stringBeforeBuffer);
  return stringBeforeBuffer;
}

// Cuts out the trimmed text before the next delimiter into `text` (kTextLength chars). Text too
// long for it cuts out as the empty string, as does a missing delimiter.
void Lum_DataPackage::CutStringBefore(std::string_view delimiter, char* text) {
  const std::string_view cut = TextBefore(delimiter);
  std::copy(cut.begin(), cut.end(), text);
  text[cut.size()] = '\0';
}

// What CutStringBefore cuts out, left where it stands; the cursor moves the same way. Readers that
// only compare a tag's content with a name need no copy of it.
std::string_view Lum_DataPackage::TextBefore(std::string_view delimiter) {
  const char* end = Find(delimiter);
  if (!end) return {};
  const char* const begin = pattern_search::SkipWhiteSpace(bufferStart + bufferCursor, textEnd);
  bufferCursor = static_cast<int>(begin - bufferStart);
  while (end > begin && IsWhiteSpaceChar(end[-1]))
    --end;
  const std::size_t length = static_cast<std::size_t>(end - begin);
  if (length == 0 || length >= kTextLength) return {};
  bufferCursor = static_cast<int>(end - bufferStart);
  return {begin, length};
}

const char* Lum_DataPackage::SkipWhiteSpace(const char* p) {
  return pattern_search::SkipWhiteSpace(p, textEnd);
}

bool Lum_DataPackage::IsWhiteSpace(char c) { return IsWhiteSpaceChar(c); }

bool Lum_DataPackage::MoveCursorBeforeTag(char* name) {
  int unknown = INT_MAX;
  return SearchTag(name, unknown);
}

// Searches as MoveCursorBeforeTag does, knowing that no tag from `failsFrom` on matches; on
// failure it lowers `failsFrom` to what it has learnt.
//
// Whatever "<" a search starts at, its second tag is one that a search from the text's start
// visits too: a "<" inside the content of a tag on that chain cuts out up to the same ">" and goes
// on from the same place. So every tag from a failed search's second on fails for any search.
bool Lum_DataPackage::SearchTag(const char* name, int& failsFrom) {
  const int start = bufferCursor;
  // A tag that matches holds the name: where the name occurs nowhere ahead, no tag does.
  if (failsFrom > start) {
    const std::string_view rest(bufferStart + start,
                                static_cast<std::size_t>(textEnd - bufferStart - start));
    if (rest.find(name) == std::string_view::npos) {
      failsFrom = start;
      return false;
    }
  }
  int secondTag = -1;
  for (bool first = true;; first = false) {
    const int before = bufferCursor;
    MovePast("<");
    const int tag = bufferCursor - 1;
    if (bufferCursor == before || bufferStart + bufferCursor >= textEnd ||
        (!first && tag >= failsFrom)) {
      failsFrom =
          std::min(failsFrom, secondTag >= 0 ? secondTag : static_cast<int>(textEnd - bufferStart));
      bufferCursor = start;
      return false;
    }
    if (!first && secondTag < 0) secondTag = tag;
    std::string_view content = TextBefore(">");
    bool found = content == name;
    if (!found) {
      // The name followed by an id attribute: cut at the whitespace before the first 'id="'.
      if (std::size_t id = content.find(kIdAttribute); id != std::string_view::npos) {
        while (id > 0 && IsWhiteSpaceChar(content[id - 1]))
          --id;
        found = content.substr(0, id) == name;
      }
    }
    if (found) {
      bufferCursor = tag;
      return true;
    }
  }
}

int Lum_DataPackage::GetItemType(char* name) {
  const int start = bufferCursor;
  const auto skipWhiteSpace = [] {
    bufferCursor = static_cast<int>(
        pattern_search::SkipWhiteSpace(bufferStart + bufferCursor, textEnd) - bufferStart);
  };
  const auto rest = [] {
    const char* here = bufferStart + bufferCursor;
    return std::string_view(here, static_cast<std::size_t>(textEnd - here));
  };
  const auto skip = [&](std::size_t count) {
    bufferCursor += static_cast<int>(std::min(count, rest().size()));
  };

  int type = 0;
  MovePast("<");
  skipWhiteSpace();
  const std::size_t nameLength = pattern_search::TextLength(name, tagName);
  if (rest().size() > nameLength &&
      pattern_search::SameBytes(bufferStart + bufferCursor, name, nameLength)) {
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
        if (StartsWith(TextBefore(">"), name)) type = 3;
      }
    }
  }
  bufferCursor = start;
  return type;
}
