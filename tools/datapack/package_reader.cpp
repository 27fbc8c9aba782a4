#include "tools/datapack/package_reader.h"

#include <cstdio>

#include "tools/datapack/channel_tree.h"
#include "tools/datapack/json_mapping.h"
#include "tools/datapack/outline.h"

namespace datapack {
namespace {

void FindShortfalls(const FoundDirectory& found, const Shape& shape,
                    const std::vector<Entry>& entries, const Place& place,
                    std::vector<Shortfall>& out) {
  if (found.entries.size() != entries.size()) {
    out.push_back({found.offset,
                   "the text holds " + Counted(found.entries.size(), "entry", "entries") + " of " +
                       place.path + ", the reader takes " + std::to_string(entries.size())});
  }
  for (std::size_t i = 0; i < std::min(found.entries.size(), entries.size()); ++i) {
    for (std::size_t k = 0; k < shape.directories.size(); ++k) {
      const Shape& sub = shape.directories[k];
      FindShortfalls(found.entries[i][k], sub, entries[i].directories[k],
                     place.Entry(i).Named(sub.name), out);
    }
  }
}

// Numbers compare as the package writes them.
std::string Written(float number) {
  char text[32];
  std::snprintf(text, sizeof(text), "%g", static_cast<double>(number));
  return text;
}

std::string Written(const Value& value) {
  if (const auto* text = std::get_if<std::string>(&value)) return "\"" + *text + "\"";
  if (const float* number = std::get_if<float>(&value)) return Written(*number);
  const float* numbers = std::holds_alternative<D3DXVECTOR3>(value)
                             ? &std::get<D3DXVECTOR3>(value).x
                             : &std::get<D3DXMATRIX>(value).m[0][0];
  const std::size_t count = std::holds_alternative<D3DXVECTOR3>(value) ? 3 : 16;
  std::string out;
  for (std::size_t i = 0; i < count; ++i)
    out += (i ? " " : "") + Written(numbers[i]);
  return out;
}

// The first place where what was read back differs from what was meant.
std::optional<Problem> Difference(const Shape& meant, const std::vector<Entry>& meantEntries,
                                  const Shape& read, const std::vector<Entry>& readEntries,
                                  const Place& list) {
  const auto report = [](const Place& place, const std::string& message) {
    return Problem{place.pointer, place.path + ": " + message};
  };
  const std::size_t meantCount = WrittenEmpty(meant, meantEntries) ? 0 : meantEntries.size();
  const std::size_t readCount = WrittenEmpty(read, readEntries) ? 0 : readEntries.size();
  if (meant.name != read.name) return report(list, "the name reads back as \"" + read.name + "\"");
  if (meantCount != readCount) {
    return report(list, std::to_string(meantCount) + " entries read back as " +
                            std::to_string(readCount) +
                            ": the reader, searching by name, meets another directory's tags");
  }
  for (std::size_t i = 0; i < meantCount; ++i) {
    const Place entry = list.Entry(i);
    for (std::size_t j = 0; j < meant.data.size(); ++j) {
      const Place value = entry.Key(kValuesKey).Item(j).Named(meant.data[j].name);
      if (j >= read.data.size() || read.data[j] != meant.data[j]) {
        return report(value, "the reader does not find this element");
      }
      const std::string meantValue = Written(meantEntries[i].values[j]);
      const std::string readValue = Written(readEntries[i].values[j]);
      if (meantValue != readValue) return report(value, "reads back as " + readValue);
    }
    for (std::size_t k = 0; k < meant.directories.size(); ++k) {
      const Shape& sub = meant.directories[k];
      const Place subList = entry.Key(kDirectoriesKey).Item(k).Named(sub.name);
      if (k >= read.directories.size()) {
        return report(subList, "the reader does not find this directory");
      }
      if (auto problem = Difference(sub, meantEntries[i].directories[k], read.directories[k],
                                    readEntries[i].directories[k], subList)) {
        return problem;
      }
    }
  }
  return std::nullopt;
}

}  // namespace

ReadResult ReadPackage(const Plugins& plugins, std::string& text) {
  Structure structure = FindStructure(text);
  ReadResult result;
  result.package.entries = ChannelTree(plugins, structure.top).Read(text, structure.crlf);
  result.package.header = std::move(structure.header);
  result.package.crlf = structure.crlf;
  result.notes = std::move(structure.notes);
  result.package.top = std::move(structure.top);
  result.found = std::move(structure.found);
  return result;
}

std::vector<Shortfall> FindShortfalls(const ReadResult& result) {
  std::vector<Shortfall> shortfalls;
  FindShortfalls(result.found, result.package.top, result.package.entries,
                 Place{"", ""}.Named(result.package.top.name), shortfalls);
  return shortfalls;
}

std::optional<Problem> CheckReadBack(const Plugins& plugins, const Package& package,
                                     const std::string& written) {
  const Place top = Place{"", ""}.Key(kDirectoryKey).Named(package.top.name);
  ReadResult back;
  std::string text = written;
  try {
    back = ReadPackage(plugins, text);
  } catch (const StructureError& error) {
    return Problem{top.pointer,
                   "the package written from it does not read back: " + std::string(error.what())};
  }
  if (WritePackage(plugins, back.package, false) == written) return std::nullopt;
  if (back.package.header != package.header) {
    return Problem{"/header", "header: reads back as \"" + back.package.header + "\""};
  }
  if (auto problem = Difference(package.top, package.entries, back.package.top,
                                back.package.entries, top.Key(kEntriesKey))) {
    return problem;
  }
  return Problem{top.pointer, top.path + ": does not read back as written"};
}

}  // namespace datapack
