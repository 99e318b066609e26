// The host context: frame counter, channel registry, current context and the message functors.
#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "host/device_channel.h"
#include "host/tests/test_channels.h"

namespace {

using HostContextRegistry = HostContextTest;

TEST_F(HostContextRegistry, FrameCounterStartsAtOneAndAdvances) {
  EXPECT_EQ(context_.GetFrameCounter(), 1u);
  context_.AdvanceFrame();
  context_.AdvanceFrame();
  EXPECT_EQ(context_.GetFrameCounter(), 3u);
}

TEST_F(HostContextRegistry, GetChannelByTypeCountsOptionsAmongChannelsOfThatType) {
  TypedChannel a0(kTypeA), b0(kTypeB), a1(kTypeA);
  auto a2 = std::make_unique<TypedChannel>(kTypeA);
  TypedChannel a3(kTypeA);
  // A channel whose base type matches is not of that type.
  TypedChannel derived(kTypeC, kTypeA);

  struct Case {
    GUID type;
    int option;
    Qen_Channel* expected;
  };
  for (const Case& c :
       {Case{kTypeA, 0, &a0}, Case{kTypeA, 1, &a1}, Case{kTypeA, 2, a2.get()}, Case{kTypeA, 3, &a3},
        Case{kTypeA, 4, nullptr}, Case{kTypeA, -1, nullptr}, Case{kTypeB, 0, &b0},
        Case{kTypeB, 1, nullptr}, Case{kTypeC, 0, &derived}, Case{GUID{}, 0, nullptr}})
    EXPECT_EQ(context_.GetChannelByType(c.type, c.option), c.expected)
        << FormatGuid(c.type) << " option " << c.option;

  a2.reset();
  EXPECT_EQ(context_.GetChannelByType(kTypeA, 2), &a3);
  EXPECT_EQ(context_.Channels().size(), 5u);
}

TEST_F(HostContextRegistry, ChannelsJoinTheContextCurrentAtTheirConstruction) {
  Qen_HostContext other;
  std::unique_ptr<TypedChannel> in_other;
  {
    Qen_HostContext::ScopedCurrent scoped(&other);
    EXPECT_EQ(Qen_HostContext::Current(), &other);
    in_other = std::make_unique<TypedChannel>(kTypeA);
  }
  EXPECT_EQ(Qen_HostContext::Current(), &context_);
  TypedChannel here(kTypeA);
  EXPECT_EQ(in_other->GetHostContext(), &other);
  EXPECT_EQ(here.GetHostContext(), &context_);
  EXPECT_EQ(other.GetChannelByType(kTypeA, 0), in_other.get());
  EXPECT_EQ(context_.GetChannelByType(kTypeA, 0), &here);
  EXPECT_EQ(context_.GetChannelByType(kTypeA, 1), nullptr);
}

TEST_F(HostContextRegistry, ChannelOutlivingItsContextForgetsIt) {
  std::unique_ptr<TypedChannel> channel;
  {
    Qen_HostContext short_lived;
    Qen_HostContext::ScopedCurrent scoped(&short_lived);
    channel = std::make_unique<TypedChannel>(kTypeA);
  }
  EXPECT_EQ(channel->GetHostContext(), nullptr);
  channel->SetTimeStamp();  // works without a context
  EXPECT_EQ(channel->GetTimeStamp(), 1u);
}

TEST_F(HostContextRegistry, UnregisteredChannelIsUnlinkedAndForgotten) {
  TypedChannel parent(kTypeC), child(kTypeA);
  parent.SetChildCreateType(LinkRecord(kTypeA, 0, "A"), 0);
  ASSERT_TRUE(parent.SetChild(0, &child));
  context_.UnregisterChannel(&child);
  EXPECT_EQ(parent.GetChild(0), nullptr);
  EXPECT_EQ(context_.GetChannelByType(kTypeA, 0), nullptr);
  EXPECT_EQ(child.GetHostContext(), nullptr);
}

TEST(HostContextCurrent, DefaultExistsAndNullRestoresIt) {
  Qen_HostContext* default_context = Qen_HostContext::Current();
  ASSERT_NE(default_context, nullptr);
  {
    Qen_HostContext mine;
    Qen_HostContext::ScopedCurrent outer(&mine);
    {
      Qen_HostContext inner_context;
      Qen_HostContext::ScopedCurrent inner(&inner_context);
      EXPECT_EQ(Qen_HostContext::Current(), &inner_context);
    }
    EXPECT_EQ(Qen_HostContext::Current(), &mine);
    Qen_HostContext::SetCurrent(nullptr);
    EXPECT_EQ(Qen_HostContext::Current(), default_context);
  }
  EXPECT_EQ(Qen_HostContext::Current(), default_context);
}

TEST(HostContextCurrent, DestroyingTheCurrentContextFallsBackToTheDefault) {
  Qen_HostContext* default_context = Qen_HostContext::Current();
  {
    Qen_HostContext temporary;
    Qen_HostContext::SetCurrent(&temporary);
  }
  EXPECT_EQ(Qen_HostContext::Current(), default_context);
}

TEST_F(HostContextRegistry, MessageSinksAreSeparate) {
  std::vector<std::string> overload, debug;
  context_.OverloadMessages.SetSink([&](const char* text) { overload.push_back(text); });
  context_.DebugMessages.SetSink([&](const char* text) { debug.push_back(text); });
  context_.OverloadMessages("APE: Too many logic updates per frame");
  context_.DebugMessages("APE: min spin speed greater than max");
  context_.DebugMessages(nullptr);
  EXPECT_EQ(overload, std::vector<std::string>{"APE: Too many logic updates per frame"});
  EXPECT_EQ(debug, (std::vector<std::string>{"APE: min spin speed greater than max", ""}));
}

TEST(ShowDebugMessageTest, WritesALineToStderrWithoutASink) {
  ShowDebugMessage show;
  testing::internal::CaptureStderr();
  show("APE: hello");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "APE: hello\n");
}

TEST(ShowDebugMessageTest, ThrowingSinkDoesNotReachTheCaller) {
  ShowDebugMessage show;
  show.SetSink([](const char*) { throw std::runtime_error("sink failed"); });
  testing::internal::CaptureStderr();
  EXPECT_NO_THROW(show("APE: still shown"));
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "APE: still shown\n");
}

TEST_F(HostContextRegistry, DeviceChannelIsFoundByItsType) {
  EXPECT_EQ(FindDeviceChannel(&context_), nullptr);
  EXPECT_EQ(FindDeviceChannel(nullptr), nullptr);
  TypedChannel decoy(kTypeA);
  Tev_DX8_DeviceChannel device_channel;
  EXPECT_EQ(FindDeviceChannel(&context_), &device_channel);
  EXPECT_EQ(FindDevice(&context_), nullptr);  // it holds no device
}

}  // namespace
