// libFuzzer target: the input is a scene file, loaded with the example scenes' folder as its own.
#include <cstdio>
#include <cstdlib>

#include "fuzz/scene_input.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string fault = apefuzz::RunSceneInput(data, size, APE_SCENE_DIR).Fault;
  if (!fault.empty()) {
    std::fprintf(stderr, "scene_loader: %s\n", fault.c_str());
    std::abort();
  }
  return 0;
}
