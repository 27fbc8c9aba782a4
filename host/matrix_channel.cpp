#include "host/matrix_channel.h"

Lum_MatrixChannel::Lum_MatrixChannel() {
  SetChannelType(MakeChannelType("Matrix", kMatrixChannelGuid, kMatrixChannelGuid, 1));
}
Lum_MatrixChannel::Lum_MatrixChannel(const D3DXMATRIX& matrix) : Lum_MatrixChannel() {
  matrix_ = matrix;
}
void Lum_MatrixChannel::SetIdentity() {
  matrix_ = {};
  for (int i = 0; i < 4; ++i)
    matrix_.m[i][i] = 1.0f;
}
D3DXMATRIX Lum_MatrixChannel::GetMatrix() { return matrix_; }
void Lum_MatrixChannel::SetMatrix(D3DXMATRIX matrix) { matrix_ = matrix; }
