// The engine's channel: a named, typed node with numbered child links. Plug-in channel classes
// derive from it; the engine owns every channel and destroys it through the virtual destructor.
#pragma once

#include <string>
#include <vector>

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

  // Called by channel plug-ins.
  void SetChannelName(const char* name);
  const char* GetChannelName() const;
  void SetChildCreationCount(int count);
  void SetChildCreateType(ChildCreation record, int link);
  Vorn_Channel* GetChild(int link) const;
  Vorn_Channel* GetChildFromLinkPosition(int link, int position) const;
  int GetChildLinkPositionCount(int link) const;

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

 private:
  struct Link {
    bool declared = false;
    ChildCreation record;
    std::vector<Vorn_Channel*> positions;  // not owned; null marks an empty position
  };

  const Link* FindLink(int link) const;
  bool Admits(int link, Vorn_Channel* child) const;

  std::string name_;
  ChannelType type_;
  int childCreationCount_ = 0;
  std::vector<Link> links_;
  unsigned long timeStamp_ = 0;
  int interfaceType_ = 0;
};
