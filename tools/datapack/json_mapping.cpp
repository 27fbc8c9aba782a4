#include "tools/datapack/json_mapping.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <nlohmann/json.hpp>

#include "tools/datapack/json_location.h"
#include "tools/datapack/text_encoding.h"

namespace datapack {
namespace {

// Numbers are floats all the way: parsed with strtof and printed in the fewest digits that give
// the same float back.
using Json = nlohmann::basic_json<nlohmann::ordered_map, std::vector, std::string, bool,
                                  std::int64_t, std::uint64_t, float>;

constexpr std::string_view kLineBreaksKey = "lineBreaks";
constexpr std::string_view kEncodingKey = "encoding";
constexpr std::string_view kTypeKey = "type";
constexpr std::string_view kLatin1 = "Latin-1";
constexpr std::string_view kUtf8 = "UTF-8";
constexpr int kMatrixRows = 4;

// ---- Writing JSON -------------------------------------------------------------------------------

class ToJson {
 public:
  explicit ToJson(bool latin1) : latin1_(latin1) {}

  Json Text(const std::string& bytes) const { return latin1_ ? Latin1ToUtf8(bytes) : bytes; }

  static Json Number(float number) {
    if (std::isfinite(number)) return number;
    if (std::isinf(number)) return number < 0 ? "-inf" : "inf";
    return std::signbit(number) ? "-nan" : "nan";
  }

  Json Shape(const datapack::Shape& shape) const {
    Json data = Json::array();
    for (const DataSlot& slot : shape.data) {
      data.push_back({{kNameKey, Text(slot.name)}, {kTypeKey, std::string(KindName(slot.kind))}});
    }
    Json directories = Json::array();
    for (const datapack::Shape& sub : shape.directories)
      directories.push_back(Shape(sub));
    return {{kNameKey, Text(shape.name)}, {kDataKey, data}, {kDirectoriesKey, directories}};
  }

  Json Entries(const datapack::Shape& shape, const std::vector<Entry>& entries) const {
    Json list = Json::array();
    for (const Entry& entry : entries) {
      Json item = Json::object();
      if (!shape.data.empty()) {
        Json& values = item[kValuesKey] = Json::array();
        for (const datapack::Value& value : entry.values)
          values.push_back(Value(value));
      }
      if (!shape.directories.empty()) {
        Json& directories = item[kDirectoriesKey] = Json::array();
        for (std::size_t k = 0; k < shape.directories.size(); ++k)
          directories.push_back(Entries(shape.directories[k], entry.directories[k]));
      }
      list.push_back(std::move(item));
    }
    return list;
  }

  Json Value(const datapack::Value& value) const {
    if (const auto* text = std::get_if<std::string>(&value)) return Text(*text);
    if (const auto* number = std::get_if<float>(&value)) return Number(*number);
    if (const auto* vector = std::get_if<D3DXVECTOR3>(&value))
      return {Number(vector->x), Number(vector->y), Number(vector->z)};
    const auto& matrix = std::get<D3DXMATRIX>(value);
    Json rows = Json::array();
    for (const auto& row : matrix.m)
      rows.push_back({Number(row[0]), Number(row[1]), Number(row[2]), Number(row[3])});
    return rows;
  }

