// Writes the hand-made hostile-host seeds into a folder: ape-fuzz-seeds <folder>.
#include <cstdio>
#include <fstream>
#include <string>

#include "fuzz/seeds/host_seeds.h"

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fprintf(stderr, "usage: %s <corpus folder>\n", argv[0]);
    return 2;
  }
  for (const apefuzz::NamedScript& seed : apefuzz::HostSeeds()) {
    const std::string path = std::string(argv[1]) + "/seed_" + seed.Name;
    std::ofstream file(path, std::ios::binary);
    file.write(reinterpret_cast<const char*>(seed.Bytes.data()),
               static_cast<std::streamsize>(seed.Bytes.size()));
    if (!file) {
      std::fprintf(stderr, "cannot write %s\n", path.c_str());
      return 1;
    }
  }
  return 0;
}
