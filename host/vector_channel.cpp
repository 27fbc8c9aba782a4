#include "host/vector_channel.h"

Lum_VectorChannel::Lum_VectorChannel() {
  SetChannelType(MakeChannelType("Vector", kVectorChannelGuid, kVectorChannelGuid, 1));
}
Lum_VectorChannel::Lum_VectorChannel(const D3DXVECTOR3& vector) : Lum_VectorChannel() {
  vector_ = vector;
}
D3DXVECTOR3 Lum_VectorChannel::GetVector() { return vector_; }
void Lum_VectorChannel::SetVector(D3DXVECTOR3 vector) { vector_ = vector; }
