// The library's entry points: GetType, InitDLL and the load-time attach.
#include "host/plugin_exports.h"
#include "host/type_guids.h"
#include "plugin/advanced_particle_emitter.h"

APE_CHANNEL_PLUGIN(Tev_AdvancedParticleEmitter, "AdvancedParticleEmitter",
                   kAdvancedParticleEmitterGuid, kObjectDataGuid, 1)