 private:
  bool latin1_;
};

bool AllUtf8(const datapack::Shape& shape) {
  if (!IsUtf8(shape.name)) return false;
  for (const DataSlot& slot : shape.data) {
    if (!IsUtf8(slot.name)) return false;
  }
  for (const datapack::Shape& sub : shape.directories) {
    if (!AllUtf8(sub)) return false;
  }
  return true;
}

bool AllUtf8(const std::vector<Entry>& entries) {
  for (const Entry& entry : entries) {
    for (const Value& value : entry.values) {
      const auto* text = std::get_if<std::string>(&value);
      if (text && !IsUtf8(*text)) return false;
    }
    for (const auto& sub : entry.directories) {
      if (!AllUtf8(sub)) return false;
    }
  }
  return true;
}

// Containers that fit the width stand on one line, and so do lists of plain values.
std::string Compact(const Json& json) {
  if (json.is_array()) {
    std::string out = "[";
    for (std::size_t i = 0; i < json.size(); ++i)
      out += (i ? ", " : "") + Compact(json[i]);
    return out + "]";
  }
  if (json.is_object()) {
    std::string out = "{";
    for (auto it = json.begin(); it != json.end(); ++it)
      out += (it == json.begin() ? "" : ", ") + Json(it.key()).dump() + ": " + Compact(*it);
    return out + "}";
  }
  return json.dump();
}

bool HoldsContainers(const Json& json) {
  for (const Json& item : json) {
    if (item.is_structured()) return true;
  }
  return false;
}

void Print(const Json& json, std::size_t indent, std::string& out) {
  constexpr std::size_t kWidth = 100;
  const std::string compact = Compact(json);
  if (!json.is_structured() || indent + compact.size() <= kWidth || !HoldsContainers(json)) {
    out += compact;
    return;
  }
  const std::string inner(indent + 2, ' ');
  out += json.is_array() ? "[\n" : "{\n";
  for (auto it = json.begin(); it != json.end(); ++it) {
    out += inner;
    if (json.is_object()) out += Json(it.key()).dump() + ": ";
    Print(*it, inner.size(), out);
    out += std::next(it) == json.end() ? "\n" : ",\n";
  }
  out += std::string(indent, ' ') + (json.is_array() ? "]" : "}");
}

// ---- Reading JSON -------------------------------------------------------------------------------

class FromJson {
 public:
  Package Read(const Json& root) {
    const Place place{"", ""};
    Expect(root, place, Json::value_t::object, "an object");
    Keys(root, place, {kHeaderKey, kLineBreaksKey, kEncodingKey, kDirectoryKey});
    if (const Json* encoding = Find(root, place, kEncodingKey)) {
      const std::string name = String(*encoding, place.Key(kEncodingKey));
      if (name != kUtf8 && name != kLatin1) {
        Fail(place.Key(kEncodingKey), "the encoding is \"UTF-8\" or \"Latin-1\"");
      }
      latin1_ = name == kLatin1;
    }
    Package package;
    if (const Json* header = Find(root, place, kHeaderKey)) {
      package.header = Text(*header, place.Key(kHeaderKey));
    }
    if (const Json* lineBreaks = Find(root, place, kLineBreaksKey)) {
      const std::string name = String(*lineBreaks, place.Key(kLineBreaksKey));
      if (name != "LF" && name != "CRLF") {
        Fail(place.Key(kLineBreaksKey), "line breaks are \"LF\" or \"CRLF\"");
      }
      package.crlf = name == "CRLF";
    }
    const Json* directory = Find(root, place, kDirectoryKey);
    if (!directory) Fail(place, "no \"directory\"");
    const Place top = place.Key(kDirectoryKey);
    package.top = Shape(*directory, top, true);
    if (const Json* entries = Find(*directory, top, kEntriesKey)) {
      package.entries =
          Entries(package.top, *entries, top.Named(package.top.name).Key(kEntriesKey));
    }
    return package;
  }

 private:
  [[noreturn]] static void Fail(const Place& place, const std::string& message) {
    throw JsonError(place.pointer, place.path.empty() ? message : place.path + ": " + message);
  }

  static void Expect(const Json& json, const Place& place, Json::value_t type, const char* what) {
    if (json.type() != type) Fail(place, std::string("expected ") + what);
  }

  static void Keys(const Json& object, const Place& place,
                   std::initializer_list<std::string_view> known) {
    for (auto it = object.begin(); it != object.end(); ++it) {
      if (std::find(known.begin(), known.end(), it.key()) == known.end()) {
        Fail(place.Key(it.key()), "unknown key \"" + it.key() + "\"");
      }
    }
  }

  static const Json* Find(const Json& object, const Place& place, std::string_view key) {
    Expect(object, place, Json::value_t::object, "an object");
    const auto it = object.find(key);
    return it == object.end() ? nullptr : &*it;
  }

  static const Json& Array(const Json& json, const Place& place) {
    Expect(json, place, Json::value_t::array, "an array");
    return json;
  }

  static const Json& Array(const Json& json, const Place& place, std::size_t size) {
    if (Array(json, place).size() != size) {
      Fail(place, "expected " + std::to_string(size) + (size == 1 ? " item" : " items"));
    }
    return json;
  }

  static std::string String(const Json& json, const Place& place) {
    Expect(json, place, Json::value_t::string, "a string");
    return json.get<std::string>();
  }

  std::string Text(const Json& json, const Place& place) const {
    std::string text = String(json, place);
    if (!latin1_) return text;
    Latin1Result bytes = Utf8ToLatin1(text);
    if (bytes.badCharacter) {
      Fail(place,
           "holds a character beyond Latin-1 at byte " + std::to_string(*bytes.badCharacter));
    }
    return bytes.bytes;
  }

  static float Number(const Json& json, const Place& place) {
    if (json.is_number()) return json.get<float>();
    if (json.is_string()) {
      const std::string name = json.get<std::string>();
      const bool negative = name.starts_with('-');
      const std::string_view word = std::string_view(name).substr(negative ? 1 : 0);
      float number = 0.0f;
      if (word == "inf") number = std::numeric_limits<float>::infinity();
      if (word == "nan") number = std::numeric_limits<float>::quiet_NaN();
      if (number != 0.0f || std::isnan(number))
        return std::copysign(number, negative ? -1.0f : 1.0f);
    }
    Fail(place, "expected a number, \"inf\", \"-inf\", \"nan\" or \"-nan\"");
  }

