// The JSON form of a package, one shape for `show --json` and `pack`:
//
//   {"header": "...", "lineBreaks": "LF" | "CRLF", "encoding": "UTF-8" | "Latin-1",
//    "directory": {"name": "Players",
//                  "data": [{"name": "Score", "type": "Val"}, ...],
//                  "directories": [<the same without "entries">, ...],
//                  "entries": [{"values": [12.5, ...], "directories": [[<entry>, ...], ...]}]}}
//
// An entry has one value per data channel (Txt a string, Val a number, Vec three, Mat four rows of
// four; "inf", "-inf", "nan" or "-nan" for numbers JSON cannot hold) and the entries of each
// sub-directory.
#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "tools/datapack/file_io.h"
#include "tools/datapack/package_model.h"

namespace datapack {

// A name as messages show it: its first 40 bytes, control bytes as \xNN.
std::string ShownName(std::string_view name);

// A path as messages show it: a deep one keeps its start and its end.
std::string ShownPath(const std::string& path);

// Where a part of a package stands in its JSON form, and how a message names it. Places are made
// for every value read; their texts only for messages, so that a deep one costs no more than a
// shallow one.
class Place {
 public:
  Place() = default;

  Place Key(std::string_view key) const { return Step(kKey, std::string(key)); }
  Place Item(std::size_t index) const { return Key(std::to_string(index)); }
  // An entry of the directory the path names.
  Place Entry(std::size_t index) const { return Step(kEntry, std::to_string(index)); }
  // Long names are cut short in messages, and bytes a terminal would not show are escaped.
  Place Named(std::string_view name) const { return Step(kNamed, std::string(name)); }

  std::string Pointer() const;  // JSON pointer
  std::string Path() const;     // "Players[3].Items", a name in brackets for entries

 private:
  enum Kind { kKey, kEntry, kNamed };
  struct Link {
    std::shared_ptr<const Link> before;
    Kind kind;
    std::string text;
  };
  Place Step(Kind kind, std::string text) const {
    Place next;
    next.last_ = std::make_shared<const Link>(Link{last_, kind, std::move(text)});
    return next;
  }
  std::vector<const Link*> Links() const;

  std::shared_ptr<const Link> last_;
};

inline constexpr std::string_view kHeaderKey = "header";
inline constexpr std::string_view kDirectoryKey = "directory";
inline constexpr std::string_view kNameKey = "name";
inline constexpr std::string_view kDataKey = "data";
inline constexpr std::string_view kDirectoriesKey = "directories";
inline constexpr std::string_view kEntriesKey = "entries";
inline constexpr std::string_view kValuesKey = "values";
inline constexpr std::string_view kScrambledKey = "scrambled";

// A JSON text that does not describe a package. Either `offset` or a JSON pointer says where.
class JsonError : public std::runtime_error {
 public:
  JsonError(std::string pointer, const std::string& message)
      : std::runtime_error(message), pointer_(std::move(pointer)) {}
  JsonError(std::size_t offset, const std::string& message)
      : std::runtime_error(message), offset_(offset) {}

  // The byte offset in `text` that the error is about.
  std::size_t OffsetIn(std::string_view text) const;

 private:
  std::string pointer_;
  std::optional<std::size_t> offset_;
};

// Prints the JSON form piece by piece.
void WritePackageJson(const Package& package, Output& out);

// Throws JsonError.
Package PackageFromJson(std::string_view text);

// The package of a JSON file read as it streams past, never held whole; nothing when the file
// needs reading whole (a message to place, entries before their shape), as PackageFromJson does.
std::optional<Package> PackageFromJsonFile(const std::string& path);

}  // namespace datapack
