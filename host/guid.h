// Type GUIDs in the Windows in-memory layout: they cross library boundaries as raw bytes.
#pragma once

#include <cstdint>
#include <cstring>
#include <string>

#include "host/export.h"

#if defined(_WIN32)
#include <guiddef.h>
#else
struct GUID {
  std::uint32_t Data1;
  std::uint16_t Data2;
  std::uint16_t Data3;
  std::uint8_t Data4[8];
};
#endif

static_assert(sizeof(GUID) == 16);

inline bool SameGuid(const GUID& a, const GUID& b) {
  return std::memcmp(&a, &b, sizeof(GUID)) == 0;
}

// The 36-character text form: upper-case hex digits in groups of 8-4-4-4-12, no braces.
TESSEL_API std::string GuidToString(const GUID& guid);

inline constexpr GUID kStringChannelGuid = {
    0x8C24E5B1, 0x19D3, 0x4A7F, {0xB0, 0x52, 0xE6, 0x71, 0x9A, 0x3C, 0x0D, 0x85}};
inline constexpr GUID kValueChannelGuid = {
    0x51D7A0E9, 0xC642, 0x4B18, {0x9E, 0x3D, 0x2F, 0x08, 0xC6, 0xB5, 0xA7, 0x14}};
inline constexpr GUID kVectorChannelGuid = {
    0xC0E83F27, 0x5A91, 0x4F6B, {0x8D, 0x24, 0x71, 0xB9, 0xE0, 0x5A, 0x3C, 0x68}};
inline constexpr GUID kMatrixChannelGuid = {
    0x6B9D12F4, 0xE37A, 0x4C05, {0x9A, 0x81, 0xD4, 0xF2, 0x60, 0x7C, 0x5E, 0xB3}};
inline constexpr GUID kDataDirectoryGuid = {
    0x3F1A9C42, 0x7B05, 0x4D2E, {0xA6, 0xC3, 0x58, 0xE0, 0xB9, 0x1D, 0x47, 0xF6}};
// Declared on a link, it admits a channel of any type.
inline constexpr GUID kAllSupportedTypesGuid = {
    0x11111111, 0x1111, 0x1111, {0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11}};
// The engine's own callback channel, used by hosts to run code once per entry.
inline constexpr GUID kCallbackChannelGuid = {
    0x2D6F8B30, 0x4E1C, 0x4A97, {0xB5, 0x0E, 0x93, 0x7C, 0x1A, 0x64, 0xD2, 0x08}};
