// The tags of a directory entry and the typed data elements, each serving both directions: one
// walk writes them and reads them back with the same calls.
#include <algorithm>
#include <cstring>

#include "codec/number_format.h"
#include "codec/number_scan.h"
#include "codec/package_output.h"
#include "codec/pattern_search.h"
#include "codec/white_space.h"
#include "plugin/data_package.h"

namespace {

using package_output::LineStart;
using package_output::Output;

// A name, measured in one step where it stands in `field`: the directory's tag field or the
// data names' field, as the walk passes them.
std::string_view FieldText(const char* name, const char* field) {
  return {name, pattern_search::TextLength(name, field)};
}

// Formats floats as the readers take them back: a space between numbers, a comma
// before the space that starts a new row of four.
std::string_view FormatFloats(const float* values, int count, char* out) {
  char* end = out;
  for (int i = 0; i < count; ++i) {
    if (i > 0) {
      if (i % 4 == 0 && count == 16) *end++ = ',';
      *end++ = ' ';
    }
    end += numbers::FormatFloat(values[i], end);
  }
  return std::string_view(out, static_cast<std::size_t>(end - out));
}

// Reading, at `at` just after a typed element's opening tag: scans `count` numbers as "%f %f ..."
// does, with a comma after every fourth of a matrix, and returns where the search for the ">"
// that ends the element may start. What the scan matched holds no ">", so that is past it.
const char* ScanNumbers(const char* at, const char* textEnd, int count, float* values) {
  const char* end = at;
  numbers::ScanFloatGroups(at, textEnd, count, count == 16 ? 4 : count, values, &end);
  return end;
}

// The ">" of a tag when it stands within a few bytes of `from`, or null: then the reader's own
// search, which remembers what it found, takes over.
const char* NearbyClose(const char* from, const char* textEnd) {
  if (const char* close = pattern_search::FindInNextSixteen(from, textEnd, ">")) return close;
  constexpr std::ptrdiff_t kNearby = 32;
  const char* const end = textEnd - from > kNearby ? from + kNearby : textEnd;
  return pattern_search::Find(from, end, textEnd, ">");
}

// What TextBefore(">") and then MovePast(">") give from `from` when the ">" stands a few
// bytes ahead: the tag's content, trimmed, and where the cursor ends, just past the ">". Null
// when it stands further, and the reader's own searches take over.
const char* NearbyTagEnd(const char* from, const char* textEnd, std::string_view& content) {
  const char* const close = NearbyClose(from, textEnd);
  if (!close) return nullptr;
  const char* const begin = pattern_search::SkipWhiteSpace(from, close);
  const char* end = close;
  while (end > begin && IsWhiteSpaceChar(end[-1]))
    --end;
  content = std::string_view(begin, static_cast<std::size_t>(end - begin));
  return close + 1;
}

}  // namespace

bool Lum_DataPackage::XML_OpeningTag(char* name) {
  if (write) {
    Output{bufferStart, bufferEnd, bufferCursor, requiredSize}.Append(
        LineStart(fileNoTxtChan, treeDepth), "<", FieldText(name, tagName), ">");
  } else {
    const std::string_view wanted(name);
    std::string_view content;
    do {
      MovePast("<");
      if (const char* after = NearbyTagEnd(bufferStart + bufferCursor, textEnd, content)) {
        bufferCursor = static_cast<int>(after - bufferStart);
      } else {
        content = TextBefore(">");
        MovePast(">");
      }
    } while (!content.empty() && !content.starts_with(wanted));
  }
  ++treeDepth;
  return true;
}

bool Lum_DataPackage::XML_OpeningIDTag(char* name, int id) {
  if (write) {
    char number[16];  // 11 would do, but the compiler takes the piece for one of up to 16 bytes
    const std::string_view idText(number, numbers::FormatInt(id, number));
    Output{bufferStart, bufferEnd, bufferCursor, requiredSize}.Append(
        LineStart(fileNoTxtChan, treeDepth), "<", FieldText(name, tagName), " id=\"", idText,
        "\">");
    ++treeDepth;
    return true;
  }
  const int start = bufferCursor;
  const std::size_t nameLength = pattern_search::TextLength(name, tagName);
  std::string_view head;  // the tag's content, cut to the name's length
  const std::string_view wanted(name, nameLength);
  do {
    MovePast("<");
    if (const char* after = NearbyTagEnd(bufferStart + bufferCursor, textEnd, head)) {
      bufferCursor = static_cast<int>(after - bufferStart);
    } else {
      head = TextBefore(">");
      MovePast(">");
    }
    head = head.substr(0, nameLength);
  } while (id == 0 && !head.empty() && head != wanted);
  if (head != wanted) {
    bufferCursor = start;
    return false;
  }
  ++treeDepth;
  return true;
}

void Lum_DataPackage::XML_ClosingTag(char* name) {
  --treeDepth;
  if (write) {
    Output{bufferStart, bufferEnd, bufferCursor, requiredSize}.Append(
        LineStart(fileNoTxtChan, treeDepth), "</", FieldText(name, tagName), ">");
    return;
  }
  const std::string_view wanted(name, pattern_search::TextLength(name, tagName));
  std::string_view content;
  do {
    MovePast("</");
    if (const char* after = NearbyTagEnd(bufferStart + bufferCursor, textEnd, content)) {
      bufferCursor = static_cast<int>(after - bufferStart);
    } else {
      content = TextBefore(">");
      MovePast(">");
    }
  } while (!content.empty() && content != wanted);
}

