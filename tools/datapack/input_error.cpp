#include "tools/datapack/input_error.h"

#include <algorithm>

namespace datapack {

std::string LineAndColumn(std::string_view text, std::size_t offset) {
  const std::string_view before = text.substr(0, std::min(offset, text.size()));
  const std::size_t line = static_cast<std::size_t>(std::count(before.begin(), before.end(), '\n'));
  const std::size_t lineStart = before.rfind('\n');
  const std::size_t column =
      lineStart == std::string_view::npos ? before.size() : before.size() - lineStart - 1;
  return std::to_string(line + 1) + ":" + std::to_string(column + 1);
}

}  // namespace datapack
