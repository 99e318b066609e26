// Edits that can reach the running effect at once: a change confined to one inline value, vector,
// matrix or envelope of one link is copied into the channel already linked there, so the next
// frame shows it without re-simulating. Anything else (a new link, a named channel, an animated
// value, a channel's own settings) needs the scene built afresh.
#pragma once

#include <string>

#include "tools/scene/json_values.h"
#include "tools/scene/scene.h"

namespace apestudio {

struct LinkPlace {
  std::string Channel;  // its name in the scene
  std::string LinkKey;  // as the document writes it: the link's name or its index in digits
};

// The link when `before` and `after` differ only inside the value of one link of one named
// channel, and both values are inline ones that a channel already linked there can take.
bool FindLiveEditableChange(const apescene::Json& before, const apescene::Json& after,
                            LinkPlace* place);

// Copies the value of the link at `place` from `source` (the edited scene, loaded to check it)
// into `live`. False when either scene lacks the channel or its linked child, or the link is not
// of a kind that can be copied.
bool CopyLinkValue(const apescene::Scene& source, apescene::Scene& live, const LinkPlace& place);

}  // namespace apestudio
