// Takes what a fuzz target needs from the fuzzer's bytes, front to back; an exhausted input
// yields zeros, so every input decides one whole case.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

class FuzzInput {
 public:
  FuzzInput(const std::uint8_t* data, std::size_t size) : data_(data), size_(size) {}

  bool Empty() const { return size_ == 0; }

  std::uint8_t Byte() {
    if (size_ == 0) return 0;
    --size_;
    return *data_++;
  }

  // A number from 0 to `last`.
  int Below(int last) { return last <= 0 ? 0 : Byte() % (last + 1); }

  bool Flag() { return (Byte() & 1) != 0; }

  float Float() {
    std::uint32_t bits = 0;
    for (int i = 0; i < 4; ++i)
      bits = bits << 8 | Byte();
    float value;
    std::memcpy(&value, &bits, sizeof(value));
    return value;
  }

  // Up to `maxLength` characters, each taken from `alphabet` by the next byte.
  std::string Text(int maxLength, std::string_view alphabet) {
    std::string text(static_cast<std::size_t>(Below(maxLength)), '\0');
    for (char& c : text)
      c = alphabet[Byte() % alphabet.size()];
    return text;
  }

  // What is left, as it stands.
  std::string_view Rest() {
    const std::string_view rest(reinterpret_cast<const char*>(data_), size_);
    data_ += size_;
    size_ = 0;
    return rest;
  }

 private:
  const std::uint8_t* data_;
  std::size_t size_;
};
