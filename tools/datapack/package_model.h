// What a package holds, independent of its text: the channel tree's layout, and the values each
// entry hands to the engine.
#pragma once

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

using Value = std::variant<std::string, float, D3DXVECTOR3, D3DXMATRIX>;

Value DefaultValue(Kind kind);

struct Entry {
  std::vector<Value> values;                    // one per data slot
  std::vector<std::vector<Entry>> directories;  // the entries of each sub-directory
};

struct Package {
  std::string header;
  bool crlf = false;
  bool scrambled = false;
  Shape top;
  std::vector<Entry> entries;
};

// True when a directory of this shape holding these entries is written as an empty element: no
// entries, or a single one that holds nothing.
bool WrittenEmpty(const Shape& shape, const std::vector<Entry>& entries);

}  // namespace datapack
