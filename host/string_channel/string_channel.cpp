#include "host/string_channel/string_channel.h"

#include "host/engine_trace.h"
#include "host/guid.h"

Lum_StringChannel::Lum_StringChannel() {
  SetChannelType(MakeChannelType("Text", kStringChannelGuid, kStringChannelGuid, 1));
}

Lum_StringChannel::Lum_StringChannel(const Lum_StringChannel& other) = default;
Lum_StringChannel& Lum_StringChannel::operator=(const Lum_StringChannel& other) = default;
Lum_StringChannel::~Lum_StringChannel() = default;

bool Lum_StringChannel::SaveChannel(VornFileSaver& saver) {
  return Vorn_Channel::SaveChannel(saver);
}

bool Lum_StringChannel::LoadChannel(VornFileLoader& loader, Vorn_ChannelGroup* group) {
  return Vorn_Channel::LoadChannel(loader, group);
}

// A text channel changes when its text does.
unsigned long Lum_StringChannel::GetTimeStamp() { return textStamp_; }

const char* Lum_StringChannel::GetString() { return text_.c_str(); }

void Lum_StringChannel::SetString(const char* text) {
  text_ = text ? text : "";
  wideTextCurrent_ = false;
  SetTimeStamp();
  textStamp_ = Vorn_Channel::GetTimeStamp();
  TraceEngineCall(*this, "SetString", static_cast<int>(text_.size()));
}

void Lum_StringChannel::SetSingeLine(bool singleLine) { singleLine_ = singleLine; }
bool Lum_StringChannel::GetSingeLine() { return singleLine_; }

// An editing hint for the engine's text fields; the text itself is never cut.
void Lum_StringChannel::SetMaxCars(int maxChars) { maxChars_ = maxChars; }

void Lum_StringChannel::SetIfUseWChar(bool useWideChars) { useWideChars_ = useWideChars; }
bool Lum_StringChannel::GetIfUseWChar() { return useWideChars_; }

// The wide text is made when first asked for: most texts are only ever read as 8-bit ones.
const unsigned short* Lum_StringChannel::GetWString() {
  if (!wideTextCurrent_) {
    wideText_.assign(text_.size() + 1, 0);
    AS2WS(wideText_.data(), text_.c_str());
    wideTextCurrent_ = true;
  }
  return wideText_.data();
}

void Lum_StringChannel::SetWString(const unsigned short* wide) {
  std::size_t length = 0;
  while (wide && wide[length])
    ++length;
  std::string text(length, '\0');
  if (wide) WS2AS(text.data(), wide);
  SetString(text.c_str());
}

// Texts are 8-bit; wide characters beyond that range have no 8-bit form.
void Lum_StringChannel::AS2WS(unsigned short* wide, const char* text) {
  std::size_t i = 0;
  for (; text[i]; ++i)
    wide[i] = static_cast<unsigned char>(text[i]);
  wide[i] = 0;
}

void Lum_StringChannel::WS2AS(char* text, const unsigned short* wide) {
  std::size_t i = 0;
  for (; wide[i]; ++i)
    text[i] = wide[i] < 256 ? static_cast<char>(wide[i]) : '?';
  text[i] = '\0';
}

tagRECT Lum_StringChannel::GetLastRect() { return lastRect_; }
void Lum_StringChannel::SetLastRect(tagRECT rect) { lastRect_ = rect; }
