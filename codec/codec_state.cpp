// The shared buffer and cursor, and the appends that write a package into it.
#include <algorithm>
#include <climits>
#include <cstring>

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

namespace {

// Most pieces are a few bytes long: copied by fixed-size moves, which need no call, that overlap
// where the piece is shorter than two of them.
char* CopyPiece(std::string_view piece, char* out) {
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
  } else {
    for (std::size_t i = 0; i < size; ++i)
      out[i] = in[i];
  }
  return out + size;
}

}  // namespace

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

// Pieces are appended as one: copied whole with a NUL after them when they fit together with
// that NUL, otherwise not at all. Either way they are counted, so that a first pass into a small
// buffer measures the package. Counts stop at INT_MAX, which no buffer of an int size reaches.
void Lum_DataPackage::AppendPieces(std::initializer_list<std::string_view> pieces) {
  long long length = 0;
  for (std::string_view piece : pieces)
    length += static_cast<long long>(piece.size());
  const long long end = bufferCursor + length;
  if (end < bufferEnd - bufferStart) {
    // The caller's buffer, writable: the member is const for the readers' sake.
    char* out = const_cast<char*>(bufferStart) + bufferCursor;
    for (std::string_view piece : pieces)
      out = CopyPiece(piece, out);
    *out = '\0';
  }
  bufferCursor = static_cast<int>(std::min<long long>(end, INT_MAX - 1));
  requiredSize = static_cast<int>(std::min<long long>(requiredSize + length, INT_MAX));
}

const char* Lum_DataPackage::GetTabs() { return Indentation().data(); }

const char* Lum_DataPackage::GetNewline() {
  const std::string_view newline = Newline();
  std::memcpy(newlineBuffer, newline.data(), newline.size() + 1);
  return newlineBuffer;
}

// GetNewline and GetTabs with their lengths, as the element writers put them together.
std::string_view Lum_DataPackage::Newline() { return fileNoTxtChan ? "\n" : "\r\n"; }

std::string_view Lum_DataPackage::Indentation() {
  const int tabs = std::clamp(treeDepth, 0, kMaxTabs);
  std::memset(tabsBuffer, '\t', static_cast<std::size_t>(tabs));
  tabsBuffer[tabs] = '\0';
  return {tabsBuffer, static_cast<std::size_t>(tabs)};
}
