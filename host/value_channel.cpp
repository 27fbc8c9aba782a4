#include "host/value_channel.h"

Lum_ValueChannel::Lum_ValueChannel() {
  SetChannelType(MakeChannelType("Value", kValueChannelGuid, kValueChannelGuid, 1));
}
Lum_ValueChannel::Lum_ValueChannel(float value) : Lum_ValueChannel() { value_ = value; }
float Lum_ValueChannel::GetValue() { return value_; }
void Lum_ValueChannel::AddValue(float amount) { value_ += amount; }
void Lum_ValueChannel::SetValue(float value) { value_ = value; }
