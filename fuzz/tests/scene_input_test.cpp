// The scene harness: the example scenes load and run, and hostile texts are refused clearly.
#include <filesystem>
#include <fstream>
#include <iterator>
#include <ostream>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "fuzz/scene_input.h"

namespace {

using namespace std::string_view_literals;

apefuzz::SceneOutcome RunText(const std::string& text) {
  return apefuzz::RunSceneInput(reinterpret_cast<const std::uint8_t*>(text.data()), text.size(),
                                APE_SCENE_DIR);
}

TEST(SceneInput, ExampleScenesLoadAndRun) {
  int scenes = 0;
  for (const auto& entry : std::filesystem::directory_iterator(APE_SCENE_DIR)) {
    if (entry.path().extension() != ".json") continue;
    std::ifstream file(entry.path(), std::ios::binary);
    const std::string text{std::istreambuf_iterator<char>(file), {}};
    const apefuzz::SceneOutcome outcome = RunText(text);
    EXPECT_TRUE(outcome.Loaded) << entry.path() << ": " << outcome.Refusal;
    EXPECT_EQ(outcome.Fault, "") << entry.path();
    ++scenes;
  }
  EXPECT_GE(scenes, 1);
}

struct HostileText {
  const char* Name;
  const char* Text;
  // Failures name the case, not its bytes.
  friend void PrintTo(const HostileText& c, std::ostream* os) { *os << c.Name; }
};

class HostileScene : public testing::TestWithParam<HostileText> {};

TEST_P(HostileScene, IsRefusedClearly) {
  const apefuzz::SceneOutcome outcome = RunText(GetParam().Text);
  EXPECT_FALSE(outcome.Loaded);
  EXPECT_EQ(outcome.Fault, "") << outcome.Refusal;
}

INSTANTIATE_TEST_SUITE_P(
    Texts, HostileScene,
    testing::Values(HostileText{"Empty", ""}, HostileText{"NotJson", "\x01\xff\xfe garbage"},
                    HostileText{"Array", "[1, 2, 3]"}, HostileText{"Null", "null"},
                    HostileText{"UnknownType", R"({"channels": {"a": {"type": "Nope"}}})"},
                    HostileText{"LinkToNothing",
                                R"({"channels": {"e": {"type": "AdvancedParticleEmitter",
                        "links": {"Emitter": "missing"}}}})"},
                    HostileText{
                        "HugeNumbers",
                        R"({"fps": 1e308, "channels": {"e": {"type": "AdvancedParticleEmitter",
                        "links": {"ParticleCount": 1e300, "Births Per Second": -1e300}}}})"},
                    HostileText{"MissingFile", R"({"channels": {"m": {"type": "3D ObjectData",
                        "obj": "no such file.obj"}}})"},
                    HostileText{"DeepNesting",
                                "[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[]]]]]]]]]]]]]]]]]]]]"
                                "]]]]]]]]]]]]]]]]]]]]"}),
    [](const auto& info) { return std::string(info.param.Name); });

// Found by the fuzzer: a number beyond the range of a double escaped the loader as an exception,
// and a control character in a name or string split the message over several lines.
struct RefusalCase {
  const char* Name;
  std::string_view Text;
  const char* RefusalStart;  // the message's beginning (a type list may follow)
  // Failures name the case, not its bytes.
  friend void PrintTo(const RefusalCase& c, std::ostream* os) { *os << c.Name; }
};

class Refusal : public testing::TestWithParam<RefusalCase> {};

TEST_P(Refusal, IsOneClearLine) {
  const apefuzz::SceneOutcome outcome = RunText(std::string(GetParam().Text));
  EXPECT_FALSE(outcome.Loaded);
  EXPECT_EQ(outcome.Fault, "");
  const std::string start = GetParam().RefusalStart;
  EXPECT_EQ(outcome.Refusal.substr(0, start.size()), start);
}

INSTANTIATE_TEST_SUITE_P(
    Findings, Refusal,
    testing::Values(
        RefusalCase{"NumberOverflow", "{\"fps\": 1e400}",
                    "fuzz.json: number overflow parsing '1e400'"},
        RefusalCase{"NewlineInName", "{\"channels\": {\"a\\nb\": {\"type\": 5}}}",
                    "fuzz.json:1: channels.\"a\\nb\".type: expected a string, got a number"},
        // The parser ends a // comment at a carriage return too; the line finder read on to the
        // next newline, lost its place and looped for ever.
        RefusalCase{"CommentEndingInCarriageReturn",
                    "{\"resolution\": [ // width\r 640, 360],\n \"seed\": -1\n}"sv,
                    "fuzz.json:2: seed: expected"},
        RefusalCase{"CommentEndingInNul",
                    "{\"resolution\": [ // width\0 640, 360],\n \"seed\": -1\n}"sv,
                    "fuzz.json:2: seed: expected"},
        RefusalCase{"ControlInValue", "{\"channels\": {\"a\": {\"type\": \"x\\ty\"}}}",
                    "fuzz.json:1: channels.a.type: unknown channel type \"x\\x09y\" (known: "}),
    [](const auto& info) { return std::string(info.param.Name); });

}  // namespace