void Lum_DataPackage::WriteTypedElement(std::string_view name, std::string_view type,
                                        std::string_view value) {
  Output{bufferStart, bufferEnd, bufferCursor, requiredSize}.Append(
      LineStart(fileNoTxtChan, treeDepth), "<", name, " Type=\"", type, "\"> ", value, " </", name,
      ">");
}

// Reading: takes the element at the next "<" when its name is `name`, leaving the cursor just
// after its opening tag; otherwise puts the cursor back and reports false.
// A name that trimmed text can equal, and in which no "Type=" cuts the text short.
bool Lum_DataPackage::IsPlainName(std::string_view name) {
  if (name.empty() || name.size() >= kTextLength || IsWhiteSpaceChar(name.front()) ||
      IsWhiteSpaceChar(name.back())) {
    return false;
  }
  // Names are short: a byte at a time beats a call.
  for (std::size_t i = 0; i + 5 <= name.size(); ++i) {
    if (name[i] == 'T' && pattern_search::SameBytes(name.data() + i, "Type=", 5)) return false;
  }
  return true;
}

bool Lum_DataPackage::ReadTypedElementName(const char* name) {
  const int start = bufferCursor;
  const std::size_t length = pattern_search::TextLength(name, strg2);
  // Elements follow one another with only whitespace between them: a "<" after whitespace is
  // the first one ahead.
  const char* open = pattern_search::SkipIndentation(bufferStart + start, textEnd);
  if (open == textEnd || *open != '<') open = Find("<");
  if (open && IsPlainName(std::string_view(name, length))) {
    // The trimmed text between "<" and the first "Type=" equals such a name exactly when the name
    // stands right after the "<" and whitespace, followed by whitespace and "Type=": "Type=" can
    // neither start inside the name nor straddle its end. So it is compared where it stands.
    const char* p = pattern_search::SkipWhiteSpace(open + 1, textEnd);
    const char* const type =
        pattern_search::SkipWhiteSpace(p + std::min(length, std::size_t(textEnd - p)), textEnd);
    // Names of eight bytes or fewer in strg2, where ReadWriteData puts them, compare as a word.
    const bool few = length <= 8 && name == strg2 && textEnd - p >= 8;
    const bool match = static_cast<std::size_t>(textEnd - p) >= length &&
                       (few ? pattern_search::SameFewBytes(p, name, length)
                            : pattern_search::SameBytes(p, name, length)) &&
                       std::string_view(type, textEnd).starts_with("Type=");
    if (!match) {
      bufferCursor = start;
      return false;
    }
    // Neither the whitespace nor "Type=" holds the ">" that ends the tag.
    if (const char* close = NearbyClose(type + 5, textEnd)) {
      bufferCursor = static_cast<int>(close + 1 - bufferStart);
    } else {
      bufferCursor = static_cast<int>(p + length - bufferStart);
      MovePast(">");
    }
    return true;
  }
  MovePast("<");
  CutStringBefore("Type=", tmp2);
  MovePast(">");
  if (std::strcmp(tmp2, name) == 0) return true;
  bufferCursor = start;
  return false;
}

void Lum_DataPackage::XML_StringTag(char* name, char* text) {
  if (write) {
    WriteTypedElement(FieldText(name, strg2), "Txt", text);
  } else if (ReadTypedElementName(name)) {
    CutStringBefore("</", text);
    MovePast(">");
  } else {
    text[0] = '\0';
  }
}

void Lum_DataPackage::XML_ValueTag(char* name, float& value) {
  if (write) {
    WriteTypedElement(FieldText(name, strg2), "Val", FormatFloats(&value, 1, tmp2));
  } else if (ReadTypedElementName(name)) {
    if (const char* close =
            NearbyClose(ScanNumbers(bufferStart + bufferCursor, textEnd, 1, &value), textEnd)) {
      bufferCursor = static_cast<int>(close + 1 - bufferStart);
    } else {
      MovePast(">");
    }
  } else {
    value = 0.0f;
  }
}

void Lum_DataPackage::XML_VectorTag(char* name, D3DXVECTOR3& vector) {
  float values[3] = {vector.x, vector.y, vector.z};
  if (write) {
    WriteTypedElement(FieldText(name, strg2), "Vec", FormatFloats(values, 3, tmp2));
    return;
  }
  if (ReadTypedElementName(name)) {
    if (const char* close =
            NearbyClose(ScanNumbers(bufferStart + bufferCursor, textEnd, 3, values), textEnd)) {
      bufferCursor = static_cast<int>(close + 1 - bufferStart);
    } else {
      MovePast(">");
    }
  } else {
    values[0] = values[1] = values[2] = 0.0f;
  }
  vector = {values[0], values[1], values[2]};
}

void Lum_DataPackage::XML_MatrixTag(char* name, D3DXMATRIX& matrix) {
  float values[16];
  std::memcpy(values, &matrix, sizeof(values));
  if (write) {
    WriteTypedElement(FieldText(name, strg2), "Mat", FormatFloats(values, 16, tmp2));
    return;
  }
  if (ReadTypedElementName(name)) {
    if (const char* close =
            NearbyClose(ScanNumbers(bufferStart + bufferCursor, textEnd, 16, values), textEnd)) {
      bufferCursor = static_cast<int>(close + 1 - bufferStart);
    } else {
      MovePast(">");
    }
  } else {
    std::memset(values, 0, sizeof(values));
  }
  std::memcpy(&matrix, values, sizeof(values));
}
