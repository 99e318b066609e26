// ape-links-doc FILE: writes the link reference as Markdown (docs/links.md) to FILE.
#include <cstdio>
#include <fstream>

#include "tools/scene/link_reference_text.h"

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fprintf(stderr, "usage: ape-links-doc FILE\n");
    return 2;
  }
  std::ofstream file(argv[1], std::ios::binary);
  file << apescene::LinkReferenceMarkdown();
  file.close();
  if (!file) {
    std::fprintf(stderr, "ape-links-doc: cannot write %s\n", argv[1]);
    return 1;
  }
  return 0;
}
