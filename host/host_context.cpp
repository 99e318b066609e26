// The host context: frame counter, channel registry and the two message functors.
#include "host/host_context.h"

#include <algorithm>
#include <cstdio>

#include "host/qen_channel.h"

namespace {

// Never destroyed, so that channels living until process exit still find a context.
Qen_HostContext* DefaultContext() {
  static Qen_HostContext* const context = new Qen_HostContext;
  return context;
}

Qen_HostContext* current_context = nullptr;  // null: the default

}  // namespace

void ShowDebugMessage::operator()(const char* text) const {
  const char* line = text != nullptr ? text : "";
  if (!sink_) {
    std::fprintf(stderr, "%s\n", line);
    return;
  }
  // A message must never throw back into the channel that reports it.
  try {
    sink_(line);
  } catch (...) {
    std::fprintf(stderr, "%s\n", line);
  }
}

Qen_HostContext::Qen_HostContext() = default;

Qen_HostContext::~Qen_HostContext() {
  // Channels that outlive their context keep working without one.
  for (Qen_Channel* channel : channels_) channel->HostContext = nullptr;
  if (current_context == this) current_context = nullptr;
}

Qen_HostContext* Qen_HostContext::Current() {
  return current_context != nullptr ? current_context : DefaultContext();
}

// Null goes back to the process-wide default.
void Qen_HostContext::SetCurrent(Qen_HostContext* context) {
  current_context = context;
}

Qen_HostContext::ScopedCurrent::ScopedCurrent(Qen_HostContext* context)
    : previous_(current_context) {
  SetCurrent(context);
}

Qen_HostContext::ScopedCurrent::~ScopedCurrent() {
  SetCurrent(previous_);
}

Qen_Channel* Qen_HostContext::GetChannelByType(GUID type, int option) {
  if (option < 0) return nullptr;
  int seen = 0;
  for (Qen_Channel* channel : channels_) {
    if (!(channel->GetChannelType().TypeGuid == type)) continue;
    if (seen == option) return channel;
    ++seen;
  }
  return nullptr;
}

void Qen_HostContext::RegisterChannel(Qen_Channel* channel) {
  if (channel == nullptr) return;
  if (std::find(channels_.begin(), channels_.end(), channel) == channels_.end())
    channels_.push_back(channel);
}

void Qen_HostContext::UnregisterChannel(Qen_Channel* channel) {
  if (channel == nullptr) return;
  std::erase(channels_, channel);
  // A forgotten channel must not keep a pointer to a context that may go before it.
  if (channel->HostContext == this) channel->HostContext = nullptr;
  channel->DetachFromParents();
}
