#include "host/type_guids.h"
#include "plugin/advanced_particle_emitter.h"

// The C and C++ runtimes this plug-in is built against, then the channel types it calls.
void Tev_AdvancedParticleEmitter::DoDependencyInit(Qen_List* list) {
  AddDLLDepend("libc.so.6", list);
  AddDLLDepend("libstdc++.so.6", list);
  AddChannelGuidDepend(kDeviceChannelGuid, list);
  AddChannelGuidDepend(kAttractorGuid, list);
  AddChannelGuidDepend(kEnvelopeStorageGuid, list);
  AddChannelGuidDepend(kSmokeSettingsGuid, list);
  AddChannelGuidDepend(kMultiCollisionManagerGuid, list);
}
