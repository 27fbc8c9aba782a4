#include "tools/datapack/package_model.h"

#include <array>

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

Value DefaultValue(Kind kind) {
  switch (kind) {
    case Kind::kText:
      return std::string();
    case Kind::kValue:
      return 0.0f;
    case Kind::kVector:
      return D3DXVECTOR3{};
    case Kind::kMatrix:
      break;
  }
  return Matrix();
}

bool WrittenEmpty(const Shape& shape, const std::vector<Entry>& entries) {
  return entries.empty() ||
         (entries.size() == 1 && shape.data.empty() && shape.directories.empty());
}

}  // namespace datapack
