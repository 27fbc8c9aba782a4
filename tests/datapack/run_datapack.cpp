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
#define WIN32_LEAN_AND_MEAN
#include <windows.h>
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
  // The folder goes when the program ends: every test program run left one behind.
  struct Remover {
    fs::path path;
    ~Remover() {
      std::error_code error;
      fs::remove_all(path, error);
    }
  };
  static const Remover remover{folder};
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

#if defined(_WIN32)
// Starts the program itself with its streams on files, rather than through cmd.exe: under Wine
// every process start costs a second or two, and under emulation up to two minutes.
int Run(std::string commandLine, const fs::path& in, const fs::path& out, const fs::path& err) {
  SECURITY_ATTRIBUTES inheritable{sizeof(SECURITY_ATTRIBUTES), nullptr, TRUE};
  const auto open = [&](const fs::path& path, DWORD access, DWORD disposition) {
    return CreateFileW(path.c_str(), access, FILE_SHARE_READ, &inheritable, disposition,
                       FILE_ATTRIBUTE_NORMAL, nullptr);
  };
  STARTUPINFOA startup{};
  startup.cb = sizeof(startup);
  startup.dwFlags = STARTF_USESTDHANDLES;
  startup.hStdInput = open(in, GENERIC_READ, OPEN_EXISTING);
  startup.hStdOutput = open(out, GENERIC_WRITE, CREATE_ALWAYS);
  startup.hStdError = open(err, GENERIC_WRITE, CREATE_ALWAYS);
  PROCESS_INFORMATION process{};
  DWORD code = static_cast<DWORD>(-1);
  if (CreateProcessA(nullptr, commandLine.data(), nullptr, nullptr, TRUE, 0, nullptr, nullptr,
                     &startup, &process)) {
    WaitForSingleObject(process.hProcess, INFINITE);
    GetExitCodeProcess(process.hProcess, &code);
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
  }
  for (HANDLE handle : {startup.hStdInput, startup.hStdOutput, startup.hStdError})
    CloseHandle(handle);
  return static_cast<int>(code);
}
#endif

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
  RunResult result;
#if defined(_WIN32)
  result.status = Run(command, folder / "in", folder / "out", folder / "err");
#else
  command += " <" + Quoted((folder / "in").string()) + " >" + Quoted((folder / "out").string()) +
             " 2>" + Quoted((folder / "err").string());
  const int code = std::system(command.c_str());
  result.status = WIFEXITED(code) ? WEXITSTATUS(code) : -1;
#endif
  result.out = ReadBytes(folder / "out");
  result.err = ReadBytes(folder / "err");
  return result;
}
