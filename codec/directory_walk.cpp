// The recursive walk over a directory tree. One routine serves both directions, so that reading
// visits the same channels in the same order, with the same element calls, as writing.
#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdint>
#include <cstring>

#include "codec/cleanup.h"
#include "codec/pattern_search.h"
#include "host/matrix_channel.h"
#include "host/value_channel.h"
#include "host/vector_channel.h"
#include "plugin/data_package.h"

namespace {

constexpr char kNoName[] = "Noname";

// The engine admits only value channels on Count and currrent index.
Lum_ValueChannel* AsValue(Vorn_Channel* channel) { return static_cast<Lum_ValueChannel*>(channel); }

// Entries to write for a Count: truncated toward zero, negative counts as one, and whatever no int
// holds (NaN, too large) as one or as many as an int can count.
int EntryCount(float count) {
  if (std::isnan(count) || count <= -1.0f) return 1;
  if (count >= 2147483648.0f) return 2147483647;
  return static_cast<int>(count);
}

// Copies a name into a fixed field when it fits there; a longer one is used where it stands. The
// element functions take names as char*, and never write them. Names are a few bytes long: byte
// loops cost them less than the C library's calls and a general copy's start-up do.
char* NameIn(char (&field)[Lum_DataPackage::kTextLength], const char* name) {
  std::size_t length = 0;
  while (name[length] != '\0') {
    if (++length == sizeof(field)) return const_cast<char*>(name);
  }
  if (length < 16) {
    pattern_search::StoreShortText(field, name, length);
  } else {
    for (std::size_t i = 0; i <= length; ++i)
      field[i] = name[i];
  }
  return field;
}

}  // namespace

// Once the size no int can count is reached, no buffer can take the package and nothing further
// changes the result: more entries would only keep the engine waiting.
bool Lum_DataPackage::PackageTooLarge() { return write && requiredSize == INT_MAX; }

int Lum_DataPackage::ReadWriteDirectory(bool) {
  // A directory already on the walk's path would be walked without end.
  if (walkDepth >= kMaxNesting || IsBeingWalked()) return bufferCursor;
  Vorn_Channel* currentIndex = GetChild(kCurrentIndexLink);
  Vorn_Channel* count = GetChild(kCountLink);
  int entryCount = count ? EntryCount(AsValue(count)->GetValue()) : 1;
  if (!write) entryCount = kMaxReadEntries;
  Vorn_Channel* callEachIteration = GetChildFromLinkPosition(kCallEachIterationLink, 0);
  TakeTagName();

  walkPath[walkDepth++] = this;
  int index = 0;
  // A directory left on the path by a channel's exception would never be walked again.
  RunThenCleanUp(
      [&] {
        if (write && entryCount == 0) {
          XML_OpeningTag(tagName);
          XML_ClosingTag(tagName);
        }
        for (; index < entryCount && !PackageTooLarge(); ++index) {
          if (currentIndex) AsValue(currentIndex)->SetValue(static_cast<float>(index));
          if (write && callEachIteration) callEachIteration->CallChannel();
          if (!OpenEntry(index, entryCount)) break;
          ReadWriteData();
          ReadWriteSubDirectories();
          XML_ClosingTag(tagName);
          if (!write && callEachIteration) callEachIteration->CallChannel();
        }
      },
      [] { --walkDepth; });

  if (!write && count) AsValue(count)->SetValue(static_cast<float>(index));
  return bufferCursor;
}

// The Tag child's text, cut to what the field holds; a missing text reads as no Tag child.
void Lum_DataPackage::TakeTagName() {
  const char* name = nullptr;
  if (Vorn_Channel* tag = GetChild(kTagLink))
    name = static_cast<Lum_StringChannel*>(tag)->GetString();
  if (!name) name = kNoName;
  const std::size_t length =
      static_cast<std::size_t>(std::find(name, name + kTextLength - 1, '\0') - name);
  // What the read learnt about searching for the old name says nothing about the new one.
  if (std::strncmp(tagName, name, length) != 0 || tagName[length] != '\0') ForgetTagSearch();
  std::memcpy(tagName, name, length);
  tagName[length] = '\0';
}

