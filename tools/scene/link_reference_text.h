// The link reference written out for people: docs/links.md (Markdown) and the listing of
// `ape-render --list-links` (plain text).
#pragma once

#include <string>
#include <string_view>

namespace apescene {

// The whole of docs/links.md. The repository's copy is kept equal to it by a test; rewrite it
// with the `links-doc` build target.
std::string LinkReferenceMarkdown();

// Every link of one channel type, grouped, for a terminal; empty for an unknown type.
std::string LinkListing(std::string_view channelTypeName);

// How a per-logic-step value is turned into one per second and back, as docs/links.md and the
// listing both say it.
std::string_view PerSecondNote();

}  // namespace apescene
