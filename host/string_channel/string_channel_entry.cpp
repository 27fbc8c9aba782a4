// The library's exports: its type record and its channel factory.
#include <new>

#include "host/channel_type.h"
#include "host/string_channel/string_channel.h"

namespace {

ChannelType typeRecord;

}  // namespace

extern "C" {

VORN_EXPORT ChannelType* GetType() {
  typeRecord = MakeChannelType("Text", kStringChannelGuid, kStringChannelGuid, 1);
  return &typeRecord;
}

VORN_EXPORT Vorn_Channel* InitDLL() { return new (std::nothrow) Lum_StringChannel; }

}  // extern "C"
