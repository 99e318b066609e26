// Birth: the record chosen, the point on the mesh, the first velocity, colour, size, spin and
// lifespan, and the exact rand() draws each takes.
#include <cstdlib>

#include "simulation/tests/emitter_fixture.h"

namespace {

// One birth per 101 ms frame and no logic step (one step per second): what birth wrote stays.
class Birth : public EmitterTest {
 protected:
  void SetUp() override {
    LinkBasics(4.0f, 1.0f, 10.0f);
    SetValue(kLinkLifespanMin, 2.0f);
    SetValue(kLinkLifespanMax, 2.0f);
  }
  void BirthOne() { RunFrame(101.0); }
  void FreeAll() {
    for (Particle& p : emitter->Particles) p.Active = false;
  }
};

// A seed whose first rand() % modulus is `wanted`.
unsigned SeedGiving(int modulus, int wanted) {
  for (unsigned seed = 1;; ++seed) {
    std::srand(seed);
    if (std::rand() % modulus == wanted) return seed;
  }
}

float Hundredths(int value) {
  return static_cast<float>(value) * 0.01f;
}

TEST_F(Birth, VertexEmissionWritesTheWholeRecordDrawingVertexSizeSpinAndLifespanInThisOrder) {
  const std::vector<D3DXVECTOR3> vertices = {
      {1.0f, 0.0f, 0.0f}, {0.0f, 2.0f, 0.0f}, {0.0f, 0.0f, 3.0f}, {4.0f, 4.0f, 0.0f}, {-1, -1, -1}};
  D3DXMATRIX motion;
  D3DXMatrixTranslation(&motion, 1.0f, 0.0f, 0.0f);
  SetEmitterMesh(vertices, {})->SetWorldMatrix(motion);  // its origin
  SetValue(kLinkInitialForceStrength, 2.0f);
  D3DXMatrixTranslation(&motion, 10.0f, 0.0f, -1.0f);
  motion._44 = 4.0f;  // w is never divided by
  ASSERT_TRUE(emitter->SetChild(kLinkEmitterMotion, Make<Qen_MatrixChannel>(motion)));
  SetValue(kLinkSizeOffsetMax, 2.0f);
  SetValue(kLinkSpinSpeedMin, 0.5f);
  SetValue(kLinkSpinSpeedMax, 1.5f);
  SetValue(kLinkLifespanMin, 1.0f);
  SetValue(kLinkLifespanMax, 3.0f);
  SetEnvelope(kLinkSizeEnvelope, {{0.0f, 2.5f}, {1.0f, 9.0f}});
  SetEnvelope(kLinkVertexAlphaEnvelope, {{0.0f, 300.0f}, {1.0f, 0.0f}});  // capped at 255
  SetEnvelope(kLinkRedColorEnvelope, {{0.0f, 100.9f}});                   // truncated
  SetEnvelope(kLinkGreenColorEnvelope, {{0.0f, -1.0f}});                  // low eight bits
  Start();
  Particle& old = P(0);
  old.SmokeForce = {1.0f, 1.0f, 1.0f};
  old.Sliding = true;
  old.Bouncing = false;
  old.NormalizedAge = 0.7f;
  const std::vector<int> s = RandSequence(11u, 12);
  BirthOne();
  const Particle& p = P(0);
  ASSERT_TRUE(p.Active);
  EXPECT_EQ(p.Position, vertices[static_cast<std::size_t>(s[0] % 5)] + D3DXVECTOR3(10, 0, -1));
  D3DXVECTOR3 direction = p.Position - D3DXVECTOR3(1.0f, 0.0f, 0.0f);
  D3DXVec3Normalize(&direction, &direction);
  EXPECT_EQ(p.Velocity, direction * 2.0f);
  EXPECT_EQ(p.SizeMultiplier, static_cast<float>(1000 + s[1] % 1000) / 1000.0f);
  EXPECT_EQ(p.Size, 2.5f * p.SizeMultiplier);
  EXPECT_EQ(p.SpinSpeed, Hundredths(50 + s[2] % 100));
  EXPECT_EQ(p.Lifespan, static_cast<float>(100 + s[3] % 200) * (1.0f * 0.01f));
  EXPECT_EQ(DrawsTaken(s), 4);
  EXPECT_EQ(p.Color, 0xFF64FF00u);
  EXPECT_EQ(p.Age, 0.101f);  // aged by the frame after its birth
  EXPECT_EQ(p.SmokeForce, kZero);
  EXPECT_FALSE(p.Sliding || p.Attached);
  EXPECT_TRUE(p.Bouncing);
  EXPECT_EQ(p.NormalizedAge, 0.7f);  // left for the first step
}

// Entries 6, 7 and 8 are the corners of the last triangle (k mod 3 = 0, 1, 2): the point goes
// from entry k's vertex toward its neighbours in order, and the velocity follows its normal. At
// scale 2 velocities double and lifespans halve.
TEST_F(Birth, TriangleEmissionBuildsThePointFromEntryKTowardItsNeighbours) {
  const std::vector<D3DXVECTOR3> v = {{0, 0, 0},  {4, 0, 0}, {0, 4, 1},  {1, 2, 3},  {-5, 1, 2},
                                      {3, -3, 7}, {2, 8, 1}, {9, 1, -4}, {-2, -6, 5}};
  const std::vector<DWORD> entries = {2, 0, 1, 5, 3, 4, 7, 8, 6};
  std::vector<D3DXVECTOR3> normals;
  for (int i = 0; i < 9; ++i) normals.push_back({0.0f, static_cast<float>(i), 1.0f});
  SetValue(kLinkVertexEmissions, 0.0f);
  SetEmitterMesh(v, entries, normals);
  SetValue(kLinkSizeOffsetMax, 1.001f);  // under two thousandths: no draw
  SetValue(kLinkSimulationScaler, 2.0f);
  SetValue(kLinkBirthsPerSecond, 5.0f);
  SetValue(kLinkInitialForceAlongNormal, 1.0f);
  SetValue(kLinkInitialForceStrength, 2.0f);
  Start();
  const int others[3][2] = {{1, 2}, {1, -1}, {-2, -1}};
  for (int k : {6, 7, 8}) {
    FreeAll();
    const std::vector<int> s = RandSequence(SeedGiving(9, k), 8);
    BirthOne();
    const D3DXVECTOR3 p0 = v[entries[k]];
    const D3DXVECTOR3 p1 = v[entries[k + others[k % 3][0]]];
    const D3DXVECTOR3 p2 = v[entries[k + others[k % 3][1]]];
    const D3DXVECTOR3 q = p0 + (p1 - p0) * Hundredths(s[1] % 100);
    const D3DXVECTOR3 expected = q + (p2 - q) * Hundredths(s[2] % 100);
    EXPECT_FLOAT_EQ(P(0).Position.x, expected.x) << k;
    EXPECT_FLOAT_EQ(P(0).Position.y, expected.y) << k;
    EXPECT_FLOAT_EQ(P(0).Position.z, expected.z) << k;
    EXPECT_EQ(P(0).SizeMultiplier, 1.0f) << k;
    EXPECT_EQ(P(0).Lifespan, 1.0f) << k;  // 2 s, equal bounds: no draw, divided by the scale
    EXPECT_EQ(P(0).Velocity, normals[entries[k]] * 2.0f * 2.0f) << k;  // not normalised
    EXPECT_EQ(DrawsTaken(s), 3) << k;
  }
}

TEST_F(Birth, SpinSpeedIsDrawnByTheSignsOfTheRange) {
  const struct {
    float Min, Max;
    int Draws;
    float (*Expected)(int draw);
  } cases[] = {{0.5f, 1.5f, 1, [](int d) { return Hundredths(50 + d % 100); }},
               {-1.0f, 2.0f, 1, [](int d) { return -1.0f + Hundredths(d % 300); }},
               {-3.0f, -1.0f, 1, [](int d) { return -1.0f - Hundredths(d % 200); }},
               {0.75f, 0.75f, 0, [](int) { return Hundredths(75); }},
               {2.0f, 1.0f, 0, [](int) { return 2.0f; }}};  // with a message
  SetValue(kLinkSpinStart, 0.25f);
  Start();
  for (const auto& c : cases) {
    SetValue(kLinkSpinSpeedMin, c.Min);
    SetValue(kLinkSpinSpeedMax, c.Max);
    FreeAll();
    const std::vector<int> s = RandSequence(3u, 4);
    BirthOne();
    EXPECT_EQ(P(0).SpinSpeed, c.Expected(s[1])) << c.Min << " " << c.Max;
    EXPECT_EQ(P(0).SpinAngle, 0.25f);
    EXPECT_EQ(DrawsTaken(s), 1 + c.Draws) << c.Min << " " << c.Max;
  }
  EXPECT_EQ(debugMessages, std::vector<std::string>{"APE: min spin speed greater than max"});
}

// Replacing takes the oldest record that is not attached; a pool without one gives no birth.
TEST_F(Birth, AFullPoolIsReplacedOnlyWhenAskedAndNeverAtAnAttachedRecord) {
  const struct {
    bool Replace;
    std::vector<bool> Attached;
    int Expected;
  } cases[] = {{true, {0, 0, 1, 0}, 1}, {false, {0, 0, 0, 0}, -1}, {true, {1, 1, 1, 1}, -1}};
  Start();
  for (const auto& c : cases) {
    SetValue(kLinkReplaceOldParticles, c.Replace ? 1.0f : 0.0f);
    const float ages[] = {0.3f, 0.8f, 0.9f, 0.8f};  // a tie keeps the lower index
    for (int i = 0; i < 4; ++i) {
      PlaceParticle(i, {9.0f, 9.0f, 9.0f}, kZero).Attached = c.Attached[i];
      P(i).NormalizedAge = ages[i];
    }
    const std::vector<int> s = RandSequence(4u, 4);
    BirthOne();
    for (int i = 0; i < 4; ++i)
      EXPECT_EQ(P(i).Position.x, i == c.Expected ? 0.0f : 9.0f) << i << " " << c.Expected;
    EXPECT_EQ(DrawsTaken(s), c.Expected < 0 ? 0 : 1);
  }
}

// Without a mesh to emit from, or a record to use, nothing is born and no record is touched.
TEST_F(Birth, NothingToEmitFromGivesNoBirth) {
  const struct {
    const char* Name;
    float Count;
    bool Linked, VertexEmission;
    std::vector<D3DXVECTOR3> Vertices;
    std::vector<DWORD> Entries;
  } cases[] = {
      {"NoLink", 4, false, true, {{0, 0, 0}}, {}},
      {"EmptyPoolReplacing", 0, true, true, {{0, 0, 0}}, {}},
      {"NoVertices", 4, true, true, {}, {}},
      {"TwoEntries", 4, true, false, {{0, 0, 0}, {1, 0, 0}}, {0, 1}},
      {"EntryNamesMissingVertex", 4, true, false, {{0, 0, 0}, {1, 0, 0}, {0, 1, 0}}, {0, 1, 3}}};
  SetValue(kLinkReplaceOldParticles, 1.0f);
  for (const auto& c : cases) {
    c.Count > 0 ? (void)SetValue(kLinkParticleCount, c.Count) : Unlink(kLinkParticleCount);
    SetValue(kLinkVertexEmissions, c.VertexEmission ? 1.0f : 0.0f);
    SetEmitterMesh(c.Vertices, c.Entries);
    if (!c.Linked) Unlink(kLinkEmitter);
    emitter->Initialize();
    BirthOne();
    EXPECT_EQ(ActiveCount(), 0) << c.Name;
    for (const Particle& p : emitter->Particles) EXPECT_EQ(p.Lifespan, 0.0f) << c.Name;
  }
}

}  // namespace