  datapack::Shape Shape(const Json& json, const Place& place, bool top) {
    datapack::Shape shape;
    const Json* name = Find(json, place, kNameKey);
    if (!name) Fail(place, "a directory without a \"name\"");
    shape.name = Text(*name, place.Key(kNameKey));
    const Place named = place.Named(shape.name);
    if (!top && json.contains(kEntriesKey)) {
      Fail(named.Key(kEntriesKey), "a sub-directory's entries stand in each entry of its parent");
    }
    Keys(json, named, {kNameKey, kDataKey, kDirectoriesKey, kEntriesKey});
    if (const Json* data = Find(json, place, kDataKey)) {
      const Place list = named.Key(kDataKey);
      for (std::size_t j = 0; j < Array(*data, list).size(); ++j) {
        const Place item = list.Item(j);
        Keys((*data)[j], item, {kNameKey, kTypeKey});
        const Json* slotName = Find((*data)[j], item, kNameKey);
        const Json* type = Find((*data)[j], item, kTypeKey);
        if (!slotName || !type) Fail(item, "a data channel has a \"name\" and a \"type\"");
        const std::optional<Kind> kind = KindNamed(String(*type, item.Key(kTypeKey)));
        if (!kind) Fail(item.Key(kTypeKey), "the type is \"Txt\", \"Val\", \"Vec\" or \"Mat\"");
        shape.data.push_back({Text(*slotName, item.Key(kNameKey)), *kind});
      }
    }
    if (const Json* directories = Find(json, place, kDirectoriesKey)) {
      const Place list = named.Key(kDirectoriesKey);
      for (std::size_t k = 0; k < Array(*directories, list).size(); ++k)
        shape.directories.push_back(Shape((*directories)[k], list.Item(k), false));
    }
    return shape;
  }

  std::vector<Entry> Entries(const datapack::Shape& shape, const Json& json, const Place& place) {
    std::vector<Entry> entries;
    for (std::size_t i = 0; i < Array(json, place).size(); ++i) {
      const Place item = place.Entry(i);
      Keys(json[i], item, {kValuesKey, kDirectoriesKey});
      Entry entry;
      const Json* values = Find(json[i], item, kValuesKey);
      if (!shape.data.empty() && !values) Fail(item, "an entry without \"values\"");
      if (values) Array(*values, item.Key(kValuesKey), shape.data.size());
      for (std::size_t j = 0; j < shape.data.size(); ++j) {
        const Place value = item.Key(kValuesKey).Item(j).Named(shape.data[j].name);
        entry.values.push_back(Value(shape.data[j].kind, (*values)[j], value));
      }
      const Json* directories = Find(json[i], item, kDirectoriesKey);
      if (!shape.directories.empty() && !directories)
        Fail(item, "an entry without \"directories\"");
      if (directories) Array(*directories, item.Key(kDirectoriesKey), shape.directories.size());
      for (std::size_t k = 0; k < shape.directories.size(); ++k) {
        const datapack::Shape& sub = shape.directories[k];
        const Place list = item.Key(kDirectoriesKey).Item(k).Named(sub.name);
        entry.directories.push_back(Entries(sub, (*directories)[k], list));
      }
      entries.push_back(std::move(entry));
    }
    return entries;
  }

  datapack::Value Value(Kind kind, const Json& json, const Place& place) const {
    switch (kind) {
      case Kind::kText:
        return Text(json, place);
      case Kind::kValue:
        return Number(json, place);
      case Kind::kVector: {
        const Json& xyz = Array(json, place, 3);
        return D3DXVECTOR3{Number(xyz[0], place), Number(xyz[1], place), Number(xyz[2], place)};
      }
      case Kind::kMatrix:
        break;
    }
    D3DXMATRIX matrix;
    const Json& rows = Array(json, place, kMatrixRows);
    for (int r = 0; r < kMatrixRows; ++r) {
      const Json& row = Array(rows[r], place.Item(r), kMatrixRows);
      for (int c = 0; c < kMatrixRows; ++c)
        matrix.m[r][c] = Number(row[c], place);
    }
    return matrix;
  }

  bool latin1_ = false;
};

}  // namespace

std::size_t JsonError::OffsetIn(std::string_view text) const {
  return offset_ ? *offset_ : LocateJsonPointer(text, pointer_);
}

std::string PackageToJson(const Package& package) {
  const bool latin1 = !IsUtf8(package.header) || !AllUtf8(package.top) || !AllUtf8(package.entries);
  const ToJson to(latin1);
  Json directory = to.Shape(package.top);
  directory[kEntriesKey] = to.Entries(package.top, package.entries);
  const Json root = {{kHeaderKey, to.Text(package.header)},
                     {kLineBreaksKey, package.crlf ? "CRLF" : "LF"},
                     {kEncodingKey, latin1 ? kLatin1 : kUtf8},
                     {kDirectoryKey, std::move(directory)}};
  std::string out;
  Print(root, 0, out);
  return out + "\n";
}

Package PackageFromJson(std::string_view text) {
  Json root;
  try {
    root = Json::parse(text);
  } catch (const Json::parse_error& error) {
    const std::string what = error.what();
    const std::size_t detail = what.find(": ", what.find("column"));
    throw JsonError(error.byte ? error.byte - 1 : 0,
                    detail == std::string::npos ? what : what.substr(detail + 2));
  } catch (const Json::out_of_range&) {
    // The parser says which number but not where: the first one beyond a float's range.
    throw JsonError(FindOverflowingNumber(text), "a number beyond the range of a float");
  }
  return FromJson().Read(root);
}

}  // namespace datapack
