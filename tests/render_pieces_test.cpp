// The pieces of a render: choosing contact-sheet frames, progress texts, the statistics table,
// the output folder and the particle census's loop replay. (The sheet's layout is in the golden
// pictures.)
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
#include "tools/render/tile_label.h"
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
            "frame,seconds,live,attached,sliding,births,deaths,logic_steps,channel_ms,draw_ms,"
            "simulation_and_vertex_ms,readback_ms\n"
            "1,0.0333,10,0,0,10,0,2,3.000,1.000,2.000,1.000\n"
            "2,0.0667,25,0,0,15,0,2,5.000,0.500,4.500,1.000\n");
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

TEST(TileLabelTest, CaptionInWhiteOnADarkBoxClippedToThePicture) {
  EXPECT_EQ(aperender::TileCaption(12, 0.4), "frame 12  0.40 s");
  Image picture = Filled(100, 40, 0xFF808080u);
  aperender::DrawCaption(&picture, "1", 2);
  auto at = [&](int x, int y) { return picture.Argb[static_cast<std::size_t>(y * 100 + x)]; };
  // The margin is 2 font pixels (4 here); "1" has ink in its middle column on every row.
  EXPECT_EQ(at(0, 0), 0xFF000000u);
  EXPECT_EQ(at(4 + 2 * 2, 4), 0xFFFFFFFFu);
  EXPECT_EQ(at(4, 4), 0xFF000000u);                  // no ink at the top-left of "1"
  EXPECT_EQ(at(4 + 2 * 2, 4 + 6 * 2), 0xFFFFFFFFu);  // its foot
  EXPECT_EQ(at(30, 30), 0xFF808080u);                // beyond the box
  Image tiny = Filled(3, 2, 0xFF808080u);
  aperender::DrawCaption(&tiny, "frame 1", 2);  // clipped, not written out of bounds
  EXPECT_EQ(tiny.Argb.size(), 6u);
}

TEST(ParticleCensusTest, BankLoopGoesRoundAsTheFrameDriverDoes) {
  struct Case {
    float Bank, Interval;
    int Rounds;
    float Left;
  };
  const Case cases[] = {
      {55.0f, 20.0f, 2, 15.0f},       // two intervals, 15 ms kept
      {40.0f, 10.0f, 3, 10.0f},       // strictly more than an interval: 10 stays banked
      {0.0f, 10.0f, 0, 0.0f},         // nothing banked
      {500000.0f, 0.1f, 1001, 0.0f},  // the cap: one round past it, and the bank dropped
  };
  for (const Case& c : cases) {
    float left = -1.0f;
    EXPECT_EQ(aperender::CountBankLoop(c.Bank, c.Interval, 1000, &left), c.Rounds) << c.Bank;
    EXPECT_EQ(left, c.Left) << c.Bank;
  }
}

}  // namespace
}  // namespace scenetest