// This directory's place in the memo of tag searches. Directories that share a place only cost
// each other what they learnt.
Lum_DataPackage::TagSearchMemo& Lum_DataPackage::TagSearchMemoSlot() const {
  const auto address = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(this));
  return tagSearchMemo[(address * 0x9E3779B97F4A7C15u) >> 56];
}

// Where this directory's tag search is known to fail during the current read.
int& Lum_DataPackage::TagSearchFailsFrom() {
  TagSearchMemo& memo = TagSearchMemoSlot();
  if (memo.directory != this || memo.read != readSerial) memo = {this, readSerial, INT_MAX};
  return memo.failsFrom;
}

void Lum_DataPackage::ForgetTagSearch() {
  TagSearchMemo& memo = TagSearchMemoSlot();
  if (memo.directory == this) memo.directory = nullptr;
}

bool Lum_DataPackage::OpenEntry(int index, int entryCount) {
  if (write) {
    return entryCount == 1 ? XML_OpeningTag(tagName) : XML_OpeningIDTag(tagName, index);
  }
  if (index > 0) return GetItemType(tagName) == 2 && XML_OpeningIDTag(tagName, index);
  if (!SearchTag(tagName, TagSearchFailsFrom())) return false;
  switch (GetItemType(tagName)) {
    case 1:
      return XML_OpeningTag(tagName);
    case 2:
      return XML_OpeningIDTag(tagName, 0);
    default:  // an empty element: neither of its tags is taken
      return false;
  }
}

void Lum_DataPackage::ReadWriteData() {
  float value = 0.0f;
  D3DXVECTOR3 vector{};
  D3DXMATRIX matrix{};
  const int positions = GetChildLinkPositionCount(kDataLink);
  for (int position = 0; position < positions; ++position) {
    Vorn_Channel* child = GetChildFromLinkPosition(kDataLink, position);
    if (!child) continue;
    const GUID kind = child->GetChannelType().baseTypeGuid;
    char* name = NameIn(strg2, child->GetChannelName());
    if (SameGuid(kind, kStringChannelGuid)) {
      auto* text = static_cast<Lum_StringChannel*>(child);
      if (write) {
        // Written where it stands: texts have no length limit of their own.
        const char* string = text->GetString();
        XML_StringTag(name, const_cast<char*>(string ? string : ""));
      } else {
        XML_StringTag(name, strg);
        text->SetString(strg);
      }
    } else if (SameGuid(kind, kValueChannelGuid)) {
      auto* channel = AsValue(child);
      if (write) value = channel->GetValue();
      XML_ValueTag(name, value);
      if (!write) channel->SetValue(value);
    } else if (SameGuid(kind, kVectorChannelGuid)) {
      auto* channel = static_cast<Lum_VectorChannel*>(child);
      if (write) vector = channel->GetVector();
      XML_VectorTag(name, vector);
      if (!write) channel->SetVector(vector);
    } else if (SameGuid(kind, kMatrixChannelGuid)) {
      auto* channel = static_cast<Lum_MatrixChannel*>(child);
      if (write) matrix = channel->GetMatrix();
      XML_MatrixTag(name, matrix);
      if (!write) channel->SetMatrix(matrix);
    }
  }
}

void Lum_DataPackage::ReadWriteSubDirectories() {
  const int positions = GetChildLinkPositionCount(kSubDirectoriesLink);
  for (int position = 0; position < positions; ++position) {
    Vorn_Channel* sub = GetChildFromLinkPosition(kSubDirectoriesLink, position);
    if (sub) static_cast<Lum_DataPackage*>(sub)->ReadWriteDirectory(false);
  }
}

bool Lum_DataPackage::IsBeingWalked() const {
  for (int i = 0; i < walkDepth; ++i) {
    if (walkPath[i] == this) return true;
  }
  return false;
}
