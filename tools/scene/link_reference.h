// What every child link of every channel type the tools know means: its index and name as the
// channel declares them, the type of channel it takes, the unit its value is read in, what the
// channel does when it is left empty, one sentence of meaning and the group it belongs to.
// docs/links.md, `ape-render --list-links` and the scene check all read this one table.
#pragma once

#include <span>
#include <string_view>
#include <vector>

namespace apescene {

struct LinkReference {
  std::string_view ChannelType;  // as the scene format names it, e.g. "AdvancedParticleEmitter"
  int Index;                     // the child index
  std::string_view Name;         // exactly as the channel declares it
  std::string_view Type;         // the channel type the link takes, e.g. "Value"
  std::string_view Unit;         // e.g. "units per logic step", "seconds", "0..255", "yes/no"
  std::string_view Default;      // what holds while nothing is linked
  std::string_view Meaning;      // one sentence
  std::string_view Group;        // e.g. "emission", "collision"
  // How many "per logic step" the unit carries: 1 for speeds and spin, 2 for forces (added to a
  // velocity every step), 0 otherwise. A per-second value is divided by the logic rate this often.
  int StepPower = 0;
};

// Every link of the type, in index order; empty for a type the table does not know (or one
// without links).
std::span<const LinkReference> LinkReferences(std::string_view channelTypeName);
// The channel types with links, in the order docs/links.md lists them.
std::vector<std::string_view> KnownChannelTypes();
// The link of the type with exactly this name, or null.
const LinkReference* FindLinkReference(std::string_view channelTypeName, std::string_view name);

}  // namespace apescene
