// One source for the loader tests' plug-ins; TEST_PLUGIN_VARIANT picks what it gets wrong.
#include <stdexcept>

#include "host/plugin_exports.h"
#include "host/tests/test_plugin_guids.h"
#include "host/type_guids.h"

#define VARIANT_DEPENDENT 1
#define VARIANT_MISSING_LIBRARY 2
#define VARIANT_UNKNOWN_TYPE 3
#define VARIANT_NULL_INIT 4
#define VARIANT_NO_INIT 5
#define VARIANT_CYCLE_FIRST 6
#define VARIANT_CYCLE_SECOND 7
#define VARIANT_THROWING 8

class TestPluginChannel : public Qen_Channel {
 public:
  ChannelType GetChannelType() override;
  void DoDependencyInit(Qen_List* list) override {
#if TEST_PLUGIN_VARIANT == VARIANT_DEPENDENT
    AddDLLDepend("libc.so.6", list);
    AddChannelGuidDepend(kObjectDataGuid, list);
    AddChannelGuidDepend(kValueGuid, list);
#elif TEST_PLUGIN_VARIANT == VARIANT_MISSING_LIBRARY
    AddDLLDepend("libape-no-such-runtime.so.9", list);
#elif TEST_PLUGIN_VARIANT == VARIANT_UNKNOWN_TYPE
    AddChannelGuidDepend(kNowhereGuid, list);
#elif TEST_PLUGIN_VARIANT == VARIANT_CYCLE_FIRST
    AddChannelGuidDepend(kCycleSecondPluginGuid, list);
#elif TEST_PLUGIN_VARIANT == VARIANT_CYCLE_SECOND
    AddChannelGuidDepend(kCycleFirstPluginGuid, list);
#elif TEST_PLUGIN_VARIANT == VARIANT_THROWING
    (void)list;
    throw std::runtime_error("dependency declaration failed");
#else
    (void)list;
#endif
  }
};

#if TEST_PLUGIN_VARIANT == VARIANT_DEPENDENT
#define TEST_PLUGIN_GUID kDependentPluginGuid
#elif TEST_PLUGIN_VARIANT == VARIANT_MISSING_LIBRARY
#define TEST_PLUGIN_GUID kMissingLibraryPluginGuid
#elif TEST_PLUGIN_VARIANT == VARIANT_UNKNOWN_TYPE
#define TEST_PLUGIN_GUID kUnknownTypePluginGuid
#elif TEST_PLUGIN_VARIANT == VARIANT_NULL_INIT
#define TEST_PLUGIN_GUID kNullInitPluginGuid
#elif TEST_PLUGIN_VARIANT == VARIANT_NO_INIT
#define TEST_PLUGIN_GUID kNoInitPluginGuid
#elif TEST_PLUGIN_VARIANT == VARIANT_CYCLE_FIRST
#define TEST_PLUGIN_GUID kCycleFirstPluginGuid
#elif TEST_PLUGIN_VARIANT == VARIANT_CYCLE_SECOND
#define TEST_PLUGIN_GUID kCycleSecondPluginGuid
#elif TEST_PLUGIN_VARIANT == VARIANT_THROWING
#define TEST_PLUGIN_GUID kThrowingPluginGuid
#endif

#if TEST_PLUGIN_VARIANT == VARIANT_NULL_INIT || TEST_PLUGIN_VARIANT == VARIANT_NO_INIT
// Entry points written by hand: InitDLL creates nothing, or is missing.
namespace {
ChannelType& Record() {
  static ChannelType record;
  return record;
}
}  // namespace
extern "C" ChannelType* GetType() {
  ape_plugin::FillTypeRecord(&Record(), "Broken", TEST_PLUGIN_GUID, GUID{}, 0);
  return &Record();
}
#if TEST_PLUGIN_VARIANT == VARIANT_NULL_INIT
extern "C" Qen_Channel* InitDLL() {
  return nullptr;
}
#endif
ChannelType TestPluginChannel::GetChannelType() {
  return *GetType();
}
#else
APE_CHANNEL_PLUGIN(TestPluginChannel, "Loader Test", TEST_PLUGIN_GUID, GUID{}, 0)
#endif
