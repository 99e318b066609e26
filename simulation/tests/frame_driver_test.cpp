// The frame driver: first use, the once-per-frame gate, timing, the birth and logic schedules
// with their strict comparisons and caps, the time scale, the active timer and rebuilding.
#include <algorithm>
#include <cmath>
#include <limits>
#include <optional>

#include "simulation/tests/emitter_fixture.h"

namespace {

using FrameDriver = EmitterTest;

int DrawCalls(const MemoryDevice& device) {
  const auto& calls = device.Calls();
  return static_cast<int>(std::count_if(calls.begin(), calls.end(), [](const DeviceCall& c) {
    return c.Name.rfind("Draw", 0) == 0;
  }));
}

TEST_F(FrameDriver, FirstCallOnlyInitializesAndTimeStartsThere) {
  LinkBasics(20.0f, 50.0f, 10.0f);
  clock.AdvanceSeconds(5.0);
  Start();
  EXPECT_EQ(DrawCalls(*device), 0);
  EXPECT_EQ(ActiveCount(), 0);

  // Measured from Initialize's reading, not from construction: 50 ms, no birth yet.
  RunFrame(50.0);
  EXPECT_EQ(ActiveCount(), 0);
  EXPECT_EQ(emitter->BirthAccumulator, 50.0f);
  EXPECT_GT(DrawCalls(*device), 0);
}

TEST_F(FrameDriver, SecondCallInTheSameHostFrameDoesNothing) {
  LinkBasics(20.0f, 50.0f, 10.0f);
  Start();
  RunFrame(50.0);
  device->ClearCalls();
  clock.AdvanceMs(1000.0);
  emitter->CallChannel();
  EXPECT_EQ(ActiveCount(), 0);
  EXPECT_TRUE(device->Calls().empty());

  // The gated call took no time reading: the next frame sees all of it.
  RunFrame(0.0);
  EXPECT_EQ(ActiveCount(), 10);
  EXPECT_EQ(emitter->BirthAccumulator, 50.0f);
}

TEST_F(FrameDriver, BirthsNeedStrictlyMoreThanOneInterval) {
  LinkBasics(20.0f, 50.0f, 10.0f);
  Start();
  RunFrame(40.0);
  RunFrame(40.0);
  EXPECT_EQ(ActiveCount(), 0);
  RunFrame(40.0);
  EXPECT_EQ(ActiveCount(), 1);
  EXPECT_EQ(emitter->BirthAccumulator, 20.0f);
}

TEST_F(FrameDriver, AnAccumulatorEqualToTheIntervalGivesNoBirthAndNoStep) {
  LinkBasics(20.0f, 50.0f, 10.0f);
  Start();
  PlaceParticle(19, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f});
  RunFrame(100.0);
  EXPECT_EQ(ActiveCount(), 1);  // only the placed one
  EXPECT_EQ(emitter->BirthAccumulator, 100.0f);
  // 100 ms at 20 ms per step: 80, 60, 40, 20 left; 20 > 20 fails.
  EXPECT_EQ(P(19).Position.z, 4.0f);
  EXPECT_EQ(emitter->LogicAccumulator, 20.0f);
  EXPECT_EQ(P(19).RenderPosition.z, 5.0f);  // t capped at 1

  RunFrame(1.0);
  EXPECT_EQ(ActiveCount(), 2);
  EXPECT_EQ(P(19).Position.z, 5.0f);
}

TEST_F(FrameDriver, FiftyMillisecondsAtFiftyStepsPerSecondRunsTwoStepsAndBlendsHalf) {
  LinkBasics(2.0f, 50.0f, 0.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 2.0f});
  RunFrame(50.0);
  EXPECT_EQ(P(0).Position.z, 4.0f);
  EXPECT_EQ(emitter->LogicAccumulator, 10.0f);
  EXPECT_EQ(P(0).RenderPosition.z, 5.0f);
}

TEST_F(FrameDriver, BirthsStopAtTheCapWithOneMessageAndTheBankDropped) {
  LinkBasics(2000.0f, 1.0f, 1e6f);
  Start();
  RunFrame(2000.0);
  EXPECT_EQ(ActiveCount(), 1001);
  EXPECT_EQ(CountMessages(overloadMessages, "APE: Too many particles created per frame"), 1);
  EXPECT_EQ(overloadMessages.size(), 1u);
  EXPECT_EQ(emitter->BirthAccumulator, 0.0f);
}

