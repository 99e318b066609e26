// Every kind of value a scene can give, and what it becomes in the host graph.
#include <gtest/gtest.h>
#include <ostream>

#include <cmath>
#include <fstream>
#include <sstream>

#include "host/attractor.h"
#include "host/envelope_storage.h"
#include "host/link_channels.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"
#include "tests/scene_test_host.h"
#include "tools/scene/png_io.h"

namespace scenetest {
namespace {

// A channel's kind and value as text, numbers rounded to 1e-4 (so a turn's -4e-8 reads 0).
std::string Describe(Qen_Channel* channel) {
  std::ostringstream text;
  auto put = [&](float v) { text << ' ' << std::round(v * 1e4) / 1e4 + 0.0; };
  if (channel == nullptr) return "none";
  if (auto* value = dynamic_cast<Qen_ValueChannel*>(channel)) {
    text << "value";
    put(value->GetValue());
  } else if (auto* vector = dynamic_cast<Qen_ValueVectorChannel*>(channel)) {
    text << "vector";
    for (float v : {vector->GetVector().x, vector->GetVector().y, vector->GetVector().z}) put(v);
  } else if (auto* matrix = dynamic_cast<Qen_MatrixChannel*>(channel)) {
    text << "matrix";
    const D3DXMATRIX m = matrix->GetMatrix();
    for (int row = 0; row < 4; ++row)
      for (int column = 0; column < 4; ++column) put(m.m[row][column]);
  } else if (auto* envelope = dynamic_cast<Tev_EnvelopeStorage*>(channel)) {
    text << "envelope";
    for (float x : {0.25f, 0.5f}) put(envelope->GetEnvelopeValue(x));
  } else {
    text << "other";
  }
  return text.str();
}

class SceneValueTest : public ::testing::Test {
 protected:
  // Loads or fails the test.
  apescene::Scene& Load(const std::string& text, const std::string& base_directory = "") {
    std::string error;
    scene_ = host_.Load(text, &error, base_directory);
    if (scene_ == nullptr) ADD_FAILURE() << error;
    static apescene::Scene empty;
    return scene_ ? *scene_ : empty;
  }
  Tev_AdvancedParticleEmitter* Emitter() {
    return static_cast<Tev_AdvancedParticleEmitter*>(scene_->Find("fx"));
  }
  template <typename T>
  T* Named(const char* name) {
    return static_cast<T*>(scene_->Find(name));
  }

  TestHost host_;
  std::unique_ptr<apescene::Scene> scene_;
};

struct ValueCase {
  const char* Name;
  std::string Links;  // the emitter's links, or a whole scene when it has no "fx"
  int Link;
  std::string Expected;
  // Failures name the case, not its bytes.
  friend void PrintTo(const ValueCase& c, std::ostream* os) { *os << c.Name; }
};

class ValueKindTest : public SceneValueTest, public ::testing::WithParamInterface<ValueCase> {};

TEST_P(ValueKindTest, BecomesTheRightChannel) {
  Load(WithEmitterLinks(GetParam().Links));
  ASSERT_NE(scene_, nullptr);
  EXPECT_EQ(Describe(Emitter()->GetChild(GetParam().Link)), GetParam().Expected);
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, ValueKindTest,
    ::testing::Values(
        ValueCase{"Number", R"({"Births Per Second": 250.5})", kLinkBirthsPerSecond, "value 250.5"},
        // Link 6 is "Births Per Second": the later of the two entries stands.
        ValueCase{"LaterEntryStands", R"({"Births Per Second": 250.5, "6": 1})",
                  kLinkBirthsPerSecond, "value 1"},
        ValueCase{"Null", R"({"Maximum Speed": null})", kLinkMaximumSpeed, "none"},
        ValueCase{"ThreeVector", R"({"GlobalForce": [0.5, -2, 3]})", kLinkGlobalForce,
                  "vector 0.5 -2 3"},
        ValueCase{"MatrixRowByRow",
                  R"({"Emitter Motion": [[1, 2, 3, 4], [5, 6, 7, 8], [9, 10, 11, 12],
                                         [13, 14, 15, 16]]})",
                  kLinkEmitterMotion, "matrix 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16"},
        ValueCase{"ScaleThenTranslate",
                  R"({"Emitter Motion": {"scale": [2, 1, 1], "translation": [0, 5, 0]}})",
                  kLinkEmitterMotion, "matrix 2 0 0 0 0 1 0 0 0 0 1 0 0 5 0 1"},
        ValueCase{"RotationAboutY", R"({"Emitter Motion": {"rotation": [0, 90, 0]}})",
                  kLinkEmitterMotion, "matrix 0 0 -1 0 0 1 0 0 1 0 0 0 0 0 0 1"},
        ValueCase{"YawIsAboutY", R"({"Emitter Motion": {"rotation": {"yaw": 90}}})",
                  kLinkEmitterMotion, "matrix 0 0 -1 0 0 1 0 0 1 0 0 0 0 0 0 1"},
        ValueCase{"RotationAboutXTurnsUpToMinusZ",
                  R"({"Emitter Motion": {"rotation": [-90, 0, 0]}})", kLinkEmitterMotion,
                  "matrix 1 0 0 0 0 0 -1 0 0 1 0 0 0 0 0 1"},
        ValueCase{"XThenY", R"({"Emitter Motion": {"rotation": [90, 90, 0]}})", kLinkEmitterMotion,
                  "matrix 0 0 -1 0 1 0 0 0 0 -1 0 0 0 0 0 1"},
        // Keys sorted by x; "step" holds until the next key, and the first key's mode governs
        // its span.
        ValueCase{"EnvelopeList", R"({"Size Envelope": [[1, 10], [0, 0]]})", kLinkSizeEnvelope,
                  "envelope 2.5 5"},
        ValueCase{"EnvelopeObject",
                  R"({"Green Color Envelope": {"keys": [[0, 0], [1, 100, "linear"]],
                                               "interpolation": "step"}})",
                  kLinkGreenColorEnvelope, "envelope 0 0"}),
    [](const ::testing::TestParamInfo<ValueCase>& info) { return info.param.Name; });

