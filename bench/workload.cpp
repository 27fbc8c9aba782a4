#include "bench/workload.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <utility>

namespace bench {

namespace {

constexpr int kMaxEntries = 9999;  // what a reader takes from one directory

// Splits `count` entries into as few equal directories as the reader allows.
std::pair<int, int> Split(int count) {
  const int directories = std::max(1, (count + kMaxEntries - 1) / kMaxEntries);
  return {directories, std::max(2, (count + directories - 1) / directories)};
}

constexpr const char* kSyllables[] = {"ka", "ri", "to",  "mo", "sa", "len", "dor", "vi",
                                      "an", "el", "thi", "or", "ne", "ja",  "qua", "ix"};

void Name(Random& random, float*, std::string& text) {
  text.clear();
  for (int i = random.Int(2, 4); i > 0; --i)
    text += kSyllables[random.Int(0, 15)];
  text[0] = static_cast<char>(text[0] - 'a' + 'A');
  text += '_';
  text += std::to_string(random.Int(1, 9999));
}

constexpr const char* kWords[] = {
    "the",    "north",   "gate",  "opens",  "when",   "all",    "four",   "lamps",
    "are",    "lit",     "and",   "guard",  "sleeps", "under",  "old",    "bridge",
    "river",  "carries", "a",     "silver", "key",    "past",   "market", "where",
    "trader", "waits",   "for",   "rain",   "tower",  "bell",   "rings",  "twice",
    "before", "dawn",    "stone", "road",   "leads",  "to",     "quiet",  "hall",
    "of",     "maps",    "every", "player", "may",    "follow", "narrow", "stairs"};
constexpr int kWordCount = sizeof(kWords) / sizeof(kWords[0]);

void Words(Random& random, std::string& text, int count) {
  for (int i = 0; i < count; ++i) {
    if (i > 0) text += ' ';
    text += kWords[random.Int(0, kWordCount - 1)];
  }
}

void Title(Random& random, float*, std::string& text) {
  text.clear();
  Words(random, text, random.Int(3, 7));
  text[0] = static_cast<char>(text[0] - 'a' + 'A');
}

// Sentences up to a length drawn between a long paragraph and the longest text that reads back.
void Body(Random& random, float*, std::string& text) {
  text.clear();
  const std::size_t length = static_cast<std::size_t>(random.Int(300, 1800));
  while (text.size() < length) {
    if (!text.empty()) text += ' ';
    const std::size_t start = text.size();
    Words(random, text, random.Int(5, 14));
    text[start] = static_cast<char>(std::toupper(static_cast<unsigned char>(text[start])));
    text += '.';
  }
}

void Empty(Random&, float*, std::string& text) { text.clear(); }

template <int kLow, int kHigh, int kDecimals>
void Number(Random& random, float* floats, std::string&) {
  floats[0] = random.Decimal(kLow, kHigh, kDecimals);
}

template <int kLow, int kHigh, int kDecimals>
void Point(Random& random, float* floats, std::string&) {
  for (int i = 0; i < 3; ++i)
    floats[i] = random.Decimal(kLow, kHigh, kDecimals);
}

// A turn about the vertical axis with four decimals, then a place with two.
void Transform(Random& random, float* floats, std::string& text) {
  const double angle = random.Int(0, 359) * 3.14159265358979 / 180;
  const auto fourPlaces = [](double value) {
    return static_cast<float>(std::lround(value * 10000)) / 10000.0f;
  };
  const float c = fourPlaces(std::cos(angle));
  const float s = fourPlaces(std::sin(angle));
  const float turn[12] = {c, 0, fourPlaces(-std::sin(angle)), 0, 0, 1, 0, 0, s, 0, c, 0};
  std::copy(turn, turn + 12, floats);
  Point<-999999, 999999, 2>(random, floats + 12, text);
  floats[15] = 1;
}

void Finish(std::vector<Level>& levels) {
  std::size_t entries = 1;
  for (Level& level : levels) {
    level.floatsPerEntry = 0;
    level.textsPerEntry = 0;
    for (const Field& field : level.fields) {
      level.floatsPerEntry += FloatCount(field.kind);
      level.textsPerEntry += field.kind == Kind::kText;
    }
    entries = level.inText ? entries * static_cast<std::size_t>(level.fanOut) : 0;
    level.entries = entries;
  }
}

std::vector<Level> Levels(Shape shape, int scale) {
  using K = Kind;
  switch (shape) {
    case Shape::kGameState: {
      const auto [zones, players] = Split(scale);
      return {{"Zones", {}, zones},
              {"Players",
               {{"Name", K::kText, Name},
                {"Score", K::kValue, Number<0, 999999, 1>},
                {"Position", K::kVector, Point<-999999, 999999, 2>},
                {"Transform", K::kMatrix, Transform}},
               players}};
    }
    case Shape::kNested:
      return {{"Regions",
               {{"Name", K::kText, Name}, {"Origin", K::kVector, Point<-999999, 999999, 2>}},
               std::clamp(scale, 1, kMaxEntries)},
              {"Sectors",
               {{"Name", K::kText, Name},
                {"Height", K::kValue, Number<-5000, 50000, 2>},
                {"Center", K::kVector, Point<-999999, 999999, 2>}},
               3},
              {"Rooms",
               {{"Name", K::kText, Name},
                {"Area", K::kValue, Number<100, 99999, 2>},
                {"Center", K::kVector, Point<-999999, 999999, 2>}},
               4},
              {"Items",
               {{"Label", K::kText, Name},
                {"Weight", K::kValue, Number<1, 99999, 3>},
                {"Place", K::kVector, Point<-99999, 99999, 3>}},
               5}};
    case Shape::kTextHeavy: {
      const auto [zones, notes] = Split(scale);
      return {{"Zones", {}, zones},
              {"Notes",
               {{"Title", K::kText, Title},
                {"Body", K::kText, Body},
                {"Stamp", K::kValue, Number<0, 999999, 2>}},
               notes}};
    }
    case Shape::kPlayers:
      return {{"Players", {{"Name", K::kText, Name}, {"Score", K::kValue, Number<0, 999, 1>}}, 2}};
    case Shape::kAdversarial: {
      // The tree asks for sub-directories S and T inside every entry of D; the text has none.
      const auto [zones, entries] = Split(scale);
      return {
          {"Zones", {}, zones},
          {"D", {{"x", K::kValue, Number<-999999, 999999, 3>}, {"t", K::kText, Empty}}, entries},
          {"S", {}, 1, false},
          {"T", {}, 1, false}};
    }
  }
  return {};
}

// Entries of D padded with elements that are not theirs, as bench/adversarial_read writes them,
// wrapped in the zones the reader needs for more than 9999 of them.
std::string HostileText(const Workload& workload) {
  const Level& zones = workload.levels[0];
  const Level& entries = workload.levels[1];
  std::string text;
  text.reserve(entries.entries * 560);
  char number[32];
  for (int zone = 0; zone < zones.fanOut; ++zone) {
    text += zones.fanOut == 1 ? "\n<Zones>" : "\n<Zones id=\"" + std::to_string(zone) + "\">";
    for (int index = 0; index < entries.fanOut; ++index) {
      const float x = workload.source.Floats(1, ChildEntry(entries, zone, index))[0];
      std::snprintf(number, sizeof(number), "%g", static_cast<double>(x));
      text += "\n\t<D id=\"" + std::to_string(index) + "\">\n\t\t<x Type=\"Val\"> ";
      text += number;
      text += " </x>";
      for (int pad = 0; pad < 14; ++pad)
        text += "\n\t\t<p>a</p><q Type=\"Txt\"> b </q>";
      text += "\n\t</D>";
    }
    text += "\n</Zones>";
  }
  return text;
}

}  // namespace

int FloatCount(Kind kind) {
  static constexpr int kCounts[] = {0, 1, 3, 16};
  return kCounts[static_cast<int>(kind)];
}

const char* TypeName(Kind kind) {
  static constexpr const char* kNames[] = {"Txt", "Val", "Vec", "Mat"};
  return kNames[static_cast<int>(kind)];
}

std::uint64_t Random::Next() {
  // splitmix64: the same sequence on every machine and library.
  std::uint64_t z = (state_ += 0x9E3779B97F4A7C15u);
  z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9u;
  z = (z ^ (z >> 27)) * 0x94D049BB133111EBu;
  return z ^ (z >> 31);
}

int Random::Int(int low, int high) {
  const auto span = static_cast<std::uint64_t>(static_cast<std::int64_t>(high) - low + 1);
  return static_cast<int>(low + static_cast<std::int64_t>(Next() % span));
}

float Random::Decimal(int low, int high, int decimals) {
  // Both operands are exact floats, and a division rounds correctly: the nearest float.
  static constexpr float kPowers[] = {1, 10, 100, 1000, 10000};
  return static_cast<float>(Int(low, high)) / kPowers[decimals];
}

Values::Values(const std::vector<Level>& levels, std::size_t textRoom, bool growable)
    : arena_(textRoom), growable_(growable) {
  for (const Level& level : levels) {
    levels_.push_back({std::vector<float>(level.entries * level.floatsPerEntry),
                       std::vector<TextRef>(level.entries * level.textsPerEntry, {0, kUnset}),
                       level.floatsPerEntry, level.textsPerEntry, level.entries});
  }
}

std::string_view Values::Text(int level, std::size_t entry, int text) const {
  const LevelValues& values = levels_[static_cast<std::size_t>(level)];
  const TextRef ref = values.texts[entry * static_cast<std::size_t>(values.textsPerEntry) +
                                   static_cast<std::size_t>(text)];
  if (ref.length == kUnset) return {};
  return {arena_.data() + ref.offset, ref.length};
}

void Values::SetText(int level, std::size_t entry, int text, std::string_view value) {
  LevelValues& values = levels_[static_cast<std::size_t>(level)];
  TextRef& ref = values.texts[entry * static_cast<std::size_t>(values.textsPerEntry) +
                              static_cast<std::size_t>(text)];
  const std::size_t room = value.size() + 1;  // a NUL after each, for channels that take C texts
  if (used_ + room > arena_.size()) {
    if (!growable_) {
      ref = {0, kUnset};
      return;
    }
    arena_.resize(std::max(arena_.size() * 2, used_ + room));
  }
  std::memcpy(arena_.data() + used_, value.data(), value.size());
  arena_[used_ + value.size()] = '\0';
  ref = {static_cast<std::uint32_t>(used_), static_cast<std::uint32_t>(value.size())};
  used_ += room;
}

void Values::Poison() {
  std::uint32_t bits = 0x7FC0DEADu;  // a NaN that no text reads back as
  float poison;
  std::memcpy(&poison, &bits, sizeof(poison));
  for (LevelValues& values : levels_) {
    std::fill(values.floats.begin(), values.floats.end(), poison);
    std::fill(values.texts.begin(), values.texts.end(), TextRef{0, kUnset});
  }
  used_ = 0;
}

std::uint64_t Values::Checksum(bool withTexts) const {
  std::uint64_t hash = 0xCBF29CE484222325u;
  const auto mix = [&hash](std::uint64_t word) { hash = (hash ^ word) * 0x100000001B3u; };
  for (std::size_t level = 0; level < levels_.size(); ++level) {
    const LevelValues& values = levels_[level];
    for (float value : values.floats) {
      std::uint32_t bits;
      std::memcpy(&bits, &value, sizeof(bits));
      mix(bits);
    }
    for (std::size_t i = 0; withTexts && i < values.texts.size(); ++i) {
      const TextRef ref = values.texts[i];
      mix(ref.length);
      if (ref.length == kUnset) continue;
      for (std::size_t at = 0; at < ref.length; ++at)
        mix(static_cast<unsigned char>(arena_[ref.offset + at]));
    }
  }
  return hash;
}

std::size_t Workload::FloatCount() const {
  std::size_t count = 0;
  for (const Level& level : levels)
    count += level.entries * static_cast<std::size_t>(level.floatsPerEntry);
  return count;
}

const char* ShapeName(Shape shape) {
  static constexpr const char* kNames[] = {"game-state", "nested", "text-heavy", "adversarial",
                                           "players"};
  return kNames[static_cast<int>(shape)];
}

Workload MakeWorkload(Shape shape, int scale) {
  std::vector<Level> levels = Levels(shape, scale);
  Finish(levels);
  Workload workload{shape, ShapeName(shape), levels, Values(levels, 0, true), {}};
  Random random(0x5EED0000u + static_cast<std::uint64_t>(shape));
  std::string text;
  for (int l = 0; l < static_cast<int>(levels.size()); ++l) {
    const Level& level = levels[static_cast<std::size_t>(l)];
    for (std::size_t entry = 0; entry < level.entries; ++entry) {
      float* floats = workload.source.Floats(l, entry);
      int texts = 0;
      for (const Field& field : level.fields) {
        field.generate(random, floats, text);
        if (field.kind == Kind::kText) workload.source.SetText(l, entry, texts++, text);
        floats += FloatCount(field.kind);
      }
    }
  }
  if (shape == Shape::kAdversarial) workload.hostileText = HostileText(workload);
  if (shape == Shape::kPlayers) {
    // The demo's entries, whose package is 184 bytes with its NUL.
    const std::pair<const char*, float> players[] = {{"Ann", 12.5f}, {"Bob", 7.0f}};
    workload.source.Poison();
    for (std::size_t entry = 0; entry < 2; ++entry) {
      workload.source.SetText(0, entry, 0, players[entry].first);
      workload.source.Floats(0, entry)[0] = players[entry].second;
    }
  }
  return workload;
}

}  // namespace bench
