// The pieces of a render: choosing contact-sheet frames, progress texts, the statistics table,
// the output folder and the particle census. (The sheet's layout is in the golden pictures.)
#include <gif_lib.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "host/host_context.h"
#include "plugin/advanced_particle_emitter.h"
#include "tests/scene_test_host.h"
#include "tools/render/contact_sheet.h"
#include "tools/render/particle_census.h"
#include "tools/render/progress.h"
#include "tools/render/render_output.h"
#include "tools/render/stats_table.h"
#include "tools/scene/png_io.h"

namespace scenetest {
namespace {

using apescene::Image;

Image Filled(int width, int height, std::uint32_t argb) {
  return Image{width, height,
               std::vector<std::uint32_t>(static_cast<std::size_t>(width * height), argb)};
}

TEST(ContactSheetTest, FramesAreEvenlySpacedEndingOnTheLast) {
  const std::pair<std::pair<int, int>, std::vector<int>> cases[] = {
      {{120, 12}, {10, 20, 30, 40, 50, 60, 70, 80, 90, 100, 110, 120}},
      {{5, 12}, {1, 2, 3, 4, 5}},
      {{1, 12}, {1}},
      {{10, 4}, {3, 5, 8, 10}}};
  for (const auto& [counts, expected] : cases)
    EXPECT_EQ(aperender::ContactSheetFrames(counts.first, counts.second), expected);
}

TEST(ProgressTest, Texts) {
  EXPECT_EQ(aperender::Progress::BarText(15, 60, 12.34, 3.6),
            "[#######-----------------------] 15/60 frames  12.3 fps  4 s left");
  EXPECT_EQ(aperender::Progress::LineText(60, 120, 2.0, 125.0),
            "ape-render: 60/120 frames, 2.0 fps, 2 min 05 s left");
  EXPECT_EQ(aperender::Progress::LineText(0, 10, 0.0, INFINITY),
            "ape-render: 0/10 frames, 0.0 fps, ? s left");
}

aperender::FrameResult Frame(int frame, int live, int births, double channel_ms, double draw_ms) {
  aperender::FrameResult result;
  result.Frame = frame;
  result.Seconds = frame / 30.0;
  result.Particles.Live = live;
  result.Particles.Births = births;
  result.Particles.LogicSteps = 2;
  result.ChannelMs = channel_ms;
  result.DrawMs = draw_ms;
  result.ReadbackMs = 1.0;
  return result;
}

TEST(StatsTableTest, OneRowPerFrameAndTotals) {
  aperender::StatsTable stats;
  stats.Add(Frame(1, 10, 10, 3.0, 1.0));
  stats.Add(Frame(2, 25, 15, 5.0, 0.5));
  EXPECT_EQ(stats.Csv(),
            "frame,seconds,live,attached,sliding,births,logic_steps,channel_ms,draw_ms,"
            "simulation_and_vertex_ms,readback_ms\n"
            "1,0.0333,10,0,0,10,2,3.000,1.000,2.000,1.000\n"
            "2,0.0667,25,0,0,15,2,5.000,0.500,4.500,1.000\n");
  const aperender::StatsTable::Totals t = stats.Summarise();
  EXPECT_EQ(std::make_tuple(t.Frames, t.PeakLive, t.Births, t.LogicSteps),
            std::make_tuple(2, 25, 25, 4));
  EXPECT_DOUBLE_EQ(t.MeanChannelMs, 4.0);
  EXPECT_DOUBLE_EQ(t.MaxChannelMs, 5.0);
}

TEST(RenderOutputTest, PicturesMakeFramesSheetAndPreviewAndStaleFramesGo) {
  TempFolder folder;
  std::ofstream(folder.File("frame_0099.png")) << "old";
  std::ofstream(folder.File("notes.txt")) << "keep";
  aperender::RenderOutput output;
  std::string error;
  ASSERT_TRUE(output.Open(folder.Path(), 3, 50.0, true, &error)) << error;
  EXPECT_FALSE(std::filesystem::exists(folder.File("frame_0099.png")));
  EXPECT_TRUE(std::filesystem::exists(folder.File("notes.txt")));
  for (int i = 1; i <= 3; ++i) {
    aperender::FrameResult frame = Frame(i, 0, 0, 0, 0);
    frame.HasPicture = true;
    frame.Picture = Filled(640, 360, 0xFF000000u | static_cast<std::uint32_t>(i * 40));
    ASSERT_TRUE(output.AddFrame(frame, &error)) << error;
  }
  EXPECT_FALSE(std::filesystem::exists(folder.File("stats.csv")));  // not before the end
  ASSERT_TRUE(output.Finish(&error)) << error;
  EXPECT_TRUE(std::filesystem::exists(folder.File("stats.csv")));
  Image sheet, first;
  ASSERT_TRUE(apescene::ReadPng(folder.File("contact_sheet.png"), &sheet, &error));
  EXPECT_EQ(sheet.Width, 3 * 320 + 4 * 4);  // three thumbnails halved to 320 wide
  ASSERT_TRUE(apescene::ReadPng(folder.File("frame_0001.png"), &first, &error));
  EXPECT_EQ(first.Argb[0], 0xFF000028u);
  EXPECT_FALSE(std::filesystem::exists(folder.File("preview.gif.partial")));
  // A 50 fps render previews at 25: every second frame, 1 and 3.
  int code = 0;
  GifFileType* gif = DGifOpenFileName(folder.File("preview.gif").c_str(), &code);
  ASSERT_NE(gif, nullptr);
  ASSERT_EQ(DGifSlurp(gif), GIF_OK);
  EXPECT_EQ(gif->ImageCount, 2);
  DGifCloseFile(gif, &code);
  // Every output follows the user's umask alike (the preview was owner-only).
  const auto permissions = [&](const char* name) {
    return std::filesystem::status(folder.File(name)).permissions();
  };
  EXPECT_EQ(permissions("preview.gif"), permissions("contact_sheet.png"));
  EXPECT_EQ(permissions("preview.gif"), permissions("stats.csv"));
}

class ParticleCensusTest : public ::testing::Test {
 protected:
  ParticleCensusTest() { emitter_.Particles.resize(4); }
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  Tev_AdvancedParticleEmitter emitter_;
  aperender::ParticleCensus census_;
};

TEST_F(ParticleCensusTest, CountsBirthsFromThePool) {
  std::vector<Particle>& p = emitter_.Particles;
  p[1].Active = true, p[1].Age = 0.5f;  // lives on
  p[2].Active = true, p[2].Age = 0.9f;  // will be replaced by a new particle
  p[3].Active = true, p[3].Age = 0.7f;  // will attach, which restarts its age
  census_.Before(emitter_);
  p[0].Active = true, p[0].Age = 0.01f;  // born
  p[1].Age = 0.53f;
  p[2].Age = 0.02f;
  p[3].Attached = true, p[3].Age = 0.0f;
  const aperender::ParticleCounts counts = census_.After(emitter_, 33.3);
  EXPECT_EQ(std::make_tuple(counts.Live, counts.Attached, counts.Births), std::make_tuple(4, 1, 2));
  // A pool rebuilt in between (another size) counts no births.
  census_.Before(emitter_);
  emitter_.Particles.assign(6, Particle{});
  emitter_.Particles[0].Active = true;
  EXPECT_EQ(census_.After(emitter_, 10.0).Births, 0);
}

TEST_F(ParticleCensusTest, LogicStepsFromTheBankedTime) {
  emitter_.LogicInterval = 20.0f;
  emitter_.LogicAccumulator = 5.0f;
  census_.Before(emitter_);
  emitter_.LogicAccumulator = 15.0f;  // 5 + 50 = 55 ms: two steps of 20, 15 left
  EXPECT_EQ(census_.After(emitter_, 50.0).LogicSteps, 2);
  emitter_.Paused = true;  // a paused frame banks nothing
  emitter_.LogicAccumulator = 5.0f;
  EXPECT_EQ(census_.After(emitter_, 50.0).LogicSteps, 0);
  emitter_.Paused = false;
  emitter_.LogicInterval = 0.0f;  // no rate: no steps, and no division by zero
  EXPECT_EQ(census_.After(emitter_, 50.0).LogicSteps, 0);
}

}  // namespace
}  // namespace scenetest
