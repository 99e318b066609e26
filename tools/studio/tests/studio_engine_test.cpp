// The running effect behind the page: edits and their refusals, undo, live changes while playing,
// scrubbing, saving (the saved file renders what the studio showed) and exporting.
#include <gtest/gtest.h>

#include <cmath>
#include <fstream>

#include "host/plugin_loader.h"
#include "platform/windows_types.h"
#include "tools/studio/tests/studio_fixture.h"

namespace apestudio {
namespace {

using apescene::Json;
using studiotest::OpenStudio;
using studiotest::ScratchFolder;
using studiotest::TickUntil;

Json LinkPath(const char* link) {
  return Json::array({"channels", "sparks", "links", link});
}

// The last published frame.
PublishedFrame Latest(StudioEngine& engine) {
  PublishedFrame frame;
  EXPECT_TRUE(engine.WaitFrame(0, std::chrono::milliseconds(0), &frame));
  return frame;
}

Json StatsOf(StudioEngine& engine) {
  return Json::parse(Latest(engine).Stats);
}

TEST(StudioEngine, RefusedEditsLeaveTheEffectAsItWas) {
  const ScratchFolder folder;
  auto engine = OpenStudio(folder, "fountain.json", "null");
  ASSERT_NE(engine, nullptr);
  ASSERT_TRUE(engine->Seek(5).Ok);
  struct Case {
    const char* What;
    Json Path;
    Json Value;
    const char* Message;  // part of the refusal
  };
  const Case cases[] = {
      {"a word for a number", LinkPath("Births Per Second"), "lots", "expected a number"},
      {"NaN", LinkPath("Births Per Second"), std::nan(""), "finite"},
      {"out of range", LinkPath("ParticleCount"), -5, "ParticleCount"},
      {"a channel that does not exist", LinkPath("Emitter"), "nozzle2", "nozzle2"},
      {"a channel of the wrong type", LinkPath("Emitter"), "spark", "cannot be linked here"},
      {"a link that does not exist", LinkPath("Births per second"), 5, "did you mean"},
      {"a key that is not a number",
       Json::array({"channels", "sparks", "links", "Size Envelope", 0}), Json::array({"a", 1}),
       "expected a number"},
      {"a path that leads nowhere",
       Json::array({"channels", "sparks", "links", "Size Envelope", 9}), Json::array({1, 1}),
       "leads nowhere"},
      {"a picture too large to stream", Json::array({"resolution"}), Json::array({4000, 4000}),
       "at most"},
      {"no frames per second", Json::array({"fps"}), 0, "frames per second"},
      {"an unknown key", Json::array({"channels", "floor", "colour"}), "#FFFFFF", "unknown key"},
  };
  for (const Case& c : cases) {
    const Json before = engine->Document();
    const PublishedFrame shown = Latest(*engine);
    const Outcome outcome = engine->Edit(c.Path, c.Value);
    EXPECT_FALSE(outcome.Ok) << c.What;
    EXPECT_NE(outcome.Message.find(c.Message), std::string::npos)
        << c.What << ": " << outcome.Message;
    EXPECT_EQ(outcome.Message.find('\n'), std::string::npos) << c.What;
    EXPECT_EQ(engine->Document(), before) << c.What;
    EXPECT_EQ(engine->State()["undo"], 0) << c.What;
    EXPECT_EQ(engine->Frame(), 5) << c.What;
    EXPECT_EQ(Latest(*engine).Serial, shown.Serial) << c.What << ": a frame was published";
  }
}

// While playing, a change of one link's value reaches the running particles on the next frame,
// without starting again; paused, the frame shown is re-simulated with the change from frame 1.
TEST(StudioEngine, EditsReachTheRunningEffect) {
  const ScratchFolder folder;
  auto engine = OpenStudio(folder, "fountain.json", "null");
  ASSERT_NE(engine, nullptr);
  engine->SetPlaying(true);
  ASSERT_TRUE(TickUntil(
      *engine, [&] { return engine->Frame() == 30; }, 40));
  const int live_before = StatsOf(*engine)["live"];
  const int births_before = StatsOf(*engine)["births"];
  ASSERT_TRUE(engine->Edit(LinkPath("Births Per Second"), 4500).Ok);
  EXPECT_EQ(engine->Frame(), 30) << "the edit restarted the run";
  engine->Tick();
  EXPECT_EQ(engine->Frame(), 31);
  EXPECT_GE(StatsOf(*engine)["births"].get<int>(), births_before * 9);
  EXPECT_GT(StatsOf(*engine)["live"].get<int>(), live_before);

  // Scrubbing forward from there shows the document's replay, not the run that took the change.
  engine->SetPlaying(false);
  ASSERT_TRUE(engine->Seek(40).Ok);
  const Json scrubbed = StatsOf(*engine);
  ASSERT_TRUE(engine->Seek(39).Ok);
  ASSERT_TRUE(engine->Seek(40).Ok);
  EXPECT_EQ(StatsOf(*engine)["live"], scrubbed["live"]);
  ASSERT_TRUE(engine->Seek(31).Ok);

  // Paused: frame 31 again, as if the rate had always been 45.
  ASSERT_TRUE(engine->Edit(LinkPath("Births Per Second"), 45).Ok);
  EXPECT_EQ(engine->Frame(), 31);
  EXPECT_LT(StatsOf(*engine)["live"].get<int>(), live_before / 5);
}

TEST(StudioEngine, ScrubbingShowsTheSameFrameEveryTime) {
  const ScratchFolder folder;
  auto engine = OpenStudio(folder, "fountain.json", "gl");
  ASSERT_NE(engine, nullptr);
  ASSERT_TRUE(engine->Seek(15).Ok);
  const std::string at_15 = Latest(*engine).Jpeg;
  ASSERT_TRUE(engine->Step().Ok);
  const std::string stepped_16 = Latest(*engine).Jpeg;
  ASSERT_TRUE(engine->Seek(40).Ok);
  EXPECT_NE(Latest(*engine).Jpeg, at_15);
  ASSERT_TRUE(engine->Seek(15).Ok);
  EXPECT_EQ(Latest(*engine).Jpeg, at_15);
  ASSERT_TRUE(engine->Seek(16).Ok);
  EXPECT_EQ(Latest(*engine).Jpeg, stepped_16);
  EXPECT_EQ(engine->Frame(), 16);
  ASSERT_TRUE(engine->Seek(100000 / 10).Ok);  // beyond the end: the last frame
  EXPECT_EQ(engine->Frame(), 120);
}

// Frames of the saved file, rendered afresh as ape-render does, are the studio's frames.
TEST(StudioEngine, SavedFileRendersTheFramesTheStudioShowed) {
  const ScratchFolder folder;
  std::string shown, original;
  {
    auto engine = OpenStudio(folder, "fountain.json", "gl");
    ASSERT_NE(engine, nullptr);
    ASSERT_TRUE(engine->Seek(12).Ok);
    original = Latest(*engine).Jpeg;
    ASSERT_TRUE(engine->Edit(LinkPath("Births Per Second"), 700.5).Ok);
    ASSERT_TRUE(
        engine->Edit({"channels", "sparks", "links", "Green Color Envelope", 1}, {0.5, 20}).Ok);
    ASSERT_TRUE(engine->Edit({"background"}, "#203040").Ok);
    shown = Latest(*engine).Jpeg;
    EXPECT_NE(shown, original);
    EXPECT_FALSE(engine->Save("../escape.json").Ok);
    EXPECT_FALSE(engine->Save("saved.txt").Ok);
    std::filesystem::create_directories(folder.Path() / "folder.json");
    EXPECT_FALSE(engine->Save("folder.json").Ok);
    EXPECT_FALSE(std::filesystem::exists(folder.Path() / "folder.json.partial"));
    ASSERT_TRUE(engine->Save("saved.json").Ok);
  }
  // The engine and its clock are gone: one test clock at a time.
  TestClock clock;
  PluginLoader loader;
  MessageLog messages;
  apescene::SceneSource source;
  std::string error;
  ASSERT_TRUE(apescene::ReadSceneFile((folder.Path() / "saved.json").string(), &source, &error));
  auto run = SceneRun::Create(source, "gl", loader, clock, &messages, &error);
  ASSERT_NE(run, nullptr) << error;
  run->Prime();
  aperender::FrameResult frame;
  for (int i = 1; i <= 12; ++i) frame = run->RenderNext();
  ASSERT_TRUE(frame.HasPicture);
  JpegEncoder encoder;
  std::string again;
  ASSERT_TRUE(encoder.Encode(frame.Picture, StudioEngine::kJpegQuality, &again, &error));
  EXPECT_EQ(again, shown);
}

TEST(StudioEngine, ExportWritesFramesSheetAndPreviewThenResumes) {
  const ScratchFolder folder;
  auto engine = OpenStudio(folder, "fountain.json", "gl");
  ASSERT_NE(engine, nullptr);
  ASSERT_TRUE(engine->Edit({"duration"}, 0.2).Ok);  // six frames
  ASSERT_TRUE(engine->Seek(4).Ok);
  std::filesystem::create_directories(folder.Path() / "taken");
  { std::ofstream(folder.Path() / "a_file") << "x"; }
  EXPECT_FALSE(engine->StartExport("../out").Ok);
  EXPECT_FALSE(engine->StartExport("a_file").Ok);
  ASSERT_TRUE(engine->StartExport("out").Ok);
  EXPECT_TRUE(engine->Exporting());
  EXPECT_FALSE(engine->Edit(LinkPath("Births Per Second"), 5).Ok) << "edited while exporting";
  ASSERT_TRUE(TickUntil(
      *engine, [&] { return !engine->Exporting(); }, 20));
  const Json progress = engine->ExportProgress();
  EXPECT_EQ(progress["error"], "");
  EXPECT_EQ(progress["done"], 6);
  EXPECT_TRUE(progress["finished"].get<bool>());
  for (const char* file :
       {"frame_0001.png", "frame_0006.png", "contact_sheet.png", "preview.gif", "stats.csv"})
    EXPECT_TRUE(std::filesystem::exists(folder.Path() / "out" / file)) << file;
  EXPECT_EQ(engine->Frame(), 4);
  EXPECT_TRUE(engine->Step().Ok);
  EXPECT_EQ(engine->Frame(), 5);
}

// The engine's thread draws the same pictures as the thread that opened it (an OpenGL context
// current on the opening thread once left the engine's thread drawing nothing).
TEST(StudioEngine, ItsOwnThreadDrawsTheSamePictures) {
  const ScratchFolder folder;
  auto engine = OpenStudio(folder, "fountain.json", "gl");
  ASSERT_NE(engine, nullptr);
  ASSERT_TRUE(engine->Seek(20).Ok);
  const PublishedFrame opened = Latest(*engine);
  engine->Start();
  PublishedFrame threaded;
  ASSERT_TRUE(engine->WaitFrame(opened.Serial, std::chrono::seconds(60), &threaded));
  EXPECT_EQ(threaded.Jpeg, opened.Jpeg);
  engine->Call([&] { EXPECT_TRUE(engine->Step().Ok); });
  ASSERT_TRUE(engine->WaitFrame(threaded.Serial, std::chrono::seconds(60), &threaded));
  EXPECT_EQ(Json::parse(threaded.Stats)["frame"], 21);
  EXPECT_NE(threaded.Jpeg, opened.Jpeg);
  engine->Stop();
}

TEST(StudioEngine, OpensOnlySceneFilesOfItsFolder) {
  const ScratchFolder folder;
  auto engine = OpenStudio(folder, "fountain.json", "null");
  ASSERT_NE(engine, nullptr);
  { std::ofstream(folder.Path() / "broken.json") << "{\"fps\": }"; }
  for (const char* name :
       {"../fountain.json", "/etc/hostname.json", "missing.json", "fountain.txt", "broken.json"})
    EXPECT_FALSE(engine->OpenFile(name).Ok) << name;
  ASSERT_TRUE(engine->Edit(LinkPath("Births Per Second"), 10).Ok);
  ASSERT_TRUE(engine->OpenFile("fountain.json").Ok);
  EXPECT_EQ(engine->Document()["channels"]["sparks"]["links"]["Births Per Second"], 450);
  EXPECT_EQ(engine->State()["undo"], 0);
}

}  // namespace
}  // namespace apestudio
