#include "tools/datapack/progress.h"

#include <cstdio>

#if defined(_WIN32)
#include <io.h>
#define DATAPACK_ISATTY(stream) _isatty(_fileno(stream))
#else
#include <unistd.h>
#define DATAPACK_ISATTY(stream) isatty(fileno(stream))
#endif

namespace datapack {

Progress::Progress(std::string label, std::uint64_t total)
    : label_(std::move(label)),
      total_(total),
      enabled_(DATAPACK_ISATTY(stderr) != 0),
      start_(std::chrono::steady_clock::now()),
      last_(start_) {}

Progress::~Progress() {
  if (shown_) std::fprintf(stderr, "\r\033[K");
}

void Progress::Show(std::uint64_t done) {
  using namespace std::chrono_literals;
  const auto now = std::chrono::steady_clock::now();
  if (now - start_ < 1s || now - last_ < 200ms) return;
  last_ = now;
  shown_ = true;
  if (total_) {
    std::fprintf(stderr, "\r\033[Kdatapack: %s: %llu%%", label_.c_str(),
                 static_cast<unsigned long long>(done * 100 / total_));
  } else {
    std::fprintf(stderr, "\r\033[Kdatapack: %s: %llu", label_.c_str(),
                 static_cast<unsigned long long>(done));
  }
  std::fflush(stderr);
}

}  // namespace datapack
