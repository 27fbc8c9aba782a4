// Whole inputs and outputs, byte for byte. No name, or "-", means the standard streams. A file is
// written under a temporary name in its own folder and renamed when complete, so that a failure
// never leaves half of it behind.
#pragma once

#include <string>
#include <string_view>

namespace datapack {

// How messages name an input or output.
std::string StreamName(const std::string& path, bool input);

// Throw InputError naming the file and the reason.
std::string ReadInput(const std::string& path);
void WriteOutput(const std::string& path, std::string_view bytes);

}  // namespace datapack
