// The host's channel base class: a node of the host graph with numbered child links.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "host/channel_records.h"
#include "platform/windows_types.h"

class Qen_HostContext;
class Qen_ChannelGroup;
class QenFileSaver;
class QenFileLoader;
struct ChildInfo;

// What a channel declares it needs loaded: runtime libraries by file name and channel types by
// GUID, in declaration order.
struct Qen_Dependency {
  enum class Kind { Library, ChannelType };
  Kind DependencyKind;
  std::string LibraryName;  // Kind::Library
  GUID TypeGuid;            // Kind::ChannelType
};

class Qen_List {
 public:
  void Append(const Qen_Dependency& dependency) { Entries.push_back(dependency); }
  std::vector<Qen_Dependency> Entries;
};

class Qen_Channel {
 public:
  // Takes the current host context (Qen_HostContext::Current()) and registers with it.
  Qen_Channel();
  Qen_Channel(const Qen_Channel& other);
  Qen_Channel& operator=(const Qen_Channel& other);

  // Virtual operations, in slot order.
  virtual ~Qen_Channel();
  virtual void CallChannel();
  virtual void OneTimeInitialize();
  virtual void DoEvent(int event, unsigned long data);
  virtual ChannelType GetChannelType();
  virtual bool SaveChannel(QenFileSaver& saver);
  virtual bool LoadChannel(QenFileLoader& loader, Qen_ChannelGroup* group);
  virtual void SetChannelInterfaceType(int type);
  virtual Qen_Channel* GetChannelFromChannel(Qen_Channel* channel, ChildInfo* info);
  virtual std::uint32_t GetTimeStamp();
  virtual void SetTimeStamp();
  virtual void DoDependencyInit(Qen_List* list);
  virtual void CheckIndexNrRemoval(int index);

  // Name.
  void SetChannelName(const char* name);
  const std::string& GetChannelName() const { return ChannelName; }

  // Declared child links.
  void SetChildCreationCount(int count);
  // Declares (or redeclares) the link at `index`, growing the table as needed.
  void SetChildCreateType(ChildCreation record, int index);
  int GetChildCreationCount() const;
  // Null when no link is declared at `index`.
  const ChildCreation* GetChildCreation(int index) const;
  // Index of the declared link with this name, or -1.
  int FindChildLinkByName(const std::string& name) const;

  // Reading links.
  Qen_Channel* GetChild(int index) const;
  int GetChildLinkPositionCount(int index) const;
  Qen_Channel* GetChildFromLinkPosition(int index, int position) const;

  // Linking: the host's own API. A channel whose type (or base type) GUID does not match the
  // declared link's type is refused with false; so is an undeclared index.
  // SetChild links a single-channel link (null unlinks it).
  bool SetChild(int index, Qen_Channel* child);
  // AddChild appends to a many-channel link (declared with link position -1).
  bool AddChild(int index, Qen_Channel* child);
  // Empties a link of either kind.
  void ClearChild(int index);
  // Drops every link to `child` (the host calls it when a channel goes away).
  void UnlinkEverywhere(const Qen_Channel* child);

  // Dependencies.
  void AddDLLDepend(const char* file_name, Qen_List* list);
  void AddChannelGuidDepend(GUID type, Qen_List* list);

  Qen_HostContext* GetHostContext() const { return HostContext; }

  // The most links a channel may declare; a larger index or count is refused.
  static constexpr int kMaximumLinkCount = 4096;

 protected:
  Qen_HostContext* HostContext;

 private:
  struct LinkSlot {
    ChildCreation Declaration;
    bool Declared = false;
    std::vector<Qen_Channel*> Channels;  // one entry at most for a single-channel link
  };
  bool Accepts(const LinkSlot& slot, Qen_Channel* child);
  LinkSlot* DeclaredSlot(int index);
  const LinkSlot* DeclaredSlot(int index) const;
  // Every change of a link goes through these two, so that Parents stays exact.
  void Link(LinkSlot& slot, Qen_Channel* child);
  void UnlinkAt(LinkSlot& slot, std::size_t position);
  void EmptySlot(LinkSlot& slot);
  // Drops the links other channels hold to this one.
  void DetachFromParents();
  void CopyLinksFrom(const Qen_Channel& other);

  // The context forgets its channels' context pointer when it goes first, and unlinks a
  // channel it unregisters.
  friend class Qen_HostContext;

  std::string ChannelName;
  std::vector<LinkSlot> Links;
  std::uint32_t TimeStamp = 0;
  // The channels whose links hold this one, once per link entry: a channel going away leaves
  // nothing dangling, whichever context its parents belong to.
  std::vector<Qen_Channel*> Parents;
};
