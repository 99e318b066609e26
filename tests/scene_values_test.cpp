// Every kind of value a scene can give, and what it becomes in the host graph.
#include <gtest/gtest.h>

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
  float LinkValue(int index) {
    auto* value = dynamic_cast<Qen_ValueChannel*>(Emitter()->GetChild(index));
    return value ? value->GetValue() : NAN;
  }

  TestHost host_;
  std::unique_ptr<apescene::Scene> scene_;
};

TEST_F(SceneValueTest, NumberBecomesAValueChannel) {
  Load(WithEmitterLinks(R"({"Births Per Second": 250.5, "6": 1})"));
  ASSERT_NE(scene_, nullptr);
  // Link 6 is "Births Per Second": the later of the two entries stands.
  EXPECT_EQ(LinkValue(kLinkBirthsPerSecond), 1.0f);
  Load(WithEmitterLinks(R"({"Births Per Second": 250.5})"));
  EXPECT_EQ(LinkValue(kLinkBirthsPerSecond), 250.5f);
}

TEST_F(SceneValueTest, ThreeVectorBecomesAValueVectorChannel) {
  Load(WithEmitterLinks(R"({"GlobalForce": [0.5, -2, 3]})"));
  ASSERT_NE(scene_, nullptr);
  auto* vector = dynamic_cast<Qen_ValueVectorChannel*>(Emitter()->GetChild(kLinkGlobalForce));
  ASSERT_NE(vector, nullptr);
  EXPECT_EQ(vector->GetVector(), D3DXVECTOR3(0.5f, -2.0f, 3.0f));
}

TEST_F(SceneValueTest, FourByFourMatrixIsTakenRowByRow) {
  Load(WithEmitterLinks(
      R"({"Emitter Motion": [[1, 2, 3, 4], [5, 6, 7, 8], [9, 10, 11, 12], [13, 14, 15, 16]]})"));
  ASSERT_NE(scene_, nullptr);
  auto* matrix = dynamic_cast<Qen_MatrixChannel*>(Emitter()->GetChild(kLinkEmitterMotion));
  ASSERT_NE(matrix, nullptr);
  const D3DXMATRIX m = matrix->GetMatrix();
  EXPECT_EQ(m._12, 2.0f);
  EXPECT_EQ(m._41, 13.0f);  // translation row
  EXPECT_EQ(m._44, 16.0f);
}

struct TransformCase {
  const char* Name;
  const char* Json;
  D3DXVECTOR3 Point;
  D3DXVECTOR3 Expected;
};

class TransformTest : public SceneValueTest, public ::testing::WithParamInterface<TransformCase> {};

TEST_P(TransformTest, MovesPointsAsWritten) {
  Load(WithEmitterLinks(std::string(R"({"Emitter Motion": )") + GetParam().Json + "}"));
  ASSERT_NE(scene_, nullptr);
  const D3DXMATRIX m =
      static_cast<Qen_MatrixChannel*>(Emitter()->GetChild(kLinkEmitterMotion))->GetMatrix();
  D3DXVECTOR3 out;
  D3DXVec3TransformCoord(&out, &GetParam().Point, &m);
  EXPECT_NEAR(out.x, GetParam().Expected.x, 1e-5f);
  EXPECT_NEAR(out.y, GetParam().Expected.y, 1e-5f);
  EXPECT_NEAR(out.z, GetParam().Expected.z, 1e-5f);
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, TransformTest,
    ::testing::Values(
        TransformCase{"EmptyIsIdentity", "{}", {1, 2, 3}, {1, 2, 3}},
        TransformCase{"Translation", R"({"translation": [1, 0, -2]})", {1, 1, 1}, {2, 1, -1}},
        TransformCase{"UniformScale", R"({"scale": 2})", {1, 2, 3}, {2, 4, 6}},
        TransformCase{"ScaleThenTranslate",
                      R"({"scale": [2, 1, 1], "translation": [0, 5, 0]})",
                      {1, 0, 0},
                      {2, 5, 0}},
        // Left-handed: a quarter turn about y takes +x to -z.
        TransformCase{"RotationAboutY", R"({"rotation": [0, 90, 0]})", {1, 0, 0}, {0, 0, -1}},
        TransformCase{
            "RotationAboutXTurnsUpToMinusZ", R"({"rotation": [-90, 0, 0]})", {0, 1, 0}, {0, 0, -1}},
        TransformCase{"YawIsAboutY", R"({"rotation": {"yaw": 90}})", {1, 0, 0}, {0, 0, -1}},
        TransformCase{"XThenYOrder", R"({"rotation": [90, 90, 0]})", {0, 1, 0}, {1, 0, 0}}),
    [](const ::testing::TestParamInfo<TransformCase>& info) { return info.param.Name; });

