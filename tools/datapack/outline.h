// The package as a person reads it: the header, each directory with its entry count, each entry
// with its typed values, indented by nesting.
#pragma once

#include <string>

#include "tools/datapack/package_model.h"

namespace datapack {

std::string PackageOutline(const Package& package);

}  // namespace datapack
