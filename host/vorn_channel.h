// The engine's channel: a named, typed node with numbered child links. Plug-in channel classes
// derive from it; the engine owns every channel and destroys it through the virtual destructor.
#pragma once

#include <cstddef>

#include "host/channel_type.h"
#include "host/export.h"

// Engine types that appear only in signatures no plug-in here calls.
class ChildInfo;
class VornFileSaver;
class VornFileLoader;
class Vorn_ChannelGroup;
class Vorn_List;

class TESSEL_API Vorn_Channel {
 public:
  Vorn_Channel();
  Vorn_Channel(const Vorn_Channel& other);
  Vorn_Channel& operator=(const Vorn_Channel& other);

  // The order of these thirteen is the engine's table order; derived classes add theirs after.
  virtual ~Vorn_Channel();
  virtual void CallChannel();
  virtual void OneTimeInitialize();
  virtual void DoEvent(int event, unsigned long data);
  virtual ChannelType GetChannelType();
  virtual bool SaveChannel(VornFileSaver& saver);
  virtual bool LoadChannel(VornFileLoader& loader, Vorn_ChannelGroup* group);
  virtual void SetChannelInterfaceType(int interfaceType);
  virtual Vorn_Channel* GetChannelFromChannel(Vorn_Channel* channel, ChildInfo* info);
  virtual unsigned long GetTimeStamp();
  virtual void SetTimeStamp();
  virtual void DoDependencyInit(Vorn_List* list);
  virtual void CheckIndexNrRemoval(int index);

  // Called by channel plug-ins. Their signatures are the engine's, const and all: a plug-in finds
  // them in the engine library by their decorated names.
  void SetChannelName(const char* name);
  const char* GetChannelName();
  void SetChildCreationCount(int count);
  void SetChildCreateType(ChildCreation record, int link);
  Vorn_Channel* GetChild(int link);
  Vorn_Channel* GetChildFromLinkPosition(int link, int position);
  int GetChildLinkPositionCount(int link);

  // Engine side: building trees and inspecting declarations.
  // Both refuse, changing nothing, a link never declared, a negative position and a child whose
  // type GUID the link's record does not admit. AttachChild refuses a null child as well;
  // SetChildAtLinkPosition takes null to empty a position. A position past the end grows the link.
  bool AttachChild(int link, Vorn_Channel* child);
  bool SetChildAtLinkPosition(int link, int position, Vorn_Channel* child);
  int GetChildCreationCount() const;
  const ChildCreation* GetChildCreateType(int link) const;  // null for a link never declared
  void SetChannelType(const ChannelType& type);             // the loader records the library's type

  static int GetLiveChannelCount();

  // A plug-in allocates its channels with the size these declarations give, and the engine's own
  // constructor fills the base part: the real engine's data must fit. Room for several fixed
  // 2048-character fields, the style of the plug-ins' own records, and link tables besides.
#if VORN_ENGINE_ROOM
  static constexpr std::size_t kDataBytes = 8192;
#else
  static constexpr std::size_t kDataBytes = sizeof(void*);
#endif

 private:
  struct State;
  // The stand-in keeps its state elsewhere; nothing but this pointer lives in the room.
  State* state_;
#if VORN_ENGINE_ROOM
  [[maybe_unused]] unsigned char reserved_[kDataBytes - sizeof(State*)];
#endif
};

static_assert(sizeof(Vorn_Channel) == sizeof(void*) + Vorn_Channel::kDataBytes,
              "the table pointer and the engine's room, nothing else");
