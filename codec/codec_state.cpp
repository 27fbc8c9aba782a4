// The shared buffer and cursor, and the appends that write a package into it.
#include <algorithm>
#include <climits>
#include <cstring>

#include "codec/package_output.h"
#include "plugin/data_package.h"

const char* Lum_DataPackage::bufferStart = nullptr;
const char* Lum_DataPackage::bufferEnd = nullptr;
const char* Lum_DataPackage::textEnd = nullptr;
int Lum_DataPackage::bufferCursor = 0;
int Lum_DataPackage::requiredSize = 0;
int Lum_DataPackage::treeDepth = 0;
bool Lum_DataPackage::write = true;
bool Lum_DataPackage::fileNoTxtChan = true;
bool Lum_DataPackage::busy = false;
char Lum_DataPackage::tmp[kTextLength] = {};
char Lum_DataPackage::tmp2[kTextLength] = {};
char Lum_DataPackage::strg[kTextLength] = {};
char Lum_DataPackage::strg2[kTextLength] = {};
char Lum_DataPackage::tabsBuffer[kMaxTabs + 1] = {};
char Lum_DataPackage::newlineBuffer[3] = {};
char Lum_DataPackage::stringBeforeBuffer[kTextLength] = {};
const Lum_DataPackage* Lum_DataPackage::walkPath[kMaxNesting] = {};
int Lum_DataPackage::walkDepth = 0;
Lum_DataPackage::DelimiterMemo Lum_DataPackage::delimiterMemo[4] = {};
Lum_DataPackage::TagSearchMemo Lum_DataPackage::tagSearchMemo[kTagSearchMemos] = {};
unsigned int Lum_DataPackage::readSerial = 0;

void Lum_DataPackage::SetBuffer(char* buffer, unsigned int size) {
  bufferStart = buffer;
  bufferEnd = buffer + size;
  textEnd = bufferEnd;
  bufferCursor = 0;
  ForgetSearches();
}

// Reading stops at the first NUL, and never looks past bufferEnd for one.
void Lum_DataPackage::EndTextAtNul() {
  const auto size = static_cast<std::size_t>(bufferEnd - bufferStart);
  if (const void* nul = size ? std::memchr(bufferStart, '\0', size) : nullptr) {
    textEnd = static_cast<const char*>(nul);
  }
  ForgetSearches();
}

int Lum_DataPackage::BufferAppend(int length) {
  // Longer lengths would read past tmp; they come only from a failed formatting, as negatives do.
  if (length < 0 || length >= kTextLength) return 0;
  AppendPieces({std::string_view(tmp, length)});
  return length;
}

// Output::Append for a list of pieces made at run time.
void Lum_DataPackage::AppendPieces(std::initializer_list<std::string_view> pieces) {
  long long length = 0;
  for (std::string_view piece : pieces)
    length += static_cast<long long>(piece.size());
  package_output::Output output{bufferStart, bufferEnd, bufferCursor, requiredSize};
  if (char* out = output.Reserve(length)) {
    for (std::string_view piece : pieces)
      out = package_output::CopyPiece(piece, out);
    *out = '\0';
  }
}

const char* Lum_DataPackage::GetTabs() { return Indentation().data(); }

const char* Lum_DataPackage::GetNewline() {
  const std::string_view newline = Newline();
  std::memcpy(newlineBuffer, newline.data(), newline.size() + 1);
  return newlineBuffer;
}

// GetNewline and GetTabs with their lengths.
std::string_view Lum_DataPackage::Newline() { return fileNoTxtChan ? "\n" : "\r\n"; }

std::string_view Lum_DataPackage::Indentation() { return package_output::Tabs(treeDepth); }
