// An engine channel that runs a host function when it is called, as a script would. Hosts put it
// on a DataDirectory's "Call each iteration" link to supply or collect the data of each entry.
#pragma once

#include <functional>
#include <utility>

#include "host/export.h"
#include "host/vorn_channel.h"

class TESSEL_API Lum_CallbackChannel : public Vorn_Channel {
 public:
  explicit Lum_CallbackChannel(std::function<void()> callback = {});

  void CallChannel() override;
  void SetCallback(std::function<void()> callback) { callback_ = std::move(callback); }

 private:
  std::function<void()> callback_;
};
