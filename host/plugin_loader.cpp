// Loads channel plug-in libraries named after their type GUIDs and creates channels of any
// known type. Every failure answers false with a message naming the file or GUID; nothing a
// plug-in throws leaves the loader.
#include "host/plugin_loader.h"

#include <dlfcn.h>

#include <cstdlib>
#include <cstring>
#include <exception>
#include <filesystem>
#include <memory>

namespace {

// Dependency chains deeper than this are taken for a fault in the plug-ins' declarations.
constexpr int kMaximumDependencyDepth = 16;

bool Fail(std::string* error, const std::string& message) {
  if (error != nullptr) *error = message;
  return false;
}

std::string DlErrorText() {
  const char* text = dlerror();
  return text != nullptr ? text : "unknown error";
}

std::string TypeNameOf(const ChannelType& record) {
  return std::string(record.TypeName, strnlen(record.TypeName, sizeof(record.TypeName)));
}

// A declared runtime library is present when it is loaded already or can be loaded.
bool RuntimeLibraryPresent(const std::string& name, std::string* why) {
  dlerror();
  void* handle = dlopen(name.c_str(), RTLD_NOLOAD | RTLD_LAZY);
  if (handle == nullptr) handle = dlopen(name.c_str(), RTLD_LAZY | RTLD_LOCAL);
  if (handle == nullptr) {
    *why = DlErrorText();
    return false;
  }
  dlclose(handle);
  return true;
}

template <typename Function>
Function LookUp(void* library, const char* symbol) {
  return reinterpret_cast<Function>(dlsym(library, symbol));
}

}  // namespace

std::string PluginLoader::DefaultPluginFolder() {
  const char* folder = std::getenv("APE_PLUGIN_DIR");
  if (folder != nullptr && folder[0] != '\0') return folder;
  return APE_DEFAULT_PLUGIN_DIR;
}

PluginLoader::PluginLoader(std::string folder) : folder_(std::move(folder)) {
  for (const BuiltInChannelType& built_in : BuiltInChannelTypes()) {
    LoadedType type;
    type.Record = built_in.Record;
    type.CreateBuiltIn = built_in.Create;
    types_.emplace_back(built_in.Record.TypeGuid, type);
  }
}

PluginLoader::~PluginLoader() {
  TruncateTypes(0);
}

bool PluginLoader::LoadType(GUID type, std::string* error) {
  const std::size_t mark = types_.size();
  try {
    return LoadType(type, error, 0);
  } catch (const std::exception& exception) {
    TruncateTypes(mark);
    return Fail(error, "loading type " + FormatGuid(type) + " threw: " + exception.what());
  } catch (...) {
    TruncateTypes(mark);
    return Fail(error, "loading type " + FormatGuid(type) + " threw an unknown exception");
  }
}

bool PluginLoader::LoadType(GUID type, std::string* error, int depth) {
  // A type being loaded is already listed, so a cycle of dependencies ends here.
  if (Find(type) != nullptr) return true;
  if (depth > kMaximumDependencyDepth)
    return Fail(error, "dependencies nest deeper than " + std::to_string(kMaximumDependencyDepth) +
                           " at type " + FormatGuid(type));
  return LoadPluginLibrary(type, error, depth);
}