TEST_F(FrameDriver, LogicStepsStopAtTheCapWithOneMessageAndNoBlend) {
  LinkBasics(2.0f, 1000.0f, 0.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f}, 1e6f);
  RunFrame(2000.0);
  EXPECT_EQ(P(0).Position.z, 1000.0f);
  EXPECT_EQ(CountMessages(overloadMessages, "APE: Too many logic updates per frame"), 1);
  EXPECT_EQ(emitter->LogicAccumulator, 0.0f);
  EXPECT_EQ(P(0).RenderPosition, P(0).Position);
  // The step that was not run cleared the flag: this frame does not rebuild the vertices.
  EXPECT_FALSE(emitter->VerticesDirty);
}

TEST_F(FrameDriver, TheNthBirthOfAFrameRunsNPlusOneUpdatesInItsFirstStep) {
  LinkBasics(3.0f, 10.0f, 30.0f);
  SetVector(kLinkInitialForceOverride, {0.0f, 0.0f, 1.0f});
  Start();
  RunFrame(101.0);  // three births, one step
  ASSERT_EQ(ActiveCount(), 3);
  EXPECT_EQ(P(0).Position.z, 1.0f);
  EXPECT_EQ(P(1).Position.z, 2.0f);
  EXPECT_EQ(P(2).Position.z, 3.0f);
  for (int i = 0; i < 3; ++i) EXPECT_EQ(P(i).PendingSteps, 1) << i;
}

TEST_F(FrameDriver, BirthsBeforeAnyStepKeepTheirPendingSteps) {
  LinkBasics(3.0f, 1.0f, 30.0f);
  Start();
  RunFrame(101.0);  // three births, no step yet
  ASSERT_EQ(ActiveCount(), 3);
  EXPECT_EQ(P(0).PendingSteps, 1);
  EXPECT_EQ(P(1).PendingSteps, 2);
  EXPECT_EQ(P(2).PendingSteps, 3);
}

TEST_F(FrameDriver, EveryRecordAgesByRealSecondsWhateverTheScale) {
  LinkBasics(3.0f, 50.0f, 0.0f);
  SetValue(kLinkSimulationScaler, 2.0f);
  Start();
  PlaceParticle(1, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  RunFrame(250.0);
  for (int i = 0; i < 3; ++i) EXPECT_EQ(P(i).Age, 0.25f) << i;
}

TEST_F(FrameDriver, PausedFramesAgeNothingAndAreNotMadeUpAfterwards) {
  LinkBasics(4.0f, 50.0f, 10.0f);
  SetValue(kLinkSimulationScaler, 0.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f});
  RunFrames(3, 500.0);
  EXPECT_TRUE(emitter->Paused);
  EXPECT_EQ(P(0).Age, 0.0f);
  EXPECT_EQ(P(0).Position.z, 0.0f);
  EXPECT_EQ(ActiveCount(), 1);
  EXPECT_GT(DrawCalls(*device), 0);  // still drawn

  SetValue(kLinkSimulationScaler, 1.0f);
  RunFrame(30.0);
  EXPECT_EQ(P(0).Age, 0.03f);
  EXPECT_EQ(emitter->BirthAccumulator, 30.0f);
  EXPECT_EQ(P(0).Position.z, 1.0f);
}

struct ScalerCase {
  const char* Name;
  std::optional<float> Value;  // nullopt: no link
  float Scaler;
  bool Paused;
};

class SimulationScaler : public EmitterTest, public ::testing::WithParamInterface<ScalerCase> {};

TEST_P(SimulationScaler, ReadsAsScaleAndPause) {
  LinkBasics(2.0f, 50.0f, 0.0f);
  if (GetParam().Value) SetValue(kLinkSimulationScaler, *GetParam().Value);
  Start();
  RunFrame(100.0);
  EXPECT_EQ(emitter->SimulationScaler, GetParam().Scaler);
  EXPECT_EQ(emitter->Paused, GetParam().Paused);
  EXPECT_EQ(P(0).Age, GetParam().Paused ? 0.0f : 0.1f);
}

