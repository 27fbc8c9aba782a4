#include "host/callback_channel.h"

Lum_CallbackChannel::Lum_CallbackChannel(std::function<void()> callback)
    : callback_(std::move(callback)) {
  SetChannelType(MakeChannelType("Callback", kCallbackChannelGuid, kCallbackChannelGuid, 1));
}
void Lum_CallbackChannel::CallChannel() {
  if (callback_) callback_();
}
