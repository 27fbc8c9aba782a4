// The engine's value channel: one float.
#pragma once

#include "host/export.h"
#include "host/vorn_channel.h"

class TESSEL_API Lum_ValueChannel : public Vorn_Channel {
 public:
  Lum_ValueChannel();
  explicit Lum_ValueChannel(float value);

  // Table order matters to plug-ins: GetValue first, SetValue third.
  virtual float GetValue();
  virtual void AddValue(float amount);
  virtual void SetValue(float value);

 private:
  float value_ = 0.0f;
};
