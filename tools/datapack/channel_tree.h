// The channel tree of a package, built through the host as the engine builds it: DataDirectories
// from the plug-in, texts from the string-channel plug-in, the host's value, vector and matrix
// channels. Its "Call each iteration" channels hand each entry's values to the writer, or take
// them from the reader.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "tools/datapack/package_model.h"
#include "tools/datapack/plugins.h"

namespace datapack {

class ChannelTree {
 public:
  ChannelTree(const Plugins& plugins, const Shape& top);
  ~ChannelTree();
  ChannelTree(const ChannelTree&) = delete;
  ChannelTree& operator=(const ChannelTree&) = delete;

  // The package of these entries, measured first and then written into a buffer of exactly the
  // measured size; returned without its NUL.
  std::string Write(const std::string& header, Entries entries, bool crlf, bool scramble);

  // Adds to `into`, a table of the tree's shape, emptied first, the entries the tree receives
  // from reading the text, read where it stands: the reader only looks, and the string's own
  // terminating NUL ends it.
  // With a sink, each entry of the top directory goes there once read and is then dropped: the
  // entries need never be held all at once.
  // `expected`, the number of entries the text holds, measures the progress shown.
  void Read(std::string& text, bool crlf, Table& into,
            const std::function<void(Entry)>& sink = nullptr, std::size_t expected = 0);

 private:
  struct Node;
  Plugins plugins_;
  std::unique_ptr<Node> top_;
};

// Writes the package through a tree of its own shape.
std::string WritePackage(const Plugins& plugins, const Package& package, bool scramble);

}  // namespace datapack
