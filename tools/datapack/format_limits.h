// What a package cannot carry: names and texts the reader would take back otherwise than written,
// and more entries or deeper nesting than it walks.
#pragma once

#include <string>
#include <vector>

#include "tools/datapack/package_model.h"

namespace datapack {

struct Problem {
  std::string pointer;  // JSON pointer to the value
  std::string message;  // which value and why
};

std::vector<Problem> CheckLimits(const Package& package);

}  // namespace datapack
