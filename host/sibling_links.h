// How the sibling channels (attractor, smoke settings, collision manager) declare their child
// links to the host.
#pragma once

#include <cstddef>

#include "host/qen_channel.h"
#include "platform/windows_types.h"

struct SiblingLink {
  const char* Name;      // the link's display name
  const char* TypeName;  // the accepted channel type's name
  GUID TypeGuid;         // the accepted channel type's GUID
  bool Many = false;     // takes any number of channels (link position -1)
};

// Declares `links[i]` at child index i, for every i below `count`.
void DeclareSiblingLinks(Qen_Channel& channel, const SiblingLink* links, std::size_t count);