INSTANTIATE_TEST_SUITE_P(
    Values, SimulationScaler,
    ::testing::Values(
        ScalerCase{"Absent", std::nullopt, 1.0f, false}, ScalerCase{"Half", 0.5f, 0.5f, false},
        ScalerCase{"Three", 3.0f, 3.0f, false}, ScalerCase{"FiveRunsAtOne", 5.0f, 1.0f, false},
        ScalerCase{"ZeroPauses", 0.0f, 1.0f, true}, ScalerCase{"NegativePauses", -1.0f, 1.0f, true},
        ScalerCase{"NaNRunsAtOne", std::numeric_limits<float>::quiet_NaN(), 1.0f, false}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(FrameDriver, ScaleTwoDoublesTheBirthRate) {
  LinkBasics(10.0f, 1.0f, 10.0f);
  SetValue(kLinkSimulationScaler, 2.0f);
  Start();
  RunFrame(101.0);
  EXPECT_EQ(emitter->BirthsPerSecond, 20.0f);
  EXPECT_EQ(ActiveCount(), 2);
}

TEST_F(FrameDriver, InactiveEmitterNeitherBanksNorResetsBirthTime) {
  LinkBasics(10.0f, 1.0f, 10.0f);
  Start();
  RunFrame(60.0);
  SetValue(kLinkEmitterActive, 0.0f);
  RunFrames(3, 60.0);
  EXPECT_EQ(emitter->BirthAccumulator, 60.0f);
  EXPECT_EQ(ActiveCount(), 0);
}

TEST_F(FrameDriver, ActiveTimerKeepsBirthsGoingForItsDurationOnly) {
  LinkBasics(100.0f, 1.0f, 10.0f);
  SetValue(kLinkEmitterActive, 0.0f);
  Start();
  emitter->EnableActiveTimer(2.0f);
  int before = 0;
  for (int frame = 1; frame <= 8; ++frame) {
    RunFrame(250.0);
    EXPECT_TRUE(emitter->ActiveTimerOn) << frame;  // 2.0 s elapsed is not beyond 2.0 s
    EXPECT_GT(ActiveCount(), before) << frame;
    before = ActiveCount();
  }
  RunFrames(2, 250.0);
  EXPECT_FALSE(emitter->ActiveTimerOn);
  EXPECT_EQ(ActiveCount(), before);
}

TEST_F(FrameDriver, InitializeTurnsTheActiveTimerOff) {
  LinkBasics(4.0f, 50.0f, 10.0f);
  emitter->EnableActiveTimer(10.0f);
  Start();
  EXPECT_FALSE(emitter->ActiveTimerOn);
}

TEST_F(FrameDriver, MissingRateLinksSkipTheSimulationButStillDraw) {
  for (int link : {kLinkEmitterActive, kLinkLogicUpdatesPerSecond, kLinkBirthsPerSecond}) {
    SCOPED_TRACE(link);
    LinkBasics(4.0f, 50.0f, 100.0f);
    Unlink(link);
    emitter->Initialized = false;
    Start();
    PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f});
    device->ClearCalls();
    RunFrame(100.0);
    EXPECT_EQ(ActiveCount(), 1);
    EXPECT_EQ(P(0).Position.z, 0.0f);
    EXPECT_EQ(P(0).Age, 0.0f);
    EXPECT_GT(DrawCalls(*device), 0);
  }
}

TEST_F(FrameDriver, AChangedCountRebuildsAtTheNextCallAfterFinishingTheFrame) {
  LinkBasics(4.0f, 1.0f, 10.0f);
  Start();
  SetValue(kLinkParticleCount, 8.0f);
  RunFrame(150.0);  // still simulated with the old pool
  EXPECT_FALSE(emitter->Initialized);
  EXPECT_EQ(emitter->ParticleCount, 4);
  EXPECT_EQ(ActiveCount(), 1);

  RunFrame(150.0);  // only rebuilds
  EXPECT_TRUE(emitter->Initialized);
  EXPECT_EQ(emitter->ParticleCount, 8);
  EXPECT_EQ(ActiveCount(), 0);

  RunFrame(150.0);
  EXPECT_EQ(ActiveCount(), 1);
}

TEST_F(FrameDriver, AnEqualTruncatedCountDoesNotRebuild) {
  LinkBasics(4.2f, 50.0f, 10.0f);
  Start();
  RunFrame(150.0);
  ASSERT_EQ(ActiveCount(), 1);
  SetValue(kLinkParticleCount, 4.9f);
  RunFrames(2, 20.0);
  EXPECT_TRUE(emitter->Initialized);
  EXPECT_EQ(ActiveCount(), 1);
}

struct PathCase {
  float AtInitialize;
  float Later;
  bool Rebuilds;
};

class DrawingPathChange : public EmitterTest, public ::testing::WithParamInterface<PathCase> {};