TEST_F(SceneValueTest, EnvelopeKeysListAndObjectForms) {
  Load(WithEmitterLinks(
      R"({"Size Envelope": [[1, 10], [0, 0]],
          "Red Color Envelope": {"keys": [[0, 0], [1, 100]], "interpolation": "step"},
          "Green Color Envelope": {"keys": [[0, 0], [1, 100, "linear"]], "interpolation": "step"}})"));
  ASSERT_NE(scene_, nullptr);
  auto* size = static_cast<Tev_EnvelopeStorage*>(Emitter()->GetChild(kLinkSizeEnvelope));
  EXPECT_FLOAT_EQ(size->GetEnvelopeValue(0.25f), 2.5f);  // keys sorted by x
  auto* red = static_cast<Tev_EnvelopeStorage*>(Emitter()->GetChild(kLinkRedColorEnvelope));
  EXPECT_FLOAT_EQ(red->GetEnvelopeValue(0.5f), 0.0f);  // held until the next key
  auto* green = static_cast<Tev_EnvelopeStorage*>(Emitter()->GetChild(kLinkGreenColorEnvelope));
  EXPECT_FLOAT_EQ(green->GetEnvelopeValue(0.5f), 0.0f);  // the first key's mode governs its span
}

TEST_F(SceneValueTest, NamedChannelsAreSharedByReference) {
  Load(WithEmitterLinks(R"({"Lifespan_Min": "life", "Lifespan_Max": "life", "Emitter": "m"})",
                        R"("life": {"type": "Value", "value": 2},
                           "m": {"type": "3D ObjectData", "shape": "quad"})"));
  ASSERT_NE(scene_, nullptr);
  EXPECT_EQ(Emitter()->GetChild(kLinkLifespanMin), scene_->Find("life"));
  EXPECT_EQ(Emitter()->GetChild(kLinkLifespanMax), scene_->Find("life"));
  EXPECT_EQ(Emitter()->GetChild(kLinkEmitter), scene_->Find("m"));
  EXPECT_EQ(LinkValue(kLinkLifespanMin), 2.0f);
}

TEST_F(SceneValueTest, InlineChannelDefinitionsAndNullLinks) {
  Load(WithEmitterLinks(
      R"({"Emitter": {"shape": "box", "half_extents": [1, 2, 3]},
          "MultiCollisionManager": {"type": "MultiCollisionManager",
                                    "colliders": [{"shape": "sphere", "centre": [0, 0, 0], "radius": 1}]},
          "Maximum Speed": null})"));
  ASSERT_NE(scene_, nullptr);
  auto* box = static_cast<Tev_DX8_ObjectDataChannel*>(Emitter()->GetChild(kLinkEmitter));
  ASSERT_NE(box, nullptr);
  EXPECT_GT(box->GetVertexCount(), 0);
  EXPECT_EQ(box->GetBoundingBoxMax().z, 3.0f);
  auto* manager =
      static_cast<Tev_MultiCollisionManager*>(Emitter()->GetChild(kLinkMultiCollisionManager));
  ASSERT_NE(manager, nullptr);
  EXPECT_EQ(manager->GetObjectCount(), 1);
  EXPECT_EQ(Emitter()->GetChild(kLinkMaximumSpeed), nullptr);
}

TEST_F(SceneValueTest, ManyChannelLinkTakesAListInOrder) {
  Load(WithEmitterLinks(R"({"Attractors": ["b", {"position": [0, 9, 0]}, "a"]})",
                        R"("a": {"type": "AdvPE_Attractor"}, "b": {"type": "AdvPE_Attractor"})"));
  ASSERT_NE(scene_, nullptr);
  ASSERT_EQ(Emitter()->GetChildLinkPositionCount(kLinkAttractors), 3);
  EXPECT_EQ(Emitter()->GetChildFromLinkPosition(kLinkAttractors, 0), scene_->Find("b"));
  EXPECT_EQ(
      static_cast<Tev_AdvPE_Attractor*>(Emitter()->GetChildFromLinkPosition(kLinkAttractors, 1))
          ->Position.y,
      9.0f);
  EXPECT_EQ(Emitter()->GetChildFromLinkPosition(kLinkAttractors, 2), scene_->Find("a"));
}

TEST_F(SceneValueTest, AttractorFields) {
  Load(WithChannel(R"({"type": "AdvPE_Attractor", "position": [1, 2, 3], "strength": -4,
                       "falloff": "linear", "minimum_radius": 0.5, "radius": 6,
                       "vortex_strength": 7, "vortex_axis": [1, 0, 0]})"));
  ASSERT_NE(scene_, nullptr);
  auto* a = static_cast<Tev_AdvPE_Attractor*>(scene_->Find("thing"));
  EXPECT_EQ(a->Position, D3DXVECTOR3(1, 2, 3));
  EXPECT_EQ(a->Strength, -4.0f);
  EXPECT_EQ(a->FalloffMode, Tev_AdvPE_Attractor::Falloff::Linear);
  EXPECT_EQ(a->MinimumRadius, 0.5f);
  EXPECT_EQ(a->Radius, 6.0f);
  EXPECT_EQ(a->VortexStrength, 7.0f);
  EXPECT_EQ(a->VortexAxis, D3DXVECTOR3(1, 0, 0));
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
  auto* manager = static_cast<Tev_MultiCollisionManager*>(scene_->Find("c"));
  EXPECT_EQ(manager->GetObjectCount(), 4);
  manager->RebuildAllCollisionObjects();
  // A ray falling onto the sphere from above hits its top.
  D3DXVECTOR3 origin{0, 8, 0}, ray{0, -4, 0}, point, normal;
  float cosine;
  EXPECT_EQ(manager->GetClosestFrontFaceCollision(&origin, &ray, &point, &normal, &cosine), 1);
  EXPECT_NEAR(point.y, 6.0f, 1e-4f);
}

TEST_F(SceneValueTest, GridHasTwoTrianglesPerCellInTwoColours) {
  Load(WithChannel(R"({"type": "3D ObjectData", "shape": "grid", "size": [4, 4], "cells": 3,
                       "color": "#FF0000", "color2": [0, 0, 1], "shade": false})"));
  ASSERT_NE(scene_, nullptr);
  auto* grid = static_cast<Tev_DX8_ObjectDataChannel*>(scene_->Find("thing"));
  EXPECT_EQ(grid->GetVertexCount(), 3 * 3 * 6);
  EXPECT_EQ(grid->GetVertexColor(0), 0xFFFF0000u);
  EXPECT_EQ(grid->GetVertexColor(6), 0xFF0000FFu);
  EXPECT_NEAR(grid->GetVertexPosition(0).x, -2.0f, 1e-6f);
}

TEST_F(SceneValueTest, ShadingDarkensFacesTurnedFromTheLight) {
  Load(WithChannel(R"({"type": "3D ObjectData", "shape": "box", "color": "#FFFFFF"})"));
  ASSERT_NE(scene_, nullptr);
  auto* box = static_cast<Tev_DX8_ObjectDataChannel*>(scene_->Find("thing"));
  DWORD top = 0, bottom = 0xFFFFFFFF;
  for (int i = 0; i < box->GetVertexCount(); ++i) {
    const D3DXVECTOR3 n = box->GetVertexNormals(static_cast<DWORD>(i));
    if (n.y > 0.9f) top = box->GetVertexColor(static_cast<DWORD>(i));
    if (n.y < -0.9f) bottom = box->GetVertexColor(static_cast<DWORD>(i));
  }
  EXPECT_GT(top & 0xFF, bottom & 0xFF);
  EXPECT_EQ(bottom & 0xFF, static_cast<DWORD>(std::lround(255 * 0.35)));  // ambient only
}

TEST_F(SceneValueTest, ObjFileIsReadRelativeToTheSceneAndMadeLeftHanded) {
  TempFolder folder;
  std::ofstream(folder.File("tri.obj")) << "v 0 0 1\nv 1 0 1\nv 0 1 1\nf 1 2 3\n";
  Load(WithChannel(R"({"type": "3D ObjectData", "obj": "tri.obj"})"), folder.Path());
  ASSERT_NE(scene_, nullptr);
  auto* mesh = static_cast<Tev_DX8_ObjectDataChannel*>(scene_->Find("thing"));
  ASSERT_EQ(mesh->GetVertexCount(), 3);
  ASSERT_EQ(mesh->GetIndexCount(), 3);
  // z negated, and the winding reversed so that the file's front face stays in front.
  EXPECT_EQ(mesh->GetVertexPosition(0), D3DXVECTOR3(0, 0, -1));
  EXPECT_EQ(mesh->GetVertexPosition(1), D3DXVECTOR3(0, 1, -1));
  EXPECT_EQ(mesh->GetVertexPosition(2), D3DXVECTOR3(1, 0, -1));
  // Counter-clockwise in the file, facing +z there: it faces -z here, and the host's rule for
  // a front face (normal = (b - a) x (c - a)) agrees with the normal given.
  EXPECT_NEAR(mesh->GetVertexNormals(0).z, -1.0f, 1e-6f);
  const D3DXVECTOR3 a = mesh->GetVertexPosition(0), b = mesh->GetVertexPosition(1),
                    c = mesh->GetVertexPosition(2);
  const D3DXVECTOR3 ab = b - a, ac = c - a;
  D3DXVECTOR3 front;
  D3DXVec3Cross(&front, &ab, &ac);
  EXPECT_LT(front.z, 0.0f);
}

TEST_F(SceneValueTest, TextureFromABuiltInImage) {
  Load(WithChannel(R"({"type": "Texture", "image": "dot", "size": 16})"));
  ASSERT_NE(scene_, nullptr);
  auto* texture = static_cast<Qen_TextureChannel*>(scene_->Find("thing"));
  EXPECT_EQ(texture->GetWidth(), 16u);
  D3DLOCKED_RECT locked;
  ASSERT_EQ(texture->LockLevel(0, &locked), S_OK);
  auto texel = [&](int x, int y) {
    return reinterpret_cast<const std::uint32_t*>(static_cast<const std::uint8_t*>(locked.pBits) +
                                                  y * locked.Pitch)[x];
  };
  EXPECT_GT(texel(8, 8) >> 24, 200u);             // opaque centre
  EXPECT_EQ(texel(0, 0) >> 24, 0u);               // clear corner
  EXPECT_EQ(texel(8, 8) & 0xFFFFFFu, 0xFFFFFFu);  // white, for the vertex colour to tint
  texture->UnlockLevel(0);
}

TEST_F(SceneValueTest, TextureFromAPngFile) {
  TempFolder folder;
  apescene::Image image{3, 2, {0xFF102030u, 0x80FFFFFFu, 0x00000000u, 1u, 2u, 0xFFABCDEFu}};
  std::string error;
  ASSERT_TRUE(apescene::WritePng(folder.File("t.png"), image, true, &error)) << error;
  Load(WithChannel(R"({"type": "Texture", "file": "t.png"})"), folder.Path());
  ASSERT_NE(scene_, nullptr);
  auto* texture = static_cast<Qen_TextureChannel*>(scene_->Find("thing"));
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
           "background": [1, 0, 0.5],
           "camera": {"eye": [0, 0, -3], "target": [0, 0, 1], "fov": 60, "near": 0.5, "far": 50}})");
  ASSERT_NE(scene_, nullptr);
  const apescene::RenderSettings& s = scene_->Settings;
  EXPECT_EQ(s.Width, 320);
  EXPECT_EQ(s.Height, 200);
  EXPECT_EQ(s.FrameCount(), 60);
  EXPECT_EQ(s.Seed, 42u);
  EXPECT_EQ(s.Background, 0xFFFF0080u);
  EXPECT_EQ(scene_->View.FovDegrees, 60.0f);
  EXPECT_EQ(scene_->View.Far, 50.0f);
  Load(R"({"frames": 7, "fps": 10})");
  EXPECT_EQ(scene_->Settings.FrameCount(), 7);
}

TEST_F(SceneValueTest, CameraEyeIsAChannelEmittersCanFace) {
  Load(WithEmitterLinks(R"({"LookAt": "camera.eye"})")
           .insert(1, R"("camera": {"eye": [1, 2, -9]}, )"));
  ASSERT_NE(scene_, nullptr);
  auto* look = static_cast<Qen_ValueVectorChannel*>(Emitter()->GetChild(kLinkLookAt));
  ASSERT_NE(look, nullptr);
  EXPECT_EQ(look->GetVector(), D3DXVECTOR3(1, 2, -9));
}

// --- Animated values ---

TEST_F(SceneValueTest, AnimatedNumberBlendsLinearlyAndHoldsItsEnds) {
  Load(WithEmitterLinks(R"({"Births Per Second": {"keys": [[1, 100], [3, 300], [4, 0]]}})"));
  ASSERT_NE(scene_, nullptr);
  const std::pair<double, float> expected[] = {{0.0, 100}, {1.0, 100}, {2.0, 200}, {2.5, 250},
                                               {3.5, 150}, {4.0, 0},   {9.0, 0}};
  for (const auto& [seconds, value] : expected) {
    scene_->Animate(seconds);
    EXPECT_FLOAT_EQ(LinkValue(kLinkBirthsPerSecond), value) << "at " << seconds << " s";
  }
}

TEST_F(SceneValueTest, HeldKeysSwitchAnEmitterOnAndOff) {
  Load(WithEmitterLinks(
      R"({"Emitter_Active?": {"keys": [[0, 1], [1, 0], [2, 1]], "interpolation": "hold"}})"));
  ASSERT_NE(scene_, nullptr);
  const std::pair<double, float> expected[] = {{0.5, 1}, {0.999, 1}, {1.0, 0}, {1.9, 0}, {2.0, 1}};
  for (const auto& [seconds, value] : expected) {
    scene_->Animate(seconds);
    EXPECT_EQ(LinkValue(kLinkEmitterActive), value) << "at " << seconds << " s";
  }
}

TEST_F(SceneValueTest, AnimatedVectorAndChannelValue) {
  Load(WithEmitterLinks(R"({"GlobalForce": {"keys": [[0, [0, 0, 0]], [2, [2, -4, 6]]]},
                            "ParticleCount": "count"})",
                        R"("count": {"type": "Value", "value": {"keys": [[0, 10], [1, 20]]}})"));
  ASSERT_NE(scene_, nullptr);
  scene_->Animate(0.5);
  auto* force = static_cast<Qen_ValueVectorChannel*>(Emitter()->GetChild(kLinkGlobalForce));
  EXPECT_EQ(force->GetVector(), D3DXVECTOR3(0.5f, -1.0f, 1.5f));
  EXPECT_EQ(LinkValue(kLinkParticleCount), 15.0f);
}

