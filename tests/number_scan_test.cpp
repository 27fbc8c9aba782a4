#include "codec/number_scan.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <bit>
#include <cctype>
#include <clocale>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <iterator>
#include <memory>
#include <random>
#include <string>
#include <string_view>

#include "codec/number_format.h"

namespace numbers {
namespace {

constexpr std::uint32_t kUntouched = 0xdeadbeefu;
constexpr std::string_view kVector = "%f %f %f";
constexpr std::string_view kMatrix = "%f %f %f %f, %f %f %f %f, %f %f %f %f, %f %f %f %f";
constexpr std::string_view kFormats[] = {"%f", kVector, kMatrix};

std::string Escape(std::string_view text) {
  std::string escaped;
  for (const char c : text) {
    if (c == '\n') {
      escaped += "\\n";
    } else if (c == '\t' || c == '\v' || c == '\f' || c == '\r' || c == '\0') {
      escaped += '\\';
      escaped += std::to_string(static_cast<int>(c));
    } else {
      escaped += c;
    }
  }
  return escaped;
}

// Holds a text at the very end of a heap block so that reading past `last` hits the allocation's
// end (and AddressSanitizer's red zone when enabled).
class EdgeBuffer {
 public:
  explicit EdgeBuffer(std::size_t capacity) : capacity_(capacity), block_(new char[capacity]) {}
  std::string_view Place(std::string_view text) {
    if (text.size() > capacity_) *this = EdgeBuffer(text.size());
    char* const start = block_.get() + capacity_ - text.size();
    std::memcpy(start, text.data(), text.size());
    return {start, text.size()};
  }

