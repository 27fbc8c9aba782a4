// Reading a package as the engine receives it: the structure found in the text decides the channel
// tree, the plug-in's reader fills it.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tools/datapack/format_limits.h"
#include "tools/datapack/package_model.h"
#include "tools/datapack/plugins.h"
#include "tools/datapack/structure_finder.h"

namespace datapack {

struct ReadResult {
  Package package;
  std::vector<FoundDirectory> found;  // the entries the text holds, read or not
  std::vector<Note> notes;
};

// Throws StructureError when the text does not hold a package.
// With a sink, each entry of the top directory goes there as it is read, with the top directory's
// shape, and the result holds no entries: an entry there lasts until the sink returns.
using EntrySink = std::function<void(const Shape& top, Entry entry)>;
ReadResult ReadPackage(const Plugins& plugins, std::string& text, const EntrySink& sink = nullptr);

// Where the text holds another number of entries than the reader took.
struct Shortfall {
  std::size_t offset;
  std::string message;
};
std::vector<Shortfall> FindShortfalls(const ReadResult& result);

// Whether `written`, the package of `package`, reads back and writes again to the same bytes; if
// not, the first value of `package` that does not come back.
// The text is read where it stands, and left as it was.
std::optional<Problem> CheckReadBack(const Plugins& plugins, const Package& package,
                                     std::string& written);

}  // namespace datapack
