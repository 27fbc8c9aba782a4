// Progress on standard error for work that runs longer than a second, when a person watches: only
// if standard error is a terminal. The line is wiped when the work ends.
#pragma once

#include <chrono>
#include <cstdint>
#include <string>

namespace datapack {

class Progress {
 public:
  // `total` 0: the amount done is shown without a percentage.
  Progress(std::string label, std::uint64_t total);
  ~Progress();
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;

  void Update(std::uint64_t done) {
    if (enabled_ && ++calls_ % 64 == 0) Show(done);
  }

 private:
  void Show(std::uint64_t done);

  std::string label_;
  std::uint64_t total_;
  bool enabled_;
  bool shown_ = false;
  std::uint64_t calls_ = 0;
  std::chrono::steady_clock::time_point start_;
  std::chrono::steady_clock::time_point last_;
};

}  // namespace datapack
