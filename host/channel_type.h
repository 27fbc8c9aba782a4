// The engine's records for channel types and child links. Both cross the boundary between the
// engine and its plug-ins by value or by pointer, so every field keeps its byte offset on 32- and
// 64-bit builds alike.
#pragma once

#include <cstddef>
#include <cstdint>

#include "host/export.h"
#include "host/guid.h"

struct ChannelType {
  // Fills the engine's own bytes with their marks and leaves names and GUIDs zero.
  TESSEL_API ChannelType();

  char typeName[80];
  GUID typeGuid;
  GUID baseTypeGuid;
  std::uint8_t engineData[8];
  std::int32_t typeCode;
  std::uint8_t engineFlags[8];
};

// Plug-ins build these themselves: the default constructor is part of the declarations they
// compile against, not of the engine library.
struct ChildCreation {
  // A link that takes any type, under no name, with the engine's default codes.
  ChildCreation()
      : linkCode(-1), flagA(0), flagB(0), linkName{}, auxGuid{}, auxValue(0), linkMode(1) {
    childType.typeGuid = kAllSupportedTypesGuid;
    childType.baseTypeGuid = kAllSupportedTypesGuid;
  }

  ChannelType childType;
  std::int32_t linkCode;
  std::uint8_t flagA;
  std::uint8_t flagB;
  char linkName[102];
  GUID auxGuid;
  std::uint32_t auxValue;
  std::int32_t linkMode;
};

static_assert(sizeof(ChannelType) == 132);
static_assert(offsetof(ChannelType, typeName) == 0);
static_assert(offsetof(ChannelType, typeGuid) == 80);
static_assert(offsetof(ChannelType, baseTypeGuid) == 96);
static_assert(offsetof(ChannelType, engineData) == 112);
static_assert(offsetof(ChannelType, typeCode) == 120);
static_assert(offsetof(ChannelType, engineFlags) == 124);

static_assert(sizeof(ChildCreation) == 264);
static_assert(offsetof(ChildCreation, childType) == 0);
static_assert(offsetof(ChildCreation, linkCode) == 132);
static_assert(offsetof(ChildCreation, flagA) == 136);
static_assert(offsetof(ChildCreation, flagB) == 137);
static_assert(offsetof(ChildCreation, linkName) == 138);
static_assert(offsetof(ChildCreation, auxGuid) == 240);
static_assert(offsetof(ChildCreation, auxValue) == 256);
static_assert(offsetof(ChildCreation, linkMode) == 260);

// A record for a channel type of the engine or of a plug-in, built on the engine's defaults.
TESSEL_API ChannelType MakeChannelType(const char* name, const GUID& typeGuid,
                                       const GUID& baseTypeGuid, std::int32_t typeCode);
