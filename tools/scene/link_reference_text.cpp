#include "tools/scene/link_reference_text.h"

#include <vector>

#include "tools/scene/link_reference.h"

namespace apescene {
namespace {

// The groups of a type in the order their first link appears.
std::vector<std::string_view> GroupsOf(std::string_view type) {
  std::vector<std::string_view> groups;
  for (const LinkReference& link : LinkReferences(type)) {
    bool seen = false;
    for (std::string_view group : groups) seen = seen || group == link.Group;
    if (!seen) groups.push_back(link.Group);
  }
  return groups;
}

// A table cell: a "|" would end the cell early.
std::string Cell(std::string_view text) {
  std::string cell;
  for (char c : text) {
    if (c == '|') cell += '\\';
    cell += c;
  }
  return cell;
}

constexpr std::string_view kIntroduction =
    R"(Every child link of the channel types that have links, as the scene loader, `ape-render
--list-links` and the scene check know them. Write a link in a scene by its name exactly as
given here (or by its index as a string, `"6"`); see [scene-format.md](scene-format.md) for the
values a link takes. This file is generated from `tools/scene/link_reference.cpp` (build the
`links-doc` target to rewrite it); a test keeps the two equal.

Columns: the link's index and name; the type of channel it takes; the unit its value is read
in; what holds while nothing is linked; what it does.

Things that surprise people:

- Velocities, forces and spin are per logic step ("Logic Updates Per Second"), not per second.
  A scene may write them per second instead (below).
- Colour and alpha envelopes run 0..255 (scene colours run 0..1); without colour envelopes
  particles are black, and without "Use Vertex Alpha Fading?" they are drawn as opaque squares
  and the alpha envelope does nothing.
- Every lifetime envelope is read at the fraction of the particle's life, 0 at birth and 1 at
  its end, whatever the keys' range; the attached envelopes at the fraction of the attached
  life. Smoke pair envelopes are read at a distance.
- A sliding particle's size is the sum of "Sliding Size Offset Envelope", its size multiplier
  (at least 1) and its size when it began to slide, so without that envelope sliding particles
  are drawn more than one unit wide; `[[0, -1], [1, -1]]` keeps them at their flight size.
- "Emitter_Active?", "Births Per Second" and "Logic Updates Per Second" must all be linked, or
  nothing is born, moves or ages.
- "ParticleCount" is the cost: every logic step visits every record of the pool.
- Rates ("Bounce Rate", "Attach Rate", ...) are chances from 0 to 1 in steps of 0.01.

`ape-render --check SCENE` warns about these and other likely mistakes.
)";

}  // namespace

std::string_view PerSecondNote() {
  return R"(Per-second values: a unit "per logic step" times the logic rate is per second, and
"per logic step per logic step" times the rate squared is per second squared. At 60 logic steps
a second, a speed of 3 units/s is 3 / 60 = 0.05 per step and a gravity of 9.8 units/s^2 is
9.8 / 60^2 = 0.00272 per step per step. An emitter link of such a unit may be written per
second in a scene and is converted with the emitter's own "Logic Updates Per Second" (a plain
number): {"per_second": 3} for a speed or spin, {"per_second_squared": [0, -9.8, 0]} for a
force ("Simulation Scaler" multiplies them further, as it does every per-step value). Attractor
and smoke settings take per-step values only (they serve any emitter): divide by the rate of the
emitter that uses them.)";
}

std::string LinkReferenceMarkdown() {
  std::string text = "# Links\n\n";
  text += kIntroduction;
  text += "\n## Per-second values\n\n";
  text += PerSecondNote();
  text += "\n";
  for (std::string_view type : KnownChannelTypes()) {
    const auto links = LinkReferences(type);
    text += "\n## " + std::string(type) + " (" + std::to_string(links.size()) + " link" +
            (links.size() == 1 ? "" : "s") + ")\n";
    for (std::string_view group : GroupsOf(type)) {
      text += "\n### " + std::string(type) + ": " + std::string(group) + "\n\n";
      text += "| index | link | type | unit | unlinked | meaning |\n";
      text += "|---|---|---|---|---|---|\n";
      for (const LinkReference& link : links) {
        if (link.Group != group) continue;
        text += "| " + std::to_string(link.Index) + " | \"" + Cell(link.Name) + "\" | " +
                Cell(link.Type) + " | " + Cell(link.Unit) + " | " + Cell(link.Default) + " | " +
                Cell(link.Meaning) + " |\n";
      }
    }
  }
  return text;
}

std::string LinkListing(std::string_view channelTypeName) {
  const auto links = LinkReferences(channelTypeName);
  if (links.empty()) return "";
  std::string text = std::string(channelTypeName) + ": " + std::to_string(links.size()) + " link" +
                     (links.size() == 1 ? "" : "s") + ", by group\n";
  for (std::string_view group : GroupsOf(channelTypeName)) {
    text += "\n" + std::string(group) + "\n";
    for (const LinkReference& link : links) {
      if (link.Group != group) continue;
      text += "  " + std::to_string(link.Index) + " \"" + std::string(link.Name) + "\" (" +
              std::string(link.Type) + ")\n";
      text += "      unit: " + std::string(link.Unit) + "; unlinked: " + std::string(link.Default) +
              "\n";
      text += "      " + std::string(link.Meaning) + "\n";
    }
  }
  bool per_step = false;
  for (const LinkReference& link : links) per_step = per_step || link.StepPower > 0;
  if (per_step) text += "\n" + std::string(PerSecondNote()) + "\n";
  return text;
}

}  // namespace apescene
