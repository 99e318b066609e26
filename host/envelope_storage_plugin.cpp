// The "EnvelopeStorage" plug-in library's entry points.
#include "host/envelope_storage.h"
#include "host/plugin_exports.h"
#include "host/type_guids.h"

APE_CHANNEL_PLUGIN(Tev_EnvelopeStorage, "EnvelopeStorage", kEnvelopeStorageGuid, GUID{}, 0)
