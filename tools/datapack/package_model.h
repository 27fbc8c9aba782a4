// What a package holds, independent of its text: the channel tree's layout, and the values each
// entry hands to the engine.
#pragma once

#include <memory>
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

// A matrix held apart from its value: a value is as large as its largest kind, and most values
// are texts and numbers. Copies copy the matrix; a moved-from one holds none and may only be
// destroyed or assigned.
class Matrix {
 public:
  Matrix(const D3DXMATRIX& matrix = {}) : matrix_(std::make_unique<D3DXMATRIX>(matrix)) {}
  Matrix(const Matrix& other) : Matrix(*other) {}
  Matrix(Matrix&&) noexcept = default;
  Matrix& operator=(const Matrix& other) { return *this = Matrix(other); }
  Matrix& operator=(Matrix&&) noexcept = default;
  ~Matrix() = default;

  const D3DXMATRIX& operator*() const { return *matrix_; }
  const float* Numbers() const { return &matrix_->m[0][0]; }

 private:
  std::unique_ptr<D3DXMATRIX> matrix_;
};

using Value = std::variant<std::string, float, D3DXVECTOR3, Matrix>;

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
