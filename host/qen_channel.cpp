// The channel base: name, declared child links, the links themselves and dependencies.
#include "host/qen_channel.h"

#include <algorithm>
#include <cstring>

#include "host/host_context.h"

Qen_Channel::Qen_Channel() : HostContext(Qen_HostContext::Current()) {
  if (HostContext != nullptr) HostContext->RegisterChannel(this);
}

// The copy joins its source's host: the channels it now links live there.
Qen_Channel::Qen_Channel(const Qen_Channel& other)
    : HostContext(other.HostContext), ChannelName(other.ChannelName), TimeStamp(other.TimeStamp) {
  CopyLinksFrom(other);
  if (HostContext != nullptr) HostContext->RegisterChannel(this);
}

Qen_Channel& Qen_Channel::operator=(const Qen_Channel& other) {
  if (this == &other) return *this;
  ChannelName = other.ChannelName;
  TimeStamp = other.TimeStamp;
  CopyLinksFrom(other);
  return *this;
}

Qen_Channel::~Qen_Channel() {
  if (HostContext != nullptr) HostContext->UnregisterChannel(this);
  DetachFromParents();
  for (LinkSlot& slot : Links) EmptySlot(slot);
}

void Qen_Channel::CopyLinksFrom(const Qen_Channel& other) {
  for (LinkSlot& slot : Links) EmptySlot(slot);
  Links.clear();
  Links.resize(other.Links.size());
  for (std::size_t i = 0; i < other.Links.size(); ++i) {
    Links[i].Declaration = other.Links[i].Declaration;
    Links[i].Declared = other.Links[i].Declared;
    for (Qen_Channel* child : other.Links[i].Channels) Link(Links[i], child);
  }
}

// --- Default virtual operations: a plain channel does nothing on its own. ---

void Qen_Channel::CallChannel() {}
void Qen_Channel::OneTimeInitialize() {}
void Qen_Channel::DoEvent(int, unsigned long) {}
ChannelType Qen_Channel::GetChannelType() {
  return ChannelType();
}
// Name and links are the host's to save; the base has nothing more of its own.
bool Qen_Channel::SaveChannel(QenFileSaver&) {
  return true;
}
bool Qen_Channel::LoadChannel(QenFileLoader&, Qen_ChannelGroup*) {
  return true;
}
void Qen_Channel::SetChannelInterfaceType(int) {}
Qen_Channel* Qen_Channel::GetChannelFromChannel(Qen_Channel* channel, ChildInfo*) {
  return channel;
}
std::uint32_t Qen_Channel::GetTimeStamp() {
  return TimeStamp;
}
// Stamps the channel with the host frame it was last touched in.
void Qen_Channel::SetTimeStamp() {
  TimeStamp = HostContext != nullptr ? HostContext->GetFrameCounter() : TimeStamp + 1;
}
void Qen_Channel::DoDependencyInit(Qen_List*) {}
// The host removes link `index`: nothing may stay linked there.
void Qen_Channel::CheckIndexNrRemoval(int index) {
  ClearChild(index);
}

void Qen_Channel::SetChannelName(const char* name) {
  ChannelName = name != nullptr ? name : "";
}

// --- Link declarations ---

void Qen_Channel::SetChildCreationCount(int count) {
  const std::size_t wanted = static_cast<std::size_t>(std::clamp(count, 0, kMaximumLinkCount));
  for (std::size_t i = wanted; i < Links.size(); ++i) EmptySlot(Links[i]);
  Links.resize(wanted);
}

void Qen_Channel::SetChildCreateType(ChildCreation record, int index) {
  if (index < 0 || index >= kMaximumLinkCount) return;
  if (static_cast<std::size_t>(index) >= Links.size())
    Links.resize(static_cast<std::size_t>(index) + 1);
  LinkSlot& slot = Links[static_cast<std::size_t>(index)];
  slot.Declaration = record;
  slot.Declared = true;
  // A redeclared link keeps only the channels its new type accepts, and one at most when it
  // no longer takes many.
  for (std::size_t i = slot.Channels.size(); i-- > 0;) {
    Qen_Channel* child = slot.Channels[i];
    const bool drop = child != nullptr ? !Accepts(slot, child) : record.LinkPosition != -1;
    if (drop) UnlinkAt(slot, i);
  }
  if (record.LinkPosition != -1)
    while (slot.Channels.size() > 1) UnlinkAt(slot, slot.Channels.size() - 1);
}

int Qen_Channel::GetChildCreationCount() const {
  return static_cast<int>(Links.size());
}

const ChildCreation* Qen_Channel::GetChildCreation(int index) const {
  const LinkSlot* slot = DeclaredSlot(index);
  return slot != nullptr ? &slot->Declaration : nullptr;
}

