// Every kind of fault in a scene file gives one message naming the file, the line and the place
// in the document.
#include <gtest/gtest.h>
#include <ostream>

#include <fstream>

#include "tests/scene_test_host.h"

namespace scenetest {
namespace {

struct ErrorCase {
  const char* Name;
  std::string Text;
  std::string Message;
  // Failures name the case, not its bytes.
  friend void PrintTo(const ErrorCase& c, std::ostream* os) { *os << c.Name; }
};

class SceneErrorTest : public ::testing::TestWithParam<ErrorCase> {};

TEST_P(SceneErrorTest, GivesTheExactMessage) {
  TestHost host;
  EXPECT_EQ(host.ErrorOf(GetParam().Text), GetParam().Message);
}

std::string Nested(int levels) {
  return "{\"description\": " + std::string(levels, '[') + std::string(levels, ']') + "}";
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, SceneErrorTest,
    ::testing::Values(
        ErrorCase{"SyntaxErrorGivesLineAndColumn", "{\n  \"fps\": 30,,\n}",
                  "test.json:2:13: syntax error while parsing object key - unexpected ','; "
                  "expected string literal"},
        ErrorCase{"StringWhereANumberGoes",
                  "{\"channels\": {\n \"sparks\": {\"type\": \"AdvancedParticleEmitter\",\n "
                  "\"links\": {\n  \"Births Per Second\": \"many\"}}}}",
                  "test.json:4: channels.sparks.links.\"Births Per Second\": expected a number, "
                  "got a string (\"many\" names no channel)"},
        ErrorCase{"CommentsStillCountLines",
                  "{\n// a comment\n/* a block\ncomment */ \"fps\": \"fast\"}",
                  "test.json:4: fps: expected a number, got a string"},
        ErrorCase{"UnknownLinkSuggestsTheNearOne",
                  WithEmitterLinks("{\n\"Births per second\": 10}"),
                  "test.json:2: channels.fx.links.\"Births per second\": unknown link name for "
                  "AdvancedParticleEmitter (did you mean \"Births Per Second\"?); ape-render "
                  "--list-links AdvancedParticleEmitter lists them all"},
        ErrorCase{"LinkIndexOutOfRange", WithEmitterLinks(R"({"54": 1})"),
                  "test.json:1: channels.fx.links.54: no link at index 54 "
                  "(AdvancedParticleEmitter has links 0 to 53)"},
        ErrorCase{"UnknownChannelName",
                  WithEmitterLinks(R"({"Emitter": "nozle"})",
                                   R"("nozzle": {"type": "3D ObjectData", "shape": "disc"})"),
                  "test.json:1: channels.fx.links.Emitter: no channel is named \"nozle\" (did you "
                  "mean \"nozzle\"?)"},
        ErrorCase{"ChannelOfTheWrongType",
                  WithEmitterLinks(R"({"Emitter": "tex"})",
                                   R"("tex": {"type": "Texture", "image": "dot", "size": 4})"),
                  "test.json:1: channels.fx.links.Emitter: channel \"tex\" (Texture) cannot be "
                  "linked here: the link takes 3D ObjectData channels"},
        ErrorCase{"UnknownChannelType", WithChannel(R"({"type": "Emiter"})"),
                  "test.json:1: channels.thing.type: unknown channel type \"Emiter\"; did you mean "
                  "\"AdvancedParticleEmitter\"? (known: "
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
        ErrorCase{"DurationAndFrames", "{\"duration\": 2, \"frames\": 10}",
                  "test.json:1: frames: give either \"duration\" or \"frames\", not both"},
        ErrorCase{"FractionalFrames", "{\"frames\": 2.5}",
                  "test.json:1: frames: expected a whole number from 1 to 1000000, got 2.5"},
        ErrorCase{"ResolutionTooLarge", "{\"resolution\": [640, 9000]}",
                  "test.json:1: resolution[1]: expected a whole number from 1 to 8192, got 9000"},
        ErrorCase{"BadColourText", "{\"background\": \"#12345\"}",
                  "test.json:1: background: expected a colour, [r, g, b], [r, g, b, a] from 0 "
                  "to 1, or \"#RRGGBB\", got \"#12345\""},
        ErrorCase{"KeyTimesMustIncrease",
                  WithChannel(R"({"type": "Value", "value": {"keys": [[1, 0], [1, 5]]}})"),
                  "test.json:1: channels.thing.value.keys[1][0]: key times must increase, got 1 "
                  "after 1"},
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
        ErrorCase{"NumberTooLargeForAFloat", WithChannel(R"({"type": "Value", "value": 1e300})"),
                  "test.json:1: channels.thing.value: expected a number, got one too large for "
                  "a float"},
        // Refused without exhausting the stack; 200 levels are within the limit.
        ErrorCase{"DeepNesting", Nested(100000),
                  "test.json: the document nests deeper than 256 levels"},
        ErrorCase{"NestingWithinTheLimit", Nested(200),
                  "test.json:1: description: expected a string, got an array of 1"}),
    [](const ::testing::TestParamInfo<ErrorCase>& info) { return info.param.Name; });

// Files the scene refers to, read relative to the scene's folder.
struct FileCase {
  const char* Where;  // the place in the document and the start of the message
  const char* Definition;
  const char* File;
  const char* Contents;  // null: the file does not exist
  const char* Problem;   // after the quoted path
  // Failures name the case, not its bytes.
  friend void PrintTo(const FileCase& c, std::ostream* os) { *os << c.Where; }
};

class SceneFileErrorTest : public ::testing::TestWithParam<FileCase> {};

TEST_P(SceneFileErrorTest, NamesTheFile) {
  TestHost host;
  TempFolder folder;
  if (GetParam().Contents) std::ofstream(folder.File(GetParam().File)) << GetParam().Contents;
  EXPECT_EQ(host.ErrorOf(WithChannel(GetParam().Definition), folder.Path()),
            std::string("test.json:2: ") + GetParam().Where + "\"" + folder.File(GetParam().File) +
                "\"" + GetParam().Problem);
}

INSTANTIATE_TEST_SUITE_P(
    Files, SceneFileErrorTest,
    ::testing::Values(FileCase{"channels.thing.file: cannot read PNG file ",
                               "{\"type\": \"Texture\",\n\"file\": \"missing.png\"}", "missing.png",
                               nullptr, ": No such file or directory"},
                      FileCase{"channels.thing.obj: OBJ file ",
                               "{\"type\": \"3D ObjectData\",\n\"obj\": \"empty.obj\"}",
                               "empty.obj", "# nothing\nv 0 0 0\n", " holds no triangles"},
                      FileCase{
                          "channels.thing.obj: OBJ file ",
                          "{\"type\": \"3D ObjectData\",\n\"obj\": \"bad.obj\"}", "bad.obj",
                          "v 0 0 0\nv 1 0 0\nv 0 1 0\nvn 0 0 1\nf 1//1 2//1 3//7\n",
                          " refers to a vertex, normal or texture coordinate it does not have"}));

TEST(SceneFileTest, MissingFileOrFolderIsNamed) {
  TestHost host;
  TempFolder folder;
  std::string error;
  EXPECT_EQ(apescene::LoadSceneFile("/nonexistent/scene.json", host.Loader, &error), nullptr);
  EXPECT_EQ(error,
            "/nonexistent/scene.json: cannot open the scene file (No such file or directory)");
  EXPECT_EQ(apescene::LoadSceneFile(folder.Path(), host.Loader, &error), nullptr);
  EXPECT_EQ(error, folder.Path() + ": is a folder, not a scene file");
}

}  // namespace
}  // namespace scenetest
