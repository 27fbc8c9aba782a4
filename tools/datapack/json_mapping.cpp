#include "tools/datapack/json_mapping.h"

#include <algorithm>
#include <cmath>
#include <fstream>
#include <functional>
#include <iterator>
#include <limits>
#include <nlohmann/json.hpp>

#include "plugin/data_package.h"
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
// Stands for a number too large for a float while the JSON is read.
constexpr std::string_view kOverflow = "\x01 beyond a float";
constexpr std::string_view kOverflowJson = "\"\\u0001 beyond a float\"";

// ---- Writing JSON -------------------------------------------------------------------------------

// A value of the JSON form, made only when the printer comes to it: the form of a large package is
// never held whole, and no part of it is made more than a few times.
struct View {
  enum class Type { kScalar, kArray, kObject };
  Type type = Type::kScalar;
  std::string scalar;                      // the JSON text of a scalar
  std::vector<std::string_view> keys;      // an object's, in order
  std::size_t size = 0;                    // an array's items or an object's members
  std::function<View(std::size_t)> child;  // the item or member at an index
};

View Scalar(std::string json) { return {View::Type::kScalar, std::move(json), {}, 0, {}}; }

View Array(std::size_t size, std::function<View(std::size_t)> child) {
  return {View::Type::kArray, {}, {}, size, std::move(child)};
}

View Object(std::vector<std::string_view> keys, std::function<View(std::size_t)> child) {
  const std::size_t size = keys.size();
  return {View::Type::kObject, {}, std::move(keys), size, std::move(child)};
}

class ToJson {
 public:
  explicit ToJson(bool latin1) : latin1_(latin1) {}

  View Text(std::string_view bytes) const {
    if (latin1_) return Scalar(Quoted(Latin1ToUtf8(bytes)));
    return Scalar(Quoted(bytes));
  }

  // As the JSON library writes strings, without making one of its documents for each.
  static std::string Quoted(std::string_view utf8) {
    std::string out;
    out.reserve(utf8.size() + 2);
    out += '"';
    for (char c : utf8) {
      const auto byte = static_cast<unsigned char>(c);
      switch (c) {
        case '"':
          out += "\\\"";
          break;
        case '\\':
          out += "\\\\";
          break;
        case '\b':
          out += "\\b";
          break;
        case '\f':
          out += "\\f";
          break;
        case '\n':
          out += "\\n";
          break;
        case '\r':
          out += "\\r";
          break;
        case '\t':
          out += "\\t";
          break;
        default:
          if (byte < 0x20) {
            constexpr char kDigits[] = "0123456789abcdef";
            out += {'\\', 'u', '0', '0', kDigits[byte >> 4], kDigits[byte & 15]};
          } else {
            out += c;
          }
      }
    }
    out += '"';
    return out;
  }

  static View Number(float number) {
    if (std::isfinite(number)) {
      // The library's own shortest form ("7.0", "1e+20"), without a serializer for each number.
      char text[64];
      return Scalar(
          std::string(text, nlohmann::detail::to_chars(text, text + sizeof(text), number)));
    }
    if (std::isinf(number)) return Scalar(number < 0 ? "\"-inf\"" : "\"inf\"");
    return Scalar(std::signbit(number) ? "\"-nan\"" : "\"nan\"");
  }

  static View Numbers(const float* numbers, std::size_t count) {
    return Array(count, [numbers](std::size_t i) { return Number(numbers[i]); });
  }

  View Shape(const datapack::Shape& shape, const datapack::Entries* entries) const {
    std::vector<std::string_view> keys = {kNameKey, kDataKey, kDirectoriesKey};
    if (entries) keys.push_back(kEntriesKey);
    return Object(std::move(keys), [this, &shape, entries](std::size_t i) {
      switch (i) {
        case 0:
          return Text(shape.name);
        case 1:
          return Array(shape.data.size(), [this, &shape](std::size_t j) {
            const DataSlot& slot = shape.data[j];
            return Object({kNameKey, kTypeKey}, [this, &slot](std::size_t k) {
              return k == 0 ? Text(slot.name)
                            : Scalar(Json(std::string(KindName(slot.kind))).dump());
            });
          });
        case 2:
          return Array(shape.directories.size(), [this, &shape](std::size_t k) {
            return Shape(shape.directories[k], nullptr);
          });
      }
      return EntryList(shape, *entries);
    });
  }

