// The package as a person reads it: the header, each directory with its entry count, each entry
// with its typed values, indented by nesting.
#pragma once

#include <string>
#include <string_view>

#include "tools/datapack/file_io.h"
#include "tools/datapack/package_model.h"

namespace datapack {

void WriteOutline(const Package& package, Output& out);

// A value as the outline shows it: texts quoted and escaped, numbers in the fewest digits.
std::string ValueText(const Value& value);

// "1 entry", "2 entries".
std::string Counted(std::size_t count, std::string_view one, std::string_view many);

}  // namespace datapack
