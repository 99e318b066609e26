// ape-soak [--frames N] scene.json...: runs each scene for N frames (default 100,000) on the
// reference device, checking the emitter invariants every frame and that the live heap does not
// grow. Exits 1 on the first fault.
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "fuzz/soak/soak_run.h"

int main(int argc, char** argv) {
  int frames = 100'000;
  std::vector<std::string> scenes;
  for (int i = 1; i < argc; ++i) {
    const std::string argument = argv[i];
    if (argument == "--frames" && i + 1 < argc) {
      frames = std::atoi(argv[++i]);
    } else {
      scenes.push_back(argument);
    }
  }
  if (scenes.empty() || frames < 1) {
    std::fprintf(stderr, "usage: %s [--frames N] scene.json...\n", argv[0]);
    return 2;
  }
  int failed = 0;
  for (const std::string& scene : scenes) {
    const apefuzz::SoakResult r = apefuzz::SoakScene(scene, frames);
    std::printf("%s: %d frames, %d emitters, %d messages, heap %zu -> %zu bytes (peak %zu): %s\n",
                scene.c_str(), r.Frames, r.Emitters, r.Messages, r.HeapAfterWarmUp, r.HeapAtEnd,
                r.HeapPeak, r.Fault.empty() ? "ok" : r.Fault.c_str());
    std::fflush(stdout);
    if (!r.Fault.empty()) ++failed;
  }
  std::printf("soak: %zu passed, %d failed\n", scenes.size() - failed, failed);
  return failed == 0 ? 0 : 1;
}
