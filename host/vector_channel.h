// The engine's vector channel: three floats.
#pragma once

#include "host/d3dx_types.h"
#include "host/export.h"
#include "host/vorn_channel.h"

class TESSEL_API Lum_VectorChannel : public Vorn_Channel {
 public:
  Lum_VectorChannel();
  explicit Lum_VectorChannel(const D3DXVECTOR3& vector);

  // Table order matters to plug-ins: GetVector first, SetVector second.
  virtual D3DXVECTOR3 GetVector();
  virtual void SetVector(D3DXVECTOR3 vector);

 private:
  D3DXVECTOR3 vector_{};
};