bool PluginLoader::LoadPluginLibrary(GUID type, std::string* error, int depth) {
  const std::string guid_text = FormatGuid(type);
  const std::filesystem::path path = std::filesystem::path(folder_) / (guid_text + ".so");
  std::error_code ignored;
  if (!std::filesystem::is_directory(folder_, ignored))
    return Fail(error, "plug-in folder " + folder_ + " not found (loading type " + guid_text + ")");
  if (!std::filesystem::exists(path, ignored))
    return Fail(error, "plug-in file " + path.string() + " not found for type " + guid_text);

  dlerror();
  void* library = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (library == nullptr)
    return Fail(error, "cannot load plug-in " + path.string() + ": " + DlErrorText());
  auto unload = [&](const std::string& message) {
    dlclose(library);
    return Fail(error, message);
  };

  dlerror();
  const auto get_type = LookUp<GetTypeFunction>(library, "GetType");
  if (get_type == nullptr)
    return unload("plug-in " + path.string() + " has no GetType: " + DlErrorText());
  dlerror();
  const auto init_dll = LookUp<InitDllFunction>(library, "InitDLL");
  if (init_dll == nullptr)
    return unload("plug-in " + path.string() + " has no InitDLL: " + DlErrorText());

  // Code of the plug-in runs from here on: what it throws is reported, never passed on.
  LoadedType loaded;
  try {
    const ChannelType* record = get_type();
    if (record == nullptr) return unload("GetType of plug-in " + path.string() + " gave no record");
    if (!(record->TypeGuid == type))
      return unload("plug-in " + path.string() + " declares type " + FormatGuid(record->TypeGuid) +
                    ", not " + guid_text);
    loaded.Record = *record;
    // One probe channel tells what the type's channels need.
    std::unique_ptr<Qen_Channel> probe(init_dll());
    if (probe == nullptr)
      return unload("InitDLL of plug-in " + path.string() + " created no channel");
    probe->DoDependencyInit(&loaded.Dependencies);
  } catch (const std::exception& exception) {
    return unload("plug-in " + path.string() + " threw: " + exception.what());
  } catch (...) {
    return unload("plug-in " + path.string() + " threw an unknown exception");
  }
  loaded.Library = library;
  loaded.Create = init_dll;

  const std::size_t mark = types_.size();
  const Qen_List dependencies = loaded.Dependencies;
  types_.emplace_back(type, std::move(loaded));  // from here the list owns the library
  for (const Qen_Dependency& dependency : dependencies.Entries) {
    std::string why;
    if (dependency.DependencyKind == Qen_Dependency::Kind::Library) {
      if (!RuntimeLibraryPresent(dependency.LibraryName, &why)) {
        TruncateTypes(mark);
        return Fail(error, "runtime library " + dependency.LibraryName + " needed by plug-in " +
                               path.string() + " is missing: " + why);
      }
    } else if (!LoadType(dependency.TypeGuid, &why, depth + 1)) {
      TruncateTypes(mark);
      return Fail(error, "type " + FormatGuid(dependency.TypeGuid) + " needed by plug-in " +
                             path.string() + " cannot be loaded: " + why);
    }
  }
  return true;
}

Qen_Channel* PluginLoader::CreateChannel(GUID type, std::string* error) {
  if (!LoadType(type, error)) return nullptr;
  const LoadedType* loaded = Find(type);
  Qen_Channel* channel = nullptr;
  try {
    channel = loaded->Create != nullptr ? loaded->Create() : loaded->CreateBuiltIn();
  } catch (...) {
    channel = nullptr;
  }
  if (channel == nullptr)
    Fail(error, "creating a channel of type " + FormatGuid(type) + " (" +
                    TypeNameOf(loaded->Record) + ") failed");
  return channel;
}

Qen_Channel* PluginLoader::CreateChannelByName(const std::string& type_name, std::string* error) {
  for (const auto& [guid, loaded] : types_)
    if (TypeNameOf(loaded.Record) == type_name) return CreateChannel(guid, error);
  Fail(error, "no loaded or built-in channel type is named \"" + type_name + "\"");
  return nullptr;
}

const ChannelType* PluginLoader::GetTypeRecord(GUID type) const {
  const LoadedType* loaded = Find(type);
  return loaded != nullptr ? &loaded->Record : nullptr;
}

const Qen_List* PluginLoader::GetDependencies(GUID type) const {
  const LoadedType* loaded = Find(type);
  return loaded != nullptr ? &loaded->Dependencies : nullptr;
}

PluginLoader::LoadedType* PluginLoader::Find(GUID type) {
  for (auto& [guid, loaded] : types_)
    if (guid == type) return &loaded;
  return nullptr;
}

const PluginLoader::LoadedType* PluginLoader::Find(GUID type) const {
  return const_cast<PluginLoader*>(this)->Find(type);
}

void PluginLoader::TruncateTypes(std::size_t count) {
  while (types_.size() > count) {
    if (types_.back().second.Library != nullptr) dlclose(types_.back().second.Library);
    types_.pop_back();
  }
}
