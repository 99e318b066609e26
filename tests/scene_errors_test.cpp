// Every kind of fault in a scene file gives one message naming the file, the line and the place
// in the document.
#include <gtest/gtest.h>

#include <fstream>

#include "tests/scene_test_host.h"

namespace scenetest {
namespace {

struct ErrorCase {
  const char* Name;
  std::string Text;
  std::string Message;
};

class SceneErrorTest : public ::testing::TestWithParam<ErrorCase> {};

TEST_P(SceneErrorTest, GivesTheExactMessage) {
  TestHost host;
  EXPECT_EQ(host.ErrorOf(GetParam().Text), GetParam().Message);
}

const std::string kNozzle = R"("nozzle": {"type": "3D ObjectData", "shape": "disc"})";

INSTANTIATE_TEST_SUITE_P(
    Kinds, SceneErrorTest,
    ::testing::Values(
        ErrorCase{"SyntaxErrorGivesLineAndColumn", "{\n  \"fps\": 30,,\n}",
                  "test.json:2:13: syntax error while parsing object key - unexpected ','; "
                  "expected string literal"},
        ErrorCase{"EmptyDocument", "",
                  "test.json:1:1: syntax error while parsing value - unexpected end of input; "
                  "expected '[', '{', or a literal"},
        ErrorCase{"StringWhereANumberGoes",
                  "{\"channels\": {\n \"sparks\": {\"type\": \"AdvancedParticleEmitter\",\n "
                  "\"links\": {\n  \"Births Per Second\": \"many\"}}}}",
                  "test.json:4: channels.sparks.links.\"Births Per Second\": expected a number, "
                  "got a string (\"many\" names no channel)"},
        ErrorCase{"ArrayWhereANumberGoes", WithEmitterLinks(R"({"ParticleCount": [1, 2, 3]})"),
                  "test.json:1: channels.fx.links.ParticleCount: expected a number, got an "
                  "array of 3"},
        ErrorCase{"NumberWhereAVectorGoes", WithEmitterLinks(R"({"GlobalForce": 3})"),
                  "test.json:1: channels.fx.links.GlobalForce: expected a 3-vector [x, y, z], "
                  "got a number"},
        ErrorCase{"UnknownLinkSuggestsTheNearOne",
                  WithEmitterLinks("{\n\"Births per second\": 10}"),
                  "test.json:2: channels.fx.links.\"Births per second\": unknown link name for "
                  "AdvancedParticleEmitter (did you mean \"Births Per Second\"?)"},
        ErrorCase{"UnknownLinkFarFromAny", WithEmitterLinks(R"({"Colour": 1})"),
                  "test.json:1: channels.fx.links.Colour: unknown link name for "
                  "AdvancedParticleEmitter"},
        ErrorCase{"LinkIndexOutOfRange", WithEmitterLinks(R"({"54": 1})"),
                  "test.json:1: channels.fx.links.54: no link at index 54 "
                  "(AdvancedParticleEmitter has links 0 to 53)"},
        ErrorCase{"UnknownChannelName", WithEmitterLinks(R"({"Emitter": "nozle"})", kNozzle),
                  "test.json:1: channels.fx.links.Emitter: no channel is named \"nozle\""},
        ErrorCase{"ChannelOfTheWrongType",
                  WithEmitterLinks(R"({"Emitter": "tex"})",
                                   R"("tex": {"type": "Texture", "image": "dot", "size": 4})"),
                  "test.json:1: channels.fx.links.Emitter: channel \"tex\" (Texture) cannot be "
                  "linked here: the link takes 3D ObjectData channels"},
        ErrorCase{"ColliderMeshOfTheWrongType",
                  "{\"channels\": {\"v\": {\"type\": \"Value\", \"value\": 1},\n"
                  "\"c\": {\"type\": \"MultiCollisionManager\", \"colliders\": [\n"
                  "{\"shape\": \"mesh\", \"mesh\": \"v\"}]}}}",
                  "test.json:3: channels.c.colliders[0].mesh: channel \"v\" (Value) is not a "
                  "3D ObjectData channel"},
        ErrorCase{"UnknownChannelType", WithChannel(R"({"type": "Emiter"})"),
                  "test.json:1: channels.thing.type: unknown channel type \"Emiter\" (known: "
                  "Value, Value Vector, Matrix, Texture, DX8 Device, AdvancedParticleEmitter, "
                  "3D ObjectData, EnvelopeStorage, MultiCollisionManager, AdvPE_Attractor, "
                  "AdvPE_SmokeSettings)"},
        ErrorCase{"MissingType", "{\"channels\": {\n\"thing\": {\"value\": 1}}}",
                  "test.json:2: channels.thing: missing key \"type\""},
        ErrorCase{"UnknownKey", WithChannel("{\"type\": \"Value\",\n \"valeu\": 1}"),
                  "test.json:2: channels.thing.valeu: unknown key (expected one of: type, "
                  "value)"},
        ErrorCase{"DuplicateKey", WithEmitterLinks("{\"Bounce Rate\": 1,\n\"Bounce Rate\": 0}"),
                  "test.json:2: channels.fx.links.\"Bounce Rate\": this key is given twice in "
                  "the same object"},
        ErrorCase{"UnknownTopLevelKey", "{\"fsp\": 30}",
                  "test.json:1: fsp: unknown key (expected one of: description, resolution, "
                  "fps, duration, frames, seed, background, camera, channels)"},
        ErrorCase{"DurationAndFrames", "{\"duration\": 2, \"frames\": 10}",
                  "test.json:1: frames: give either \"duration\" or \"frames\", not both"},
        ErrorCase{"FractionalFrames", "{\"frames\": 2.5}",
                  "test.json:1: frames: expected a whole number from 1 to 1000000, got 2.5"},
        ErrorCase{"ResolutionTooLarge", "{\"resolution\": [640, 9000]}",
                  "test.json:1: resolution[1]: expected a whole number from 1 to 8192, got 9000"},
        ErrorCase{"BadColourText", "{\"background\": \"#12345\"}",
                  "test.json:1: background: expected a colour, [r, g, b], [r, g, b, a] from 0 "
                  "to 1, or \"#RRGGBB\", got \"#12345\""},
        ErrorCase{"ColourOutOfRange", "{\"background\": [0, 2, 0]}",
                  "test.json:1: background[1]: expected a colour component from 0 to 1, got 2"},
        ErrorCase{"KeyTimesMustIncrease",
                  WithChannel(R"({"type": "Value", "value": {"keys": [[1, 0], [1, 5]]}})"),
                  "test.json:1: channels.thing.value.keys[1][0]: key times must increase, got 1 "
                  "after 1"},
        ErrorCase{
            "BadInterpolation",
            WithChannel(
                R"({"type": "Value", "value": {"keys": [[0, 1]], "interpolation": "cubic"}})"),
            "test.json:1: channels.thing.value.interpolation: expected \"linear\" or "
            "\"hold\", got \"cubic\""},
        ErrorCase{"CameraTargetOnEye", R"({"camera": {"eye": [1, 2, 3], "target": [1, 2, 3]}})",
                  "test.json:1: camera.target: the camera's target lies on its eye"},
        ErrorCase{"ReservedName", WithEmitterLinks("{}", R"("camera.eye": {"type": "Value"})"),
                  "test.json:1: channels.\"camera.eye\": the name \"camera.eye\" is reserved for "
                  "the camera's eye position"},
        ErrorCase{"UnknownImage", WithChannel(R"({"type": "Texture", "image": "star"})"),
                  "test.json:1: channels.thing.image: unknown built-in image \"star\" (known: "
                  "dot, spark, ring, puff)"},
        ErrorCase{"ShapeParameterOfAnotherShape",
                  WithChannel(R"({"type": "3D ObjectData", "shape": "box", "radius": 1})"),
                  "test.json:1: channels.thing.radius: does not apply to a box"},
        ErrorCase{
            "UnknownColliderShape",
            WithChannel(R"({"type": "MultiCollisionManager", "colliders": [{"shape": "cone"}]})"),
            "test.json:1: channels.thing.colliders[0].shape: unknown collider shape "
            "\"cone\" (known: plane, sphere, box, mesh)"},
        ErrorCase{"NegativeRadius",
                  WithChannel(R"({"type": "3D ObjectData", "shape": "sphere", "radius": -1})"),
                  "test.json:1: channels.thing.radius: expected a number above 0, got -1"},
        ErrorCase{"NumberTooLargeForAFloat", WithChannel(R"({"type": "Value", "value": 1e300})"),
                  "test.json:1: channels.thing.value: expected a number, got one too large for "
                  "a float"}),
    [](const ::testing::TestParamInfo<ErrorCase>& info) { return info.param.Name; });

TEST(SceneFileErrorTest, MissingSceneFileNamesIt) {
  TestHost host;
  std::string error;
  EXPECT_EQ(apescene::LoadSceneFile("/nonexistent/scene.json", host.Loader, &error), nullptr);
  EXPECT_EQ(error,
            "/nonexistent/scene.json: cannot open the scene file (No such file or directory)");
}

TEST(SceneFileErrorTest, FolderIsNotAScene) {
  TestHost host;
  TempFolder folder;
  std::string error;
  EXPECT_EQ(apescene::LoadSceneFile(folder.Path(), host.Loader, &error), nullptr);
  EXPECT_EQ(error, folder.Path() + ": is a folder, not a scene file");
}

TEST(SceneFileErrorTest, MissingPngNamesTheFileRelativeToTheScene) {
  TestHost host;
  TempFolder folder;
  const std::string error = host.ErrorOf(
      WithChannel("{\"type\": \"Texture\",\n\"file\": \"missing.png\"}"), folder.Path());
  EXPECT_EQ(error, "test.json:2: channels.thing.file: cannot read PNG file \"" +
                       folder.File("missing.png") + "\": No such file or directory");
}

TEST(SceneFileErrorTest, MissingObjNamesTheFile) {
  TestHost host;
  TempFolder folder;
  const std::string error =
      host.ErrorOf(WithChannel(R"({"type": "3D ObjectData", "obj": "gone.obj"})"), folder.Path());
  EXPECT_EQ(error.rfind("test.json:1: channels.thing.obj: cannot read OBJ file \"" +
                            folder.File("gone.obj") + "\"",
                        0),
            0u)
      << error;
}

TEST(SceneFileErrorTest, ObjWithoutTrianglesIsRefused) {
  TestHost host;
  TempFolder folder;
  std::ofstream(folder.File("empty.obj")) << "# nothing\nv 0 0 0\n";
  EXPECT_EQ(
      host.ErrorOf(WithChannel(R"({"type": "3D ObjectData", "obj": "empty.obj"})"), folder.Path()),
      "test.json:1: channels.thing.obj: OBJ file \"" + folder.File("empty.obj") +
          "\" holds no triangles");
}

TEST(SceneFileErrorTest, ObjIndexBeyondItsVerticesIsRefused) {
  TestHost host;
  TempFolder folder;
  std::ofstream(folder.File("bad.obj"))
      << "v 0 0 0\nv 1 0 0\nv 0 1 0\nvn 0 0 1\nf 1//1 2//1 3//7\n";
  EXPECT_EQ(
      host.ErrorOf(WithChannel(R"({"type": "3D ObjectData", "obj": "bad.obj"})"), folder.Path()),
      "test.json:1: channels.thing.obj: OBJ file \"" + folder.File("bad.obj") +
          "\" refers to a vertex, normal or texture coordinate it does not have");
}

TEST(SceneFileErrorTest, DeeplyNestedDocumentIsRefusedWithoutExhaustingTheStack) {
  TestHost host;
  const std::string deep =
      "{\"description\": " + std::string(100000, '[') + std::string(100000, ']') + "}";
  EXPECT_EQ(host.ErrorOf(deep), "test.json: the document nests deeper than 256 levels");
  // 200 levels are fine as far as nesting goes (the description must still be text).
  const std::string fine =
      "{\"description\": " + std::string(200, '[') + std::string(200, ']') + "}";
  EXPECT_EQ(host.ErrorOf(fine), "test.json:1: description: expected a string, got an array of 1");
}

TEST(SceneFileErrorTest, SettingsAloneReportSettingFaultsOnly) {
  apescene::SceneSource source;
  source.DisplayName = "s.json";
  source.Text = "{\"fps\": 0,\n \"channels\": {\"x\": {\"type\": \"Nothing\"}}}";
  apescene::RenderSettings settings;
  std::string error;
  EXPECT_FALSE(apescene::ReadSceneSettings(source, &settings, &error));
  EXPECT_EQ(error, "s.json:1: fps: expected frames per second from above 0 to 1000, got 0");
  source.Text = "{\"fps\": 24,\n \"channels\": {\"x\": {\"type\": \"Nothing\"}}}";
  EXPECT_TRUE(apescene::ReadSceneSettings(source, &settings, &error));
  EXPECT_EQ(settings.Fps, 24.0);
}

}  // namespace
}  // namespace scenetest
