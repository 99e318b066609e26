// libFuzzer target: the input is a hostile host's script (host_script.h).
#include <cstdio>
#include <cstdlib>

#include "fuzz/hostile_host.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string fault = apefuzz::RunHostScript(data, size);
  if (!fault.empty()) {
    std::fprintf(stderr, "emitter_host: %s\n", fault.c_str());
    std::abort();
  }
  return 0;
}
