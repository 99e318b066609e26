// How quickly the studio shows things, on the OpenGL device at the fountain's 640x360: a stream
// frame (render, JPEG, publish), an edit while playing up to the frame that shows it, an edit
// while paused (the scene built afresh and re-simulated to the frame shown), and a scrub back.
// Real time: llvmpipe rasterises on threads of its own.
#include <benchmark/benchmark.h>

#include <filesystem>

#include "tools/render/default_scene.h"
#include "tools/studio/studio_engine.h"

namespace {

using apescene::Json;

std::unique_ptr<apestudio::StudioEngine> OpenFountain() {
  apestudio::StudioOptions options;
  options.Source.Text = aperender::DefaultSceneText();
  options.Source.DisplayName = aperender::kDefaultSceneName;
  options.Folder = std::filesystem::temp_directory_path().string();
  options.SaveName = "unused.json";
  auto engine = std::make_unique<apestudio::StudioEngine>(options);
  std::string error;
  if (!engine->Open(&error)) return nullptr;
  return engine;
}

const Json kBirths = Json::array({"channels", "sparks", "links", "Births Per Second"});

void StreamFrame(benchmark::State& state) {
  auto engine = OpenFountain();
  if (engine == nullptr) return state.SkipWithError("no OpenGL device");
  engine->SetPlaying(true);
  for (auto _ : state) engine->Tick();
  state.counters["fps"] =
      benchmark::Counter(static_cast<double>(state.iterations()), benchmark::Counter::kIsRate);
}
BENCHMARK(StreamFrame)->UseRealTime()->Unit(benchmark::kMillisecond)->MinTime(3.0);

// The edit, then the next frame, which shows it.
void EditWhilePlaying(benchmark::State& state) {
  auto engine = OpenFountain();
  if (engine == nullptr) return state.SkipWithError("no OpenGL device");
  engine->SetPlaying(true);
  int rate = 450;
  for (auto _ : state) {
    rate = rate == 450 ? 460 : 450;
    if (!engine->Edit(kBirths, rate).Ok) return state.SkipWithError("edit refused");
    engine->Tick();
  }
}
BENCHMARK(EditWhilePlaying)->UseRealTime()->Unit(benchmark::kMillisecond)->MinTime(2.0);

// Paused on frame N: the edit re-simulates frames 1..N and shows N.
void EditWhilePaused(benchmark::State& state) {
  auto engine = OpenFountain();
  if (engine == nullptr) return state.SkipWithError("no OpenGL device");
  engine->SetPlaying(false);
  engine->Seek(static_cast<int>(state.range(0)));
  int rate = 450;
  for (auto _ : state) {
    rate = rate == 450 ? 460 : 450;
    if (!engine->Edit(kBirths, rate).Ok) return state.SkipWithError("edit refused");
  }
}
BENCHMARK(EditWhilePaused)
    ->Arg(1)
    ->Arg(30)
    ->Arg(60)
    ->Arg(120)
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
