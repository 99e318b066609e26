// Makes every channel type a scene may name available in a plug-in loader: the host's built-in
// types, the plug-in types of this installation (host/type_guids.h) and any other "{GUID}.so" in
// the plug-in folder.
#pragma once

#include <string>
#include <vector>

class PluginLoader;

namespace apescene {

struct PluginTypeReport {
  std::vector<std::string> TypeNames;  // every type that can be created, built-in first
  std::vector<std::string> Problems;   // one line per plug-in that could not be loaded
};

PluginTypeReport LoadPluginTypes(PluginLoader& loader);

}  // namespace apescene
