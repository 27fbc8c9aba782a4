// Byte scrambling of a package: no key, undone exactly by its partner.
#include <cstdint>

#include "plugin/data_package.h"

namespace {

// The low byte of k(i) = ((i * i + 5) mod (i + 3)) - i in wrapping 32-bit arithmetic; only the low
// byte of k reaches the data.
std::uint8_t Amount(int i) {
  // i * i + 5 = (i + 3) * (i - 3) + 14, so until i * i wraps (i > 46340) the remainder is 14.
  if (i >= 12 && i <= 46340) return static_cast<std::uint8_t>(14 - i);
  const auto index = static_cast<std::uint32_t>(i);
  const auto square = static_cast<std::int32_t>(index * index + 5u);
  const auto divisor = static_cast<std::int32_t>(index + 3u);
  const auto remainder = static_cast<std::uint32_t>(square % divisor);
  return static_cast<std::uint8_t>(remainder - index);
}

}  // namespace

void Lum_DataPackage::Encrypt(char* data, int length) {
  for (int i = 0; i < length; ++i) {
    data[i] = static_cast<char>(static_cast<std::uint8_t>(data[i]) + Amount(i));
  }
}

void Lum_DataPackage::Decrypt(char* data, int length) {
  for (int i = 0; i < length; ++i) {
    data[i] = static_cast<char>(static_cast<std::uint8_t>(data[i]) - Amount(i));
  }
}
