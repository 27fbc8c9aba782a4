#include "host/vorn_channel.h"

#include "host/engine_trace.h"

namespace {

int liveChannels = 0;
unsigned long stampClock = 0;

}  // namespace

Vorn_Channel::Vorn_Channel() { ++liveChannels; }

Vorn_Channel::Vorn_Channel(const Vorn_Channel& other)
    : name_(other.name_),
      type_(other.type_),
      childCreationCount_(other.childCreationCount_),
      links_(other.links_),
      timeStamp_(other.timeStamp_),
      interfaceType_(other.interfaceType_) {
  ++liveChannels;
}

Vorn_Channel& Vorn_Channel::operator=(const Vorn_Channel& other) = default;

Vorn_Channel::~Vorn_Channel() { --liveChannels; }

void Vorn_Channel::CallChannel() {}
void Vorn_Channel::OneTimeInitialize() {}
void Vorn_Channel::DoEvent(int, unsigned long) {}
ChannelType Vorn_Channel::GetChannelType() { return type_; }

// The stand-in engine keeps no channel files.
bool Vorn_Channel::SaveChannel(VornFileSaver&) { return false; }
bool Vorn_Channel::LoadChannel(VornFileLoader&, Vorn_ChannelGroup*) { return false; }

void Vorn_Channel::SetChannelInterfaceType(int interfaceType) { interfaceType_ = interfaceType; }
Vorn_Channel* Vorn_Channel::GetChannelFromChannel(Vorn_Channel* channel, ChildInfo*) {
  return channel;
}
unsigned long Vorn_Channel::GetTimeStamp() { return timeStamp_; }
void Vorn_Channel::SetTimeStamp() { timeStamp_ = ++stampClock; }
void Vorn_Channel::DoDependencyInit(Vorn_List*) {}
void Vorn_Channel::CheckIndexNrRemoval(int) {}

void Vorn_Channel::SetChannelName(const char* name) {
  name_ = name ? name : "";
  TraceEngineCall(*this, "SetChannelName", 0);
}

const char* Vorn_Channel::GetChannelName() const { return name_.c_str(); }

void Vorn_Channel::SetChildCreationCount(int count) {
  childCreationCount_ = count;
  TraceEngineCall(*this, "SetChildCreationCount", count);
}

void Vorn_Channel::SetChildCreateType(ChildCreation record, int link) {
  TraceEngineCall(*this, "SetChildCreateType", link);
  if (link < 0) return;
  if (static_cast<std::size_t>(link) >= links_.size()) links_.resize(link + 1);
  links_[link].declared = true;
  links_[link].record = record;
}

const Vorn_Channel::Link* Vorn_Channel::FindLink(int link) const {
  if (link < 0 || static_cast<std::size_t>(link) >= links_.size()) return nullptr;
  return &links_[link];
}

Vorn_Channel* Vorn_Channel::GetChild(int link) const { return GetChildFromLinkPosition(link, 0); }

Vorn_Channel* Vorn_Channel::GetChildFromLinkPosition(int link, int position) const {
  const Link* found = FindLink(link);
  if (!found || position < 0 || static_cast<std::size_t>(position) >= found->positions.size()) {
    return nullptr;
  }
  return found->positions[position];
}

int Vorn_Channel::GetChildLinkPositionCount(int link) const {
  const Link* found = FindLink(link);
  return found ? static_cast<int>(found->positions.size()) : 0;
}

bool Vorn_Channel::Admits(int link, Vorn_Channel* child) const {
  const Link* found = FindLink(link);
  if (!found || !found->declared) return false;
  if (!child) return true;
  const GUID& wanted = found->record.childType.typeGuid;
  return SameGuid(wanted, kAllSupportedTypesGuid) ||
         SameGuid(wanted, child->GetChannelType().typeGuid);
}

bool Vorn_Channel::AttachChild(int link, Vorn_Channel* child) {
  if (!child || !Admits(link, child)) return false;
  links_[link].positions.push_back(child);
  return true;
}

bool Vorn_Channel::SetChildAtLinkPosition(int link, int position, Vorn_Channel* child) {
  if (position < 0 || !Admits(link, child)) return false;
  std::vector<Vorn_Channel*>& positions = links_[link].positions;
  if (static_cast<std::size_t>(position) >= positions.size()) positions.resize(position + 1);
  positions[position] = child;
  return true;
}

int Vorn_Channel::GetChildCreationCount() const { return childCreationCount_; }

const ChildCreation* Vorn_Channel::GetChildCreateType(int link) const {
  const Link* found = FindLink(link);
  return found && found->declared ? &found->record : nullptr;
}

void Vorn_Channel::SetChannelType(const ChannelType& type) { type_ = type; }

int Vorn_Channel::GetLiveChannelCount() { return liveChannels; }
