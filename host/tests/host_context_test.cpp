// The host context: channel registry, current context, frame counter and the message functors.
#include <stdexcept>

#include "host/tests/test_channels.h"

namespace {

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

// A channel joins the context current at its construction and may outlive it; so may the
// context's time as current.
TEST_F(HostContextRegistry, ChannelsAndTheCurrentPointerMayOutliveAContext) {
  std::unique_ptr<TypedChannel> elsewhere;
  {
    Qen_HostContext other;
    Qen_HostContext::ScopedCurrent scoped(&other);
    elsewhere = std::make_unique<TypedChannel>(kTypeA);
    EXPECT_EQ(elsewhere->GetHostContext(), &other);
    EXPECT_EQ(context_.GetChannelByType(kTypeA, 0), nullptr);
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
