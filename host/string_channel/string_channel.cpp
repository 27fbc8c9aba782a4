#include "host/string_channel/string_channel.h"

#include <string>
#include <vector>

#include "host/engine_trace.h"
#include "host/guid.h"

struct Lum_StringChannel::State {
  std::string text;
  std::vector<unsigned short> wideText;  // NUL-terminated, made from text when asked for
  bool wideTextCurrent = false;
  bool singleLine = false;
  bool useWideChars = false;
  int maxChars = 0;
  tagRECT lastRect{};
  unsigned long textStamp = 0;
};

Lum_StringChannel::Lum_StringChannel() : state_(new State) {
  SetChannelType(MakeChannelType("Text", kStringChannelGuid, kStringChannelGuid, 1));
}

Lum_StringChannel::Lum_StringChannel(const Lum_StringChannel& other)
    : Vorn_Channel(other), state_(new State(*other.state_)) {}

Lum_StringChannel& Lum_StringChannel::operator=(const Lum_StringChannel& other) {
  Vorn_Channel::operator=(other);
  *state_ = *other.state_;
  return *this;
}

Lum_StringChannel::~Lum_StringChannel() { delete state_; }

bool Lum_StringChannel::SaveChannel(VornFileSaver& saver) {
  return Vorn_Channel::SaveChannel(saver);
}

bool Lum_StringChannel::LoadChannel(VornFileLoader& loader, Vorn_ChannelGroup* group) {
  return Vorn_Channel::LoadChannel(loader, group);
}

// A text channel changes when its text does.
unsigned long Lum_StringChannel::GetTimeStamp() { return state_->textStamp; }

const char* Lum_StringChannel::GetString() { return state_->text.c_str(); }

void Lum_StringChannel::SetString(const char* text) {
  state_->text = text ? text : "";
  state_->wideTextCurrent = false;
  SetTimeStamp();
  state_->textStamp = Vorn_Channel::GetTimeStamp();
  TraceEngineCall(*this, "SetString", static_cast<int>(state_->text.size()));
}

void Lum_StringChannel::SetSingeLine(bool singleLine) { state_->singleLine = singleLine; }
bool Lum_StringChannel::GetSingeLine() { return state_->singleLine; }

// An editing hint for the engine's text fields; the text itself is never cut.
void Lum_StringChannel::SetMaxCars(int maxChars) { state_->maxChars = maxChars; }

void Lum_StringChannel::SetIfUseWChar(bool useWideChars) { state_->useWideChars = useWideChars; }
bool Lum_StringChannel::GetIfUseWChar() { return state_->useWideChars; }

// The wide text is made when first asked for: most texts are only ever read as 8-bit ones.
const unsigned short* Lum_StringChannel::GetWString() {
  State& state = *state_;
  if (!state.wideTextCurrent) {
    state.wideText.assign(state.text.size() + 1, 0);
    AS2WS(state.wideText.data(), state.text.c_str());
    state.wideTextCurrent = true;
  }
  return state.wideText.data();
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

tagRECT Lum_StringChannel::GetLastRect() { return state_->lastRect; }
void Lum_StringChannel::SetLastRect(tagRECT rect) { state_->lastRect = rect; }
