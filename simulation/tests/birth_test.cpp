// Birth: the record chosen, the point on the mesh, the first velocity, colour, size, spin and
// lifespan, and the exact rand() draws each takes.
#include <cstdlib>
#include <optional>

#include "simulation/tests/emitter_fixture.h"

namespace {

// One birth per 101 ms frame and no logic step (one step per second): what birth wrote stays.
class Birth : public EmitterTest {
 protected:
  void SetUpBirths(float count = 4.0f) {
    LinkBasics(count, 1.0f, 10.0f);
    SetValue(kLinkLifespanMin, 2.0f);
    SetValue(kLinkLifespanMax, 2.0f);
  }
  void BirthOne() { RunFrame(101.0); }
};

// A seed whose first rand() % modulus is `wanted`.
unsigned SeedGiving(int modulus, int wanted) {
  for (unsigned seed = 1;; ++seed) {
    std::srand(seed);
    if (std::rand() % modulus == wanted) return seed;
  }
}

const std::vector<D3DXVECTOR3> kNineVertices = {
    {0.0f, 0.0f, 0.0f}, {4.0f, 0.0f, 0.0f},  {0.0f, 4.0f, 1.0f},
    {1.0f, 2.0f, 3.0f}, {-5.0f, 1.0f, 2.0f}, {3.0f, -3.0f, 7.0f},
    {2.0f, 8.0f, 1.0f}, {9.0f, 1.0f, -4.0f}, {-2.0f, -6.0f, 5.0f}};
const std::vector<DWORD> kNineEntries = {2, 0, 1, 5, 3, 4, 7, 8, 6};

TEST_F(Birth, VertexEmissionDrawsVertexSizeSpinAndLifespanInThisOrder) {
  SetUpBirths();
  const std::vector<D3DXVECTOR3> vertices = {{1.0f, 0.0f, 0.0f},
                                             {0.0f, 2.0f, 0.0f},
                                             {0.0f, 0.0f, 3.0f},
                                             {4.0f, 4.0f, 0.0f},
                                             {-1.0f, -1.0f, -1.0f}};
  SetEmitterMesh(vertices, {});
  SetValue(kLinkSizeOffsetMax, 2.0f);
  SetValue(kLinkSpinSpeedMin, 0.5f);
  SetValue(kLinkSpinSpeedMax, 1.5f);
  SetValue(kLinkLifespanMin, 1.0f);
  SetValue(kLinkLifespanMax, 3.0f);
  Start();
  const std::vector<int> s = RandSequence(11u, 12);
  BirthOne();
  const Particle& p = P(0);
  ASSERT_TRUE(p.Active);
  EXPECT_EQ(p.Position, vertices[static_cast<std::size_t>(s[0] % 5)]);
  EXPECT_EQ(p.SizeMultiplier, static_cast<float>(1000 + s[1] % 1000) / 1000.0f);
  EXPECT_EQ(p.SpinSpeed, static_cast<float>(50 + s[2] % 100) * 0.01f);
  EXPECT_EQ(p.Lifespan, static_cast<float>(100 + s[3] % 200) * (1.0f * 0.01f));
  EXPECT_EQ(DrawsTaken(s), 4);
}

class TriangleCorner : public Birth, public ::testing::WithParamInterface<int> {};

// Entry k of the index list and its triangle's other two entries, in the order the point is built.
TEST_P(TriangleCorner, BuildsThePointFromEntryKTowardItsNeighbours) {
  const int k = GetParam();
  SetUpBirths();
  SetValue(kLinkVertexEmissions, 0.0f);
  SetEmitterMesh(kNineVertices, kNineEntries);
  SetValue(kLinkSizeOffsetMax, 3.0f);
  SetValue(kLinkSpinSpeedMin, 0.0f);
  SetValue(kLinkSpinSpeedMax, 1.0f);
  SetValue(kLinkLifespanMin, 1.0f);
  SetValue(kLinkLifespanMax, 2.0f);
  Start();
  const std::vector<int> s = RandSequence(SeedGiving(9, k), 12);
  ASSERT_EQ(s[0] % 9, k);
  BirthOne();

  const int others[3][2] = {{k + 1, k + 2}, {k + 1, k - 1}, {k - 2, k - 1}};
  const D3DXVECTOR3 p0 = kNineVertices[kNineEntries[static_cast<std::size_t>(k)]];
  const D3DXVECTOR3 p1 = kNineVertices[kNineEntries[static_cast<std::size_t>(others[k % 3][0])]];
  const D3DXVECTOR3 p2 = kNineVertices[kNineEntries[static_cast<std::size_t>(others[k % 3][1])]];
  const float a = static_cast<float>(s[1] % 100) * 0.01f;
  const float b = static_cast<float>(s[2] % 100) * 0.01f;
  const D3DXVECTOR3 q = p0 + (p1 - p0) * a;
  const D3DXVECTOR3 expected = q + (p2 - q) * b;
  const Particle& p = P(0);
  EXPECT_FLOAT_EQ(p.Position.x, expected.x);
  EXPECT_FLOAT_EQ(p.Position.y, expected.y);
  EXPECT_FLOAT_EQ(p.Position.z, expected.z);
  EXPECT_EQ(p.SizeMultiplier, static_cast<float>(1000 + s[3] % 2000) / 1000.0f);
  EXPECT_EQ(p.SpinSpeed, static_cast<float>(s[4] % 100) * 0.01f);
  EXPECT_EQ(p.Lifespan, static_cast<float>(100 + s[5] % 100) * 0.01f);
  EXPECT_EQ(DrawsTaken(s), 6);
}

// 6, 7 and 8 are the three corners of the last triangle (k mod 3 = 0, 1, 2).
INSTANTIATE_TEST_SUITE_P(Entries, TriangleCorner, ::testing::Values(6, 7, 8));

TEST_F(Birth, TriangleAlongNormalTakesTheNormalOfEntryKsVertex) {
  SetUpBirths();
  SetValue(kLinkVertexEmissions, 0.0f);
  std::vector<D3DXVECTOR3> normals(9);
  for (int v = 0; v < 9; ++v)
    normals[static_cast<std::size_t>(v)] = {0.0f, static_cast<float>(v), 1.0f};
  SetEmitterMesh(kNineVertices, kNineEntries, normals);
  SetValue(kLinkInitialForceAlongNormal, 1.0f);
  SetValue(kLinkInitialForceStrength, 2.0f);
  Start();
  const std::vector<int> s = RandSequence(SeedGiving(9, 4), 4);
  BirthOne();
  EXPECT_EQ(P(0).Velocity, normals[kNineEntries[4]] * 2.0f);
  EXPECT_EQ(DrawsTaken(s), 3);
}

struct VelocityCase {
  const char* Name;
  std::optional<D3DXVECTOR3> Override;
  bool AlongNormal;
  float Strength;
  float Scaler;
  D3DXVECTOR3 Expected;
};

class FirstVelocity : public Birth, public ::testing::WithParamInterface<VelocityCase> {};

// The vertex sits at (4, 4, 0) with the stored normal (0, 3, 0); the mesh origin is (1, 0, 0).
TEST_P(FirstVelocity, FollowsOverrideNormalOrDirectionFromTheMeshOrigin) {
  const VelocityCase& c = GetParam();
  SetUpBirths();
  Tev_DX8_ObjectDataChannel* mesh = SetEmitterMesh({{4.0f, 4.0f, 0.0f}}, {}, {{0.0f, 3.0f, 0.0f}});
  D3DXMATRIX world;
  D3DXMatrixTranslation(&world, 1.0f, 0.0f, 0.0f);
  mesh->SetWorldMatrix(world);
  if (c.Override) SetVector(kLinkInitialForceOverride, *c.Override);
  SetValue(kLinkInitialForceAlongNormal, c.AlongNormal ? 1.0f : 0.0f);
  SetValue(kLinkInitialForceStrength, c.Strength);
  SetValue(kLinkSimulationScaler, c.Scaler);
  Start();
  BirthOne();
  EXPECT_FLOAT_EQ(P(0).Velocity.x, c.Expected.x);
  EXPECT_FLOAT_EQ(P(0).Velocity.y, c.Expected.y);
  EXPECT_FLOAT_EQ(P(0).Velocity.z, c.Expected.z);
}

INSTANTIATE_TEST_SUITE_P(
    Modes, FirstVelocity,
    ::testing::Values(
        VelocityCase{
            "Override", D3DXVECTOR3(1.0f, 2.0f, 3.0f), true, 9.0f, 2.0f, {2.0f, 4.0f, 6.0f}},
        VelocityCase{"NormalUnnormalised", std::nullopt, true, 2.0f, 1.5f, {0.0f, 9.0f, 0.0f}},
        VelocityCase{"FromMeshOrigin", std::nullopt, false, 5.0f, 1.0f, {3.0f, 4.0f, 0.0f}},
        VelocityCase{"FromMeshOriginScaled", std::nullopt, false, 5.0f, 2.0f, {6.0f, 8.0f, 0.0f}}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(Birth, BirthPointIsMovedByEmitterMotionWithoutPerspectiveDivide) {
  SetUpBirths();
  SetEmitterMesh({{1.0f, 2.0f, 3.0f}}, {});
  D3DXMATRIX motion;
  D3DXMatrixTranslation(&motion, 10.0f, 0.0f, -1.0f);
  motion._44 = 4.0f;  // w is never divided by
  SetMatrix(kLinkEmitterMotion, motion);
  Start();
  BirthOne();
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(11.0f, 2.0f, 2.0f));
}

TEST_F(Birth, ColourTakesEnvelopesAtZeroCappedAboveAndLowEightBitsOnly) {
  SetUpBirths();
  SetEnvelope(kLinkVertexAlphaEnvelope, {{0.0f, 300.0f}, {1.0f, 0.0f}});
  SetEnvelope(kLinkRedColorEnvelope, {{0.0f, 100.9f}});
  SetEnvelope(kLinkGreenColorEnvelope, {{0.0f, -1.0f}});
  Start();
  BirthOne();
  EXPECT_EQ(P(0).Color, 0xFF64FF00u);
}

struct SizeCase {
  float SizeOffsetMax;  // 0: no link
  int Draws;
};

class SizeMultiplier : public Birth, public ::testing::WithParamInterface<SizeCase> {};

TEST_P(SizeMultiplier, IsOneWithoutADrawBelowARangeOfTwoThousandths) {
  SetUpBirths();
  if (GetParam().SizeOffsetMax != 0.0f) SetValue(kLinkSizeOffsetMax, GetParam().SizeOffsetMax);
  Start();
  const std::vector<int> s = RandSequence(5u, 4);
  BirthOne();
  const int t = static_cast<int>(GetParam().SizeOffsetMax * 1000.0f);
  const float expected =
      GetParam().Draws ? static_cast<float>(1000 + s[1] % (t - 1000)) / 1000.0f : 1.0f;
  EXPECT_EQ(P(0).SizeMultiplier, expected);
  EXPECT_EQ(P(0).Size, expected);
  EXPECT_EQ(DrawsTaken(s), 1 + GetParam().Draws);
}

INSTANTIATE_TEST_SUITE_P(Values, SizeMultiplier,
                         ::testing::Values(SizeCase{0.0f, 0}, SizeCase{1.0f, 0},
                                           SizeCase{1.001f, 0}, SizeCase{0.25f, 0},
                                           SizeCase{1.5f, 1}, SizeCase{4.0f, 1}));

TEST_F(Birth, SizeIsTheEnvelopeAtZeroTimesTheMultiplierAndNeverNegative) {
  SetUpBirths();
  SetValue(kLinkSizeOffsetMax, 1.0f);
  Tev_EnvelopeStorage* envelope = SetEnvelope(kLinkSizeEnvelope, {{0.0f, 2.5f}, {1.0f, 9.0f}});
  Start();
  BirthOne();
  EXPECT_EQ(P(0).Size, 2.5f);
  envelope->ClearKeys();
  envelope->AddKey(0.0f, -2.0f);
  BirthOne();
  EXPECT_EQ(P(1).Size, 0.0f);
}

struct SpinCase {
  const char* Name;
  float Min;
  float Max;
  int Draws;
  float (*Expected)(int draw);
};

class SpinAtBirth : public Birth, public ::testing::WithParamInterface<SpinCase> {};

TEST_P(SpinAtBirth, DrawsTheSpeedByTheSignsOfTheRange) {
  const SpinCase& c = GetParam();
  SetUpBirths();
  SetValue(kLinkSpinSpeedMin, c.Min);
  SetValue(kLinkSpinSpeedMax, c.Max);
  SetValue(kLinkSpinStart, 0.25f);
  Start();
  const std::vector<int> s = RandSequence(3u, 4);
  BirthOne();
  EXPECT_EQ(P(0).SpinSpeed, c.Expected(s[1]));
  EXPECT_EQ(P(0).SpinAngle, 0.25f);
  EXPECT_EQ(DrawsTaken(s), 1 + c.Draws);
}

INSTANTIATE_TEST_SUITE_P(
    Ranges, SpinAtBirth,
    ::testing::Values(SpinCase{"BothPositive", 0.5f, 1.5f, 1,
                               [](int d) { return static_cast<float>(50 + d % 100) * 0.01f; }},
                      SpinCase{"AcrossZero", -1.0f, 2.0f, 1,
                               [](int d) { return -1.0f + static_cast<float>(d % 300) * 0.01f; }},
                      SpinCase{"BothNegative", -3.0f, -1.0f, 1,
                               [](int d) { return -1.0f - static_cast<float>(d % 200) * 0.01f; }},
                      SpinCase{"Equal", 0.75f, 0.75f, 0,
                               [](int) { return static_cast<float>(75) * 0.01f; }},
                      SpinCase{"MinAboveMax", 2.0f, 1.0f, 0, [](int) { return 2.0f; }}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(Birth, MinimumSpinAboveMaximumShowsAMessageAtEveryBirth) {
  SetUpBirths();
  SetValue(kLinkSpinSpeedMin, 2.0f);
  SetValue(kLinkSpinSpeedMax, 1.0f);
  Start();
  BirthOne();
  BirthOne();
  EXPECT_EQ(CountMessages(debugMessages, "APE: min spin speed greater than max"), 2);
}

TEST_F(Birth, WithoutSpinTheSpinFieldsKeepTheRecordsValuesAndNothingIsDrawn) {
  SetUpBirths();
  SetValue(kLinkSpinSpeedMin, 0.5f);  // alone: spin stays off
  Start();
  P(0).SpinSpeed = 7.0f;
  P(0).SpinAngle = 8.0f;
  const std::vector<int> s = RandSequence(3u, 4);
  BirthOne();
  EXPECT_FALSE(emitter->SpinEnabled);
  EXPECT_EQ(P(0).SpinSpeed, 7.0f);
  EXPECT_EQ(P(0).SpinAngle, 8.0f);
  EXPECT_EQ(DrawsTaken(s), 1);
}

TEST_F(Birth, SpinStartAloneSwitchesSpinOnWithZeroSpeed) {
  SetUpBirths();
  SetValue(kLinkSpinStart, 1.5f);
  Start();
  P(0).SpinSpeed = 7.0f;
  BirthOne();
  EXPECT_TRUE(emitter->SpinEnabled);
  EXPECT_EQ(P(0).SpinSpeed, 0.0f);
  EXPECT_EQ(P(0).SpinAngle, 1.5f);
}

struct LifespanCase {
  const char* Name;
  float Min;
  float Max;
  float Scaler;
  int Draws;
  float (*Expected)(int draw);
};

class LifespanAtBirth : public Birth, public ::testing::WithParamInterface<LifespanCase> {};

TEST_P(LifespanAtBirth, IsDrawnInHundredthsAndDividedByTheScale) {
  const LifespanCase& c = GetParam();
  SetUpBirths();
  SetValue(kLinkLifespanMin, c.Min);
  SetValue(kLinkLifespanMax, c.Max);
  SetValue(kLinkSimulationScaler, c.Scaler);
  SetValue(kLinkBirthsPerSecond, 10.0f / c.Scaler);  // still one birth per frame
  Start();
  const std::vector<int> s = RandSequence(9u, 4);
  BirthOne();
  EXPECT_EQ(P(0).Lifespan, c.Expected(s[1]));
  EXPECT_EQ(DrawsTaken(s), 1 + c.Draws);
}

INSTANTIATE_TEST_SUITE_P(
    Ranges, LifespanAtBirth,
    ::testing::Values(
        LifespanCase{"EqualScaled", 2.0f, 2.0f, 2.0f, 0, [](int) { return 1.0f; }},
        LifespanCase{"Range", 1.0f, 3.0f, 1.0f, 1,
                     [](int d) { return static_cast<float>(100 + d % 200) * (1.0f * 0.01f); }},
        LifespanCase{"RangeScaled", 1.0f, 3.0f, 2.0f, 1,
                     [](int d) { return static_cast<float>(100 + d % 200) * (0.5f * 0.01f); }},
        LifespanCase{"MinAboveMax", 3.0f, 1.0f, 2.0f, 0, [](int) { return 1.5f; }}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(Birth, ResetsTheRestOfTheRecord) {
  SetUpBirths();
  Start();
  Particle& old = P(0);
  old.Age = 5.0f;
  old.SmokeForce = {1.0f, 1.0f, 1.0f};
  old.Sliding = true;
  old.Bouncing = false;
  old.NormalizedAge = 0.7f;
  old.AttachRed = 9;
  BirthOne();
  EXPECT_TRUE(P(0).Active);
  EXPECT_EQ(P(0).Age, 0.101f);  // aged by the frame after its birth
  EXPECT_EQ(P(0).SmokeForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  EXPECT_FALSE(P(0).Sliding);
  EXPECT_FALSE(P(0).Attached);
  EXPECT_TRUE(P(0).Bouncing);
  EXPECT_EQ(P(0).NormalizedAge, 0.7f);  // left for the first step
  EXPECT_EQ(P(0).AttachRed, 9);
}

TEST_F(Birth, ReplacingTakesTheOldestFreeFlyingRecord) {
  SetUpBirths(3.0f);
  SetValue(kLinkReplaceOldParticles, 1.0f);
  Start();
  for (int i = 0; i < 3; ++i) PlaceParticle(i, {9.0f, 9.0f, 9.0f}, {0.0f, 0.0f, 0.0f});
  P(0).NormalizedAge = 0.3f;
  P(1).NormalizedAge = 0.8f;
  P(2).NormalizedAge = 0.9f;
  P(2).Attached = true;
  BirthOne();
  EXPECT_EQ(P(1).Position, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(9.0f, 9.0f, 9.0f));
}

TEST_F(Birth, WithoutReplacingAFullPoolGivesNoBirth) {
  SetUpBirths(2.0f);
  Start();
  for (int i = 0; i < 2; ++i) PlaceParticle(i, {9.0f, 9.0f, 9.0f}, {0.0f, 0.0f, 0.0f});
  const std::vector<int> s = RandSequence(4u, 4);
  BirthOne();
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(9.0f, 9.0f, 9.0f));
  EXPECT_EQ(P(1).Position, D3DXVECTOR3(9.0f, 9.0f, 9.0f));
  EXPECT_EQ(DrawsTaken(s), 0);
}

TEST_F(Birth, ReplacingNeverTakesAnAttachedRecord) {
  SetUpBirths(2.0f);
  SetValue(kLinkReplaceOldParticles, 1.0f);
  Start();
  for (int i = 0; i < 2; ++i) {
    PlaceParticle(i, {9.0f, 9.0f, 9.0f}, {0.0f, 0.0f, 0.0f}).Attached = true;
  }
  BirthOne();
  EXPECT_TRUE(P(0).Attached);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(9.0f, 9.0f, 9.0f));
}

TEST_F(Birth, ReplacingWithAnEmptyPoolGivesNoBirth) {
  LinkBasics(1.0f, 1.0f, 10.0f);
  Unlink(kLinkParticleCount);
  SetValue(kLinkReplaceOldParticles, 1.0f);
  Start();
  ASSERT_EQ(emitter->ParticleCount, 0);
  const std::vector<int> s = RandSequence(4u, 4);
  RunFrames(3, 101.0);
  EXPECT_EQ(DrawsTaken(s), 0);
}

TEST_F(Birth, NoEmitterLinkGivesNoBirth) {
  SetUpBirths();
  Unlink(kLinkEmitter);
  Start();
  const std::vector<int> s = RandSequence(4u, 4);
  BirthOne();
  EXPECT_EQ(ActiveCount(), 0);
  EXPECT_EQ(DrawsTaken(s), 0);
}

struct BadMeshCase {
  const char* Name;
  bool VertexEmission;
  std::vector<D3DXVECTOR3> Vertices;
  std::vector<DWORD> Entries;
};

class UnusableMesh : public Birth, public ::testing::WithParamInterface<BadMeshCase> {};

TEST_P(UnusableMesh, GivesNoBirthAndTouchesNoRecord) {
  const BadMeshCase& c = GetParam();
  SetUpBirths();
  SetValue(kLinkVertexEmissions, c.VertexEmission ? 1.0f : 0.0f);
  SetEmitterMesh(c.Vertices, c.Entries);
  Start();
  BirthOne();
  EXPECT_EQ(ActiveCount(), 0);
  const Particle fresh{};
  EXPECT_EQ(P(0).Lifespan, fresh.Lifespan);
  EXPECT_EQ(P(0).PendingSteps, fresh.PendingSteps);
  EXPECT_EQ(P(0).Color, fresh.Color);
}

INSTANTIATE_TEST_SUITE_P(
    Meshes, UnusableMesh,
    ::testing::Values(BadMeshCase{"NoVertices", true, {}, {}},
                      BadMeshCase{"NoEntries", false, {{0.0f, 0.0f, 0.0f}}, {}},
                      BadMeshCase{
                          "TwoEntries", false, {{0.0f, 0.0f, 0.0f}, {1.0f, 0.0f, 0.0f}}, {0, 1}},
                      BadMeshCase{"EntryNamesMissingVertex",
                                  false,
                                  {{0.0f, 0.0f, 0.0f}, {1.0f, 0.0f, 0.0f}, {0.0f, 1.0f, 0.0f}},
                                  {0, 1, 3}}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(Birth, APartialLastTriangleIsNeverChosen) {
  SetUpBirths(60.0f);
  SetValue(kLinkLifespanMin, 100.0f);
  SetValue(kLinkLifespanMax, 100.0f);
  SetValue(kLinkVertexEmissions, 0.0f);
  // Entries 3 and 4 would start a triangle that runs off the list toward a far vertex.
  SetEmitterMesh(
      {{0.0f, 0.0f, 0.0f}, {1.0f, 0.0f, 0.0f}, {0.0f, 1.0f, 0.0f}, {500.0f, 500.0f, 500.0f}},
      {0, 1, 2, 3, 3});
  Start();
  std::srand(21u);
  RunFrames(60, 101.0);
  ASSERT_EQ(ActiveCount(), 60);
  for (const Particle& p : emitter->Particles) {
    EXPECT_GE(p.Position.x, 0.0f);
    EXPECT_GE(p.Position.y, 0.0f);
    EXPECT_LE(p.Position.x + p.Position.y, 1.0f + 1e-6f);
    EXPECT_EQ(p.Position.z, 0.0f);
  }
}

}  // namespace
