// The string channel of the sibling plug-in: a channel holding one text. DataDirectories derive
// from it and inherit everything the engine does with a channel.
#pragma once

#include <cstddef>

#include "host/d3dx_types.h"
#include "host/export.h"
#include "host/vorn_channel.h"

#if defined(STRING_CHANNEL_BUILD)
#define STRING_CHANNEL_API VORN_EXPORT
#else
#define STRING_CHANNEL_API VORN_IMPORT
#endif

class STRING_CHANNEL_API Lum_StringChannel : public Vorn_Channel {
 public:
  Lum_StringChannel();
  Lum_StringChannel(const Lum_StringChannel& other);
  Lum_StringChannel& operator=(const Lum_StringChannel& other);
  ~Lum_StringChannel() override;

  bool SaveChannel(VornFileSaver& saver) override;
  bool LoadChannel(VornFileLoader& loader, Vorn_ChannelGroup* group) override;
  unsigned long GetTimeStamp() override;

  // Table order matters to plug-ins: GetString first, SetString second.
  virtual const char* GetString();
  virtual void SetString(const char* text);  // copies; null reads as ""
  virtual void SetSingeLine(bool singleLine);
  virtual bool GetSingeLine();
  virtual void SetMaxCars(int maxChars);
  virtual void SetIfUseWChar(bool useWideChars);
  virtual bool GetIfUseWChar();
  virtual const unsigned short* GetWString();
  virtual void SetWString(const unsigned short* text);  // null reads as ""
  virtual void AS2WS(unsigned short* wide, const char* text);
  virtual void WS2AS(char* text, const unsigned short* wide);
  virtual tagRECT GetLastRect();
  virtual void SetLastRect(tagRECT rect);

  // As for the engine's base: the real string channel's data must fit in what a DataDirectory
  // allocates for it, and may hold its text in fixed 8- and 16-bit fields.
#if VORN_ENGINE_ROOM
  static constexpr std::size_t kDataBytes = 16384;
#else
  static constexpr std::size_t kDataBytes = sizeof(void*);
#endif

 private:
  struct State;
  State* state_;
#if VORN_ENGINE_ROOM
  [[maybe_unused]] unsigned char reserved_[kDataBytes - sizeof(State*)];
#endif
};

static_assert(sizeof(Lum_StringChannel) == sizeof(Vorn_Channel) + Lum_StringChannel::kDataBytes,
              "the engine's base and the string channel's room, nothing else");
