#include "host/channel_type.h"

#include <cstring>

namespace {

// Non-zero marks, so that a plug-in writing into the engine's bytes shows.
constexpr std::uint8_t kEngineDataMark = 0xA5;
constexpr std::uint8_t kEngineFlagsMark = 0x5A;

}  // namespace

ChannelType::ChannelType() : typeName{}, typeGuid{}, baseTypeGuid{}, typeCode(0) {
  std::memset(engineData, kEngineDataMark, sizeof(engineData));
  std::memset(engineFlags, kEngineFlagsMark, sizeof(engineFlags));
}

ChannelType MakeChannelType(const char* name, const GUID& typeGuid, const GUID& baseTypeGuid,
                            std::int32_t typeCode) {
  ChannelType type;
  std::strncpy(type.typeName, name, sizeof(type.typeName) - 1);
  type.typeGuid = typeGuid;
  type.baseTypeGuid = baseTypeGuid;
  type.typeCode = typeCode;
  return type;
}
