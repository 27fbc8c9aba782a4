// The tags of a directory entry and the typed data elements, each serving both directions: one
// walk writes them and reads them back with the same calls.
#include <cstring>

#include "codec/number_format.h"
#include "codec/number_scan.h"
#include "codec/white_space.h"
#include "plugin/data_package.h"

namespace {

constexpr std::string_view kVectorFormat = "%f %f %f";
constexpr std::string_view kMatrixFormat = "%f %f %f %f, %f %f %f %f, %f %f %f %f, %f %f %f %f";

// Formats floats as the scan formats above read them back: a space between numbers, a comma
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

}  // namespace

bool Lum_DataPackage::XML_OpeningTag(char* name) {
  if (write) {
    AppendPieces({Newline(), Indentation(), "<", name, ">"});
  } else {
    std::string_view content;
    do {
      MovePast("<");
      content = TextBefore(">");
      MovePast(">");
    } while (!content.empty() && !content.starts_with(name));
  }
  ++treeDepth;
  return true;
}

bool Lum_DataPackage::XML_OpeningIDTag(char* name, int id) {
  if (write) {
    char number[12];
    const std::string_view idText(number, numbers::FormatInt(id, number));
    AppendPieces({Newline(), Indentation(), "<", name, " id=\"", idText, "\">"});
    ++treeDepth;
    return true;
  }
  const int start = bufferCursor;
  const std::size_t nameLength = std::strlen(name);
  std::string_view head;  // the tag's content, cut to the name's length
  do {
    MovePast("<");
    head = TextBefore(">").substr(0, nameLength);
    MovePast(">");
  } while (id == 0 && !head.empty() && head != name);
  if (head != name) {
    bufferCursor = start;
    return false;
  }
  ++treeDepth;
  return true;
}

void Lum_DataPackage::XML_ClosingTag(char* name) {
  --treeDepth;
  if (write) {
    AppendPieces({Newline(), Indentation(), "</", name, ">"});
    return;
  }
  std::string_view content;
  do {
    MovePast("</");
    content = TextBefore(">");
    MovePast(">");
  } while (!content.empty() && content != name);
}

void Lum_DataPackage::WriteTypedElement(std::string_view name, std::string_view type,
                                        std::string_view value) {
  AppendPieces(
      {Newline(), Indentation(), "<", name, " Type=\"", type, "\"> ", value, " </", name, ">"});
}

// Reading: takes the element at the next "<" when its name is `name`, leaving the cursor just
// after its opening tag; otherwise puts the cursor back and reports false.
// A name that trimmed text can equal, and in which no "Type=" cuts the text short.
bool Lum_DataPackage::IsPlainName(std::string_view name) {
  return !name.empty() && name.size() < kTextLength && !IsWhiteSpaceChar(name.front()) &&
         !IsWhiteSpaceChar(name.back()) && name.find("Type=") == std::string_view::npos;
}

bool Lum_DataPackage::ReadTypedElementName(const char* name) {
  const int start = bufferCursor;
  const std::size_t length = std::strlen(name);
  const char* const open = Find("<");
  if (open && IsPlainName(std::string_view(name, length))) {
    // The trimmed text between "<" and the first "Type=" equals such a name exactly when the name
    // stands right after the "<" and whitespace, followed by whitespace and "Type=": "Type=" can
    // neither start inside the name nor straddle its end. So it is compared where it stands.
    const char* p = SkipWhiteSpace(open + 1);
    const bool match = static_cast<std::size_t>(textEnd - p) >= length &&
                       std::memcmp(p, name, length) == 0 &&
                       std::string_view(SkipWhiteSpace(p + length), textEnd).starts_with("Type=");
    bufferCursor = match ? static_cast<int>(p + length - bufferStart) : start;
    if (match) MovePast(">");
    return match;
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
    WriteTypedElement(name, "Txt", text);
  } else if (ReadTypedElementName(name)) {
    CutStringBefore("</", text);
    MovePast(">");
  } else {
    text[0] = '\0';
  }
}

void Lum_DataPackage::XML_ValueTag(char* name, float& value) {
  if (write) {
    WriteTypedElement(name, "Val", FormatFloats(&value, 1, tmp2));
  } else if (ReadTypedElementName(name)) {
    numbers::ScanFloat(bufferStart + bufferCursor, textEnd, value);
    MovePast(">");
  } else {
    value = 0.0f;
  }
}

void Lum_DataPackage::XML_VectorTag(char* name, D3DXVECTOR3& vector) {
  float values[3] = {vector.x, vector.y, vector.z};
  if (write) {
    WriteTypedElement(name, "Vec", FormatFloats(values, 3, tmp2));
    return;
  }
  if (ReadTypedElementName(name)) {
    numbers::ScanFloats(bufferStart + bufferCursor, textEnd, kVectorFormat, values);
    MovePast(">");
  } else {
    values[0] = values[1] = values[2] = 0.0f;
  }
  vector = {values[0], values[1], values[2]};
}

void Lum_DataPackage::XML_MatrixTag(char* name, D3DXMATRIX& matrix) {
  float values[16];
  std::memcpy(values, &matrix, sizeof(values));
  if (write) {
    WriteTypedElement(name, "Mat", FormatFloats(values, 16, tmp2));
    return;
  }
  if (ReadTypedElementName(name)) {
    numbers::ScanFloats(bufferStart + bufferCursor, textEnd, kMatrixFormat, values);
    MovePast(">");
  } else {
    std::memset(values, 0, sizeof(values));
  }
  std::memcpy(&matrix, values, sizeof(values));
}