int Qen_Channel::FindChildLinkByName(const std::string& name) const {
  for (std::size_t i = 0; i < Links.size(); ++i) {
    if (!Links[i].Declared) continue;
    const char* link_name = Links[i].Declaration.LinkName;
    const std::size_t length = strnlen(link_name, sizeof(Links[i].Declaration.LinkName));
    if (name.size() == length && name.compare(0, length, link_name, length) == 0)
      return static_cast<int>(i);
  }
  return -1;
}

// --- Reading links ---

Qen_Channel* Qen_Channel::GetChild(int index) const {
  const LinkSlot* slot = DeclaredSlot(index);
  if (slot == nullptr || slot->Channels.empty()) return nullptr;
  return slot->Channels.front();
}

int Qen_Channel::GetChildLinkPositionCount(int index) const {
  const LinkSlot* slot = DeclaredSlot(index);
  return slot != nullptr ? static_cast<int>(slot->Channels.size()) : 0;
}

Qen_Channel* Qen_Channel::GetChildFromLinkPosition(int index, int position) const {
  const LinkSlot* slot = DeclaredSlot(index);
  if (slot == nullptr || position < 0 ||
      static_cast<std::size_t>(position) >= slot->Channels.size())
    return nullptr;
  return slot->Channels[static_cast<std::size_t>(position)];
}

// --- Linking ---

bool Qen_Channel::SetChild(int index, Qen_Channel* child) {
  LinkSlot* slot = DeclaredSlot(index);
  if (slot == nullptr || (child != nullptr && !Accepts(*slot, child))) return false;
  // On a many-channel link SetChild leaves exactly this one channel (or none).
  EmptySlot(*slot);
  if (child != nullptr) Link(*slot, child);
  return true;
}

bool Qen_Channel::AddChild(int index, Qen_Channel* child) {
  LinkSlot* slot = DeclaredSlot(index);
  if (slot == nullptr || slot->Declaration.LinkPosition != -1) return false;
  if (child != nullptr && !Accepts(*slot, child)) return false;
  Link(*slot, child);
  return true;
}

void Qen_Channel::ClearChild(int index) {
  if (LinkSlot* slot = DeclaredSlot(index)) EmptySlot(*slot);
}

void Qen_Channel::UnlinkEverywhere(const Qen_Channel* child) {
  if (child == nullptr) return;
  for (LinkSlot& slot : Links)
    for (std::size_t i = slot.Channels.size(); i-- > 0;)
      if (slot.Channels[i] == child) UnlinkAt(slot, i);
}

// --- Dependencies ---

void Qen_Channel::AddDLLDepend(const char* file_name, Qen_List* list) {
  if (list == nullptr || file_name == nullptr) return;
  list->Append({Qen_Dependency::Kind::Library, file_name, GUID{}});
}

void Qen_Channel::AddChannelGuidDepend(GUID type, Qen_List* list) {
  if (list == nullptr) return;
  list->Append({Qen_Dependency::Kind::ChannelType, std::string(), type});
}

// --- Internals ---

// A zero base type GUID means "no base type", so it never matches a link's type.
bool Qen_Channel::Accepts(const LinkSlot& slot, Qen_Channel* child) {
  const GUID wanted = slot.Declaration.Type.TypeGuid;
  const ChannelType type = child->GetChannelType();
  if (type.TypeGuid == wanted) return true;
  return !(type.BaseTypeGuid == GUID{}) && type.BaseTypeGuid == wanted;
}

Qen_Channel::LinkSlot* Qen_Channel::DeclaredSlot(int index) {
  if (index < 0 || static_cast<std::size_t>(index) >= Links.size()) return nullptr;
  LinkSlot& slot = Links[static_cast<std::size_t>(index)];
  return slot.Declared ? &slot : nullptr;
}

const Qen_Channel::LinkSlot* Qen_Channel::DeclaredSlot(int index) const {
  return const_cast<Qen_Channel*>(this)->DeclaredSlot(index);
}

void Qen_Channel::Link(LinkSlot& slot, Qen_Channel* child) {
  slot.Channels.push_back(child);
  if (child != nullptr) child->Parents.push_back(this);
}

void Qen_Channel::UnlinkAt(LinkSlot& slot, std::size_t position) {
  Qen_Channel* child = slot.Channels[position];
  slot.Channels.erase(slot.Channels.begin() + static_cast<std::ptrdiff_t>(position));
  if (child == nullptr) return;
  auto entry = std::find(child->Parents.begin(), child->Parents.end(), this);
  if (entry != child->Parents.end()) child->Parents.erase(entry);
}

void Qen_Channel::EmptySlot(LinkSlot& slot) {
  while (!slot.Channels.empty()) UnlinkAt(slot, slot.Channels.size() - 1);
}

void Qen_Channel::DetachFromParents() {
  while (!Parents.empty()) {
    Qen_Channel* parent = Parents.back();
    parent->UnlinkEverywhere(this);
    std::erase(Parents, parent);  // progress even if the two lists ever disagreed
  }
}
