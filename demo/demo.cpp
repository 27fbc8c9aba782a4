// Loads the DataDirectory plug-in as the engine does and shows what it declares.
#include <cstdio>
#include <string>

#include "host/channel_library.h"
#include "host/guid.h"

namespace {

void PrintTypeRecord(const ChannelType& type) {
  std::printf("Type record\n");
  std::printf("  %-10s %s\n", "name", type.typeName);
  std::printf("  %-10s %s\n", "GUID", GuidToString(type.typeGuid).c_str());
  std::printf("  %-10s %s\n", "base GUID", GuidToString(type.baseTypeGuid).c_str());
  std::printf("  %-10s %d\n", "type code", static_cast<int>(type.typeCode));
}

void PrintLinks(const Vorn_Channel& channel) {
  std::printf("\nLinks of a new \"%s\" channel (declared count %d)\n", channel.GetChannelName(),
              channel.GetChildCreationCount());
  std::printf("  %-4s %-20s %-20s %-36s %5s %5s\n", "link", "name", "takes", "type GUID", "code",
              "mode");
  for (int link = 0; const ChildCreation* record = channel.GetChildCreateType(link); ++link) {
    std::printf("  %-4d %-20s %-20s %-36s %5d %5d\n", link, record->linkName,
                record->childType.typeName, GuidToString(record->childType.typeGuid).c_str(),
                static_cast<int>(record->linkCode), static_cast<int>(record->linkMode));
  }
}

}  // namespace

int main() {
  std::string error;
  const auto library = ChannelLibrary::Open(ExecutableFolder(), kDataDirectoryGuid, error);
  if (!library) {
    std::fprintf(stderr, "datadirectory_demo: %s\n", error.c_str());
    return 1;
  }
  std::printf("Loaded %s\n\n", library->Path().c_str());
  PrintTypeRecord(library->Type());

  const ChannelHandle directory = library->CreateChannel();
  if (!directory) {
    std::fprintf(stderr, "datadirectory_demo: the plug-in could not create a channel\n");
    return 1;
  }
  PrintLinks(*directory);
  return 0;
}
