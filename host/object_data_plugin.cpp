// The "3D ObjectData" plug-in library's entry points.
#include "host/object_data_channel.h"
#include "host/plugin_exports.h"
#include "host/type_guids.h"

APE_CHANNEL_PLUGIN(Tev_DX8_ObjectDataChannel, "3D ObjectData", kObjectDataGuid, GUID{}, 0)
