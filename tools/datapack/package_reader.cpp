#include "tools/datapack/package_reader.h"

#include <cstdio>

#include "tools/datapack/channel_tree.h"
#include "tools/datapack/json_mapping.h"
#include "tools/datapack/outline.h"

namespace datapack {
namespace {

// A Place made only when a message needs one. Every entry and value of a package has a place, and
// making each costs more than comparing it; the steps wait on the stack instead, so a Way must not
// outlive the one it was made from.
class Way {
 public:
  explicit Way(const Place& start) : start_(&start) {}
  Way Key(std::string_view key) const { return Way(this, kKey, key, 0); }
  Way Item(std::size_t index) const { return Way(this, kItem, {}, index); }
  Way Entry(std::size_t index) const { return Way(this, kEntry, {}, index); }
  Way Named(std::string_view name) const { return Way(this, kNamed, name, 0); }

  Place Made() const {
    if (start_) return *start_;
    const Place before = before_->Made();
    switch (kind_) {
      case kKey:
        return before.Key(text_);
      case kItem:
        return before.Item(index_);
      case kEntry:
        return before.Entry(index_);
      case kNamed:
        break;
    }
    return before.Named(text_);
  }

 private:
  enum Kind { kKey, kItem, kEntry, kNamed };
  Way(const Way* before, Kind kind, std::string_view text, std::size_t index)
      : before_(before), kind_(kind), text_(text), index_(index) {}

