// The "AdvPE_SmokeSettings" plug-in library's entry points.
#include "host/plugin_exports.h"
#include "host/smoke_settings.h"
#include "host/type_guids.h"

APE_CHANNEL_PLUGIN(Tev_AdvPE_SmokeSettings, "AdvPE_SmokeSettings", kSmokeSettingsGuid, GUID{}, 0)
