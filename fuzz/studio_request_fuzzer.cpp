// libFuzzer target: the input is a script of requests to the studio's HTTP interface
// (fuzz/studio_request.h).
#include <cstdio>
#include <cstdlib>

#include "fuzz/studio_request.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string fault = apefuzz::RunStudioRequests(data, size, APE_SCENE_DIR).Fault;
  if (!fault.empty()) {
    std::fprintf(stderr, "studio_request: %s\n", fault.c_str());
    std::abort();
  }
  return 0;
}
