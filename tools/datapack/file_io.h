// Whole inputs and outputs, byte for byte. No name, or "-", means the standard streams.
//
// An output that is a regular file (or does not exist yet) is written under a temporary name in
// its own folder and renamed over it when complete, keeping its mode, so that a failure or an
// interruption never leaves half of it behind; a symbolic link is followed and its target replaced.
// Anything else (a FIFO, a device) is written straight through.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

namespace datapack {

// Packages are read into buffers an int measures; nothing larger is read at all.
inline constexpr std::uint64_t kLargestInput = 0x7FFFFFFE;

// How messages name an input or output.
std::string StreamName(const std::string& path, bool input);
bool IsStandardStream(const std::string& path);

// Throw InputError naming the file and the reason.
std::string ReadInput(const std::string& path);

// `input`, when not a standard stream, is the file the output was made from: writing over it is
// refused unless the bytes would stay the same.
void WriteOutput(const std::string& path, std::string_view bytes, const std::string& input = "");

// Whether two paths, neither a standard stream, name one file.
bool SameFile(const std::string& input, const std::string& output);

// An output written piece by piece; nothing reaches a file's name before Commit.
class Output {
 public:
  explicit Output(const std::string& path);
  ~Output();
  Output(const Output&) = delete;
  Output& operator=(const Output&) = delete;

  Output& operator<<(std::string_view bytes);
  void Commit();

 private:
  struct Target;
  void Flush();
  std::unique_ptr<Target> target_;
  std::string buffer_;
};

// Removes unfinished outputs on SIGINT and SIGTERM, and turns a closed pipe into a write error.
void HandleSignals();

}  // namespace datapack
