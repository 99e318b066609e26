// The host's records and context: record bytes, the channel registry, the current context, the
// frame counter and the message functors.
#include <cstring>
#include <stdexcept>

#include "host/tests/test_channels.h"
#include "host/type_guids.h"

namespace {

// Every byte of `record` against runs of (end offset, value) that tile it from offset 0.
template <typename Record>
void ExpectBytes(const Record& record, std::initializer_list<std::pair<std::size_t, int>> runs) {
  const auto* bytes = reinterpret_cast<const std::uint8_t*>(&record);
  std::size_t i = 0;
  for (const auto& [end, value] : runs)
    for (; i < end; ++i) EXPECT_EQ(bytes[i], value) << "byte " << i;
  EXPECT_EQ(i, sizeof(Record));
}

TEST(ChannelRecords, ConstructorsGiveTheHostDefaults) {
  ExpectBytes(ChannelType(), {{132, 0}});
  // Name 0, both GUIDs 0x11, reserved 0, position -1, flags, name and trailing GUID 0, then the
  // words 0 and 1 (little-endian).
  ExpectBytes(ChildCreation(),
              {{80, 0}, {112, 0x11}, {132, 0}, {136, 0xFF}, {260, 0}, {261, 1}, {264, 0}});
}

TEST(ChannelRecords, NamesAreTruncatedAndFillersWriteOnlyTheirFields) {
  ChildCreation link;
  link.SetLinkName(std::string(150, 'L').c_str());
  EXPECT_TRUE(link.LinkName[100] == 'L' && link.LinkName[101] == '\0');
  ChannelType record, expected;
  for (ChannelType* r : {&record, &expected}) std::memset(static_cast<void*>(r), 0xAB, sizeof(*r));
  const std::string long_name(90, 'n');
  ape_plugin::FillTypeRecord(&record, long_name.c_str(), kObjectDataGuid, kDeviceChannelGuid, 7);
  EXPECT_TRUE(record.TypeName[78] == 'n' && record.TypeName[79] == '\0');
  ape_plugin::FillTypeRecord(&record, "3D ObjectData", kObjectDataGuid, kDeviceChannelGuid, 7);
  std::memset(expected.TypeName, 0, sizeof(expected.TypeName));  // no stale bytes after the name
  std::strcpy(expected.TypeName, "3D ObjectData");
  expected.TypeGuid = kObjectDataGuid;
  expected.BaseTypeGuid = kDeviceChannelGuid;
  expected.TypeWord = 7;
  EXPECT_EQ(std::memcmp(&record, &expected, sizeof(record)), 0);
}

using HostContextRegistry = HostContextTest;

TEST_F(HostContextRegistry, GetChannelByTypeCountsOptionsAmongChannelsOfThatType) {
  TypedChannel a0(kTypeA), b0(kTypeB);
  auto a1 = std::make_unique<TypedChannel>(kTypeA);
  TypedChannel a2(kTypeA), derived(kTypeC, kTypeA);  // of type C only, though based on A
  EXPECT_EQ(context_.GetChannelByType(kTypeA, 1), a1.get());
  EXPECT_TRUE(!context_.GetChannelByType(kTypeA, 3) && !context_.GetChannelByType(kTypeA, -1));
  EXPECT_EQ(context_.GetChannelByType(kTypeB, 0), &b0);
  EXPECT_EQ(context_.GetChannelByType(kTypeC, 0), &derived);
  a1.reset();  // a destroyed channel is forgotten
  EXPECT_EQ(context_.GetChannelByType(kTypeA, 1), &a2);
  context_.AdvanceFrame();  // the counter starts at 1
  a2.SetTimeStamp();
  EXPECT_EQ(a2.GetTimeStamp(), 2u);
}

// A channel joins the context current at its construction and may outlive it; a destroyed
// current context gives the process-wide default back.
TEST_F(HostContextRegistry, ChannelsAndTheCurrentPointerMayOutliveAContext) {
  std::unique_ptr<TypedChannel> elsewhere;
  {
    Qen_HostContext other;
    Qen_HostContext::ScopedCurrent scoped(&other);
    elsewhere = std::make_unique<TypedChannel>(kTypeA);
    EXPECT_EQ(elsewhere->GetHostContext(), &other);
  }
  EXPECT_EQ(elsewhere->GetHostContext(), nullptr);
  elsewhere->SetTimeStamp();
  Qen_HostContext::SetCurrent(nullptr);
  Qen_HostContext* fallback = Qen_HostContext::Current();  // the process-wide default
  {
    Qen_HostContext temporary;
    Qen_HostContext::SetCurrent(&temporary);
  }
  EXPECT_EQ(Qen_HostContext::Current(), fallback);
}

TEST_F(HostContextRegistry, MessagesGoToTheirOwnSinkElseToStderr) {
  std::vector<std::string> overload, debug;
  context_.OverloadMessages.SetSink([&](const char* text) { overload.push_back(text); });
  context_.DebugMessages.SetSink([&](const char* text) { debug.push_back(text); });
  context_.OverloadMessages("APE: Too many logic updates per frame");
  context_.DebugMessages(nullptr);
  EXPECT_EQ(overload, std::vector<std::string>{"APE: Too many logic updates per frame"});
  EXPECT_EQ(debug, std::vector<std::string>{""});
  // A sink that throws must not throw back into the channel reporting.
  ShowDebugMessage plain, throwing;
  throwing.SetSink([](const char*) { throw std::runtime_error("sink failed"); });
  testing::internal::CaptureStderr();
  plain("APE: one");
  EXPECT_NO_THROW(throwing("APE: two"));
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "APE: one\nAPE: two\n");
}

}  // namespace