 private:
  std::size_t capacity_;
  std::unique_ptr<char[]> block_;
};

struct Outcome {
  int stored = 0;
  int consumed = -1;  // only for "%f"
  std::uint32_t bits[16];
  Outcome() { std::fill(std::begin(bits), std::end(bits), kUntouched); }
  bool operator==(const Outcome&) const = default;
};

Outcome Glibc(const std::string& text, std::string_view format) {
  Outcome outcome;
  float v[16];
  std::memcpy(v, outcome.bits, sizeof v);
  if (format == "%f") {
    outcome.stored = std::sscanf(text.c_str(), "%f%n", &v[0], &outcome.consumed);
  } else {
    outcome.stored = std::sscanf(text.c_str(), std::string(format).c_str(), &v[0], &v[1], &v[2],
                                 &v[3], &v[4], &v[5], &v[6], &v[7], &v[8], &v[9], &v[10], &v[11],
                                 &v[12], &v[13], &v[14], &v[15]);
  }
  if (outcome.stored < 0) outcome.stored = 0;
  std::memcpy(outcome.bits, v, sizeof v);
  return outcome;
}

Outcome Ours(std::string_view text, std::string_view format) {
  Outcome outcome;
  float v[16];
  std::memcpy(v, outcome.bits, sizeof v);
  const char* const last = text.data() + text.size();
  if (format == "%f") {
    const char* const end = ScanFloat(text.data(), last, v[0]);
    outcome.stored = end != nullptr;
    if (end != nullptr) outcome.consumed = static_cast<int>(end - text.data());
    // The general entry point must agree with the single-value one.
    float w = std::bit_cast<float>(kUntouched);
    EXPECT_EQ(ScanFloats(text.data(), last, format, &w), outcome.stored);
    EXPECT_EQ(std::bit_cast<std::uint32_t>(w), std::bit_cast<std::uint32_t>(v[0]));
  } else {
    outcome.stored = ScanFloats(text.data(), last, format, v);
  }
  std::memcpy(outcome.bits, v, sizeof v);
  // The readers' own entry point must agree with the format.
  const int count = format == "%f" ? 1 : format == kVector ? 3 : 16;
  float grouped[16];
  std::fill(std::begin(grouped), std::end(grouped), std::bit_cast<float>(kUntouched));
  const char* end = nullptr;
  EXPECT_EQ(ScanFloatGroups(text.data(), last, count, count == 16 ? 4 : count, grouped, &end),
            outcome.stored);
  EXPECT_EQ(std::memcmp(grouped, v, sizeof v), 0);
  return outcome;
}

// Compares with sscanf on a NUL-terminated copy; false (and one reported failure) on a mismatch.
bool SameAsGlibc(EdgeBuffer& buffer, const std::string& text, std::string_view format) {
  const Outcome expected = Glibc(text, format);
  const Outcome actual = Ours(buffer.Place(text), format);
  if (expected == actual) return true;
  ADD_FAILURE() << '"' << Escape(text) << "\" with \"" << format << "\": stored " << actual.stored
                << " vs " << expected.stored << ", consumed " << actual.consumed << " vs "
                << expected.consumed << ", first value " << std::hex << actual.bits[0] << " vs "
                << expected.bits[0];
  return false;
}

TEST(ScanFloatTest, AwkwardInputs) {
  const std::string exact_tie_at_2_to_minus_127 =
      "0.0000000000000000000000000000000000000058774728050852857834564858789084158565304262440568"
      "940149305873491932992146169478786532636149786412715911865234375";
  const struct {
    std::string text;
    int consumed;  // -1: the conversion fails
    std::uint32_t bits;
  } kCases[] = {
      {"  \t\n\v\f\r-12.5x", 12, 0xc1480000u},
      {"+.5", 3, 0x3f000000u},
      {"0e5", 3, 0},
      {"1e5e", 3, 0x47c35000u},
      {"1p3", 1, 0x3f800000u},
      {"00x1", 2, 0},
      // Dangling exponents are consumed although strtof ignores them.
      {"1e", 2, 0x3f800000u},
      {"1e+", 3, 0x3f800000u},
      {"1E+-3", 3, 0x3f800000u},
      {"", -1, 0},
      {"\v ", -1, 0},
      {"-", -1, 0},
      {"- 1", -1, 0},
      {"-.", -1, 0},
      {".e5", -1, 0},
      // Hexadecimal.
      {"0x1.8p3", 7, 0x41400000u},
      {"-0xA.Bp1", 8, 0xc1ab0000u},
      {"0x1e+5", 4, 0x41f00000u},
      {"0x1p", 4, 0x3f800000u},
      {"0x.", 3, 0},
      {"0x.p1", 3, 0},
      {"0x", -1, 0},
      {"0xp3", -1, 0},
      {"0x+1", -1, 0},
      {"0x1.000001p0", 12, 0x3f800000u},  // tie, to even
      {"0x1.000003p0", 12, 0x3f800002u},
      {"0x1.0000010000000000000000001p0", 31, 0x3f800001u},
      {"0x1.fffffffp127", 15, 0x7f800000u},
      // glibc leaves the 25th significant bit out when rounding hexadecimal subnormals.
      {"0x1.000001p-150", 15, 0},
      {"0x1.400001p-148", 15, 0x00000002u},
      {"0x1.0000008p-150", 16, 0x00000001u},
      // Words.
      {"inf", 3, 0x7f800000u},
      {"infx", 3, 0x7f800000u},
      {"-iNfInItY", 9, 0xff800000u},
      {"infin", -1, 0},
      {"infinit", -1, 0},
      {"infix", -1, 0},
      {"nan", 3, 0x7fc00000u},
      {"-NaN", 4, 0xffc00000u},
      {"nan(123)", 3, 0x7fc00000u},
      {"na", -1, 0},
      // Range.
      {"3.4028235e38", 12, 0x7f7fffffu},
      {"3.40282357e38", 13, 0x7f800000u},
      {"1e99999999999999999999", 22, 0x7f800000u},
      {"0e99999999999999999999", 22, 0},
      {"7.1e-46", 7, 0x00000001u},
      {"0x1p128", 7, 0x7f800000u},
      {"0x1p99999999999999999999", 24, 0x7f800000u},
      {"1.000000059604644775390625", 26, 0x3f800000u},  // tie, to even
      {"1.00000005960464477539062500000000000000000000000000000001", 58, 0x3f800001u},
      {"0." + std::string(300, '0') + "1e301", 307, 0x3f800000u},
      {std::string(300, '9') + "e-300", 305, 0x3f800000u},
      // glibc rounds (4r - 1) * 2^-151 down to r - 1 when the leading bit is 2^-127.
      {exact_tie_at_2_to_minus_127, 153, 0x00400000u},
      {exact_tie_at_2_to_minus_127 + "1", 154, 0x00400001u},
  };
  for (const auto& c : kCases) {
    float value = std::bit_cast<float>(kUntouched);
    const char* const end = ScanFloat(c.text.data(), c.text.data() + c.text.size(), value);
    if (c.consumed < 0) {
      EXPECT_EQ(end, nullptr) << Escape(c.text);
      EXPECT_EQ(std::bit_cast<std::uint32_t>(value), kUntouched) << Escape(c.text);
    } else {
      ASSERT_NE(end, nullptr) << Escape(c.text);
      EXPECT_EQ(end - c.text.data(), c.consumed) << Escape(c.text);
      EXPECT_EQ(std::bit_cast<std::uint32_t>(value), c.bits) << Escape(c.text);
    }
  }
}

TEST(ScanFloatsTest, Formats) {
  const struct {
    std::string_view text;
    std::string_view format;
    int stored;
    float values[16];
  } kCases[] = {
      {"1 2 3", kVector, 3, {1, 2, 3}},
      {"  1\n2\t3  ", kVector, 3, {1, 2, 3}},
      {"1e+ 2 3", kVector, 3, {1, 2, 3}},
      {"0x1p1 inf -0", kVector, 3, {2, std::bit_cast<float>(0x7f800000u), -0.0f}},
      {"1,2,3", kVector, 1, {1}},
      {"1ex2 3", kVector, 1, {1}},
      {"", kVector, 0, {}},
      {"1 0 0 0, 0 1 0 0, 0 0 1 0, 0 0 0 1",
       kMatrix,
       16,
       {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}},
      {"1 2 3 4,5 6 7 8,9 10 11 12,13 14 15 16",
       kMatrix,
       16,
       {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16}},
      {"1 2 3 4 , 5 6 7 8", kMatrix, 4, {1, 2, 3, 4}},
      {"1 2 3 4 5 6 7 8", kMatrix, 4, {1, 2, 3, 4}},
      {"1 2 3 4, 5 6 7 8, 9 10 11 12, 13 14 15",
       kMatrix,
       15,
       {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15}},
      {"1 2", "%f, %f", 1, {1}},
      {"5", "%d", 0, {}},
      {std::string_view("1.5\0 2 3", 8), kVector, 1, {1.5f}},  // the text ends at a NUL
  };
  for (const auto& c : kCases) {
    float values[16];
    std::fill(std::begin(values), std::end(values), std::bit_cast<float>(kUntouched));
    const int stored = ScanFloats(c.text.data(), c.text.data() + c.text.size(), c.format, values);
    EXPECT_EQ(stored, c.stored) << Escape(c.text);
    for (int i = 0; i < 16; ++i) {
      const std::uint32_t expected =
          i < c.stored ? std::bit_cast<std::uint32_t>(c.values[i]) : kUntouched;
      EXPECT_EQ(std::bit_cast<std::uint32_t>(values[i]), expected) << Escape(c.text) << " #" << i;
    }
  }
}

// Readers go on from where the scan stopped: past everything the format matched, and no further.
TEST(ScanFloatGroupsTest, StopsAfterWhatTheFormatMatched) {
  const struct {
    std::string_view text;
    int count;
    int stored;
    int stop;
  } kCases[] = {
      {" 1 2.5 -3 </Pos>", 3, 3, 9},
      {"1 2 x", 3, 2, 4},  // the whitespace before x matched
      {"1 2 3 4 5", 16, 4, 7},
      {"1 2 3 4,5 6 7 8,\t9 10 11 12, 13 14 15 16,", 16, 16, 40},
      {"1e+ </V>", 1, 1, 3},
      {"x", 1, 0, 0},
      {"", 3, 0, 0},
  };
  for (const auto& c : kCases) {
    float values[16];
    const char* stop = nullptr;
    EXPECT_EQ(ScanFloatGroups(c.text.data(), c.text.data() + c.text.size(), c.count,
                              c.count == 16 ? 4 : c.count, values, &stop),
              c.stored)
        << Escape(c.text);
    EXPECT_EQ(stop - c.text.data(), c.stop) << Escape(c.text);
  }
}

// Every prefix of awkward texts, each ending exactly at the end of its allocation.
TEST(ScanFloatTest, ReadsNothingAtOrAfterLast) {
  const char* const kTexts[] = {
      " -1.25e+07 2 3", "+.5e-3, 1",
      "0x1.8p+3 4",     "0X.8P-1",
      "infinity nan",   "-NaN(7)",
      "1e+-3",          "0x1p-150",
      "3.40282357e38",  "1 0 0 0, 0 1 0 0, 0 0 1 0, 0 0 0 1",
  };
  for (const std::string text : kTexts) {
    for (std::size_t length = 0; length <= text.size(); ++length) {
      EdgeBuffer buffer(length);
      for (const std::string_view format : kFormats) {
        SameAsGlibc(buffer, text.substr(0, length), format);
      }
    }
  }
}

// Strings from a number-like alphabet, some free-form and some shaped like numbers.
class TextMaker {
 public:
  explicit TextMaker(std::uint64_t seed) : random_(seed) {}

