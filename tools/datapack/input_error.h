// A failure caused by what the user handed the tool: a file, its contents, a missing plug-in. The
// message is complete and ready for standard error; the program exits with status 1.
#pragma once

#include <cstddef>
#include <stdexcept>
#include <string>
#include <string_view>

namespace datapack {

class InputError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// "<line>:<column>" of a byte offset in a text, both counted from 1, columns in bytes.
std::string LineAndColumn(std::string_view text, std::size_t offset);

}  // namespace datapack
