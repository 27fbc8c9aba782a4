// The workloads every contestant packs and reads: a chain of directory levels, each entry of a
// level holding the same data fields and then the entries of the next level. Values come from a
// seeded generator as decimals of at most six significant digits, which survive "%g" exactly, so
// every contestant must give back every bit it was given.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace bench {

enum class Kind { kText, kValue, kVector, kMatrix };  // in the order of the tables that name them

int FloatCount(Kind kind);
const char* TypeName(Kind kind);  // the package's Type attribute

class Random {
 public:
  explicit Random(std::uint64_t seed) : state_(seed) {}
  std::uint64_t Next();
  int Int(int low, int high);  // both included
  // A decimal with `decimals` places and at most six significant digits, as a float.
  float Decimal(int low, int high, int decimals);

 private:
  std::uint64_t state_;
};

struct Field {
  const char* name;
  Kind kind;
  // Fills one entry's value: texts into `text`, numbers into FloatCount(kind) floats.
  void (*generate)(Random& random, float* floats, std::string& text);
};

struct Level {
  const char* tag;
  std::vector<Field> fields;
  int fanOut;          // entries in each entry of the level above; the top level's Count
  bool inText = true;  // false: the tree asks for it, the text leaves it out
  int floatsPerEntry = 0;
  int textsPerEntry = 0;
  std::size_t entries = 0;  // in the whole text
};

// Every value of every entry, level by level in entry order; texts live in one arena. Readers
// fill one without allocating: the arena's room is fixed when it is made.
class Values {
 public:
  Values(const std::vector<Level>& levels, std::size_t textRoom, bool growable);

  float* Floats(int level, std::size_t entry) {
    LevelValues& values = levels_[static_cast<std::size_t>(level)];
    return values.floats.data() + entry * static_cast<std::size_t>(values.floatsPerEntry);
  }
  const float* Floats(int level, std::size_t entry) const {
    return const_cast<Values*>(this)->Floats(level, entry);
  }
  std::string_view Text(int level, std::size_t entry, int text) const;
  // Copies, with a NUL after it; a text that no longer fits is left unset, which the checksum
  // catches.
  void SetText(int level, std::size_t entry, int text, std::string_view value);
  std::size_t TextBytes() const { return used_; }

  // Unsets every value, so that a reader that skips one is caught.
  void Poison();
  // Makes the texts' room free again for a reader that sets every text anew.
  void Rewind() { used_ = 0; }
  std::uint64_t Checksum(bool withTexts = true) const;

 private:
  struct TextRef {
    std::uint32_t offset;
    std::uint32_t length;
  };
  struct LevelValues {
    std::vector<float> floats;
    std::vector<TextRef> texts;
    int floatsPerEntry;
    int textsPerEntry;
    std::size_t entries;
  };
  static constexpr std::uint32_t kUnset = 0xFFFFFFFFu;

  std::vector<LevelValues> levels_;
  std::vector<char> arena_;
  std::size_t used_ = 0;
  bool growable_;
};

enum class Shape { kGameState, kNested, kTextHeavy, kAdversarial, kPlayers };

struct Workload {
  Shape shape;
  std::string name;
  std::vector<Level> levels;
  Values source;
  std::string hostileText;  // the adversarial text; empty where each contestant writes its own

  bool Writes() const { return hostileText.empty(); }
  std::size_t FloatCount() const;
};

// `scale` counts the entries of the workload's main level: players, regions, notes or hostile
// entries. The Players package is always the demo's two entries.
Workload MakeWorkload(Shape shape, int scale);
const char* ShapeName(Shape shape);

// The entry of `level` at `index` within the entry `parent` of the level above.
inline std::size_t ChildEntry(const Level& level, std::size_t parent, int index) {
  return parent * static_cast<std::size_t>(level.fanOut) + static_cast<std::size_t>(index);
}

}  // namespace bench