  std::string Token() {
    std::string text;
    switch (Below(8)) {
      case 0:
      case 1: {
        static constexpr std::string_view kAlphabet =
            "0123456789012345678901234567890.....eeEE++--xXpPabcdefintyINFAT(),, \t\n\v\f\r";
        for (std::size_t n = Below(12); n > 0; --n)
          text += kAlphabet[Below(kAlphabet.size())];
        return text;
      }
      case 2: {
        text = Space();
        text += Sign();
        static constexpr std::string_view kWords[] = {"infinity", "nan", "nan(12)", "nan()"};
        const std::string_view word = kWords[Below(4)];
        for (std::size_t i = 0, n = Below(word.size() + 1); i < n; ++i) {
          text += Below(2) ? word[i] : static_cast<char>(std::toupper(word[i]));
        }
        return text + Tail();
      }
      case 3:
        return Space() + Sign() + (Below(2) ? "0x" : "0X") + Digits(true) + Fraction(true) +
               Exponent(Below(2) ? 'p' : 'P', 160) + Tail();
      case 4: {
        char text_of_float[kMaxFloatText];
        const auto value = std::bit_cast<float>(static_cast<std::uint32_t>(random_()));
        return Space() + std::string(text_of_float, FormatFloat(value, text_of_float)) + Tail();
      }
      default:
        return Space() + Sign() + Digits(false) + Fraction(false) +
               Exponent(Below(2) ? 'e' : 'E', 60) + Tail();
    }
  }

