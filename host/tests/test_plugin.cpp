// One source for the loader tests' plug-ins; TEST_PLUGIN_VARIANT picks what it gets wrong.
#include <stdexcept>

#include "host/plugin_exports.h"
#include "host/tests/test_plugin_guids.h"
#include "host/type_guids.h"

namespace {
constexpr GUID kOwnType = TestPluginGuid(TEST_PLUGIN_VARIANT);
}

class TestPluginChannel : public Qen_Channel {
 public:
  ChannelType GetChannelType() override;
  void DoDependencyInit(Qen_List* list) override {
    if (TEST_PLUGIN_VARIANT == TEST_PLUGIN_THROWING)
      throw std::runtime_error("dependency declaration failed");
    if (TEST_PLUGIN_VARIANT == TEST_PLUGIN_MISSING_LIBRARY)
      AddDLLDepend("libape-no-such-runtime.so.9", list);
    if (TEST_PLUGIN_VARIANT != TEST_PLUGIN_DEPENDENT) return;
    AddDLLDepend("libc.so.6", list);
    AddChannelGuidDepend(kObjectDataGuid, list);
    AddChannelGuidDepend(kValueGuid, list);
    AddChannelGuidDepend(kOwnType, list);  // a cycle, which the loader must end
  }
};

#if TEST_PLUGIN_VARIANT == TEST_PLUGIN_NULL_INIT || TEST_PLUGIN_VARIANT == TEST_PLUGIN_NO_INIT
extern "C" ChannelType* GetType() {
  static ChannelType record;
  ape_plugin::FillTypeRecord(&record, "Broken", kOwnType, GUID{}, 0);
  return &record;
}
ChannelType TestPluginChannel::GetChannelType() {
  return *GetType();
}
#if TEST_PLUGIN_VARIANT == TEST_PLUGIN_NULL_INIT
extern "C" Qen_Channel* InitDLL() {
  return nullptr;
}
#endif
#else
APE_CHANNEL_PLUGIN(TestPluginChannel, "Loader Test", kOwnType, GUID{}, 0)
#endif
