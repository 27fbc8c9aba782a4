#include "tools/datapack/file_io.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <system_error>

#include "tools/datapack/input_error.h"

#if defined(_WIN32)
#include <io.h>
#include <process.h>
#include <windows.h>
#define DATAPACK_OPEN _open
#define DATAPACK_WRITE _write
#define DATAPACK_CLOSE _close
#define DATAPACK_PID _getpid
#else
#include <unistd.h>
#define O_BINARY 0
#define DATAPACK_OPEN open
#define DATAPACK_WRITE write
#define DATAPACK_CLOSE close
#define DATAPACK_PID getpid
#endif

namespace datapack {
namespace {

bool IsStandardStream(const std::string& path) { return path.empty() || path == "-"; }

// Windows would turn "\n" into "\r\n" and stop at a Ctrl-Z.
void MakeBinary(std::FILE* stream) {
#if defined(_WIN32)
  _setmode(_fileno(stream), _O_BINARY);
#else
  (void)stream;
#endif
}

[[noreturn]] void Fail(const std::string& what, const std::string& path, int error) {
  throw InputError("cannot " + what + " " + path + ": " + std::strerror(error));
}

std::string ReadAll(std::FILE* stream, const std::string& name) {
  std::string bytes;
  char chunk[1 << 16];
  std::size_t read;
  while ((read = std::fread(chunk, 1, sizeof(chunk), stream)) > 0)
    bytes.append(chunk, read);
  if (std::ferror(stream)) Fail("read", name, errno);
  return bytes;
}

bool WriteAll(int file, std::string_view bytes) {
  while (!bytes.empty()) {
    const unsigned int piece =
        static_cast<unsigned int>(std::min<std::size_t>(bytes.size(), 1 << 30));
    const auto written = DATAPACK_WRITE(file, bytes.data(), piece);
    if (written <= 0) return false;
    bytes.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

// A new file beside `target`, open for writing; its name goes to `temporary`.
int CreateTemporary(const std::filesystem::path& target, std::filesystem::path& temporary) {
  const std::filesystem::path folder =
      target.has_parent_path() ? target.parent_path() : std::filesystem::path(".");
  const std::string stem =
      "." + target.filename().string() + "." + std::to_string(DATAPACK_PID()) + ".";
  for (int attempt = 0;; ++attempt) {
    temporary = folder / (stem + std::to_string(attempt) + ".tmp");
    const int file =
        DATAPACK_OPEN(temporary.string().c_str(), O_WRONLY | O_CREAT | O_EXCL | O_BINARY, 0666);
    if (file >= 0 || errno != EEXIST || attempt == 100) return file;
  }
}

}  // namespace

std::string StreamName(const std::string& path, bool input) {
  if (!IsStandardStream(path)) return path;
  return input ? "standard input" : "standard output";
}

std::string ReadInput(const std::string& path) {
  if (IsStandardStream(path)) {
    MakeBinary(stdin);
    return ReadAll(stdin, StreamName(path, true));
  }
  std::FILE* file = std::fopen(path.c_str(), "rb");
  if (!file) Fail("read", path, errno);
  try {
    std::string bytes = ReadAll(file, path);
    std::fclose(file);
    return bytes;
  } catch (...) {
    std::fclose(file);
    throw;
  }
}

void WriteOutput(const std::string& path, std::string_view bytes) {
  if (IsStandardStream(path)) {
    MakeBinary(stdout);
    if (std::fwrite(bytes.data(), 1, bytes.size(), stdout) != bytes.size() ||
        std::fflush(stdout) != 0) {
      Fail("write", StreamName(path, false), errno);
    }
    return;
  }
  const std::filesystem::path target(path);
  std::filesystem::path temporary;
  const int file = CreateTemporary(target, temporary);
  if (file < 0) Fail("write", path, errno);
  const bool written = WriteAll(file, bytes);
  const int error = errno;
  if (DATAPACK_CLOSE(file) != 0 || !written) {
    const int reason = written ? errno : error;
    std::error_code ignored;
    std::filesystem::remove(temporary, ignored);
    Fail("write", path, reason);
  }
  std::error_code renamed;
#if defined(_WIN32)
  // Windows renames onto an existing file only when asked to replace it.
  if (!MoveFileExW(temporary.c_str(), target.c_str(), MOVEFILE_REPLACE_EXISTING)) {
    renamed = std::error_code(static_cast<int>(GetLastError()), std::system_category());
  }
#else
  std::filesystem::rename(temporary, target, renamed);
#endif
  if (renamed) {
    std::error_code ignored;
    std::filesystem::remove(temporary, ignored);
    throw InputError("cannot write " + path + ": " + renamed.message());
  }
}

}  // namespace datapack
