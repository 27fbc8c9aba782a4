#include "tools/datapack/file_io.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/types.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <system_error>

#include "tools/datapack/input_error.h"
#include "tools/datapack/progress.h"

#if defined(_WIN32)
#include <io.h>
#include <process.h>
#include <windows.h>
#define DATAPACK_OPEN _open
#define DATAPACK_WRITE _write
#define DATAPACK_CLOSE _close
#define DATAPACK_PID _getpid
#define DATAPACK_UNLINK _unlink
#else
#include <unistd.h>
#define O_BINARY 0
#define DATAPACK_OPEN open
#define DATAPACK_WRITE write
#define DATAPACK_CLOSE close
#define DATAPACK_PID getpid
#define DATAPACK_UNLINK unlink
#endif

namespace datapack {
namespace {

namespace fs = std::filesystem;

// The temporary file being written, for the signal handler to remove. A fixed buffer: the handler
// may touch nothing that allocates.
char pendingTemporary[4096];
volatile std::sig_atomic_t temporaryPending = 0;

extern "C" void RemoveTemporaryAndDie(int signal) {
  if (temporaryPending) DATAPACK_UNLINK(pendingTemporary);
  std::signal(signal, SIG_DFL);
  std::raise(signal);
}

void RegisterTemporary(const std::string& path) {
  if (path.size() >= sizeof(pendingTemporary)) return;
  std::memcpy(pendingTemporary, path.c_str(), path.size() + 1);
  temporaryPending = 1;
}

void ForgetTemporary() { temporaryPending = 0; }

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

[[noreturn]] void TooLarge(const std::string& name, std::uint64_t size) {
  throw InputError(name + ": " + (size ? std::to_string(size) + " bytes" : "more than 2 GiB") +
                   ", too large: datapack reads files of at most " + std::to_string(kLargestInput) +
                   " bytes");
}

std::string ReadAll(std::FILE* stream, const std::string& name, std::uint64_t expected) {
  std::string bytes;
  bytes.reserve(static_cast<std::size_t>(expected));
  Progress progress("reading " + name, expected);
  char chunk[1 << 16];
  std::size_t read;
  while ((read = std::fread(chunk, 1, sizeof(chunk), stream)) > 0) {
    if (bytes.size() + read > kLargestInput) TooLarge(name, 0);
    bytes.append(chunk, read);
    progress.Update(bytes.size());
  }
  if (std::ferror(stream)) Fail("read", name, errno);
  return bytes;
}

bool WriteAll(int file, std::string_view bytes) {
  while (!bytes.empty()) {
    const unsigned int piece =
        static_cast<unsigned int>(std::min<std::size_t>(bytes.size(), 1 << 30));
    const auto written = DATAPACK_WRITE(file, bytes.data(), piece);
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) return false;
    bytes.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

// The file a path finally names, past every symbolic link on the way.
fs::path FollowLinks(fs::path path) {
  std::error_code error;
  for (int hops = 0; hops < 40 && fs::is_symlink(fs::symlink_status(path, error)); ++hops) {
    const fs::path target = fs::read_symlink(path, error);
    if (error) break;
    path = target.is_absolute() ? target : path.parent_path() / target;
  }
  return path;
}

// A new file beside `target`, open for writing; its name goes to `temporary`.
int CreateTemporary(const fs::path& target, fs::path& temporary) {
  const fs::path folder = target.has_parent_path() ? target.parent_path() : fs::path(".");
  const std::string stem =
      "." + target.filename().string() + "." + std::to_string(DATAPACK_PID()) + ".";
  for (int attempt = 0;; ++attempt) {
    temporary = folder / (stem + std::to_string(attempt) + ".tmp");
    RegisterTemporary(temporary.string());
    const int file =
        DATAPACK_OPEN(temporary.string().c_str(), O_WRONLY | O_CREAT | O_EXCL | O_BINARY, 0666);
    if (file >= 0) return file;
    ForgetTemporary();
    if (errno != EEXIST || attempt == 100) return file;
  }
}

std::error_code Rename(const fs::path& from, const fs::path& to) {
  std::error_code renamed;
#if defined(_WIN32)
  // Windows renames onto an existing file only when asked to replace it.
  if (!MoveFileExW(from.c_str(), to.c_str(), MOVEFILE_REPLACE_EXISTING)) {
    renamed = std::error_code(static_cast<int>(GetLastError()), std::system_category());
  }
#else
  fs::rename(from, to, renamed);
#endif
  return renamed;
}

}  // namespace

bool IsStandardStream(const std::string& path) { return path.empty() || path == "-"; }

std::string StreamName(const std::string& path, bool input) {
  if (!IsStandardStream(path)) return path;
  return input ? "standard input" : "standard output";
}

std::string ReadInput(const std::string& path) {
  if (IsStandardStream(path)) {
    MakeBinary(stdin);
    return ReadAll(stdin, StreamName(path, true), 0);
  }
  std::FILE* file = std::fopen(path.c_str(), "rb");
  if (!file) Fail("read", path, errno);
  try {
    // A regular file says its size: one too large is refused before anything is read.
    std::uint64_t size = 0;
    struct stat status;
    if (fstat(fileno(file), &status) == 0 && S_ISREG(status.st_mode)) {
      size = static_cast<std::uint64_t>(status.st_size);
      if (size > kLargestInput) TooLarge(path, size);
    }
    std::string bytes = ReadAll(file, path, size);
    std::fclose(file);
    return bytes;
  } catch (...) {
    std::fclose(file);
    throw;
  }
}

struct Output::Target {
  std::string name;       // as messages give it
  int file = -1;          // where the bytes go
  bool own = false;       // the file is ours to close
  fs::path temporary;     // set when replacing a regular file
  fs::path destination;   // what the temporary file becomes
  bool keepMode = false;  // the destination exists: its mode stays
  struct stat status {};
};

Output::Output(const std::string& path) : target_(std::make_unique<Target>()) {
  Target& target = *target_;
  target.name = StreamName(path, false);
  if (IsStandardStream(path)) {
    MakeBinary(stdout);
    target.file = fileno(stdout);
    return;
  }
  target.destination = FollowLinks(path);
  const std::string destination = target.destination.string();
  if (stat(destination.c_str(), &target.status) == 0) {
    if (!S_ISREG(target.status.st_mode)) {
      // A FIFO, a device or the like: replacing it would break what it connects to.
      target.file = DATAPACK_OPEN(destination.c_str(), O_WRONLY | O_BINARY);
      if (target.file < 0) Fail("write", target.name, errno);
      target.own = true;
      return;
    }
    target.keepMode = true;
  }
  target.file = CreateTemporary(target.destination, target.temporary);
  if (target.file < 0) Fail("write", target.name, errno);
  target.own = true;
}

Output::~Output() {
  if (!target_) return;
  if (target_->own) DATAPACK_CLOSE(target_->file);
  if (!target_->temporary.empty()) {
    std::error_code ignored;
    fs::remove(target_->temporary, ignored);
    ForgetTemporary();
  }
}

Output& Output::operator<<(std::string_view bytes) {
  constexpr std::size_t kBuffered = 1 << 16;
  if (buffer_.size() + bytes.size() > kBuffered) {
    Flush();
    if (bytes.size() > kBuffered) {
      if (!WriteAll(target_->file, bytes)) Fail("write", target_->name, errno);
      return *this;
    }
  }
  buffer_ += bytes;
  return *this;
}

void Output::Flush() {
  if (!WriteAll(target_->file, buffer_)) Fail("write", target_->name, errno);
  buffer_.clear();
}

void Output::Commit() {
  Flush();
  Target& target = *target_;
  if (target.temporary.empty()) {
    if (target.own && DATAPACK_CLOSE(target.file) != 0) Fail("write", target.name, errno);
    target.own = false;
    return;
  }
#if !defined(_WIN32)
  if (target.keepMode) {
    // Owner first: changing it may clear the set-id bits that the mode then restores. Only root
    // may give a file away; others keep theirs.
    if (fchown(target.file, target.status.st_uid, target.status.st_gid) != 0) errno = 0;
    if (fchmod(target.file, target.status.st_mode & 07777) != 0) Fail("write", target.name, errno);
  }
  // The new contents reach the disk before their name does.
  if (fsync(target.file) != 0 && errno != EINVAL) Fail("write", target.name, errno);
#endif
  target.own = false;
  if (DATAPACK_CLOSE(target.file) != 0) Fail("write", target.name, errno);
  if (const std::error_code renamed = Rename(target.temporary, target.destination)) {
    throw InputError("cannot write " + target.name + ": " + renamed.message());
  }
  target.temporary.clear();
  ForgetTemporary();
}

bool SameFile(const std::string& input, const std::string& output) {
  std::error_code error;
  return !IsStandardStream(input) && !IsStandardStream(output) &&
         fs::equivalent(input, output, error);
}

void WriteOutput(const std::string& path, std::string_view bytes, const std::string& input) {
  if (SameFile(input, path)) {
    {
      if (ReadInput(input) == bytes) return;
      throw InputError("will not write over the input file " + path +
                       ": the output differs from it; write it elsewhere");
    }
  }
  Output output(path);
  output << bytes;
  output.Commit();
}

void HandleSignals() {
  std::signal(SIGINT, RemoveTemporaryAndDie);
  std::signal(SIGTERM, RemoveTemporaryAndDie);
#if !defined(_WIN32)
  std::signal(SIGHUP, RemoveTemporaryAndDie);
  // A closed pipe is a write error like any other: the write fails with EPIPE.
  std::signal(SIGPIPE, SIG_IGN);
#endif
}

}  // namespace datapack