  View EntryList(const datapack::Shape& shape, datapack::Entries entries) const {
    return Array(entries.size(), [this, &shape, entries](std::size_t i) {
      const Entry entry = entries[i];
      std::vector<std::string_view> keys;
      if (!shape.data.empty()) keys.push_back(kValuesKey);
      if (!shape.directories.empty()) keys.push_back(kDirectoriesKey);
      return Object(std::move(keys), [this, &shape, entry](std::size_t k) {
        if (k == 0 && !shape.data.empty()) {
          return Array(shape.data.size(),
                       [this, entry](std::size_t j) { return Value(entry.Value(j)); });
        }
        return Array(shape.directories.size(), [this, &shape, entry](std::size_t j) {
          return EntryList(shape.directories[j], entry.Directory(j));
        });
      });
    });
  }

  View Value(const datapack::Value& value) const {
    if (const auto* text = std::get_if<std::string_view>(&value)) return Text(*text);
    if (const auto* number = std::get_if<float>(&value)) return Number(*number);
    if (const auto* vector = std::get_if<D3DXVECTOR3>(&value)) {
      // A vector is held in the value, which the view outlives.
      return Array(3, [xyz = *vector](std::size_t i) { return Number((&xyz.x)[i]); });
    }
    const D3DXMATRIX& matrix = *std::get<const D3DXMATRIX*>(value);
    return Array(kMatrixRows,
                 [&matrix](std::size_t r) { return Numbers(matrix.m[r], kMatrixRows); });
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

bool AllUtf8(const Table& table, const datapack::Shape& shape) {
  for (std::size_t j = 0; j < shape.data.size(); ++j) {
    if (shape.data[j].kind != Kind::kText) continue;
    for (std::size_t i = 0; i < table.size(); ++i) {
      if (!IsUtf8(std::get<std::string_view>(table.At(i, j)))) return false;
    }
  }
  for (std::size_t k = 0; k < shape.directories.size(); ++k) {
    if (!AllUtf8(table.Directory(k), shape.directories[k])) return false;
  }
  return true;
}

// Containers that fit the width stand on one line, and so do lists of plain values.
class Printer {
 public:
  explicit Printer(Output& out) : out_(out) {}

  void Print(const View& view, std::size_t indent) {
    constexpr std::size_t kWidth = 100;
    // Past the width, indenting would cost more than the values it lays out: deep nesting adds
    // eight columns a level, and 1023 levels made JSON 24 times the size of their package.
    const bool fits = indent > kWidth || CompactSize(view, kWidth - indent) <= kWidth - indent;
    if (view.type == View::Type::kScalar || fits || !HoldsContainers(view)) {
      Compact(view);
      return;
    }
    const std::string inner(indent + 2, ' ');
    out_ << (view.type == View::Type::kArray ? "[\n" : "{\n");
    for (std::size_t i = 0; i < view.size; ++i) {
      out_ << inner;
      if (view.type == View::Type::kObject) out_ << "\"" << view.keys[i] << "\": ";
      Print(view.child(i), inner.size());
      out_ << (i + 1 == view.size ? "\n" : ",\n");
    }
    out_ << std::string(indent, ' ') << (view.type == View::Type::kArray ? "]" : "}");
  }

 private:
  // The length of the compact form, counted no further than just past `limit`.
  static std::size_t CompactSize(const View& view, std::size_t limit) {
    if (view.type == View::Type::kScalar) return view.scalar.size();
    std::size_t size = 2;
    for (std::size_t i = 0; i < view.size && size <= limit; ++i) {
      if (i) size += 2;
      if (view.type == View::Type::kObject) size += view.keys[i].size() + 4;
      if (size <= limit) size += CompactSize(view.child(i), limit - size);
    }
    return size;
  }

  static bool HoldsContainers(const View& view) {
    for (std::size_t i = 0; i < view.size; ++i) {
      if (view.child(i).type != View::Type::kScalar) return true;
    }
    return false;
  }

  void Compact(const View& view) {
    if (view.type == View::Type::kScalar) {
      out_ << view.scalar;
      return;
    }
    out_ << (view.type == View::Type::kArray ? "[" : "{");
    for (std::size_t i = 0; i < view.size; ++i) {
      if (i) out_ << ", ";
      if (view.type == View::Type::kObject) out_ << "\"" << view.keys[i] << "\": ";
      Compact(view.child(i));
    }
    out_ << (view.type == View::Type::kArray ? "]" : "}");
  }

  Output& out_;
};

// ---- Reading JSON -------------------------------------------------------------------------------

class FromJson {
 public:
  explicit FromJson(bool latin1 = false) : latin1_(latin1) {}

  Package Read(const Json& root) {
    const Place place;
    Expect(root, place, Json::value_t::object, "an object");
    Keys(root, place, {kHeaderKey, kLineBreaksKey, kEncodingKey, kScrambledKey, kDirectoryKey});
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
    if (const Json* scrambled = Find(root, place, kScrambledKey)) {
      Expect(*scrambled, place.Key(kScrambledKey), Json::value_t::boolean, "true or false");
      package.scrambled = scrambled->get<bool>();
    }
    const Json* directory = Find(root, place, kDirectoryKey);
    if (!directory) Fail(place, "no \"directory\"");
    const Place top = place.Key(kDirectoryKey);
    package.top = Shape(*directory, top, 0);
    package.table = Table(package.top);
    if (const Json* entries = Find(*directory, top, kEntriesKey)) {
      AddEntries(package.top, package.table, *entries,
                 top.Named(package.top.name).Key(kEntriesKey));
    }
    return package;
  }

 private:
  [[noreturn]] static void Fail(const Place& place, const std::string& message) {
    const std::string path = place.Path();
    throw JsonError(place.Pointer(), path.empty() ? message : ShownPath(path) + ": " + message);
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
      if (name == kOverflow) Fail(place, "a number beyond the range of a float");
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

 public:
  datapack::Shape Shape(const Json& json, const Place& place, int depth) {
    const bool top = depth == 0;
    if (depth >= Lum_DataPackage::kMaxNesting) {
      // Refused at once: going on would cost time and memory with the square of the depth.
      Fail(place, "nested deeper than 1023 directories, which the walk skips");
    }
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
        shape.directories.push_back(Shape((*directories)[k], list.Item(k), depth + 1));
    }
    return shape;
  }

 private:
  void AddEntries(const datapack::Shape& shape, Table& table, const Json& json,
                  const Place& place) {
    for (std::size_t i = 0; i < Array(json, place).size(); ++i)
      AddEntry(shape, table, json[i], place.Entry(i));
  }

 public:
  bool latin1() const { return latin1_; }

  void AddEntry(const datapack::Shape& shape, Table& table, const Json& json, const Place& item) {
    Keys(json, item, {kValuesKey, kDirectoriesKey});
    const Json* values = Find(json, item, kValuesKey);
    if (!shape.data.empty() && !values) Fail(item, "an entry without \"values\"");
    if (values) Array(*values, item.Key(kValuesKey), shape.data.size());
    for (std::size_t j = 0; j < shape.data.size(); ++j) {
      const Place value = item.Key(kValuesKey).Item(j).Named(shape.data[j].name);
      AddValue(table, j, shape.data[j].kind, (*values)[j], value);
    }
    const Json* directories = Find(json, item, kDirectoriesKey);
    if (!shape.directories.empty() && !directories) Fail(item, "an entry without \"directories\"");
    if (directories) Array(*directories, item.Key(kDirectoriesKey), shape.directories.size());
    for (std::size_t k = 0; k < shape.directories.size(); ++k) {
      const datapack::Shape& sub = shape.directories[k];
      const Place list = item.Key(kDirectoriesKey).Item(k).Named(sub.name);
      AddEntries(sub, table.Directory(k), (*directories)[k], list);
    }
    table.EndEntry();
  }

 private:
  void AddValue(Table& table, std::size_t slot, Kind kind, const Json& json,
                const Place& place) const {
    switch (kind) {
      case Kind::kText:
        table.Add(slot, std::string_view(Text(json, place)));
        return;
      case Kind::kValue:
        table.Add(slot, Number(json, place));
        return;
      case Kind::kVector: {
        const Json& xyz = Array(json, place, 3);
        table.Add(slot,
                  D3DXVECTOR3{Number(xyz[0], place), Number(xyz[1], place), Number(xyz[2], place)});
        return;
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
    table.Add(slot, &matrix);
  }

  bool latin1_ = false;
};

// The JSON text parsed with each entry of the top directory added to its table as soon as it is
// complete and dropped from the document: the document never holds the package's values. That
// needs the directory's shape and the encoding before its entries, as show --json prints them;
// other texts are read whole.
class StreamedReader {
 public:
  struct Unstreamable {};

  // `input` is a text, or a pair of iterators over one.
  template <typename... Input>
  Package Read(Input&&... input) {
    Json root = Json::parse(
        std::forward<Input>(input)...,
        [this](int, Json::parse_event_t event, Json& parsed) { return Handle(event, parsed); });
    FromJson from;
    Package package = from.Read(root);
    if (streamed_) {
      if (from.latin1() != latin1_ || package.top != *shape_) throw Unstreamable();
      package.table = std::move(*table_);
    }
    return package;
  }

 private:
  using Event = Json::parse_event_t;
  struct Frame {
    bool array = false;
    std::string key;
    std::size_t count = 0;
  };

  // Whether the parser keeps what it has just read.
  bool Handle(Event event, Json& parsed) {
    switch (event) {
      case Event::object_start:
      case Event::array_start:
        frames_.push_back({event == Event::array_start, "", 0});
        return true;
      case Event::key:
        frames_.back().key = parsed.get<std::string>();
        return true;
      case Event::object_end:
      case Event::array_end:
        frames_.pop_back();
        if (frames_.empty()) return true;
        break;
      case Event::value:
        if (frames_.empty()) return true;
        break;
    }
    const bool keep = Complete(parsed, event == Event::object_end);
    if (frames_.back().array) ++frames_.back().count;
    return keep;
  }

  bool At(std::initializer_list<std::string_view> keys) const {
    if (frames_.size() != keys.size()) return false;
    std::size_t i = 0;
    for (std::string_view key : keys) {
      if (frames_[i].array || frames_[i].key != key) return false;
      ++i;
    }
    return true;
  }

  // A value complete where the frames say.
  bool Complete(Json& parsed, bool object) {
    if (At({kEncodingKey})) {
      latin1_ = parsed == Json(std::string(kLatin1));
      if (streamed_) throw Unstreamable();
    } else if (frames_.size() == 2 && At({kDirectoryKey, frames_[1].key}) &&
               frames_[1].key != kEntriesKey) {
      if (streamed_) throw Unstreamable();  // the shape has changed under its entries
      parts_[frames_[1].key] = parsed;
    } else if (object && frames_.size() == 3 && !frames_[0].array &&
               frames_[0].key == kDirectoryKey && !frames_[1].array &&
               frames_[1].key == kEntriesKey && frames_[2].array) {
      if (!shape_) {
        if (frames_[2].count != 0 || !parts_.contains(kNameKey)) return true;
        shape_ = FromJson(latin1_).Shape(parts_, top_, 0);
        table_.emplace(*shape_);
      }
      if (!streamed_ && frames_[2].count != 0) return true;
      streamed_ = true;
      const Place list = top_.Named(shape_->name).Key(kEntriesKey);
      FromJson(latin1_).AddEntry(*shape_, *table_, parsed, list.Entry(frames_[2].count));
      return false;
    }
    return true;
  }

  std::vector<Frame> frames_;
  Json parts_ = Json::object();
  const Place top_ = Place().Key(kDirectoryKey);
  std::optional<datapack::Shape> shape_;
  std::optional<Table> table_;  // the entries streamed, of `shape_`
  bool latin1_ = false;
  bool streamed_ = false;
};

}  // namespace

std::string ShownName(std::string_view name) {
  constexpr std::size_t kShown = 40;
  std::string shown;
  for (char c : name.substr(0, kShown)) {
    const auto byte = static_cast<unsigned char>(c);
    if (byte < 0x20 || byte == 0x7F) {
      constexpr char kDigits[] = "0123456789abcdef";
      shown += {'\\', 'x', kDigits[byte >> 4], kDigits[byte & 15]};
    } else {
      shown += c;
    }
  }
  if (name.size() > kShown) shown += "...";
  return shown;
}

std::vector<const Place::Link*> Place::Links() const {
  std::vector<const Link*> links;
  for (const Link* link = last_.get(); link; link = link->before.get())
    links.push_back(link);
  std::reverse(links.begin(), links.end());
  return links;
}

std::string Place::Pointer() const {
  std::string pointer;
  for (const Link* link : Links()) {
    if (link->kind != kNamed) pointer += "/" + link->text;
  }
  return pointer;
}

std::string Place::Path() const {
  std::string path;
  for (const Link* link : Links()) {
    if (link->kind == kEntry) path += "[" + link->text + "]";
    if (link->kind == kNamed) path += (path.empty() ? "" : ".") + ShownName(link->text);
  }
  return path;
}

std::string ShownPath(const std::string& path) {
  constexpr std::size_t kEnds = 60;
  if (path.size() <= 3 * kEnds) return path;
  return path.substr(0, kEnds) + " ... " + path.substr(path.size() - kEnds) + " (" +
         std::to_string(std::count(path.begin(), path.end(), '.') + 1) + " names)";
}

std::size_t JsonError::OffsetIn(std::string_view text) const {
  return offset_ ? *offset_ : LocateJsonPointer(text, pointer_);
}

void WritePackageJson(const Package& package, Output& out) {
  const bool latin1 =
      !IsUtf8(package.header) || !AllUtf8(package.top) || !AllUtf8(package.table, package.top);
  const Entries entries = package.entries();
  const ToJson to(latin1);
  std::vector<std::string_view> keys = {kHeaderKey, kLineBreaksKey, kEncodingKey};
  if (package.scrambled) keys.push_back(kScrambledKey);
  keys.push_back(kDirectoryKey);
  const View root = Object(keys, [&](std::size_t i) {
    switch (i) {
      case 0:
        return to.Text(package.header);
      case 1:
        return Scalar(package.crlf ? "\"CRLF\"" : "\"LF\"");
      case 2:
        return Scalar(ToJson::Quoted(latin1 ? kLatin1 : kUtf8));
    }
    if (i == 3 && package.scrambled) return Scalar("true");
    return to.Shape(package.top, &entries);
  });
  Printer(out).Print(root, 0);
  out << "\n";
}

std::optional<Package> PackageFromJsonFile(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  if (!file) return std::nullopt;
  try {
    return StreamedReader().Read(std::istreambuf_iterator<char>(file),
                                 std::istreambuf_iterator<char>());
  } catch (const StreamedReader::Unstreamable&) {
  } catch (const Json::exception&) {
  } catch (const JsonError&) {
  }
  return std::nullopt;
}

Package PackageFromJson(std::string_view text) {
  try {
    return StreamedReader().Read(text);
  } catch (const StreamedReader::Unstreamable&) {
  } catch (const Json::exception&) {
  } catch (const JsonError&) {
    // Read whole, the text gives the message it always gives.
  }
  Json root;
  try {
    root = Json::parse(text);
  } catch (const Json::parse_error& error) {
    const std::string what = error.what();
    const std::size_t detail = what.find(": ", what.find("column"));
    throw JsonError(error.byte ? error.byte - 1 : 0,
                    detail == std::string::npos ? what : what.substr(detail + 2));
  } catch (const Json::out_of_range&) {
    // The parser says which number but neither where nor whose: mark each number beyond a float's
    // range, so that reading names the first one's path.
    std::string marked(text);
    for (std::size_t at = FindOverflowingNumber(marked, 0); at != std::string::npos;
         at = FindOverflowingNumber(marked, at)) {
      const std::size_t end = marked.find_first_not_of("+-.0123456789eE", at);
      marked.replace(at, end - at, kOverflowJson);
    }
    try {
      root = Json::parse(marked);
    } catch (const Json::exception&) {
      throw JsonError(FindOverflowingNumber(text, 0), "a number beyond the range of a float");
    }
  }
  return FromJson().Read(root);
}

}  // namespace datapack
