// Finds the channel tree a package text was written from: the header, the directory elements with
// their entries, and the typed elements of each entry. Tags stand where the writer puts them, but
// any whitespace may separate them, as the reader allows.
#pragma once

#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "tools/datapack/package_model.h"

namespace datapack {

// One directory element as the text holds it, before any reader sees it. A package's are listed
// in the order they open: each is followed by those inside its entries, entry by entry. A list
// rather than a tree: small entries would cost several times their text as vectors.
struct FoundDirectory {
  std::size_t offset = 0;  // of its first opening tag
  std::uint32_t entries = 0;
  std::uint32_t end = 0;  // the index in the list past those inside it
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
  std::vector<FoundDirectory> found;  // the first is the top directory
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
