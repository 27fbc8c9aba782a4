// Finds the channel tree a package text was written from: the header, the directory elements with
// their entries, and the typed elements of each entry. Tags stand where the writer puts them, but
// any whitespace may separate them, as the reader allows.
#pragma once

#include <cstddef>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "tools/datapack/package_model.h"

namespace datapack {

// The entries of one directory element as the text holds them, before any reader sees them.
struct FoundDirectory {
  std::size_t offset = 0;                            // of its first opening tag
  std::vector<std::vector<FoundDirectory>> entries;  // per entry, its sub-directories
};

// What the reader would take otherwise than the text holds it, noticed on the way.
struct Note {
  std::size_t offset;
  bool warning;         // the engine gets the same values, but writing them again differs
  std::string message;  // with the path of what it is about
};

struct Structure {
  std::string header;
  bool crlf = false;
  Shape top;
  FoundDirectory found;
  std::vector<Note> notes;
};

class StructureError : public std::runtime_error {
 public:
  StructureError(std::size_t offset, const std::string& message)
      : std::runtime_error(message), offset_(offset) {}
  std::size_t offset() const { return offset_; }

 private:
  std::size_t offset_;
};

// Throws StructureError at the place where the text stops following the package layout.
Structure FindStructure(std::string_view text);

}  // namespace datapack
