// Places in a JSON text, for messages that point at the value they are about.
#pragma once

#include <cstddef>
#include <string_view>

namespace datapack {

// The byte offset of the value a JSON pointer names in a well-formed JSON text; of the nearest
// value on its way there when the text has no such value.
std::size_t LocateJsonPointer(std::string_view text, std::string_view pointer);

// The byte offset of the first number from `from` on too large for a float; npos when there is
// none.
std::size_t FindOverflowingNumber(std::string_view text, std::size_t from);

}  // namespace datapack
