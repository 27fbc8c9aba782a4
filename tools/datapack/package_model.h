// What a package holds, independent of its text: the channel tree's layout, and the values each
// entry hands to the engine.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "host/d3dx_types.h"

namespace datapack {

// The packed kinds of data channel, in the order of Value's alternatives.
enum class Kind { kText, kValue, kVector, kMatrix };

// The Type attribute of an element of this kind: "Txt", "Val", "Vec" or "Mat".
std::string_view KindName(Kind kind);
std::optional<Kind> KindNamed(std::string_view name);

struct DataSlot {
  std::string name;
  Kind kind;
  bool operator==(const DataSlot&) const = default;
};

// One DataDirectory of the tree: what each of its entries holds.
struct Shape {
  std::string name;
  std::vector<DataSlot> data;
  std::vector<Shape> directories;
  bool operator==(const Shape&) const = default;
};

// A value where it is held: a text or a matrix is seen in place.
using Value = std::variant<std::string_view, float, D3DXVECTOR3, const D3DXMATRIX*>;

class Table;
class Entry;

// Entries of one directory, in order: a run of its table's.
class Entries {
 public:
  Entries() = default;
  Entries(const Table& table, std::size_t first, std::size_t count)
      : table_(&table), first_(first), count_(count) {}

  std::size_t size() const { return count_; }
  bool empty() const { return count_ == 0; }
  Entry operator[](std::size_t i) const;

 private:
  const Table* table_ = nullptr;
  std::size_t first_ = 0;
  std::size_t count_ = 0;
};

// One entry: its values, one per data slot, and the entries of each sub-directory in it.
class Entry {
 public:
  Entry(const Table& table, std::size_t index) : table_(&table), index_(index) {}

  datapack::Value Value(std::size_t slot) const;
  const char* Text(std::size_t slot) const;  // a text value, ended by a NUL
  Entries Directory(std::size_t k) const;

 private:
  const Table* table_;
  std::size_t index_;
};

// Every entry of one directory of the tree, across the package, in the order they were added:
// a column of values per data slot, and per sub-directory where each entry's entries end in that
// directory's table. Small entries would cost several times their text held one by one.
class Table {
 public:
  Table() = default;
  explicit Table(const Shape& shape);

  std::size_t size() const { return size_; }
  Entries All() const { return Entries(*this, 0, size_); }
  const Table& Directory(std::size_t k) const { return directories_[k]; }
  Table& Directory(std::size_t k) { return directories_[k]; }

  Value At(std::size_t entry, std::size_t slot) const;
  // A text value, ended by a NUL as channels take it.
  const char* TextAt(std::size_t entry, std::size_t slot) const;
  Entries DirectoryOf(std::size_t entry, std::size_t k) const;

  // An entry is added value by value, its sub-directories' entries into their tables meanwhile,
  // then ended.
  void Add(std::size_t slot, const Value& value);
  void EndEntry();
  // Empties this table and those below it, keeping their room.
  void Clear();

 private:
  struct Texts {
    std::string bytes;              // each text followed by a NUL
    std::vector<std::size_t> ends;  // of each text's NUL, plus one
  };
  using Column =
      std::variant<Texts, std::vector<float>, std::vector<D3DXVECTOR3>, std::vector<D3DXMATRIX>>;

  std::vector<Column> columns_;
  std::vector<std::vector<std::size_t>> ends_;  // per sub-directory
  std::vector<Table> directories_;
  std::size_t size_ = 0;
};

inline Entry Entries::operator[](std::size_t i) const { return Entry(*table_, first_ + i); }
inline Value Entry::Value(std::size_t slot) const { return table_->At(index_, slot); }
inline const char* Entry::Text(std::size_t slot) const { return table_->TextAt(index_, slot); }
inline Entries Entry::Directory(std::size_t k) const { return table_->DirectoryOf(index_, k); }

struct Package {
  std::string header;
  bool crlf = false;
  bool scrambled = false;
  Shape top;
  Table table;  // of the top directory, holding those below
  Entries entries() const { return table.All(); }
};

// True when a directory of this shape holding these entries is written as an empty element: no
// entries, or a single one that holds nothing.
bool WrittenEmpty(const Shape& shape, std::size_t entries);

}  // namespace datapack
