// Plays the engine with the DataDirectory DLL built in the engine's own ABI: loads it by its file
// name, reads its type record, creates channels through InitDLL, calls virtual operations by their
// slot in the table and members by their decorated names, and writes and reads the stored sample
// packages. GoogleTest cannot be built for this target: the checks print one line each and the
// program ends with "N passed, N failed".
//
// Usage: engine_tests PACKAGE_FOLDER
#include <windows.h>

#include <cstdio>
#include <cstring>
#include <string>
#include <type_traits>
#include <vector>

#include "host/channel_type.h"
#include "host/guid.h"
#include "host/string_channel/string_channel.h"
#include "tests/engine/sample_trees.h"

namespace {

int passed = 0;
int failed = 0;

void Check(bool ok, const char* what, const char* detail = "") {
  ++(ok ? passed : failed);
  std::printf("%s %s%s%s\n", ok ? "PASS" : "FAIL", what, *detail ? ": " : "", detail);
  std::fflush(stdout);
}

using GetTypeFunction = ChannelType*(__cdecl*)();
using InitDllFunction = Vorn_Channel*(__cdecl*)();
// Members as a caller that links the DLL reaches them: by decorated name, `this` in ecx.
using WriteToBufferMember = int(__thiscall*)(void* self, char*, int, bool, bool);  // and Read
using ScrambleMember = void(__thiscall*)(void* self, char*, int);
// Slots of the table: the destructor takes one, Vorn_Channel's twelve others follow, then the
// string channel's.
using DeletingDestructorSlot = void*(__thiscall*)(void* self, unsigned flags);
using GetChannelTypeSlot = ChannelType*(__thiscall*)(void* self, ChannelType* result);
using CallChannelSlot = void(__thiscall*)(void* self);
using GetStringSlot = const char*(__thiscall*)(void* self);
using SetStringSlot = void(__thiscall*)(void* self, const char*);
constexpr int kGetChannelTypeSlot = 4;
constexpr int kGetStringSlot = 13;
constexpr int kSetStringSlot = 14;

template <typename Function>
Function Slot(Vorn_Channel* channel, int slot) {
  return reinterpret_cast<Function>((*reinterpret_cast<void***>(channel))[slot]);
}

template <typename Function>
Function Export(HMODULE module, const char* name) {
  return reinterpret_cast<Function>(reinterpret_cast<void*>(GetProcAddress(module, name)));
}

struct Library {
  HMODULE module = nullptr;
  GetTypeFunction getType = nullptr;
  InitDllFunction initDll = nullptr;
};

Library Load(const char* file) {
  Library library;
  library.module = LoadLibraryA(file);
  Check(library.module != nullptr, "loads by file name", file);
  if (library.module) {
    library.getType = Export<GetTypeFunction>(library.module, "GetType");
    library.initDll = Export<InitDllFunction>(library.module, "InitDLL");
  }
  Check(library.getType && library.initDll, "exports GetType and InitDLL undecorated", file);
  return library;
}

Library directories;
Library texts;
WriteToBufferMember writeToBuffer;
WriteToBufferMember readFromBuffer;  // the same signature
ScrambleMember encrypt;
ScrambleMember decrypt;

// As the engine creates a plug-in's channel: the record GetType gives becomes its type.
Vorn_Channel* NewDirectory() {
  Vorn_Channel* channel = directories.initDll();
  channel->SetChannelType(*directories.getType());
  return channel;
}
Vorn_Channel* NewText() {
  Vorn_Channel* channel = texts.initDll();
  channel->SetChannelType(*texts.getType());
  return channel;
}

void CheckTypeRecord() {
  ChannelType* record = directories.getType();
  const ChannelType fresh;
  Check(record == directories.getType(), "GetType gives one record");
  Check(std::strcmp(record->typeName, "DataDirectory") == 0, "type name", record->typeName);
  Check(SameGuid(record->typeGuid, kDataDirectoryGuid), "type GUID");
  Check(SameGuid(record->baseTypeGuid, kStringChannelGuid), "base type GUID: the string channel");
  Check(record->typeCode == 1, "type code 1");
  Check(std::memcmp(record->engineData, fresh.engineData, sizeof(fresh.engineData)) == 0 &&
            std::memcmp(record->engineFlags, fresh.engineFlags, sizeof(fresh.engineFlags)) == 0,
        "the engine's bytes as its constructor left them");
}

void CheckLinks(Vorn_Channel* directory) {
  struct Expected {
    const char* typeName;
    const GUID& typeGuid;
    int linkCode;
    const char* linkName;
    int linkMode;
  };
  const Expected links[] = {
      {"Text", kStringChannelGuid, 0, "Tag", 1},
      {"Value", kValueChannelGuid, 1, "Count", 1},
      {"Value", kValueChannelGuid, 2, "currrent index", 2},
      {"All supported Types", kAllSupportedTypesGuid, -1, "Data", 2},
      {"DataDirectory", kDataDirectoryGuid, -1, "Sub-Directories", 2},
      {"All supported Types", kAllSupportedTypesGuid, 5, "Call each iteration", 2},
  };
  const GUID zero{};
  for (int link = 0; link < 6; ++link) {
    const ChildCreation* record = directory->GetChildCreateType(link);
    const Expected& expected = links[link];
    const bool ok = record && std::strcmp(record->childType.typeName, expected.typeName) == 0 &&
                    SameGuid(record->childType.typeGuid, expected.typeGuid) &&
                    SameGuid(record->childType.baseTypeGuid, kAllSupportedTypesGuid) &&
                    record->linkCode == expected.linkCode && record->flagA == 0 &&
                    record->flagB == 0 && std::strcmp(record->linkName, expected.linkName) == 0 &&
                    SameGuid(record->auxGuid, zero) && record->auxValue == 0 &&
                    record->linkMode == expected.linkMode;
    Check(ok, "link record", expected.linkName);
  }
  Check(directory->GetChildCreationCount() == 4, "child creation count 4");
}

void CheckTable(Vorn_Channel* directory) {
  Check(std::strcmp(directory->GetChannelName(), "DataDirectory") == 0, "channel name");
  ChannelType type;
  Slot<GetChannelTypeSlot>(directory, kGetChannelTypeSlot)(directory, &type);
  Check(SameGuid(type.typeGuid, kDataDirectoryGuid), "slot 4 is GetChannelType");
  const char* header = Slot<GetStringSlot>(directory, kGetStringSlot)(directory);
  Check(header && *header == '\0', "slot 13 is GetString: a new directory's string is empty");
  Slot<SetStringSlot>(directory, kSetStringSlot)(directory, "header");
  header = Slot<GetStringSlot>(directory, kGetStringSlot)(directory);
  Check(header && std::strcmp(header, "header") == 0, "slot 14 is SetString");
  // Slot 1 is CallChannel, which a DataDirectory inherits and which changes nothing; the walk
  // calls "Call each iteration" through the same slot, which the samples show.
  Slot<CallChannelSlot>(directory, 1)(directory);
  Check(std::strcmp(directory->GetChannelName(), "DataDirectory") == 0 &&
            std::strcmp(Slot<GetStringSlot>(directory, kGetStringSlot)(directory), "header") == 0,
        "slot 1 is CallChannel");
}

void CheckSamples(const char* folder) {
  for (std::size_t i = 0; i < samples::kSampleCount; ++i) {
    const samples::Sample& sample = samples::kSamples[i];
    const std::string path = std::string(folder) + "/" + sample.name + ".pkg";
    std::vector<char> stored;
    if (FILE* file = std::fopen(path.c_str(), "rb")) {
      char chunk[4096];
      for (std::size_t n; (n = std::fread(chunk, 1, sizeof(chunk), file)) > 0;)
        stored.insert(stored.end(), chunk, chunk + n);
      std::fclose(file);
    }
    Check(!stored.empty(), "reads the stored package", path.c_str());

    const samples::Factories factories = {NewDirectory, NewText};
    samples::Tree writer(sample, factories);
    const int size = writeToBuffer(writer.Top(), nullptr, 0, sample.lineFeeds, sample.scramble);
    std::vector<char> written(static_cast<std::size_t>(size > 0 ? size : 0));
    writer.Supply();
    writeToBuffer(writer.Top(), written.data(), size, sample.lineFeeds, sample.scramble);
    Check(written == stored, "writes the stored bytes", sample.name);

    samples::Tree reader(sample, factories);
    reader.Collect();
    const int read = readFromBuffer(reader.Top(), stored.data(), static_cast<int>(stored.size()),
                                    sample.lineFeeds, sample.scramble);
    Check(read == static_cast<int>(stored.size()) - 1, "reads to the last closing tag",
          sample.name);
    const char* problem = "";
    Check(reader.Received(writer, problem), "reads back every value", problem);
  }
}

// The engine's C++ exceptions are structured exceptions underneath; one passing through a
// package operation must leave the next ones working.
bool raising = false;
void RaiseFromChannel() {
  if (raising) RaiseException(0xE0000001u, 0, 0, nullptr);
}

// Whether a package operation let the channel's exception through to its caller.
bool PassesThrough(WriteToBufferMember operation, Vorn_Channel* top, char* buffer, int size) {
  __try {
    operation(top, buffer, size, false, false);
  } __except (GetExceptionCode() == 0xE0000001u ? EXCEPTION_EXECUTE_HANDLER
                                                : EXCEPTION_CONTINUE_SEARCH) {
    return true;
  }
  return false;
}

void CheckExceptionsPassThrough() {
  const samples::Factories factories = {NewDirectory, NewText};
  samples::Tree tree(samples::kSamples[3], factories);  // nested: raised two directories deep
  std::vector<char> buffer(8192);
  samples::Tree::onCall = RaiseFromChannel;
  raising = true;
  Check(PassesThrough(writeToBuffer, tree.Top(), buffer.data(), 8192),
        "an exception passes through a write");
  raising = false;
  tree.Supply();
  const int size = writeToBuffer(tree.Top(), buffer.data(), 8192, false, false);
  Check(size == 1145, "the next write is whole");

  raising = true;
  Check(PassesThrough(readFromBuffer, tree.Top(), buffer.data(), size),
        "an exception passes through a read");
  raising = false;
  tree.Collect();
  Check(readFromBuffer(tree.Top(), buffer.data(), size, false, false) == size - 1,
        "the next read is whole");
  samples::Tree::onCall = nullptr;
}

}  // namespace