TEST_F(SceneValueTest, AnimatedTransformBlendsItsParts) {
  Load(WithEmitterLinks(R"({"Emitter Motion": {"keys": [
      [0, {"rotation": [0, 0, 0], "translation": [0, 0, 0]}],
      [1, {"rotation": [0, 180, 0], "translation": [4, 0, 0]}]]}})"));
  ASSERT_NE(scene_, nullptr);
  scene_->Animate(0.5);
  const D3DXMATRIX m =
      static_cast<Qen_MatrixChannel*>(Emitter()->GetChild(kLinkEmitterMotion))->GetMatrix();
  // Half way: a quarter turn (not a blend of the two matrices, which would squash) and half
  // the translation.
  D3DXVECTOR3 out, x{1, 0, 0};
  D3DXVec3TransformCoord(&out, &x, &m);
  EXPECT_NEAR(out.x, 2.0f, 1e-5f);
  EXPECT_NEAR(out.z, -1.0f, 1e-5f);
}

TEST_F(SceneValueTest, AnimatedAttractorMeshAndCamera) {
  Load(R"({"camera": {"eye": {"keys": [[0, [0, 0, -5]], [2, [0, 4, -5]]]}},
           "channels": {
             "a": {"type": "AdvPE_Attractor", "position": {"keys": [[0, [0, 0, 0]], [1, [1, 0, 0]]]},
                   "strength": {"keys": [[0, 1], [1, 3]]}},
             "m": {"type": "3D ObjectData", "shape": "quad",
                   "transform": {"keys": [[0, {"translation": [0, 0, 0]}], [1, {"translation": [0, 2, 0]}]]}}}})");
  ASSERT_NE(scene_, nullptr);
  scene_->Animate(0.5);
  auto* a = static_cast<Tev_AdvPE_Attractor*>(scene_->Find("a"));
  EXPECT_EQ(a->Position, D3DXVECTOR3(0.5f, 0, 0));
  EXPECT_EQ(a->Strength, 2.0f);
  EXPECT_EQ(static_cast<Tev_DX8_ObjectDataChannel*>(scene_->Find("m"))->GetWorldMatrix()._42, 1.0f);
  EXPECT_EQ(static_cast<Qen_ValueVectorChannel*>(scene_->Find("camera.eye"))->GetVector(),
            D3DXVECTOR3(0, 1, -5));
  EXPECT_TRUE(scene_->MovingGeometry);
}

TEST_F(SceneValueTest, ChannelsAreNamedAndKeptInDocumentOrder) {
  Load(
      R"({"channels": {"zeta": {"type": "Value", "value": 1}, "alpha": {"type": "Value", "value": 2}}})");
  ASSERT_NE(scene_, nullptr);
  ASSERT_EQ(scene_->Named.size(), 3u);  // with camera.eye first
  EXPECT_EQ(scene_->Named[1].Name, "zeta");
  EXPECT_EQ(scene_->Named[2].Name, "alpha");
  EXPECT_EQ(scene_->Find("zeta")->GetChannelName(), "zeta");
}

TEST_F(SceneValueTest, CommentsAreAllowedAndLinesStillCount) {
  const std::string error =
      host_.ErrorOf("{\n// a comment\n/* a block\ncomment */ \"fps\": \"fast\"}");
  EXPECT_EQ(error, "test.json:4: fps: expected a number, got a string");
}

TEST_F(SceneValueTest, TheDocumentedExampleLoads) {
  std::ifstream doc(std::string(APE_SOURCE_DIR) + "/docs/scene-format.md");
  std::stringstream text;
  text << doc.rdbuf();
  const std::string markdown = text.str();
  const std::string start = "## A complete example\n\n```json\n";
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
