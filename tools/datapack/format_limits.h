// What a package cannot carry: names and texts the reader would take back otherwise than written,
// and more entries or deeper nesting than it walks.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tools/datapack/package_model.h"

namespace datapack {

struct Problem {
  std::string pointer;    // JSON pointer to the value
  std::string message;    // which value and why
  bool forceable = true;  // --force may write it all the same
};

std::vector<Problem> CheckLimits(const Package& package);

// The rules CheckLimits applies, for those who meet names and texts elsewhere: why the reader
// would not take this back as written, or nothing. `directory` says which kind of name.
std::optional<std::string> NameProblem(std::string_view name, bool directory);
std::optional<std::string> TextProblem(std::string_view text);
std::string EntryCountProblem(std::size_t count);

}  // namespace datapack