int main(int argc, char** argv) {
  const char* folder = argc > 1 ? argv[1] : "packages";
  directories = Load("3F1A9C42-7B05-4D2E-A6C3-58E0B91D47F6.dll");
  texts = Load("8C24E5B1-19D3-4A7F-B052-E6719A3C0D85.dll");
  if (!directories.initDll || !texts.initDll) return failed;

  const auto member = [](auto& function, const char* name) {
    function = Export<std::remove_reference_t<decltype(function)>>(directories.module, name);
    Check(function != nullptr, "exports", name);
  };
  member(writeToBuffer, "?WriteToBuffer@Lum_DataPackage@@QAEHPADH_N1@Z");
  member(readFromBuffer, "?ReadFromBuffer@Lum_DataPackage@@QAEHPADH_N1@Z");
  member(encrypt, "?Encrypt@Lum_DataPackage@@QAEXPADH@Z");
  member(decrypt, "?Decrypt@Lum_DataPackage@@QAEXPADH@Z");
  if (!writeToBuffer || !readFromBuffer || !encrypt || !decrypt) return failed;

  CheckTypeRecord();
  Vorn_Channel* first = NewDirectory();
  Vorn_Channel* second = NewDirectory();
  Check(first && second && first != second, "InitDLL creates distinct channels");
  CheckLinks(first);
  CheckTable(first);

  char abc[] = "abc";
  encrypt(first, abc, 3);
  Check(std::strcmp(abc, "cce") == 0, "Encrypt scrambles abc to cce");
  decrypt(first, abc, 3);
  Check(std::strcmp(abc, "abc") == 0, "Decrypt undoes it");

  CheckSamples(folder);
  CheckExceptionsPassThrough();

  // The engine destroys channels through slot 0, the deleting destructor, or through the base.
  void* result = Slot<DeletingDestructorSlot>(first, 0)(first, 1);
  Check(result == first, "slot 0 destroys and frees");
  delete second;

  std::printf("%d passed, %d failed\n", passed, failed);
  return failed == 0 ? 0 : 1;
}
