// Package texts are 8-bit and carry no encoding. JSON needs Unicode: texts that are UTF-8 pass as
// they are, any others byte by byte as Latin-1 characters.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace datapack {

bool IsUtf8(std::string_view bytes);

std::string Latin1ToUtf8(std::string_view bytes);

// The bytes of a UTF-8 text whose characters all lie below U+0100; otherwise the offset of the
// first character that does not.
struct Latin1Result {
  std::string bytes;
  std::optional<std::size_t> badCharacter;
};
Latin1Result Utf8ToLatin1(std::string_view text);

}  // namespace datapack
