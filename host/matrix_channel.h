// The engine's matrix channel: four rows of four floats.
#pragma once

#include "host/d3dx_types.h"
#include "host/export.h"
#include "host/vorn_channel.h"

class TESSEL_API Lum_MatrixChannel : public Vorn_Channel {
 public:
  Lum_MatrixChannel();
  explicit Lum_MatrixChannel(const D3DXMATRIX& matrix);

  // Table order matters to plug-ins: GetMatrix second, SetMatrix third.
  virtual void SetIdentity();
  virtual D3DXMATRIX GetMatrix();
  virtual void SetMatrix(D3DXMATRIX matrix);

 private:
  D3DXMATRIX matrix_{};
};
