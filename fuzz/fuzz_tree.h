// Channel trees for the fuzz targets, created as the engine creates them and owned here.
#pragma once

#include <string>
#include <vector>

#include "host/callback_channel.h"
#include "host/channel_library.h"
#include "host/matrix_channel.h"
#include "host/value_channel.h"
#include "host/vector_channel.h"
#include "plugin/data_package.h"

// Stops the fuzzer with a finding: a broken promise, not a crash of its own.
[[noreturn]] void Fail(const std::string& what);
inline void Check(bool holds, const char* what) {
  if (!holds) Fail(what);
}

class FuzzTree {
 public:
  using Link = Lum_DataPackage::Link;

  // A DataDirectory from the plug-in, named by a Tag child unless `tag` is null.
  Lum_DataPackage* Directory(const char* tag);
  Lum_StringChannel* Text(const std::string& name);
  template <typename Channel>
  Channel* Make() {
    auto* channel = new Channel;
    owned_.push_back(ChannelHandle(channel, ChannelDeleter{}));
    return channel;
  }
  // Attaches or reports a finding: the trees here are built only of what links admit.
  template <typename Channel>
  Channel* Attach(Vorn_Channel* parent, int link, Channel* child) {
    if (!parent->AttachChild(link, child))
      Fail("link " + std::to_string(link) + " refused a child");
    return child;
  }

 private:
  std::vector<ChannelHandle> owned_;
};