TEST_F(SceneValueTest, ChannelsAreLinkedByNameInlineAndInListsInOrder) {
  Load(WithEmitterLinks(R"({"Lifespan_Min": "life", "Lifespan_Max": "life", "LookAt": "camera.eye",
          "Emitter": {"shape": "box", "half_extents": [1, 2, 3]},
          "Attractors": ["b", {"position": [0, 9, 0]}, "a"]})",
                        R"("life": {"type": "Value", "value": 2},
          "a": {"type": "AdvPE_Attractor"}, "b": {"type": "AdvPE_Attractor"})")
           .insert(1, R"("camera": {"eye": [1, 2, -9]}, )"));
  ASSERT_NE(scene_, nullptr);
  EXPECT_EQ(Emitter()->GetChild(kLinkLifespanMin), scene_->Find("life"));
  EXPECT_EQ(Emitter()->GetChild(kLinkLifespanMax), scene_->Find("life"));
  EXPECT_EQ(Describe(Emitter()->GetChild(kLinkLookAt)), "vector 1 2 -9");
  EXPECT_EQ(static_cast<Tev_DX8_ObjectDataChannel*>(Emitter()->GetChild(kLinkEmitter))
                ->GetBoundingBoxMax()
                .z,
            3.0f);
  ASSERT_EQ(Emitter()->GetChildLinkPositionCount(kLinkAttractors), 3);
  EXPECT_EQ(Emitter()->GetChildFromLinkPosition(kLinkAttractors, 0), scene_->Find("b"));
  EXPECT_EQ(
      static_cast<Tev_AdvPE_Attractor*>(Emitter()->GetChildFromLinkPosition(kLinkAttractors, 1))
          ->Position.y,
      9.0f);
  EXPECT_EQ(Emitter()->GetChildFromLinkPosition(kLinkAttractors, 2), scene_->Find("a"));
}

TEST_F(SceneValueTest, CollidersOfEveryShapeAreAdded) {
  Load(R"({"channels": {
      "wall": {"type": "3D ObjectData", "shape": "quad", "size": [2, 2]},
      "c": {"type": "MultiCollisionManager", "colliders": [
        {"shape": "plane", "point": [0, 0, 0], "normal": [0, 1, 0]},
        {"shape": "sphere", "centre": [0, 5, 0], "radius": 1},
        {"shape": "box", "half_extents": [1, 1, 1], "transform": {"translation": [5, 0, 0]}},
        {"shape": "mesh", "mesh": "wall"}]}}})");
  ASSERT_NE(scene_, nullptr);
  auto* manager = Named<Tev_MultiCollisionManager>("c");
  EXPECT_EQ(manager->GetObjectCount(), 4);
  manager->RebuildAllCollisionObjects();
  // A ray falling onto the sphere from above hits its top.
  D3DXVECTOR3 origin{0, 8, 0}, ray{0, -4, 0}, point, normal;
  float cosine;
  EXPECT_EQ(manager->GetClosestFrontFaceCollision(&origin, &ray, &point, &normal, &cosine), 1);
  EXPECT_NEAR(point.y, 6.0f, 1e-4f);
}

