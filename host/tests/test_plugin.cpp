// One source for the loader tests' plug-ins; TEST_PLUGIN_VARIANT picks what it gets wrong.
#include <stdexcept>

#include "host/plugin_exports.h"
#include "host/tests/test_plugin_guids.h"
#include "host/type_guids.h"

namespace {
constexpr GUID kOwnType = TestPluginGuid(TEST_PLUGIN_VARIANT);
constexpr int kVariant = TEST_PLUGIN_VARIANT;
}  // namespace

class TestPluginChannel : public Qen_Channel {
 public:
  TestPluginChannel() {
    if (kVariant == TEST_PLUGIN_NULL_INIT) throw std::runtime_error("no channel");  // InitDLL: null
  }
  ChannelType GetChannelType() override;
  void DoDependencyInit(Qen_List* list) override {
    if (kVariant == TEST_PLUGIN_THROWING) throw std::runtime_error("dependency declaration failed");
    if (kVariant == TEST_PLUGIN_MISSING_LIBRARY) AddDLLDepend("libape-no-such-runtime.so.9", list);
    if (kVariant != TEST_PLUGIN_DEPENDENT) return;
    AddDLLDepend("libc.so.6", list);
    AddChannelGuidDepend(kObjectDataGuid, list);
    AddChannelGuidDepend(kValueGuid, list);
    AddChannelGuidDepend(kOwnType, list);  // a cycle, which the loader must end
  }
};

#if TEST_PLUGIN_VARIANT == TEST_PLUGIN_NO_INIT
#define InitDLL NotInitDLL  // the library exports no InitDLL
#endif
APE_CHANNEL_PLUGIN(TestPluginChannel, "Loader Test", kOwnType, GUID{}, 0)
