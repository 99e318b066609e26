// The emitter as a plug-in library: found by its GUID file name, entry points unmangled.
#include <dlfcn.h>

#include <cstring>
#include <string>

#include <gtest/gtest.h>

#include "host/host_context.h"
#include "host/plugin_loader.h"
#include "host/type_guids.h"

namespace {

std::string EmitterLibraryPath() {
  return PluginLoader::DefaultPluginFolder() + "/" + kAdvancedParticleEmitterGuidText + ".so";
}

TEST(EmitterPlugin, ExportsUnmangledEntryPointsAndAStableTypeRecord) {
  void* library = dlopen(EmitterLibraryPath().c_str(), RTLD_NOW | RTLD_LOCAL);
  ASSERT_NE(library, nullptr) << dlerror();
  auto get_type = reinterpret_cast<GetTypeFunction>(dlsym(library, "GetType"));
  auto init_dll = reinterpret_cast<InitDllFunction>(dlsym(library, "InitDLL"));
  ASSERT_NE(get_type, nullptr);
  ASSERT_NE(init_dll, nullptr);

  ChannelType* first = get_type();
  ChannelType snapshot = *first;
  ChannelType* second = get_type();
  EXPECT_EQ(first, second);
  EXPECT_EQ(std::memcmp(&snapshot, second, sizeof(ChannelType)), 0);

  EXPECT_STREQ(first->TypeName, "AdvancedParticleEmitter");
  EXPECT_EQ(first->TypeGuid, kAdvancedParticleEmitterGuid);
  EXPECT_EQ(first->BaseTypeGuid, kObjectDataGuid);
  EXPECT_EQ(first->TypeWord, 1u);
  ChannelType fresh;
  EXPECT_EQ(std::memcmp(first->Reserved112, fresh.Reserved112, 8), 0);
  EXPECT_EQ(std::memcmp(first->Reserved124, fresh.Reserved124, 8), 0);
  dlclose(library);
}

TEST(EmitterPlugin, LoaderLoadsItWithItsDependenciesAndCreatesEmitters) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  PluginLoader loader;
  std::string error;
  ASSERT_TRUE(loader.LoadType(kAdvancedParticleEmitterGuid, &error)) << error;
  // Its declared channel types came with it.
  for (GUID type : {kAttractorGuid, kEnvelopeStorageGuid, kSmokeSettingsGuid,
                    kMultiCollisionManagerGuid, kDeviceChannelGuid})
    EXPECT_NE(loader.GetTypeRecord(type), nullptr) << FormatGuid(type);

  Qen_Channel* emitter = loader.CreateChannel(kAdvancedParticleEmitterGuid, &error);
  ASSERT_NE(emitter, nullptr) << error;
  EXPECT_EQ(emitter->GetChannelName(), "AdvancedParticleEmitter");
  EXPECT_EQ(emitter->GetChildCreationCount(), 54);
  EXPECT_EQ(emitter->GetChannelType().TypeGuid, kAdvancedParticleEmitterGuid);
  delete emitter;

  Qen_Channel* by_name = loader.CreateChannelByName("AdvancedParticleEmitter", &error);
  ASSERT_NE(by_name, nullptr) << error;
  delete by_name;
}

}  // namespace
