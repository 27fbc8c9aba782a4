// show and pack against each other over generated trees: a package packed from a JSON shows as the
// values the format keeps of that JSON, and packing what show printed gives the same bytes back.
#include <gtest/gtest.h>

#include <algorithm>
#include <bit>
#include <cfloat>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <limits>
#include <nlohmann/json.hpp>
#include <random>
#include <string>

#include "tests/datapack/run_datapack.h"
#include "tools/datapack/text_encoding.h"

namespace {

namespace fs = std::filesystem;

// Floats all the way, as the tool reads and prints them.
using Json = nlohmann::basic_json<nlohmann::ordered_map, std::vector, std::string, bool,
                                  std::int64_t, std::uint64_t, float>;

const char* const kKinds[] = {"Txt", "Val", "Vec", "Mat"};

// Random package descriptions within the format's limits: names and texts the reader takes back
// as written, directory names none of which begins another, counts the reader takes.
class Generator {
 public:
  explicit Generator(unsigned seed) : random_(seed), latin1_(Chance(30)) {}

  Json Package() {
    Json top = Shape(0);
    top["entries"] = Entries(top, 0);
    return {{"header", Encoded(Header())},
            {"encoding", latin1_ ? "Latin-1" : "UTF-8"},
            {"directory", std::move(top)}};
  }

 private:
  int Pick(int count) { return std::uniform_int_distribution<int>(0, count - 1)(random_); }
  bool Chance(int percent) { return Pick(100) < percent; }

  Json Encoded(const std::string& bytes) const {
    return latin1_ ? datapack::Latin1ToUtf8(bytes) : bytes;
  }

  // Printable ASCII and inner whitespace, some 8-bit bytes or UTF-8 characters.
  std::string Characters(int length, bool allowNewlines) {
    static const std::string plain =
        "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789 "
        "_-.:;,!?'\"&=+*#()[]{}|~^%$@/<";
    static const char* const wide[] = {"\xC3\xA9", "\xE2\x82\xAC", "\xE6\x97\xA5"};
    std::string text;
    while (static_cast<int>(text.size()) < length) {
      const int kind = Pick(40);
      if (kind == 0 && allowNewlines) {
        text += Pick(2) ? "\n" : "\t";
      } else if (kind == 1) {
        text += latin1_ ? std::string(1, static_cast<char>(0x80 + Pick(128))) : wide[Pick(3)];
      } else {
        text += plain[static_cast<std::size_t>(Pick(static_cast<int>(plain.size())))];
      }
    }
    return text;
  }

  static bool Trimmed(const std::string& text) {
    const auto space = [](char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; };
    return text.empty() || (!space(text.front()) && !space(text.back()));
  }

  std::string Name(bool directory) {
    // A directory's tag holds an id besides its name: the reader takes 2047 characters of both.
    const int longest = directory ? 2030 : 2047;
    for (;;) {
      const std::string name = Characters(Chance(1) ? longest : 1 + Pick(10), Chance(10));
      if (name.size() > static_cast<std::size_t>(longest) || !Trimmed(name) ||
          name.front() == '/' || name.find("Type=") != std::string::npos ||
          name.find("id=\"") != std::string::npos) {
        continue;
      }
      if (!directory) return name;
      bool clash = name.find("</") != std::string::npos;
      for (const std::string& other : directoryNames_)
        clash = clash || other.starts_with(name) || name.starts_with(other);
      if (clash) continue;
      directoryNames_.push_back(name);
      return name;
    }
  }

  std::string Text() {
    for (;;) {
      const std::string text = Characters(Chance(1) ? 2047 : Pick(25), true);
      if (text.size() <= 2047 && Trimmed(text) && text.find("</") == std::string::npos) {
        return text;
      }
    }
  }

  // Any text but a "<" that a tag of the directory could start with.
  std::string Header() {
    if (Chance(2)) return std::string(2047, 'H');
    std::string text = Chance(50) ? Characters(Pick(30), true) : "";
    text.erase(std::remove(text.begin(), text.end(), '<'), text.end());
    return (Chance(30) ? "<?xml version=\"1.0\"?>" : "") + text;
  }

