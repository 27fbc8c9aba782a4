// The Players demo: an engine-side host packs a small tree, scrambles the package and reads it back
// into a second tree.
#pragma once

#include "tools/datapack/plugins.h"

namespace datapack {

void RunDemo(const Plugins& plugins);

}  // namespace datapack
