#include "codec/number_format.h"

#include <gtest/gtest.h>

#include <bit>
#include <clocale>
#include <cstdint>
#include <cstdio>
#include <random>
#include <string>

namespace numbers {
namespace {

std::string Format(float value) {
  char text[kMaxFloatText];
  return std::string(text, FormatFloat(value, text));
}

TEST(FormatFloatTest, AwkwardValues) {
  const struct {
    std::uint32_t bits;
    const char* expected;
  } kCases[] = {
      {0x40e00000u, "7"},
      {0x41480000u, "12.5"},
      {0xbf800000u, "-1"},
      {0x80000000u, "-0"},
      {0x3eaaaaabu, "0.333333"},
      {0x47c35000u, "100000"},
      {0x497423f0u, "999999"},
      {0x497423f8u, "1e+06"},        // 999999.5: tie, odd digit rounds up
                                     // into the next decade
      {0x4996b438u, "1.23457e+06"},  // 1234567
      {0x4996b428u, "1.23456e+06"},  // 1234565: exact tie, to even
      {0x4996b478u, "1.23458e+06"},  // 1234575: exact tie, to even
      {0x4996b42au, "1.23457e+06"},  // 1234565.25: just above the tie
      {0x47f12040u, "123456"},       // 123456.5: tie, to even
      {0x4440e400u, "771.562"},      // 771.5625: exact tie in a seven-digit shortest form
      {0x3dd00000u, "0.101562"},     // 0.1015625
      {0x4b1896b2u, "1e+07"},        // 10000050
      {0x461c3ffeu, "10000"},        // 9999.99805 rounds up a digit position
      {0x38d1b717u, "0.0001"},       // 9.99999975e-05 rounds up into fixed notation
      {0x38d1b70fu, "9.99999e-05"},
      {0x3727c5acu, "1e-05"},
      {0x2f800000u, "2.32831e-10"},
      {0x7f7fffffu, "3.40282e+38"},  // FLT_MAX
      {0x00800000u, "1.17549e-38"},  // FLT_MIN
      {0x007fffffu, "1.17549e-38"},  // largest subnormal
      {0x00000001u, "1.4013e-45"},   // shortest form "1e-45" is not the six-digit rounding
      {0x7f800000u, "inf"},
      {0xff800000u, "-inf"},
      {0x7fc00000u, "nan"},
      {0xffc00000u, "-nan"},
      {0x7f800001u, "nan"},  // signalling payload
      {0xffffffffu, "-nan"},
  };
  for (const auto& c : kCases) {
    EXPECT_EQ(Format(std::bit_cast<float>(c.bits)), c.expected) << std::hex << c.bits;
  }
}

TEST(FormatFloatTest, MatchesPrintfOnRandomBitPatterns) {
#if defined(_WIN32)
  GTEST_SKIP()
      << "the oracle is glibc; a Windows C runtime prints and scans some numbers its own way";
#endif
  std::setlocale(LC_ALL, "C");
  std::mt19937 random(20240611);
  int failures = 0;
  for (int i = 0; i < 4'000'000 && failures < 10; ++i) {
    const auto value = std::bit_cast<float>(static_cast<std::uint32_t>(random()));
    char ours[kMaxFloatText];
    char expected[32];
    const std::size_t length = FormatFloat(value, ours);
    std::snprintf(expected, sizeof expected, "%g", static_cast<double>(value));
    if (std::string(ours, length) != expected) {
      ADD_FAILURE() << std::hex << std::bit_cast<std::uint32_t>(value) << ": "
                    << std::string(ours, length) << " vs " << expected;
      ++failures;
    }
  }
}

TEST(FormatIntTest, MatchesPrintf) {
  const int kCases[] = {0, 7, -7, 10, -100, 123456789, 2147483647, -2147483647 - 1};
  for (const int value : kCases) {
    char ours[11];
    char expected[16];
    std::snprintf(expected, sizeof expected, "%i", value);
    EXPECT_EQ(std::string(ours, FormatInt(value, ours)), expected);
  }
}

}  // namespace
}  // namespace numbers
