#include "host/channel_library.h"

#include <filesystem>
#include <utility>

#if defined(_WIN32)
#include <windows.h>
#else
#include <dlfcn.h>
#endif

namespace {

#if defined(_WIN32)

constexpr const char* kLibrarySuffix = ".dll";

// The system's message for the last error, on one line, with the file put in for its "%1".
std::string LastSystemError(const std::string& file) {
  const DWORD code = GetLastError();
  char* text = nullptr;
  const DWORD length = FormatMessageA(
      FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS,
      nullptr, code, 0, reinterpret_cast<char*>(&text), 0, nullptr);
  std::string message = length ? std::string(text, length) : "error " + std::to_string(code);
  LocalFree(text);
  while (!message.empty() && (message.back() == '\n' || message.back() == '\r')) {
    message.pop_back();
  }
  for (std::size_t at = message.find("%1"); at != std::string::npos;
       at = message.find("%1", at + file.size())) {
    message.replace(at, 2, file);
  }
  return message;
}

void* OpenModule(const std::string& path, std::string& error) {
  // The caller reports a plug-in that fails to load; the system shows no dialog box for it.
  DWORD previousMode = 0;
  SetThreadErrorMode(SEM_FAILCRITICALERRORS | SEM_NOOPENFILEERRORBOX, &previousMode);
  HMODULE module = LoadLibraryA(path.c_str());
  if (!module) error = LastSystemError(std::filesystem::path(path).filename().string());
  SetThreadErrorMode(previousMode, nullptr);
  return module;
}

void* FindSymbol(void* module, const char* name) {
  return reinterpret_cast<void*>(GetProcAddress(static_cast<HMODULE>(module), name));
}

void CloseModule(void* module) { FreeLibrary(static_cast<HMODULE>(module)); }

#else

constexpr const char* kLibrarySuffix = ".so";

void* OpenModule(const std::string& path, std::string& error) {
  void* module = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (!module) error = dlerror();
  return module;
}

void* FindSymbol(void* module, const char* name) { return dlsym(module, name); }

void CloseModule(void* module) { dlclose(module); }

#endif

template <typename Function>
Function SymbolAs(void* module, const char* name) {
  return reinterpret_cast<Function>(FindSymbol(module, name));
}

}  // namespace

std::string ChannelLibraryFileName(const GUID& type) { return GuidToString(type) + kLibrarySuffix; }

void* ChannelLibrary::Symbol(const char* name) const { return FindSymbol(module_, name); }

std::string ExecutableFolder() {
#if defined(_WIN32)
  // A path that fills the buffer may have been cut short: try again with a larger one.
  std::string path(MAX_PATH, '\0');
  DWORD length;
  while ((length = GetModuleFileNameA(nullptr, path.data(), static_cast<DWORD>(path.size()))) ==
         path.size())
    path.resize(path.size() * 2);
  path.resize(length);
  return std::filesystem::path(path).parent_path().string();
#else
  return std::filesystem::read_symlink("/proc/self/exe").parent_path().string();
#endif
}

std::shared_ptr<ChannelLibrary> ChannelLibrary::Open(const std::string& folder, const GUID& type,
                                                     std::string& error) {
  const std::string path = (std::filesystem::path(folder) / ChannelLibraryFileName(type)).string();
  std::string reason;
  void* module = OpenModule(path, reason);
  if (!module) {
    error = "cannot load channel plug-in " + path + ": " + reason;
    return nullptr;
  }
  const auto getType = SymbolAs<GetTypeFunction>(module, "GetType");
  const auto initDll = SymbolAs<InitDllFunction>(module, "InitDLL");
  if (!getType || !initDll) {
    error = "channel plug-in " + path + " does not export " + (getType ? "InitDLL" : "GetType");
    CloseModule(module);
    return nullptr;
  }
  return std::shared_ptr<ChannelLibrary>(new ChannelLibrary(path, module, getType, initDll));
}

ChannelLibrary::ChannelLibrary(std::string path, void* module, GetTypeFunction getType,
                               InitDllFunction initDll)
    : path_(std::move(path)), module_(module), getType_(getType), initDll_(initDll) {}

ChannelLibrary::~ChannelLibrary() { CloseModule(module_); }

ChannelHandle ChannelLibrary::CreateChannel() const {
  Vorn_Channel* channel = initDll_();
  if (!channel) return ChannelHandle(nullptr, ChannelDeleter{});
  channel->SetChannelType(Type());
  return ChannelHandle(channel, ChannelDeleter{shared_from_this()});
}