TEST_F(SceneValueTest, ObjFileIsReadRelativeToTheSceneAndMadeLeftHanded) {
  TempFolder folder;
  std::ofstream(folder.File("tri.obj")) << "v 0 0 1\nv 1 0 1\nv 0 1 1\nf 1 2 3\n";
  Load(WithChannel(R"({"type": "3D ObjectData", "obj": "tri.obj"})"), folder.Path());
  ASSERT_NE(scene_, nullptr);
  auto* mesh = Named<Tev_DX8_ObjectDataChannel>("thing");
  ASSERT_EQ(mesh->GetVertexCount(), 3);
  // z negated, and the winding reversed so that the file's front face stays in front (-z here).
  EXPECT_EQ(mesh->GetVertexPosition(0), D3DXVECTOR3(0, 0, -1));
  EXPECT_EQ(mesh->GetVertexPosition(1), D3DXVECTOR3(0, 1, -1));
  EXPECT_EQ(mesh->GetVertexPosition(2), D3DXVECTOR3(1, 0, -1));
  EXPECT_NEAR(mesh->GetVertexNormals(0).z, -1.0f, 1e-6f);
}

TEST_F(SceneValueTest, TextureFromAPngFile) {
  TempFolder folder;
  apescene::Image image{3, 2, {0xFF102030u, 0x80FFFFFFu, 0x00000000u, 1u, 2u, 0xFFABCDEFu}};
  std::string error;
  ASSERT_TRUE(apescene::WritePng(folder.File("t.png"), image, true, &error)) << error;
  Load(WithChannel(R"({"type": "Texture", "file": "t.png"})"), folder.Path());
  ASSERT_NE(scene_, nullptr);
  auto* texture = Named<Qen_TextureChannel>("thing");
  ASSERT_EQ(texture->GetWidth(), 3u);
  ASSERT_EQ(texture->GetHeight(), 2u);
  D3DLOCKED_RECT locked;
  ASSERT_EQ(texture->LockLevel(0, &locked), S_OK);
  const auto* row1 = reinterpret_cast<const std::uint32_t*>(
      static_cast<const std::uint8_t*>(locked.pBits) + locked.Pitch);
  EXPECT_EQ(static_cast<const std::uint32_t*>(locked.pBits)[0], 0xFF102030u);
  EXPECT_EQ(row1[2], 0xFFABCDEFu);
  texture->UnlockLevel(0);
}

TEST_F(SceneValueTest, RenderSettingsAndCamera) {
  Load(R"({"resolution": [320, 200], "fps": 24, "duration": 2.5, "seed": 42,
           "background": [1, 0, 0.5], "camera": {"eye": [0, 0, -3], "target": [0, 0, 1],
           "fov": 60, "near": 0.5, "far": 50}})");
  ASSERT_NE(scene_, nullptr);
  const apescene::RenderSettings& s = scene_->Settings;
  EXPECT_EQ(std::make_tuple(s.Width, s.Height, s.FrameCount(), s.Seed, s.Background),
            std::make_tuple(320, 200, 60, 42u, 0xFFFF0080u));
  EXPECT_EQ(scene_->View.FovDegrees, 60.0f);
  EXPECT_EQ(scene_->View.Far, 50.0f);
  Load(R"({"frames": 7, "fps": 10})");
  EXPECT_EQ(scene_->Settings.FrameCount(), 7);
}

// --- Animated values ---

struct AnimatedCase {
  const char* Name;
  std::string Links;
  int Link;
  std::vector<double> Seconds;
  std::string Expected;  // the link at each of those times, joined by "; "
  // Failures name the case, not its bytes.
  friend void PrintTo(const AnimatedCase& c, std::ostream* os) { *os << c.Name; }
};

class AnimatedValueTest : public SceneValueTest,
                          public ::testing::WithParamInterface<AnimatedCase> {};