  float Number() {
    switch (Pick(8)) {
      case 0:
        return static_cast<float>(Pick(2001) - 1000);
      case 1:
        return static_cast<float>(Pick(20001) - 10000) / 8.0f;
      case 2: {  // any finite float, subnormals included
        float number;
        do {
          number = std::bit_cast<float>(static_cast<std::uint32_t>(random_()));
        } while (!std::isfinite(number));
        return number;
      }
      case 3:
        return static_cast<float>((Pick(2) ? -1 : 1) * (1 + Pick(999999)) *
                                  std::pow(10.0, -30 - Pick(20)));
      case 4:
        return static_cast<float>((1 + Pick(339999)) * std::pow(10.0, 25 + Pick(9)));
      case 5: {
        const float nan = std::numeric_limits<float>::quiet_NaN();
        const float inf = std::numeric_limits<float>::infinity();
        const float special[] = {
            0.0f, -0.0f,   inf,      -inf,    nan,
            -nan, FLT_MAX, -FLT_MAX, FLT_MIN, std::numeric_limits<float>::denorm_min()};
        return special[Pick(10)];
      }
      default:
        return std::uniform_real_distribution<float>(-1e6f, 1e6f)(random_);
    }
  }

  static Json NumberJson(float number) {
    if (std::isfinite(number)) return number;
    if (std::isinf(number)) return number < 0 ? "-inf" : "inf";
    return std::signbit(number) ? "-nan" : "nan";
  }

  Json Value(const std::string& kind) {
    if (kind == "Txt") return Encoded(Text());
    if (kind == "Val") return NumberJson(Number());
    Json numbers = Json::array();
    for (int i = 0; i < (kind == "Vec" ? 3 : 4); ++i) {
      if (kind == "Vec") {
        numbers.push_back(NumberJson(Number()));
      } else {
        numbers.push_back({NumberJson(Number()), NumberJson(Number()), NumberJson(Number()),
                           NumberJson(Number())});
      }
    }
    return numbers;
  }

  Json Shape(int depth) {
    Json shape = {
        {"name", Encoded(Name(true))}, {"data", Json::array()}, {"directories", Json::array()}};
    for (int j = Pick(5); j > 0; --j)
      shape["data"].push_back({{"name", Encoded(Name(false))}, {"type", kKinds[Pick(4)]}});
    for (int k = depth < 3 ? Pick(3) : 0; k > 0; --k)
      shape["directories"].push_back(Shape(depth + 1));
    return shape;
  }

  Json Entries(const Json& shape, int depth) {
    int count = Chance(5) ? 5 + Pick(11) : Pick(5);
    if (entryBudget_ <= 0) count = std::min(count, 1);
    entryBudget_ -= count;
    Json entries = Json::array();
    for (int i = 0; i < count; ++i) {
      Json entry = Json::object();
      if (!shape["data"].empty()) {
        entry["values"] = Json::array();
        for (const Json& slot : shape["data"])
          entry["values"].push_back(Value(slot["type"].get<std::string>()));
      }
      if (!shape["directories"].empty()) {
        entry["directories"] = Json::array();
        for (const Json& sub : shape["directories"])
          entry["directories"].push_back(Entries(sub, depth + 1));
      }
      entries.push_back(std::move(entry));
    }
    return entries;
  }

