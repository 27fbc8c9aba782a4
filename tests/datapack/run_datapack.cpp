#include "tests/datapack/run_datapack.h"

#include <cstdlib>
#include <fstream>
#include <iterator>

#include "host/channel_library.h"

#if !defined(_WIN32)
#include <sys/wait.h>
#include <unistd.h>
#else
#include <process.h>
#endif

namespace {

namespace fs = std::filesystem;

fs::path Folder() {
#if defined(_WIN32)
  const int pid = _getpid();
#else
  const int pid = static_cast<int>(getpid());
#endif
  static const fs::path folder =
      fs::temp_directory_path() / ("datapack_test_" + std::to_string(pid));
  return folder;
}

std::string Quoted(const std::string& argument) {
#if defined(_WIN32)
  return "\"" + argument + "\"";
#else
  std::string quoted = "'";
  for (char c : argument)
    quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return quoted + "'";
#endif
}

}  // namespace

fs::path ScratchFolder() {
  const fs::path folder = Folder() / "scratch";
  fs::remove_all(folder);
  fs::create_directories(folder);
  return folder;
}

std::string ReadBytes(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
}

void WriteBytes(const fs::path& path, const std::string& bytes) {
  std::ofstream(path, std::ios::binary) << bytes;
}

RunResult RunDatapack(const std::vector<std::string>& arguments, const std::string& input) {
  const fs::path folder = Folder() / "run";
  fs::create_directories(folder);
  WriteBytes(folder / "in", input);
#if defined(_WIN32)
  const char* const program = "datapack.exe";
#else
  const char* const program = "datapack";
#endif
  std::string command = Quoted((fs::path(ExecutableFolder()) / program).string());
  for (const std::string& argument : arguments)
    command += " " + Quoted(argument);
  command += " <" + Quoted((folder / "in").string()) + " >" + Quoted((folder / "out").string()) +
             " 2>" + Quoted((folder / "err").string());
#if defined(_WIN32)
  command = "\"" + command + "\"";  // cmd drops the outer quotes
#endif
  const int code = std::system(command.c_str());
  RunResult result;
#if defined(_WIN32)
  result.status = code;
#else
  result.status = WIFEXITED(code) ? WEXITSTATUS(code) : -1;
#endif
  result.out = ReadBytes(folder / "out");
  result.err = ReadBytes(folder / "err");
  return result;
}