TEST_P(AnimatedValueTest, FollowsItsKeys) {
  Load(WithEmitterLinks(GetParam().Links,
                        R"("count": {"type": "Value", "value": {"keys": [[0, 10], [1, 20]]}})"));
  ASSERT_NE(scene_, nullptr);
  std::string seen;
  for (double seconds : GetParam().Seconds) {
    scene_->Animate(seconds);
    seen += (seen.empty() ? "" : "; ") + Describe(Emitter()->GetChild(GetParam().Link));
  }
  EXPECT_EQ(seen, GetParam().Expected);
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, AnimatedValueTest,
    ::testing::Values(
        // Blends linearly and holds its ends.
        AnimatedCase{"Linear",
                     R"({"Births Per Second": {"keys": [[1, 100], [3, 300], [4, 0]]}})",
                     kLinkBirthsPerSecond,
                     {0, 1, 2.5, 3.5, 4, 9},
                     "value 100; value 100; value 250; value 150; value 0; value 0"},
        AnimatedCase{
            "Held",
            R"({"Emitter_Active?": {"keys": [[0, 1], [1, 0], [2, 1]], "interpolation": "hold"}})",
            kLinkEmitterActive,
            {0.999, 1, 1.9, 2},
            "value 1; value 0; value 0; value 1"},
        AnimatedCase{"Vector",
                     R"({"GlobalForce": {"keys": [[0, [0, 0, 0]], [2, [2, -4, 6]]]}})",
                     kLinkGlobalForce,
                     {0.5},
                     "vector 0.5 -1 1.5"},
        AnimatedCase{
            "NamedChannel", R"({"ParticleCount": "count"})", kLinkParticleCount, {0.5}, "value 15"},
        // Half way: a quarter turn (a blend of the two matrices would squash) and half the
        // translation.
        AnimatedCase{"Transform",
                     R"({"Emitter Motion": {"keys": [
                         [0, {"rotation": [0, 0, 0], "translation": [0, 0, 0]}],
                         [1, {"rotation": [0, 180, 0], "translation": [4, 0, 0]}]]}})",
                     kLinkEmitterMotion,
                     {0.5},
                     "matrix 0 0 -1 0 0 1 0 0 1 0 0 0 2 0 0 1"}),
    [](const ::testing::TestParamInfo<AnimatedCase>& info) { return info.param.Name; });

TEST_F(SceneValueTest, AnimatedAttractorMeshAndCamera) {
  Load(R"({"camera": {"eye": {"keys": [[0, [0, 0, -5]], [2, [0, 4, -5]]]}},
           "channels": {
             "a": {"type": "AdvPE_Attractor", "position": {"keys": [[0, [0, 0, 0]], [1, [1, 0, 0]]]},
                   "strength": {"keys": [[0, 1], [1, 3]]}},
             "m": {"type": "3D ObjectData", "shape": "quad",
                   "transform": {"keys": [[0, {"translation": [0, 0, 0]}], [1, {"translation": [0, 2, 0]}]]}}}})");
  ASSERT_NE(scene_, nullptr);
  scene_->Animate(0.5);
  EXPECT_EQ(Named<Tev_AdvPE_Attractor>("a")->Position, D3DXVECTOR3(0.5f, 0, 0));
  EXPECT_EQ(Named<Tev_AdvPE_Attractor>("a")->Strength, 2.0f);
  EXPECT_EQ(Named<Tev_DX8_ObjectDataChannel>("m")->GetWorldMatrix()._42, 1.0f);
  EXPECT_EQ(Describe(scene_->Find("camera.eye")), "vector 0 1 -5");
  EXPECT_TRUE(scene_->MovingGeometry);
}

TEST_F(SceneValueTest, TheDocumentedExampleLoads) {
  std::ifstream doc(std::string(APE_SOURCE_DIR) + "/docs/scene-format.md");
  std::stringstream text;
  text << doc.rdbuf();
  const std::string markdown = text.str(), start = "## A complete example\n\n```json\n";
  const std::size_t begin = markdown.find(start);
  ASSERT_NE(begin, std::string::npos);
  const std::size_t end = markdown.find("```", begin + start.size());
  Load(markdown.substr(begin + start.size(), end - begin - start.size()));
  ASSERT_NE(scene_, nullptr);
  EXPECT_NE(scene_->Find("sparks"), nullptr);
  EXPECT_EQ(scene_->Settings.FrameCount(), 90);
}

}  // namespace
}  // namespace scenetest
