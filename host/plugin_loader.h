// Loads channel plug-ins by file name ("{type GUID}.so") from a plug-in folder and creates
// channels of any known type, plug-in or built-in.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "host/channel_records.h"
#include "host/qen_channel.h"

// What every plug-in library exports, unmangled.
extern "C" {
using GetTypeFunction = ChannelType* (*)();
using InitDllFunction = Qen_Channel* (*)();
}

// A channel type built into the host: its record and its factory.
struct BuiltInChannelType {
  ChannelType Record;
  Qen_Channel* (*Create)();
};
// The types the host knows without loading anything: "Value", "Value Vector", "Matrix",
// "Texture" and the device channel.
const std::vector<BuiltInChannelType>& BuiltInChannelTypes();

class PluginLoader {
 public:
  // The folder named by APE_PLUGIN_DIR when set, else the build's plug-in folder.
  static std::string DefaultPluginFolder();

  explicit PluginLoader(std::string folder = DefaultPluginFolder());
  ~PluginLoader();  // unloads the libraries; destroy their channels first
  PluginLoader(const PluginLoader&) = delete;
  PluginLoader& operator=(const PluginLoader&) = delete;

  // Makes the type available: built-in types at once, others by loading "{GUID}.so" and then the
  // libraries of the channel types its channels declare in DoDependencyInit. False, with a
  // message naming the file or GUID in *error, when anything is missing.
  bool LoadType(GUID type, std::string* error);
  // Creates a channel of the type (loading it first). Null with *error on failure. The caller
  // owns the channel and deletes it through its virtual destructor.
  Qen_Channel* CreateChannel(GUID type, std::string* error);
  // The same, by type name ("AdvancedParticleEmitter", "Value"...), for types already loaded or
  // built in.
  Qen_Channel* CreateChannelByName(const std::string& type_name, std::string* error);
  // The type record of a loaded or built-in type, or null.
  const ChannelType* GetTypeRecord(GUID type) const;
  // The dependencies the type's channels declared when it was loaded.
  const Qen_List* GetDependencies(GUID type) const;
  const std::string& Folder() const { return folder_; }

 private:
  struct LoadedType {
    ChannelType Record;
    void* Library = nullptr;  // null for built-in types
    InitDllFunction Create = nullptr;
    Qen_Channel* (*CreateBuiltIn)() = nullptr;
    Qen_List Dependencies;
  };
  bool LoadType(GUID type, std::string* error, int depth);

  LoadedType* Find(GUID type);
  const LoadedType* Find(GUID type) const;
  bool LoadPluginLibrary(GUID type, std::string* error, int depth);
  bool LoadDependencies(LoadedType& loaded, std::string* error, int depth);
  // Forgets (and unloads) every type from `count` on: a failed load leaves nothing behind.
  void TruncateTypes(std::size_t count);

  std::string folder_;
  std::vector<std::pair<GUID, LoadedType>> types_;
};
