#include "host/guid.h"

namespace {

void AppendHex(std::string& text, unsigned value, int digits) {
  static constexpr char kDigits[] = "0123456789ABCDEF";
  for (int shift = 4 * (digits - 1); shift >= 0; shift -= 4)
    text += kDigits[(value >> shift) & 0xF];
}

}  // namespace

std::string GuidToString(const GUID& guid) {
  std::string text;
  AppendHex(text, static_cast<unsigned>(guid.Data1), 8);
  text += '-';
  AppendHex(text, guid.Data2, 4);
  text += '-';
  AppendHex(text, guid.Data3, 4);
  text += '-';
  for (int i = 0; i < 8; ++i) {
    if (i == 2) text += '-';
    AppendHex(text, guid.Data4[i], 2);
  }
  return text;
}