  const Place* start_ = nullptr;
  const Way* before_ = nullptr;
  Kind kind_ = kKey;
  std::string_view text_;
  std::size_t index_ = 0;
};

// Compares the directory element at `at` in `found`, and those inside it; leaves `at` past them.
void FindShortfalls(const std::vector<FoundDirectory>& found, std::size_t& at, const Shape& shape,
                    Entries entries, const Way& place, std::vector<Shortfall>& out) {
  const FoundDirectory& directory = found[at++];
  if (directory.entries != entries.size()) {
    out.push_back({directory.offset, "the text holds " +
                                         Counted(directory.entries, "entry", "entries") + " of " +
                                         ShownPath(place.Made().Path()) + ", the reader takes " +
                                         std::to_string(entries.size())});
  }
  for (std::size_t i = 0; i < std::min<std::size_t>(directory.entries, entries.size()); ++i) {
    const Way entry = place.Entry(i);
    for (std::size_t k = 0; k < shape.directories.size(); ++k) {
      const Shape& sub = shape.directories[k];
      FindShortfalls(found, at, sub, entries[i].Directory(k), entry.Named(sub.name), out);
    }
  }
  at = directory.end;  // past the entries the reader did not take
}

// Numbers compare as the package writes them.
std::string Written(float number) {
  char text[32];
  std::snprintf(text, sizeof(text), "%g", static_cast<double>(number));
  return text;
}

std::string Written(const Value& value) {
  if (const auto* text = std::get_if<std::string_view>(&value)) {
    return "\"" + std::string(*text) + "\"";
  }
  if (const float* number = std::get_if<float>(&value)) return Written(*number);
  const float* numbers = std::holds_alternative<D3DXVECTOR3>(value)
                             ? &std::get<D3DXVECTOR3>(value).x
                             : &std::get<const D3DXMATRIX*>(value)->m[0][0];
  const std::size_t count = std::holds_alternative<D3DXVECTOR3>(value) ? 3 : 16;
  std::string out;
  for (std::size_t i = 0; i < count; ++i)
    out += (i ? " " : "") + Written(numbers[i]);
  return out;
}

// The bytes of a value's numbers.
std::string_view NumberBytes(const Value& value) {
  const auto bytes = [](const auto* numbers, std::size_t size) {
    return std::string_view(reinterpret_cast<const char*>(numbers), size);
  };
  if (const float* number = std::get_if<float>(&value)) return bytes(number, sizeof(float));
  if (const auto* vector = std::get_if<D3DXVECTOR3>(&value)) return bytes(vector, sizeof(*vector));
  return bytes(std::get<const D3DXMATRIX*>(value), sizeof(D3DXMATRIX));
}

// Values compare as the package writes them; most are simply the same.
bool SameWritten(const Value& meant, const Value& read) {
  if (meant.index() == read.index() && !std::holds_alternative<std::string_view>(meant) &&
      NumberBytes(meant) == NumberBytes(read)) {
    return true;
  }
  return Written(meant) == Written(read);
}

Problem Report(const Place& place, const std::string& message) {
  return Problem{place.Pointer(), ShownPath(place.Path()) + ": " + message};
}

std::optional<Problem> Difference(const Shape& meant, Entries meantEntries, const Shape& read,
                                  Entries readEntries, const Way& list);

// The first place where an entry read back differs from what was meant.
std::optional<Problem> EntryDifference(const Shape& meant, Entry meantEntry, const Shape& read,
                                       Entry readEntry, const Way& entry) {
  const Way values = entry.Key(kValuesKey);
  for (std::size_t j = 0; j < meant.data.size(); ++j) {
    const Way item = values.Item(j);
    const Way value = item.Named(meant.data[j].name);
    if (j >= read.data.size() || read.data[j] != meant.data[j]) {
      return Report(value.Made(), "the reader does not find this element");
    }
    if (!SameWritten(meantEntry.Value(j), readEntry.Value(j))) {
      return Report(value.Made(), "reads back as " + Written(readEntry.Value(j)));
    }
  }
  const Way directories = entry.Key(kDirectoriesKey);
  for (std::size_t k = 0; k < meant.directories.size(); ++k) {
    const Shape& sub = meant.directories[k];
    const Way item = directories.Item(k);
    const Way subList = item.Named(sub.name);
    if (k >= read.directories.size()) {
      return Report(subList.Made(), "the reader does not find this directory");
    }
    if (auto problem = Difference(sub, meantEntry.Directory(k), read.directories[k],
                                  readEntry.Directory(k), subList)) {
      return problem;
    }
  }
  return std::nullopt;
}

std::optional<Problem> CountDifference(std::size_t meantCount, std::size_t readCount,
                                       const Place& list) {
  if (meantCount == readCount) return std::nullopt;
  return Report(list, Counted(meantCount, "entry", "entries") + " read back as " +
                          std::to_string(readCount) +
                          ": the reader, searching by name, meets another directory's tags");
}

// The first place where what was read back differs from what was meant.
std::optional<Problem> Difference(const Shape& meant, Entries meantEntries, const Shape& read,
                                  Entries readEntries, const Way& list) {
  const std::size_t meantCount = WrittenEmpty(meant, meantEntries.size()) ? 0 : meantEntries.size();
  const std::size_t readCount = WrittenEmpty(read, readEntries.size()) ? 0 : readEntries.size();
  if (meant.name != read.name) {
    return Report(list.Made(), "the name reads back as \"" + read.name + "\"");
  }
  if (meantCount != readCount) return CountDifference(meantCount, readCount, list.Made());
  for (std::size_t i = 0; i < meantCount; ++i) {
    if (auto problem =
            EntryDifference(meant, meantEntries[i], read, readEntries[i], list.Entry(i))) {
      return problem;
    }
  }
  return std::nullopt;
}

}  // namespace

ReadResult ReadPackage(const Plugins& plugins, std::string& text, const EntrySink& sink) {
  Structure structure = FindStructure(text);
  ReadResult result;
  std::function<void(Entry)> each;
  if (sink) each = [&](Entry entry) { sink(structure.top, entry); };
  result.package.table = Table(structure.top);
  ChannelTree(plugins, structure.top)
      .Read(text, structure.crlf, result.package.table, each, structure.found.front().entries);
  result.package.header = std::move(structure.header);
  result.package.crlf = structure.crlf;
  result.notes = std::move(structure.notes);
  result.package.top = std::move(structure.top);
  result.found = std::move(structure.found);
  return result;
}

std::vector<Shortfall> FindShortfalls(const ReadResult& result) {
  std::vector<Shortfall> shortfalls;
  const Place top = Place().Named(result.package.top.name);
  std::size_t at = 0;
  FindShortfalls(result.found, at, result.package.top, result.package.entries(), Way(top),
                 shortfalls);
  return shortfalls;
}

std::optional<Problem> CheckReadBack(const Plugins& plugins, const Package& package,
                                     std::string& written) {
  const Place top = Place().Key(kDirectoryKey).Named(package.top.name);
  Structure structure;
  try {
    structure = FindStructure(written);
  } catch (const StructureError& error) {
    return Problem{top.Pointer(),
                   "the package written from it does not read back: " + std::string(error.what())};
  }
  if (structure.header != package.header) {
    return Problem{"/header", "header: reads back as \"" + structure.header + "\""};
  }
  const Place list = top.Key(kEntriesKey);
  if (structure.top.name != package.top.name) {
    return Report(list, "the name reads back as \"" + structure.top.name + "\"");
  }
  // Each entry is compared as it is read, and dropped.
  const bool holdsNothing = package.top.data.empty() && package.top.directories.empty();
  std::size_t count = 0;
  std::optional<Problem> first;
  const Entries meant = package.entries();
  const auto compare = [&](Entry entry) {
    const std::size_t i = count++;
    if (!first && i < meant.size()) {
      first = EntryDifference(package.top, meant[i], structure.top, entry, Way(list).Entry(i));
    }
  };
  Table read(structure.top);
  ChannelTree(plugins, structure.top)
      .Read(written, structure.crlf, read, holdsNothing ? nullptr : std::function(compare));
  const std::size_t meantCount = WrittenEmpty(package.top, meant.size()) ? 0 : meant.size();
  const std::size_t readCount =
      holdsNothing ? (WrittenEmpty(structure.top, read.size()) ? 0 : read.size()) : count;
  if (auto problem = CountDifference(meantCount, readCount, list)) return problem;
  return first;
}

}  // namespace datapack
