// A failure caused by what the user handed the tool: a file, its contents, a missing plug-in. The
// message is complete and ready for standard error; the program exits with status 1 (2 for check
// and diff, whose 1 says what they found).
#pragma once

#include <stdexcept>

namespace datapack {

class InputError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

}  // namespace datapack
