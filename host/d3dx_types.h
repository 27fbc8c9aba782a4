// The platform's plain math and rectangle structures, as far as channels pass them around.
#pragma once

#include <cstdint>

struct D3DXVECTOR3 {
  float x;
  float y;
  float z;
};

// Four rows of four floats, first row first.
struct D3DXMATRIX {
  float m[4][4];
};

// Windows has its own; a second definition would clash wherever <windows.h> is included too.
#if defined(_WIN32)
#include <windef.h>
#else
struct tagRECT {
  std::int32_t left;
  std::int32_t top;
  std::int32_t right;
  std::int32_t bottom;
};
#endif

static_assert(sizeof(D3DXVECTOR3) == 12);
static_assert(sizeof(D3DXMATRIX) == 64);
static_assert(sizeof(tagRECT) == 16);
