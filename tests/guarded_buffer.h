// Bytes placed right before an inaccessible page, so that reading or writing one byte past them
// faults at once, in any build.
#pragma once

#include <cstddef>
#include <string_view>

class GuardedBuffer {
 public:
  explicit GuardedBuffer(std::string_view bytes);
  ~GuardedBuffer();
  GuardedBuffer(const GuardedBuffer&) = delete;
  GuardedBuffer& operator=(const GuardedBuffer&) = delete;

  char* data() const { return data_; }
  int size() const { return static_cast<int>(size_); }

 private:
  char* mapping_ = nullptr;
  std::size_t mappingSize_ = 0;
  char* data_ = nullptr;
  std::size_t size_ = 0;
};