TEST_P(DrawingPathChange, RebuildsOnlyWhenTheYesNoReadingChanges) {
  LinkBasics(4.0f, 50.0f, 0.0f);
  SetValue(kLinkHardwareParticles, GetParam().AtInitialize);
  Start();
  SetValue(kLinkHardwareParticles, GetParam().Later);
  RunFrame(20.0);
  EXPECT_EQ(emitter->Initialized, !GetParam().Rebuilds);
}

INSTANTIATE_TEST_SUITE_P(Values, DrawingPathChange,
                         ::testing::Values(PathCase{-1.0f, 0.0f, false},
                                           PathCase{-1.0f, 2.0f, true}, PathCase{1.0f, 0.0f, true},
                                           PathCase{1.0f, -1.0f, true},
                                           PathCase{1.0f, 0.5f, false}));

TEST_F(FrameDriver, AMissingHardwareLinkNeverRebuilds) {
  LinkBasics(4.0f, 50.0f, 0.0f);
  SetValue(kLinkHardwareParticles, 1.0f);
  Start();
  ASSERT_TRUE(emitter->HardwareParticles);
  Unlink(kLinkHardwareParticles);
  RunFrame(20.0);
  EXPECT_TRUE(emitter->Initialized);
}

class UnusableLogicRate : public EmitterTest, public ::testing::WithParamInterface<float> {};

TEST_P(UnusableLogicRate, RunsNoStepAndBlendsWithZeroWithoutAMessage) {
  LinkBasics(2.0f, GetParam(), 0.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f});
  RunFrames(3, 100.0);
  EXPECT_EQ(P(0).Position.z, 0.0f);
  EXPECT_EQ(P(0).RenderPosition, P(0).Position);
  EXPECT_TRUE(overloadMessages.empty());
}

TEST_P(UnusableLogicRate, ReplacingAUsableRateStopsTheSteps) {
  LinkBasics(2.0f, 50.0f, 0.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f});
  RunFrame(50.0);
  ASSERT_EQ(P(0).Position.z, 2.0f);
  SetValue(kLinkLogicUpdatesPerSecond, GetParam());
  RunFrames(2, 50.0);
  EXPECT_EQ(P(0).Position.z, 2.0f);
  EXPECT_EQ(P(0).RenderPosition, P(0).Position);
  EXPECT_TRUE(overloadMessages.empty());
}

INSTANTIATE_TEST_SUITE_P(Values, UnusableLogicRate,
                         ::testing::Values(0.0f, -5.0f, std::numeric_limits<float>::quiet_NaN()));

TEST_F(FrameDriver, VerticesStayDirtyWhileParticlesLiveAndOnceMoreWhenTheLastDies) {
  LinkBasics(2.0f, 50.0f, 0.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}, 0.04f);
  RunFrame(30.0);  // one step, alive at 0.03 s
  EXPECT_TRUE(emitter->VerticesDirty);
  RunFrame(5.0);  // no step: keeps the last step's value
  EXPECT_TRUE(emitter->VerticesDirty);
  RunFrame(10.0);  // one step, in which it dies and still marks
  EXPECT_FALSE(P(0).Active);
  EXPECT_TRUE(emitter->VerticesDirty);
  RunFrame(20.0);
  EXPECT_FALSE(emitter->VerticesDirty);
}

TEST(RandInt, DrawsOnlyForARangeOfTwoOrMore) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Tev_AdvancedParticleEmitter emitter;
  const std::vector<int> sequence = RandSequence(7u, 8);
  EXPECT_EQ(emitter.RandInt(5, 5), 5);
  EXPECT_EQ(emitter.RandInt(5, 6), 5);
  EXPECT_EQ(emitter.RandInt(5, 2), 5);
  EXPECT_EQ(emitter.RandInt(0, 100), sequence[0] % 100);
  EXPECT_EQ(emitter.RandInt(-10, 10), sequence[1] % 20 - 10);
  // Ranges beyond int do not overflow.
  const int wide =
      emitter.RandInt(std::numeric_limits<int>::min(), std::numeric_limits<int>::max());
  EXPECT_EQ(wide, static_cast<int>(sequence[2] +
                                   static_cast<long long>(std::numeric_limits<int>::min())));
  EXPECT_EQ(emitter.RandInt(1000, std::numeric_limits<int>::min()), 1000);
  EXPECT_EQ(DrawsTaken(sequence), 3);
}

}  // namespace
