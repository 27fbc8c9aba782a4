#include "tools/datapack/package_model.h"

#include <array>
#include <type_traits>

namespace datapack {
namespace {

constexpr std::array<std::string_view, 4> kKindNames = {"Txt", "Val", "Vec", "Mat"};

}  // namespace

std::string_view KindName(Kind kind) { return kKindNames[static_cast<std::size_t>(kind)]; }

std::optional<Kind> KindNamed(std::string_view name) {
  for (std::size_t i = 0; i < kKindNames.size(); ++i) {
    if (kKindNames[i] == name) return static_cast<Kind>(i);
  }
  return std::nullopt;
}

Table::Table(const Shape& shape) {
  for (const DataSlot& slot : shape.data) {
    switch (slot.kind) {
      case Kind::kText:
        columns_.emplace_back(Texts());
        break;
      case Kind::kValue:
        columns_.emplace_back(std::vector<float>());
        break;
      case Kind::kVector:
        columns_.emplace_back(std::vector<D3DXVECTOR3>());
        break;
      case Kind::kMatrix:
        columns_.emplace_back(std::vector<D3DXMATRIX>());
        break;
    }
  }
  ends_.resize(shape.directories.size());
  for (const Shape& sub : shape.directories)
    directories_.emplace_back(sub);
}

Value Table::At(std::size_t entry, std::size_t slot) const {
  const Column& column = columns_[slot];
  if (const auto* texts = std::get_if<Texts>(&column)) {
    const std::size_t begin = entry ? texts->ends[entry - 1] : 0;
    return std::string_view(texts->bytes).substr(begin, texts->ends[entry] - 1 - begin);
  }
  if (const auto* numbers = std::get_if<std::vector<float>>(&column)) return (*numbers)[entry];
  if (const auto* vectors = std::get_if<std::vector<D3DXVECTOR3>>(&column)) {
    return (*vectors)[entry];
  }
  return &std::get<std::vector<D3DXMATRIX>>(column)[entry];
}

const char* Table::TextAt(std::size_t entry, std::size_t slot) const {
  const Texts& texts = std::get<Texts>(columns_[slot]);
  return texts.bytes.data() + (entry ? texts.ends[entry - 1] : 0);
}

Entries Table::DirectoryOf(std::size_t entry, std::size_t k) const {
  const std::vector<std::size_t>& ends = ends_[k];
  const std::size_t begin = entry ? ends[entry - 1] : 0;
  return Entries(directories_[k], begin, ends[entry] - begin);
}

void Table::Add(std::size_t slot, const Value& value) {
  Column& column = columns_[slot];
  if (auto* texts = std::get_if<Texts>(&column)) {
    texts->bytes += std::get<std::string_view>(value);
    texts->bytes += '\0';
    texts->ends.push_back(texts->bytes.size());
  } else if (auto* numbers = std::get_if<std::vector<float>>(&column)) {
    numbers->push_back(std::get<float>(value));
  } else if (auto* vectors = std::get_if<std::vector<D3DXVECTOR3>>(&column)) {
    vectors->push_back(std::get<D3DXVECTOR3>(value));
  } else {
    std::get<std::vector<D3DXMATRIX>>(column).push_back(*std::get<const D3DXMATRIX*>(value));
  }
}

void Table::EndEntry() {
  for (std::size_t k = 0; k < directories_.size(); ++k)
    ends_[k].push_back(directories_[k].size_);
  ++size_;
}

void Table::Clear() {
  for (Column& column : columns_) {
    std::visit(
        [](auto& values) {
          if constexpr (std::is_same_v<std::decay_t<decltype(values)>, Texts>) {
            values.bytes.clear();
            values.ends.clear();
          } else {
            values.clear();
          }
        },
        column);
  }
  for (auto& ends : ends_)
    ends.clear();
  for (Table& sub : directories_)
    sub.Clear();
  size_ = 0;
}

bool WrittenEmpty(const Shape& shape, std::size_t entries) {
  return entries == 0 || (entries == 1 && shape.data.empty() && shape.directories.empty());
}

}  // namespace datapack