  // Mostly well-formed texts for `format`, separators and values sometimes off.
  std::string ForFormat(std::string_view format) {
    std::string text;
    for (std::size_t i = 0; i < format.size(); ++i) {
      if (format[i] == '%') {
        text += Below(5) ? Token() : Space() + Float();
        ++i;
      } else if (format[i] == ' ') {
        static constexpr std::string_view kGaps[] = {" ", " ", "  ", "\t", "\n ", "", ","};
        text += kGaps[Below(7)];
      } else {
        text += Below(20) ? std::string(1, format[i]) : Space();
      }
    }
    return text;
  }

  // A vector's or matrix's numbers as writers write them, with the package's text after them.
  std::string PackageGroup(bool matrix) {
    using namespace std::string_view_literals;
    static constexpr std::string_view kGaps[] = {" ", " ", " ", " ", "  ", "\t", "\n\t\t", ""};
    static constexpr std::string_view kAfter[] = {
        " </Origin>\n\t\t\t<Name Type=\"Txt\"> Room </Name>\n\t\t</Rooms>"sv, " </T>"sv, ""sv};
    std::string text(kGaps[Below(8)]);
    for (int n = 0; n < (matrix ? 16 : 3); ++n) {
      if (n > 0)
        text += std::string(matrix && n % 4 == 0 ? "," : "") + std::string(kGaps[Below(8)]);
      text += PackageNumber();
    }
    return text + std::string(kAfter[Below(3)]);
  }

