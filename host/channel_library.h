// Loads a channel plug-in the way the engine does: by the file named after its type GUID. A
// library stays loaded while the library object or any channel it created is alive.
#pragma once

#include <memory>
#include <string>

#include "host/channel_type.h"
#include "host/export.h"
#include "host/guid.h"
#include "host/vorn_channel.h"

class ChannelLibrary;

// Destroys a channel through its virtual destructor, then lets go of the library whose code that
// destructor is.
struct ChannelDeleter {
  std::shared_ptr<const ChannelLibrary> library;
  void operator()(Vorn_Channel* channel) {
    delete channel;
    library.reset();
  }
};
using ChannelHandle = std::unique_ptr<Vorn_Channel, ChannelDeleter>;

// The two exports every channel plug-in has, under these undecorated names.
using GetTypeFunction = ChannelType* (*)();
using InitDllFunction = Vorn_Channel* (*)();

class TESSEL_API ChannelLibrary : public std::enable_shared_from_this<ChannelLibrary> {
 public:
  // Opens "<folder>/<GUID>.so" (".dll" on Windows). On failure returns null and sets `error` to a
  // message naming the file and the reason.
  static std::shared_ptr<ChannelLibrary> Open(const std::string& folder, const GUID& type,
                                              std::string& error);

  ChannelLibrary(const ChannelLibrary&) = delete;
  ChannelLibrary& operator=(const ChannelLibrary&) = delete;
  ~ChannelLibrary();

  const std::string& Path() const { return path_; }
  GetTypeFunction GetTypeEntry() const { return getType_; }
  InitDllFunction InitDllEntry() const { return initDll_; }

  // Another export of the library, by its exported name; null when it has none.
  void* Symbol(const char* name) const;

  // The library's type record, as its GetType reports it.
  const ChannelType& Type() const { return *getType_(); }

  // A new channel from the library's factory, carrying the library's type record; empty when the
  // factory fails.
  ChannelHandle CreateChannel() const;

 private:
  ChannelLibrary(std::string path, void* module, GetTypeFunction getType, InitDllFunction initDll);

  std::string path_;
  void* module_;
  GetTypeFunction getType_;
  InitDllFunction initDll_;
};

// "<GUID>.so" here, "<GUID>.dll" on Windows.
TESSEL_API std::string ChannelLibraryFileName(const GUID& type);

// The folder of the running program, where the engine keeps its plug-ins.
TESSEL_API std::string ExecutableFolder();
