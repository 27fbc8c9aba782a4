// The number conversions against the C library in the "C" locale: "%g" for writing, "%f" and
// the vector and matrix formats for reading.
#include <clocale>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string>

#include "codec/number_format.h"
#include "codec/number_scan.h"
#include "fuzz/fuzz_input.h"
#include "fuzz/fuzz_tree.h"

namespace {

constexpr const char* kFormats[] = {"%f", "%f %f %f",
                                    "%f %f %f %f, %f %f %f %f, %f %f %f %f, %f %f %f %f"};

bool SameFloat(float a, float b) {
  return std::memcmp(&a, &b, sizeof(float)) == 0 || (std::isnan(a) && std::isnan(b));
}

void CheckFormat(float value) {
  char expected[64];
  std::snprintf(expected, sizeof(expected), "%g", static_cast<double>(value));
  char ours[numbers::kMaxFloatText];
  const std::size_t length = numbers::FormatFloat(value, ours);
  if (std::string(ours, length) != expected) {
    Fail("FormatFloat gives " + std::string(ours, length) + ", %g gives " + expected);
  }
}

void CheckScan(const std::string& text, int format) {
  float expected[16] = {};
  float ours[16] = {};
  int count = 0;
  int consumed = 0;
  if (format == 0) {
    count = std::sscanf(text.c_str(), "%f%n", &expected[0], &consumed);
    const char* end = numbers::ScanFloat(text.data(), text.data() + text.size(), ours[0]);
    Check((end != nullptr) == (count == 1), "ScanFloat matches where %f does not, or back");
    if (end) Check(end - text.data() == consumed, "ScanFloat consumes another length than %f");
  } else {
    float* v = expected;
    count = std::sscanf(text.c_str(), kFormats[format], v, v + 1, v + 2, v + 3, v + 4, v + 5, v + 6,
                        v + 7, v + 8, v + 9, v + 10, v + 11, v + 12, v + 13, v + 14, v + 15);
    const int stored =
        numbers::ScanFloats(text.data(), text.data() + text.size(), kFormats[format], ours);
    Check(stored == (count < 0 ? 0 : count), "ScanFloats stores another count than sscanf");
  }
  for (int i = 0; i < 16; ++i)
    Check(SameFloat(ours[i], expected[i]), "a value scanned differs");
  // The readers' own entry point, without the format.
  static constexpr int kCounts[] = {1, 3, 16};
  float grouped[16] = {};
  const char* end = nullptr;
  const int stored =
      numbers::ScanFloatGroups(text.data(), text.data() + text.size(), kCounts[format],
                               format == 2 ? 4 : kCounts[format], grouped, &end);
  Check(stored == (count < 0 ? 0 : count), "ScanFloatGroups stores another count than sscanf");
  for (int i = 0; i < 16; ++i)
    Check(SameFloat(grouped[i], expected[i]), "a value ScanFloatGroups scanned differs");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const bool cLocale = std::setlocale(LC_ALL, "C") != nullptr;
  Check(cLocale, "no C locale");
  FuzzInput input(data, size);
  const int mode = input.Below(3);
  if (mode == 3) {
    while (!input.Empty())
      CheckFormat(input.Float());
    return 0;
  }
  const std::string_view rest = input.Rest();
  const std::string text(rest.substr(0, rest.find('\0')));
  CheckScan(text, mode);
  // What "%g" writes reads back through "%f".
  char written[numbers::kMaxFloatText + 1] = {};
  float value = 0;
  if (numbers::ScanFloat(text.data(), text.data() + text.size(), value)) {
    CheckFormat(value);
    CheckScan(std::string(written, numbers::FormatFloat(value, written)), 0);
  }
  return 0;
}
