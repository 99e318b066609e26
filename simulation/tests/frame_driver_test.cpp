// The frame driver: first use, the once-per-frame gate, the birth and logic schedules with their
// strict comparisons and caps, the time scale, the active timer and rebuilding.
#include <algorithm>
#include <cmath>
#include <limits>
#include <memory>
#include <optional>
#include <vector>

#include "host/type_guids.h"
#include "simulation/tests/emitter_fixture.h"

namespace {

using FrameDriver = EmitterTest;
constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();

int DrawCalls(const MemoryDevice& device) {
  return static_cast<int>(
      std::count_if(device.Calls().begin(), device.Calls().end(),
                    [](const DeviceCall& c) { return c.Name.find("Draw") == 0; }));
}

TEST_F(FrameDriver, FirstCallOnlyInitializesAndLaterCallsInTheSameFrameDoNothing) {
  LinkBasics(20.0f, 50.0f, 10.0f);
  clock.AdvanceSeconds(5.0);
  Start();
  EXPECT_EQ(DrawCalls(*device), 0);
  RunFrame(50.0);  // measured from Initialize's reading, not from construction
  EXPECT_EQ(emitter->BirthAccumulator, 50.0f);
  EXPECT_GT(DrawCalls(*device), 0);
  device->ClearCalls();
  clock.AdvanceMs(1000.0);
  emitter->CallChannel();
  EXPECT_TRUE(device->Calls().empty());
  EXPECT_EQ(ActiveCount(), 0);
  RunFrame(0.0);  // the gated call took no time reading
  EXPECT_EQ(ActiveCount(), 10);
  EXPECT_EQ(emitter->BirthAccumulator, 50.0f);
}

TEST_F(FrameDriver, BirthsAndStepsNeedStrictlyMoreThanOneInterval) {
  LinkBasics(20.0f, 50.0f, 10.0f);
  Start();
  PlaceParticle(19, kZero, {0.0f, 0.0f, 1.0f});
  RunFrames(2, 40.0);
  EXPECT_EQ(ActiveCount(), 1);
  RunFrame(20.0);  // 100 ms banked for births and steps: 100 > 100 and 20 > 20 fail
  EXPECT_EQ(ActiveCount(), 1);
  EXPECT_EQ(P(19).Position.z, 4.0f);
  EXPECT_EQ(emitter->LogicAccumulator, 20.0f);
  EXPECT_EQ(P(19).RenderPosition.z, 5.0f);  // t capped at 1
  RunFrame(10.0);
  EXPECT_EQ(ActiveCount(), 2);
  EXPECT_EQ(emitter->BirthAccumulator, 10.0f);
  EXPECT_EQ(P(19).Position.z, 5.0f);
  EXPECT_EQ(emitter->LogicAccumulator, 10.0f);
  EXPECT_EQ(P(19).RenderPosition.z, 5.5f);
}

// At either cap the rest of the backlog is dropped: no blend, no vertex rebuild this frame.
TEST_F(FrameDriver, BirthsAndLogicStepsStopAtTheirCapsWithOneMessageEach) {
  LinkBasics(2000.0f, 1000.0f, 1e6f);
  Start();
  PlaceParticle(1999, kZero, {0.0f, 0.0f, 1.0f}, 1e6f);
  RunFrame(2000.0);
  EXPECT_EQ(ActiveCount(), 1002);
  EXPECT_EQ(P(1999).Position.z, 1000.0f);
  EXPECT_EQ(overloadMessages, (std::vector<std::string>{"APE: Too many particles created per frame",
                                                        "APE: Too many logic updates per frame"}));
  EXPECT_EQ(emitter->BirthAccumulator, 0.0f);
  EXPECT_EQ(emitter->LogicAccumulator, 0.0f);
  EXPECT_EQ(P(1999).RenderPosition, P(1999).Position);
  EXPECT_FALSE(emitter->VerticesDirty);
}

TEST_F(FrameDriver, TheNthBirthOfAFrameRunsNPlusOneUpdatesInItsFirstStep) {
  LinkBasics(3.0f, 10.0f, 30.0f);
  SetVector(kLinkInitialForceOverride, {0.0f, 0.0f, 1.0f});
  Start();
  RunFrame(101.0);  // three births, one step
  for (int i = 0; i < 3; ++i) {
    EXPECT_EQ(P(i).Position.z, static_cast<float>(i + 1));
    EXPECT_EQ(P(i).PendingSteps, 1);
  }
}

// Every record, born or not, ages by the real seconds whatever the scale; births per second
// follow the scale.
TEST_F(FrameDriver, TheSimulationScalerReadsAsScaleAndPause) {
  const struct {
    std::optional<float> Value;
    float Scaler;
    bool Paused;
  } cases[] = {{std::nullopt, 1.0f, false}, {0.5f, 0.5f, false}, {3.0f, 3.0f, false},
               {5.0f, 1.0f, false},         {0.0f, 1.0f, true},  {-1.0f, 1.0f, true},
               {kNaN, 1.0f, false}};
  for (const auto& c : cases) {
    SCOPED_TRACE(c.Value.value_or(-99.0f));
    LinkBasics(2.0f, 50.0f, 10.0f);
    if (c.Value) SetValue(kLinkSimulationScaler, *c.Value);
    emitter->Initialize();
    RunFrame(100.0);
    EXPECT_EQ(emitter->SimulationScaler, c.Scaler);
    EXPECT_EQ(emitter->Paused, c.Paused);
    EXPECT_EQ(emitter->BirthsPerSecond, 10.0f * c.Scaler);
    EXPECT_EQ(P(1).Age, c.Paused ? 0.0f : 0.1f);
    Unlink(kLinkSimulationScaler);
    RunFrame(30.0);  // paused time is not made up
    EXPECT_EQ(P(1).Age, c.Paused ? 0.03f : 0.13f);
  }
}

// Inactive, the birth bank neither grows nor resets.
TEST_F(FrameDriver, TheActiveTimerBirthsForItsDurationOnly) {
  LinkBasics(100.0f, 1.0f, 10.0f);
  SetValue(kLinkEmitterActive, 0.0f);
  emitter->EnableActiveTimer(10.0f);
  Start();
  EXPECT_FALSE(emitter->ActiveTimerOn);  // Initialize turns it off
  RunFrame(60.0);
  EXPECT_EQ(emitter->BirthAccumulator, 0.0f);
  emitter->EnableActiveTimer(2.0f);
  RunFrames(7, 250.0);
  int before = ActiveCount();
  RunFrame(250.0);
  EXPECT_TRUE(emitter->ActiveTimerOn);  // 2.0 s elapsed is not beyond 2.0 s
  EXPECT_GT(ActiveCount(), before);
  before = ActiveCount();
  RunFrame(250.0);
  EXPECT_FALSE(emitter->ActiveTimerOn);
  EXPECT_EQ(ActiveCount(), before);
}

// Only a change of the pool size as Initialize takes it, or of the yes/no reading, rebuilds; the
// frame that notices it still runs.
TEST_F(FrameDriver, RebuildsOnlyWhenTheCountOrTheDrawingPathReadsDifferently) {
  const struct {
    int Link;
    float AtStart;
    std::optional<float> Later;  // nullopt: unlinked
    bool Rebuilds;
  } cases[] = {{kLinkParticleCount, 4.2f, 4.9f, false},
               {kLinkParticleCount, 0.5f, 0.0f, false},
               {kLinkParticleCount, 4.0f, 5.0f, true},
               {kLinkHardwareParticles, -1.0f, 0.0f, false},
               {kLinkHardwareParticles, -1.0f, 2.0f, true},
               {kLinkHardwareParticles, 1.0f, 0.0f, true},
               {kLinkHardwareParticles, 1.0f, 0.5f, false},
               {kLinkHardwareParticles, 1.0f, std::nullopt, false}};
  for (const auto& c : cases) {
    LinkBasics(4.0f, 50.0f, 0.0f);
    SetValue(c.Link, c.AtStart);
    emitter->Initialize();
    c.Later ? (void)SetValue(c.Link, *c.Later) : Unlink(c.Link);
    PlaceParticle(0, kZero, {0.0f, 0.0f, 1.0f});
    StepOnce();
    EXPECT_EQ(emitter->Initialized, !c.Rebuilds) << c.Link << " " << c.AtStart;
    EXPECT_EQ(P(0).Position.z, 1.0f);
    Unlink(kLinkHardwareParticles);
  }
}

// 0, negative, NaN or infinite, from the start or replacing a usable rate: no step, blend factor
// 0 and no overload message.
TEST_F(FrameDriver, AnUnusableLogicRateRunsNoStep) {
  LinkBasics(2.0f, 0.0f, 0.0f);
  Start();
  PlaceParticle(0, kZero, {0.0f, 0.0f, 1.0f});
  RunFrames(2, 50.0);
  EXPECT_EQ(P(0).RenderPosition, kZero);
  for (float rate : {0.0f, -5.0f, kNaN, std::numeric_limits<float>::infinity()}) {
    SetValue(kLinkLogicUpdatesPerSecond, 50.0f);
    emitter->LogicAccumulator = 0.0f;
    PlaceParticle(0, kZero, {0.0f, 0.0f, 1.0f});
    RunFrame(50.0);  // two steps
    SetValue(kLinkLogicUpdatesPerSecond, rate);
    RunFrames(2, 50.0);
    EXPECT_EQ(P(0).RenderPosition, D3DXVECTOR3(0.0f, 0.0f, 2.0f)) << rate;
  }
  EXPECT_TRUE(overloadMessages.empty());
}

// A clock that runs backwards banks negative time; the drawing stays at the last step.
TEST_F(FrameDriver, ABackwardClockBlendsNoFurtherBack) {
  LinkBasics(2.0f, 50.0f, 0.0f);
  Start();
  PlaceParticle(0, kZero, {0.0f, 0.0f, 1.0f});
  clock.Advance(-TestClock::kTicksPerSecond / 100);
  context.AdvanceFrame();
  emitter->CallChannel();
  EXPECT_LT(emitter->LogicAccumulator, 0.0f);
  EXPECT_EQ(P(0).RenderPosition, kZero);
}

// Link channels that record, in order, the emitter links they stand at as they are read or
// written.
using ReadLog = std::vector<int>;
class RecordingValue : public Qen_ValueChannel {
 public:
  RecordingValue(int link, ReadLog* log) : link_(link), log_(log) {}
  float GetValue() override { return log_->push_back(link_), Qen_ValueChannel::GetValue(); }
  void SetValue(float value) override { log_->push_back(link_), Qen_ValueChannel::SetValue(value); }

