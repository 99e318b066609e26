// Every checked-in corpus input, replayed through the very harness its fuzzer runs: what a
// fuzzer once found (or was seeded with) must stay fixed.
#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "fuzz/hostile_host.h"
#include "fuzz/scene_input.h"

namespace {

namespace fs = std::filesystem;

std::vector<std::uint8_t> ReadBytes(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  return std::vector<std::uint8_t>(std::istreambuf_iterator<char>(file), {});
}

std::vector<std::string> CorpusFiles(const std::string& target) {
  std::vector<std::string> files;
  std::error_code ec;
  for (const auto& entry : fs::directory_iterator(fs::path(APE_FUZZ_CORPUS_DIR) / target, ec))
    if (entry.is_regular_file()) files.push_back(entry.path().filename().string());
  std::sort(files.begin(), files.end());
  return files;
}

std::string TestName(const testing::TestParamInfo<std::string>& info) {
  std::string name = info.param;
  for (char& c : name)
    if (!std::isalnum(static_cast<unsigned char>(c))) c = '_';
  return name;
}

class EmitterHostCorpus : public testing::TestWithParam<std::string> {};

TEST_P(EmitterHostCorpus, RunsClean) {
  const auto bytes = ReadBytes(fs::path(APE_FUZZ_CORPUS_DIR) / "emitter_host" / GetParam());
  EXPECT_EQ(apefuzz::RunHostScript(bytes.data(), bytes.size()), "");
}

INSTANTIATE_TEST_SUITE_P(Corpus, EmitterHostCorpus, testing::ValuesIn(CorpusFiles("emitter_host")),
                         TestName);

class SceneLoaderCorpus : public testing::TestWithParam<std::string> {};

TEST_P(SceneLoaderCorpus, LoadsOrRefusesClearly) {
  const auto bytes = ReadBytes(fs::path(APE_FUZZ_CORPUS_DIR) / "scene_loader" / GetParam());
  EXPECT_EQ(apefuzz::RunSceneInput(bytes.data(), bytes.size(), APE_SCENE_DIR).Fault, "");
}

INSTANTIATE_TEST_SUITE_P(Corpus, SceneLoaderCorpus, testing::ValuesIn(CorpusFiles("scene_loader")),
                         TestName);

// A corpus folder that went missing would otherwise pass by replaying nothing.
TEST(Corpus, BothCorporaAreThere) {
  EXPECT_GE(CorpusFiles("emitter_host").size(), 20u);
  EXPECT_GE(CorpusFiles("scene_loader").size(), 20u);
}

}  // namespace
