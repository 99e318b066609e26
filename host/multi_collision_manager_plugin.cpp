// The "MultiCollisionManager" plug-in library's entry points.
#include "host/multi_collision_manager.h"
#include "host/plugin_exports.h"
#include "host/type_guids.h"

APE_CHANNEL_PLUGIN(Tev_MultiCollisionManager, "MultiCollisionManager", kMultiCollisionManagerGuid,
                   GUID{}, 0)