  std::mt19937 random_;
  bool latin1_;
  std::vector<std::string> directoryNames_;
  int entryBudget_ = 60;
};

// What reading a number back gives: the package holds it as printf's "%g" writes it, and a NaN
// as "nan" or "-nan", which not every C library reads back.
float AsPackaged(float number) {
  if (std::isnan(number)) return std::copysign(std::numeric_limits<float>::quiet_NaN(), number);
  char text[32];
  std::snprintf(text, sizeof(text), "%g", static_cast<double>(number));
  return std::strtof(text, nullptr);
}

float NumberOf(const Json& json) {
  if (json.is_number()) return json.get<float>();
  const std::string word = json.get<std::string>();
  const float sign = word.starts_with('-') ? -1.0f : 1.0f;
  const bool nan = word.ends_with("nan");
  return std::copysign(
      nan ? std::numeric_limits<float>::quiet_NaN() : std::numeric_limits<float>::infinity(), sign);
}

bool SameFloat(float a, float b) {
  if (std::isnan(a) || std::isnan(b)) {
    return std::isnan(a) && std::isnan(b) && std::signbit(a) == std::signbit(b);
  }
  return std::bit_cast<std::uint32_t>(a) == std::bit_cast<std::uint32_t>(b);
}

// Compares a generated description with what show printed for its package; returns where they
// first differ, empty when they agree.
class Comparison {
 public:
  Comparison(const Json& meant, const Json& shown)
      : meantLatin1_(meant["encoding"] == "Latin-1"),
        shownLatin1_(shown["encoding"] == "Latin-1") {}

  std::string Bytes(const Json& json, bool latin1) const {
    const std::string text = json.get<std::string>();
    return latin1 ? datapack::Utf8ToLatin1(text).bytes : text;
  }
  bool SameText(const Json& meant, const Json& shown) const {
    return Bytes(meant, meantLatin1_) == Bytes(shown, shownLatin1_);
  }

  std::string Value(const std::string& kind, const Json& meant, const Json& shown) const {
    if (kind == "Txt") return SameText(meant, shown) ? "" : "text " + shown.dump();
    if (kind == "Val") {
      return SameFloat(AsPackaged(NumberOf(meant)), NumberOf(shown)) ? "" : "value " + shown.dump();
    }
    for (std::size_t i = 0; i < meant.size(); ++i) {
      if (std::string difference = Value(kind == "Mat" ? "Vec" : "Val", meant[i], shown[i]);
          !difference.empty()) {
        return difference;
      }
    }
    return "";
  }

  std::string Directory(const Json& meant, const Json& meantEntries, const Json& shown,
                        const Json& shownEntries, const std::string& path) const {
    if (!SameText(meant["name"], shown["name"])) return path + ": name " + shown["name"].dump();
    const bool writtenEmpty =
        meantEntries.size() == 1 && meant["data"].empty() && meant["directories"].empty();
    const std::size_t count = writtenEmpty ? 0 : meantEntries.size();
    if (shownEntries.size() != count) return path + ": " + std::to_string(shownEntries.size());
    if (count == 0) return "";
    if (meant["data"].size() != shown["data"].size() ||
        meant["directories"].size() != shown["directories"].size()) {
      return path + ": another shape";
    }
    for (std::size_t j = 0; j < meant["data"].size(); ++j) {
      if (!SameText(meant["data"][j]["name"], shown["data"][j]["name"]) ||
          meant["data"][j]["type"] != shown["data"][j]["type"]) {
        return path + ": data channel " + std::to_string(j);
      }
    }
    for (std::size_t i = 0; i < count; ++i) {
      const std::string entry = path + "[" + std::to_string(i) + "]";
      for (std::size_t j = 0; j < meant["data"].size(); ++j) {
        const std::string kind = meant["data"][j]["type"].get<std::string>();
        if (std::string difference =
                Value(kind, meantEntries[i]["values"][j], shownEntries[i]["values"][j]);
            !difference.empty()) {
          return entry + "." + std::to_string(j) + ": " + difference;
        }
      }
      for (std::size_t k = 0; k < meant["directories"].size(); ++k) {
        if (std::string difference = Directory(
                meant["directories"][k], meantEntries[i]["directories"][k], shown["directories"][k],
                shownEntries[i]["directories"][k], entry + "/" + std::to_string(k));
            !difference.empty()) {
          return difference;
        }
      }
    }
    return "";
  }