 private:
  // Mostly a short decimal; now and then what the quickest route leaves to the others: a ninth
  // digit, a second point, an exponent, a hexadecimal prefix, a lone sign or point, a NUL.
  std::string PackageNumber() {
    using namespace std::string_view_literals;
    static constexpr std::string_view kOdd[] = {""sv,  ""sv,  ""sv,   ""sv, ""sv, ""sv,
                                                ""sv,  ""sv,  ""sv,   ""sv, ""sv, ""sv,
                                                "e"sv, "x"sv, "\0"sv, "."sv};
    std::string text = Sign() + ShortDigits(Below(7));
    if (Below(4) != 0) text += "." + ShortDigits(Below(6));
    return text + std::string(kOdd[Below(16)]);
  }
  std::string ShortDigits(std::size_t count) {
    std::string digits;
    for (std::size_t i = 0; i < count; ++i)
      digits += static_cast<char>('0' + Below(10));
    return digits;
  }
  std::size_t Below(std::size_t n) { return static_cast<std::size_t>(random_() % n); }
  std::string Space() {
    static constexpr std::string_view kSpaces[] = {"", "", "", " ", "\t", "\n\v\f\r "};
    return std::string(kSpaces[Below(6)]);
  }
  std::string Sign() { return Below(3) ? "" : Below(2) ? "-" : "+"; }
  std::string Tail() {
    static constexpr std::string_view kTails[] = {"",  "",  "",  " ", "x", "e", "e+", "E-",
                                                  ".", "p", "i", "(", ",", "0", "f",  "n"};
    return std::string(kTails[Below(16)]);
  }
  std::string Float() {
    char text[kMaxFloatText];
    return std::string(
        text, FormatFloat(std::bit_cast<float>(static_cast<std::uint32_t>(random_())), text));
  }
  std::string Digits(bool hex) {
    std::string digits(Below(4) == 0 ? Below(60) : 0, '0');  // leading zeros
    const std::size_t count = Below(10) == 0 ? Below(400) : Below(12);
    for (std::size_t i = 0; i < count; ++i) {
      digits += "0123456789abcdefABCDEF"[Below(hex ? 22 : 10)];
    }
    return digits;
  }
  std::string Fraction(bool hex) {
    if (Below(2)) return "";
    std::string fraction(1, '.');
    return fraction.append(Digits(hex));
  }
  std::string Exponent(char marker, int range) {
    switch (Below(6)) {
      case 0:
        return "";
      case 1:
        return std::string(1, marker) + Sign();  // dangling
      case 2:
        return std::string(1, marker) + Sign() + "99999999999999999999";
      default:
        return std::string(1, marker) + Sign() +
               std::to_string(Below(static_cast<std::size_t>(range)));
    }
  }