 private:
  int link_;
  ReadLog* log_;
};
class RecordingVector : public Qen_ValueVectorChannel {
 public:
  RecordingVector(int link, ReadLog* log) : link_(link), log_(log) {}
  D3DXVECTOR3 GetVector() override {
    return log_->push_back(link_), Qen_ValueVectorChannel::GetVector();
  }

 private:
  int link_;
  ReadLog* log_;
};
class RecordingMatrix : public Qen_MatrixChannel {
 public:
  RecordingMatrix(int link, ReadLog* log) : link_(link), log_(log) {}
  D3DXMATRIX GetMatrix() override { return log_->push_back(link_), Qen_MatrixChannel::GetMatrix(); }

 private:
  int link_;
  ReadLog* log_;
};

TEST_F(FrameDriver, ReadsEveryLinkAtItsPlaceInTheStageOrder) {
  ReadLog log;
  LinkSmoke();
  Start();
  for (int link = 1; link <= kLinkSimulationScaler; ++link) {
    const GUID type = GetEmitterLinkSpec(link).TypeGuid;
    if (type == kValueGuid) {
      emitter->ClearChild(link);
      Link(*emitter, link, Make<RecordingValue>(link, &log));
    } else if (type == kValueVectorGuid) {
      Link(*emitter, link, Make<RecordingVector>(link, &log));
    } else if (type == kMatrixGuid) {
      Link(*emitter, link, Make<RecordingMatrix>(link, &log));
    }
  }
  emitter->ReadLinks();
  const std::vector<int> documented = {kLinkAttachedSizeOffsetAdditive,
                                       kLinkParticleCount,
                                       kLinkHardwareParticles,
                                       kLinkBouncingReportCollisions,
                                       kLinkSlidingAttractorImmunity,
                                       kLinkAlignToNormals,
                                       kLinkSizeOffsetMax,
                                       kLinkSmoke,
                                       kLinkUseVertexAlphaFading,
                                       kLinkAttachedSlideRate,
                                       kLinkAttachedLifespan,
                                       kLinkAttachedSlidingHeight,
                                       kLinkSimulationScaler,
                                       kLinkSpinSpeedMin,
                                       kLinkSpinSpeedMax,
                                       kLinkSpinStart,
                                       kLinkEmitterMotion,
                                       kLinkCollisionReportRate,
                                       kLinkOutCollisionId,
                                       kLinkAttachRate,
                                       kLinkBounceRate,
                                       kLinkMaximumSpeed,
                                       kLinkInitialForceStrength,
                                       kLinkInitialForceAlongNormal,
                                       kLinkVertexEmissions,
                                       kLinkLookAt,
                                       kLinkLookAtLocal,
                                       kLinkReplaceOldParticles,
                                       kLinkLifespanMin,
                                       kLinkLifespanMax,
                                       kLinkInitialForceOverride,
                                       kLinkGlobalForce};
  EXPECT_EQ(log, documented);
}

// Once the host context is gone a frame call does nothing, and the public operations stay safe.
TEST(FrameDriverWithoutHost, DoesNothingOnceTheHostContextIsGone) {
  auto context = std::make_unique<Qen_HostContext>();
  std::optional<Qen_HostContext::ScopedCurrent> current(context.get());
  Tev_AdvancedParticleEmitter emitter;
  Qen_ValueChannel count(4.0f);
  ASSERT_TRUE(emitter.SetChild(kLinkParticleCount, &count));
  emitter.CallChannel();
  ASSERT_TRUE(emitter.Initialized);
  current.reset();
  context.reset();
  ASSERT_EQ(emitter.GetHostContext(), nullptr);
  const std::uint32_t lastFrame = emitter.LastFrameCounter;
  emitter.CallChannel();
  emitter.CallChannel();
  EXPECT_EQ(emitter.LastFrameCounter, lastFrame);
  EXPECT_FALSE(emitter.GetIfParticleActive(0));
  EXPECT_EQ(emitter.GetParticlePosition(0), D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  emitter.BirthParticle(0);
  emitter.ClearChild(kLinkParticleCount);
}

TEST(RandInt, DrawsOnlyForARangeOfTwoOrMore) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Tev_AdvancedParticleEmitter emitter;
  constexpr int kMin = std::numeric_limits<int>::min();
  const std::vector<int> s = RandSequence(7u, 8);
  EXPECT_EQ(emitter.RandInt(5, 6), 5);
  EXPECT_EQ(emitter.RandInt(5, 2), 5);
  EXPECT_EQ(emitter.RandInt(0, 100), s[0] % 100);
  EXPECT_EQ(emitter.RandInt(-10, 10), s[1] % 20 - 10);
  // Ranges beyond int do not overflow.
  EXPECT_EQ(emitter.RandInt(kMin, std::numeric_limits<int>::max()), s[2] + kMin);
  EXPECT_EQ(emitter.RandInt(1000, kMin), 1000);
  EXPECT_EQ(DrawsTaken(s), 3);
}

}  // namespace
