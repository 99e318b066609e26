// The "AdvPE_Attractor" plug-in library's entry points.
#include "host/attractor.h"
#include "host/plugin_exports.h"
#include "host/type_guids.h"

APE_CHANNEL_PLUGIN(Tev_AdvPE_Attractor, "AdvPE_Attractor", kAttractorGuid, GUID{}, 0)