  std::mt19937_64 random_;
};

TEST(ScanFloatTest, MatchesSscanfOnRandomTexts) {
#if defined(_WIN32)
  GTEST_SKIP()
      << "the oracle is glibc; a Windows C runtime prints and scans some numbers its own way";
#endif
  std::setlocale(LC_ALL, "C");
  TextMaker maker(7);
  EdgeBuffer buffer(4096);
  int failures = 0;
  for (int i = 0; i < 3'000'000 && failures < 10; ++i) {
    failures += !SameAsGlibc(buffer, maker.Token(), "%f");
  }
}

// Numbers inside a package have the rest of the package after them, which lets short decimals
// take a path of their own: the same texts again, followed by what packages put after numbers.
TEST(ScanFloatTest, MatchesSscanfWithTextAfterTheNumber) {
#if defined(_WIN32)
  GTEST_SKIP()
      << "the oracle is glibc; a Windows C runtime prints and scans some numbers its own way";
#endif
  std::setlocale(LC_ALL, "C");
  using namespace std::string_view_literals;
  static constexpr std::string_view kAfter[] = {
      " </Score>\n\t\t<Name Type=\"Txt\"> Ann </Name>"sv, ", 1 2 3 4, 5 6 7 8, 9 10 11 12, 13"sv,
      "\0 12345678901234567890123456789"sv, "e 1234567890123456789012345678"sv,
      "12345678901234567890123456789012"sv};
  const std::string kShort[] = {"0",          "-0",
                                "12.5",       "-3.25",
                                "+.5",        "5.",
                                ".",          "-",
                                "16777216",   "16777217",
                                "99999999",   "1.2345678",
                                "12345.678",  "00000000000000000000001.5",
                                "0.0000001",  "1e3",
                                "7x",         "2.5E-1",
                                "3.40282e+38"};
  TextMaker maker(13);
  EdgeBuffer buffer(4096);
  int failures = 0;
  // Long runs of zeros that end the text around the room that path needs, so that a byte read
  // past the text's end faults under AddressSanitizer.
  for (std::size_t zeros = 0; zeros <= 30; ++zeros) {
    for (const char* tail : {".", ".5", "5", "-"}) {
      failures += !SameAsGlibc(buffer, std::string(zeros, '0') + tail, "%f");
      failures += !SameAsGlibc(buffer, "-" + std::string(zeros, '0') + tail, "%f");
    }
  }
  for (const std::string& number : kShort) {
    for (const std::string_view after : kAfter) {
      failures += !SameAsGlibc(buffer, number + std::string(after), "%f");
    }
  }
  for (int i = 0; i < 1'000'000 && failures < 10; ++i) {
    failures += !SameAsGlibc(buffer, maker.Token() + std::string(kAfter[i % 5]), "%f");
  }
}

TEST(ScanFloatsTest, MatchesSscanfOnRandomTexts) {
#if defined(_WIN32)
  GTEST_SKIP()
      << "the oracle is glibc; a Windows C runtime prints and scans some numbers its own way";
#endif
  std::setlocale(LC_ALL, "C");
  TextMaker maker(11);
  EdgeBuffer buffer(8192);
  int failures = 0;
  for (int i = 0; i < 1'000'000 && failures < 10; ++i) {
    failures += !SameAsGlibc(buffer, maker.ForFormat(kVector), kVector);
  }
  for (int i = 0; i < 300'000 && failures < 10; ++i) {
    failures += !SameAsGlibc(buffer, maker.ForFormat(kMatrix), kMatrix);
  }
}

// Groups as packages hold them: short decimals, mostly plain enough for the reader's quickest
// route, with the rest of the package after them.
TEST(ScanFloatsTest, MatchesSscanfOnPackageGroups) {
#if defined(_WIN32)
  GTEST_SKIP()
      << "the oracle is glibc; a Windows C runtime prints and scans some numbers its own way";
#endif
  std::setlocale(LC_ALL, "C");
  TextMaker maker(17);
  EdgeBuffer buffer(8192);
  int failures = 0;
  for (int i = 0; i < 200'000 && failures < 10; ++i) {
    const std::string_view format = i % 2 ? kMatrix : kVector;
    failures += !SameAsGlibc(buffer, maker.PackageGroup(format == kMatrix), format);
  }
}

}  // namespace
}  // namespace numbers
