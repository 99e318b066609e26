#include "tools/scene/plugin_types.h"

#include <algorithm>
#include <filesystem>

#include "host/plugin_loader.h"
#include "host/type_guids.h"

namespace apescene {

PluginTypeReport LoadPluginTypes(PluginLoader& loader) {
  PluginTypeReport report;
  for (const BuiltInChannelType& type : BuiltInChannelTypes())
    report.TypeNames.emplace_back(type.Record.TypeName);

  std::vector<GUID> guids = {kAdvancedParticleEmitterGuid, kObjectDataGuid, kEnvelopeStorageGuid,
                             kMultiCollisionManagerGuid,   kAttractorGuid,  kSmokeSettingsGuid};
  std::error_code ec;
  for (const auto& entry : std::filesystem::directory_iterator(loader.Folder(), ec)) {
    GUID guid;
    if (entry.path().extension() == ".so" && ParseGuid(entry.path().stem().string(), &guid) &&
        std::find(guids.begin(), guids.end(), guid) == guids.end())
      guids.push_back(guid);
  }
  for (const GUID& guid : guids) {
    std::string error;
    if (!loader.LoadType(guid, &error)) {
      report.Problems.push_back(error);
      continue;
    }
    if (const ChannelType* record = loader.GetTypeRecord(guid)) {
      const std::string name = record->TypeName;
      if (std::find(report.TypeNames.begin(), report.TypeNames.end(), name) ==
          report.TypeNames.end())
        report.TypeNames.push_back(name);
    }
  }
  return report;
}

}  // namespace apescene
