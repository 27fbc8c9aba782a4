#include "tools/datapack/format_limits.h"

#include <optional>
#include <string_view>

#include "plugin/data_package.h"
#include "tools/datapack/json_mapping.h"

namespace datapack {
namespace {

constexpr std::size_t kLongest = Lum_DataPackage::kTextLength - 1;

bool IsSpace(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

bool Contains(std::string_view text, std::string_view part) {
  return text.find(part) != std::string_view::npos;
}

std::string Length(std::string_view text) { return std::to_string(text.size()) + " characters, "; }

constexpr std::string_view kNulProblem = "holds a NUL character, which ends it there";

std::optional<std::string> CommonProblem(std::string_view text) {
  if (Contains(text, std::string_view("\0", 1))) return std::string(kNulProblem);
  if (!text.empty() && (IsSpace(text.front()) || IsSpace(text.back()))) {
    return "begins or ends with whitespace, which the reader trims";
  }
  return std::nullopt;
}

// Directory and data channel names alike; only what a long one suffers differs.
std::optional<std::string> AnyNameProblem(std::string_view name, const char* whenLong) {
  if (name.empty()) return "an empty name, which the reader cannot look for";
  // "<" and the name would make "</", which the reader takes for a closing tag.
  if (name.starts_with('/')) return "begins with \"/\", so that its tag reads as a closing tag";
  if (auto problem = CommonProblem(name)) return problem;
  if (Contains(name, ">")) return "holds \">\", which ends its tag early";
  if (Contains(name, "Type=")) return "holds \"Type=\", where the reader looks for a data type";
  if (Contains(name, "id=\"")) return "holds 'id=\"', where the reader looks for an entry id";
  if (name.size() > kLongest) return Length(name) + whenLong;
  return std::nullopt;
}

// The reader looks for the directory's first tag from the start of the package, header included.
std::optional<std::string> HeaderProblem(std::string_view header, std::string_view top) {
  if (header.size() > kLongest) {
    return Length(header) + "but the writer leaves out a header longer than 2047";
  }
  if (Contains(header, std::string_view("\0", 1))) return std::string(kNulProblem);
  for (std::size_t open = header.find('<'); open != std::string_view::npos;
       open = header.find('<', open + 1)) {
    const std::size_t close = header.find('>', open);
    if (close == std::string_view::npos) {
      return "holds a \"<\" without a \">\" after it, which hides the first entry from the reader";
    }
    std::string_view tag = header.substr(open + 1, close - open - 1);
    while (!tag.empty() && IsSpace(tag.front()))
      tag.remove_prefix(1);
    if (tag.starts_with(top)) {
      std::string_view rest = tag.substr(top.size());
      while (!rest.empty() && IsSpace(rest.front()))
        rest.remove_prefix(1);
      if (rest.empty() || rest.starts_with("id=\"")) {
        return "holds the tag <" + std::string(tag) + ">, where the reader looks for the directory";
      }
    }
  }
  return std::nullopt;
}

// Looking for one more entry of a directory, the reader takes the next tag that starts with its
// name followed by "id", and reads no further to tell.
std::optional<std::string> SiblingProblem(const Shape& before, Entries beforeEntries,
                                          const Shape& next, Entries entries) {
  if (WrittenEmpty(before, beforeEntries.size()) || !next.name.starts_with(before.name)) {
    return std::nullopt;
  }
  std::string_view rest = std::string_view(next.name).substr(before.name.size());
  while (!rest.empty() && IsSpace(rest.front()))
    rest.remove_prefix(1);
  const bool withIds = entries.size() > 1;
  if (rest.starts_with("id") || (rest.empty() && withIds)) {
    return "the reader takes its entries for more entries of \"" + before.name +
           "\" just before it";
  }
  return std::nullopt;
}

class Checker {
 public:
  std::vector<Problem> problems;

  void Report(const Place& place, const std::optional<std::string>& problem) {
    // A NUL ends the channel's text: nothing could write what follows it.
    if (problem) {
      problems.push_back(
          {place.Pointer(), ShownPath(place.Path()) + ": " + *problem, *problem != kNulProblem});
    }
  }

  void CheckShape(const Shape& shape, const Place& place, int depth) {
    const Place named = place.Named(shape.name);
    Report(named.Key(kNameKey), NameProblem(shape.name, true));
    if (depth >= Lum_DataPackage::kMaxNesting) {
      Report(named, std::string("nested deeper than 1023 directories, which the walk skips"));
      return;
    }
    for (std::size_t j = 0; j < shape.data.size(); ++j) {
      const Place slot = named.Key(kDataKey).Item(j).Named(shape.data[j].name);
      Report(slot.Key(kNameKey), NameProblem(shape.data[j].name, false));
    }
    for (std::size_t k = 0; k < shape.directories.size(); ++k)
      CheckShape(shape.directories[k], named.Key(kDirectoriesKey).Item(k), depth + 1);
  }

  void CheckEntries(const Shape& shape, Entries entries, const Place& list) {
    if (entries.size() > static_cast<std::size_t>(Lum_DataPackage::kMaxReadEntries)) {
      Report(list, EntryCountProblem(entries.size()));
    } else if (entries.size() > 1) {
      // The reader takes a whole tag, name and id, into a field of 2047 characters.
      const std::string lastId = " id=\"" + std::to_string(entries.size() - 1) + "\"";
      if (shape.name.size() + lastId.size() > kLongest) {
        Report(list, std::to_string(entries.size()) + " entries, but a tag of this name with id " +
                         std::to_string(entries.size() - 1) +
                         " runs past 2047 characters, and the reader does not take it");
      }
    }
    for (std::size_t i = 0; i < entries.size(); ++i) {
      const Place entry = list.Entry(i);
      for (std::size_t j = 0; j < shape.data.size(); ++j) {
        const Value value = entries[i].Value(j);
        if (const auto* text = std::get_if<std::string_view>(&value)) {
          Report(entry.Key(kValuesKey).Item(j).Named(shape.data[j].name), TextProblem(*text));
        }
      }
      for (std::size_t k = 0; k < shape.directories.size(); ++k) {
        const Shape& sub = shape.directories[k];
        const Place subList = entry.Key(kDirectoriesKey).Item(k).Named(sub.name);
        if (k > 0) {
          const Shape& before = shape.directories[k - 1];
          Report(subList,
                 SiblingProblem(before, entries[i].Directory(k - 1), sub, entries[i].Directory(k)));
        }
        CheckEntries(sub, entries[i].Directory(k), subList);
      }
    }
  }
};

}  // namespace

std::optional<std::string> NameProblem(std::string_view name, bool directory) {
  if (!directory) return AnyNameProblem(name, "but a longer name than 2047 is never read back");
  if (auto problem = AnyNameProblem(name, "but the package keeps only the first 2047 of a name")) {
    return problem;
  }
  if (Contains(name, "</")) {
    return "holds \"</\", where the reader looks for the directory's closing tag";
  }
  return std::nullopt;
}

std::optional<std::string> TextProblem(std::string_view text) {
  if (auto problem = CommonProblem(text)) return problem;
  if (Contains(text, "</")) return "holds \"</\", where the reader ends the text";
  if (text.size() > kLongest) {
    return Length(text) + "but the reader takes one longer than 2047 as the empty text";
  }
  return std::nullopt;
}

std::string EntryCountProblem(std::size_t count) {
  return std::to_string(count) + " entries, but the reader takes at most 9999 from a directory";
}

std::vector<Problem> CheckLimits(const Package& package) {
  Checker checker;
  const Place root;
  checker.Report(root.Key(kHeaderKey).Named("header"),
                 HeaderProblem(package.header, package.top.name));
  const Place top = root.Key(kDirectoryKey);
  checker.CheckShape(package.top, top, 0);
  checker.CheckEntries(package.top, package.entries(),
                       top.Named(package.top.name).Key(kEntriesKey));
  return checker.problems;
}

}  // namespace datapack
