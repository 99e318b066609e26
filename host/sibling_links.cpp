#include "host/sibling_links.h"

void DeclareSiblingLinks(Qen_Channel& channel, const SiblingLink* links, std::size_t count) {
  channel.SetChildCreationCount(static_cast<int>(count));
  for (std::size_t i = 0; i < count; ++i) {
    const int index = static_cast<int>(i);
    ChildCreation link;
    link.Type.SetTypeName(links[i].TypeName);
    link.Type.TypeGuid = links[i].TypeGuid;
    link.LinkPosition = links[i].Many ? -1 : index;
    link.SetLinkName(links[i].Name);
    channel.SetChildCreateType(link, index);
  }
}