  std::string Package(const Json& meant, const Json& shown) const {
    if (!SameText(meant["header"], shown["header"])) return "header " + shown["header"].dump();
    return Directory(meant["directory"], meant["directory"]["entries"], shown["directory"],
                     shown["directory"]["entries"], "directory");
  }

 private:
  bool meantLatin1_;
  bool shownLatin1_;
};

// Each tree starts the program three times; under Wine a start costs far more.
int TreeCount() {
  if (const char* count = std::getenv("DATAPACK_ROUND_TRIP_TREES")) return std::atoi(count);
#if defined(_WIN32)
  return 40;
#else
  return 300;
#endif
}

TEST(DatapackRoundTripTest, ShowThenPackGivesTheSameBytesForGeneratedTrees) {
  const fs::path folder = ScratchFolder();
  const fs::path meantJson = folder / "meant.json";
  const fs::path shownJson = folder / "shown.json";
  const fs::path first = folder / "first.pkg";
  const fs::path second = folder / "second.pkg";
  std::mt19937 choices(2024);
  int trees = 0;
  int mismatches = 0;
  std::size_t comparedBytes = 0;
  for (int tree = 0; tree < TreeCount(); ++tree) {
    Json meant = Generator(static_cast<unsigned>(tree)).Package();
    const bool crlf = choices() % 2;
    const bool crlfByFlag = crlf && choices() % 2;
    const bool scramble = choices() % 2;
    if (crlf && !crlfByFlag) meant["lineBreaks"] = "CRLF";
    WriteBytes(meantJson, meant.dump(1));
    ++trees;
    const std::string context = "tree " + std::to_string(tree);

    std::vector<std::string> pack = {"pack", meantJson.string(), "-o", first.string()};
    if (crlfByFlag) pack.push_back("--crlf");
    if (scramble) pack.push_back("--scramble");
    const RunResult packed = RunDatapack(pack);
    // Whether the package is scrambled is told from its first bytes.
    const RunResult shown = RunDatapack({"show", first.string(), "--json"});
    if (packed.status != 0 || shown.status != 0 || !shown.err.empty()) {
      ADD_FAILURE() << context << "\n" << packed.err << shown.err;
      ++mismatches;
      continue;
    }
    const Json shownTree = Json::parse(shown.out);
    EXPECT_EQ(shownTree["lineBreaks"], crlf ? "CRLF" : "LF") << context;
    EXPECT_EQ(shownTree.value("scrambled", false), scramble) << context;
    if (const std::string difference = Comparison(meant, shownTree).Package(meant, shownTree);
        !difference.empty()) {
      ADD_FAILURE() << context << ": " << difference;
      ++mismatches;
    }

    WriteBytes(shownJson, shown.out);
    const RunResult repacked = RunDatapack({"pack", shownJson.string(), "-o", second.string()});
    const std::string bytes = ReadBytes(first);
    comparedBytes += bytes.size();
    if (repacked.status != 0 || ReadBytes(second) != bytes) {
      ADD_FAILURE() << context << ": the package packed from show's JSON differs\n" << repacked.err;
      ++mismatches;
    }
    // What pack accepts, check finds sound, and a package is the same as itself scrambled: for
    // every other tree, which is plenty and keeps the test's time.
    if (tree % 2 == 0) {
      const RunResult checked = RunDatapack({"check", "--strict", first.string()});
      EXPECT_EQ(checked.status, 0) << context << "\n" << checked.out << checked.err;
      const std::string plain = scramble ? RunDatapack({"unscramble", first.string()}).out : "";
      const RunResult compared =
          RunDatapack({"diff", first.string(), scramble ? "-" : second.string()}, plain);
      EXPECT_EQ(compared.status, 0) << context << "\n" << compared.out << compared.err;
    }
  }
  std::printf("round trips: %d trees, %zu bytes compared, %d mismatches\n", trees, comparedBytes,
              mismatches);
  RecordProperty("trees", trees);
  RecordProperty("bytes_compared", static_cast<int>(comparedBytes));
  RecordProperty("mismatches", mismatches);
  EXPECT_EQ(mismatches, 0);
}

}  // namespace
