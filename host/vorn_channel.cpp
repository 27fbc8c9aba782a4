#include "host/vorn_channel.h"

#include <string>
#include <vector>

#include "host/engine_trace.h"

struct Vorn_Channel::State {
  struct Link {
    bool declared = false;
    ChildCreation record;
    std::vector<Vorn_Channel*> positions;  // not owned; null marks an empty position
  };

  const Link* FindLink(int link) const {
    if (link < 0 || static_cast<std::size_t>(link) >= links.size()) return nullptr;
    return &links[link];
  }

  std::string name;
  ChannelType type;
  int childCreationCount = 0;
  std::vector<Link> links;
  unsigned long timeStamp = 0;
  int interfaceType = 0;
};

namespace {

int liveChannels = 0;
unsigned long stampClock = 0;

}  // namespace

// The room is left as the engine would leave it: only the pointer to the real state is ours.
Vorn_Channel::Vorn_Channel() : state_(new State) { ++liveChannels; }

Vorn_Channel::Vorn_Channel(const Vorn_Channel& other) : state_(new State(*other.state_)) {
  ++liveChannels;
}

Vorn_Channel& Vorn_Channel::operator=(const Vorn_Channel& other) {
  *state_ = *other.state_;
  return *this;
}

Vorn_Channel::~Vorn_Channel() {
  delete state_;
  --liveChannels;
}

void Vorn_Channel::CallChannel() {}
void Vorn_Channel::OneTimeInitialize() {}
void Vorn_Channel::DoEvent(int, unsigned long) {}
ChannelType Vorn_Channel::GetChannelType() { return state_->type; }

// The stand-in engine keeps no channel files.
bool Vorn_Channel::SaveChannel(VornFileSaver&) { return false; }
bool Vorn_Channel::LoadChannel(VornFileLoader&, Vorn_ChannelGroup*) { return false; }

void Vorn_Channel::SetChannelInterfaceType(int interfaceType) {
  state_->interfaceType = interfaceType;
}
Vorn_Channel* Vorn_Channel::GetChannelFromChannel(Vorn_Channel* channel, ChildInfo*) {
  return channel;
}
unsigned long Vorn_Channel::GetTimeStamp() { return state_->timeStamp; }
void Vorn_Channel::SetTimeStamp() { state_->timeStamp = ++stampClock; }
void Vorn_Channel::DoDependencyInit(Vorn_List*) {}
void Vorn_Channel::CheckIndexNrRemoval(int) {}

void Vorn_Channel::SetChannelName(const char* name) {
  state_->name = name ? name : "";
  TraceEngineCall(*this, "SetChannelName", 0);
}

const char* Vorn_Channel::GetChannelName() { return state_->name.c_str(); }

void Vorn_Channel::SetChildCreationCount(int count) {
  state_->childCreationCount = count;
  TraceEngineCall(*this, "SetChildCreationCount", count);
}

void Vorn_Channel::SetChildCreateType(ChildCreation record, int link) {
  TraceEngineCall(*this, "SetChildCreateType", link);
  if (link < 0) return;
  std::vector<State::Link>& links = state_->links;
  if (static_cast<std::size_t>(link) >= links.size()) {
    // A record is a few hundred bytes and a channel declares a handful: room for just these.
    links.reserve(static_cast<std::size_t>(link) + 1);
    links.resize(static_cast<std::size_t>(link) + 1);
  }
  links[link].declared = true;
  links[link].record = record;
}

Vorn_Channel* Vorn_Channel::GetChild(int link) { return GetChildFromLinkPosition(link, 0); }

Vorn_Channel* Vorn_Channel::GetChildFromLinkPosition(int link, int position) {
  const State::Link* found = state_->FindLink(link);
  if (!found || position < 0 || static_cast<std::size_t>(position) >= found->positions.size()) {
    return nullptr;
  }
  return found->positions[position];
}

int Vorn_Channel::GetChildLinkPositionCount(int link) {
  const State::Link* found = state_->FindLink(link);
  return found ? static_cast<int>(found->positions.size()) : 0;
}

namespace {

// Whether a link declared by `record` takes `child`; every link takes an empty position.
bool Admits(const ChildCreation& record, Vorn_Channel* child) {
  if (!child) return true;
  const GUID& wanted = record.childType.typeGuid;
  return SameGuid(wanted, kAllSupportedTypesGuid) ||
         SameGuid(wanted, child->GetChannelType().typeGuid);
}

}  // namespace

bool Vorn_Channel::AttachChild(int link, Vorn_Channel* child) {
  const ChildCreation* record = GetChildCreateType(link);
  if (!child || !record || !Admits(*record, child)) return false;
  state_->links[link].positions.push_back(child);
  return true;
}

bool Vorn_Channel::SetChildAtLinkPosition(int link, int position, Vorn_Channel* child) {
  const ChildCreation* record = GetChildCreateType(link);
  if (position < 0 || !record || !Admits(*record, child)) return false;
  std::vector<Vorn_Channel*>& positions = state_->links[link].positions;
  if (static_cast<std::size_t>(position) >= positions.size()) positions.resize(position + 1);
  positions[position] = child;
  return true;
}

int Vorn_Channel::GetChildCreationCount() const { return state_->childCreationCount; }

const ChildCreation* Vorn_Channel::GetChildCreateType(int link) const {
  const State::Link* found = state_->FindLink(link);
  return found && found->declared ? &found->record : nullptr;
}

void Vorn_Channel::SetChannelType(const ChannelType& type) { state_->type = type; }

int Vorn_Channel::GetLiveChannelCount() { return liveChannels; }
