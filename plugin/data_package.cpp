#include "plugin/data_package.h"

#include <cstring>

#include "host/channel_type.h"
#include "host/guid.h"

namespace {

struct LinkDeclaration {
  const char* typeName;
  const GUID& typeGuid;
  std::int32_t linkCode;
  const char* linkName;
  std::int32_t linkMode;
};

// The engine is told 4, yet keeps all six records and the walk uses all six links.
constexpr int kDeclaredChildCreationCount = 4;

const LinkDeclaration kLinks[Lum_DataPackage::kLinkCount] = {
    {"Text", kStringChannelGuid, 0, "Tag", 1},
    {"Value", kValueChannelGuid, 1, "Count", 1},
    {"Value", kValueChannelGuid, 2, "currrent index", 2},
    {"All supported Types", kAllSupportedTypesGuid, -1, "Data", 2},
    {"DataDirectory", kDataDirectoryGuid, -1, "Sub-Directories", 2},
    {"All supported Types", kAllSupportedTypesGuid, 5, "Call each iteration", 2},
};

// Zero-fills the rest of the field, so that no byte of one link's name shows in the next record.
template <std::size_t N>
void SetField(char (&field)[N], const char* text) {
  std::memset(field, 0, N);
  std::memcpy(field, text, std::strlen(text));
}

}  // namespace

Lum_DataPackage::Lum_DataPackage() {
  SetChannelName("DataDirectory");
  ChildCreation record;
  SetChildCreationCount(kDeclaredChildCreationCount);
  for (int link = 0; link < kLinkCount; ++link) {
    const LinkDeclaration& declaration = kLinks[link];
    SetField(record.childType.typeName, declaration.typeName);
    record.childType.typeGuid = declaration.typeGuid;
    record.linkCode = declaration.linkCode;
    record.flagB = 0;
    SetField(record.linkName, declaration.linkName);
    record.linkMode = declaration.linkMode;
    SetChildCreateType(record, link);
  }
  SetString("");
}

Lum_DataPackage::Lum_DataPackage(const Lum_DataPackage& other) : Lum_StringChannel(other) {
  std::memcpy(tagName, other.tagName, sizeof(tagName));
}

Lum_DataPackage& Lum_DataPackage::operator=(const Lum_DataPackage& other) {
  Lum_StringChannel::operator=(other);
  std::memmove(tagName, other.tagName, sizeof(tagName));
  return *this;
}

Lum_DataPackage::~Lum_DataPackage() = default;
