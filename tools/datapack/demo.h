// The Players demo: an engine-side host packs a small tree, scrambles the package and reads it back
// into a second tree.
#pragma once

#include <string>

#include "tools/datapack/plugins.h"

namespace datapack {

// Returns the package it wrote, without its NUL.
std::string RunDemo(const Plugins& plugins);

}  // namespace datapack
