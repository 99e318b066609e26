// The studio request corpus replayed, and the harness's own judgement: answers to strangers and
// refusals that change the scene are faults, skipped heavy requests are not made.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "fuzz/studio_request.h"

namespace {

namespace fs = std::filesystem;

std::vector<std::string> StudioCorpus() {
  std::vector<std::string> names;
  for (const auto& entry : fs::directory_iterator(fs::path(APE_FUZZ_CORPUS_DIR) / "studio_request"))
    names.push_back(entry.path().filename().string());
  std::sort(names.begin(), names.end());
  return names;
}

apefuzz::StudioOutcome RunScript(const std::string& script) {
  return apefuzz::RunStudioRequests(reinterpret_cast<const std::uint8_t*>(script.data()),
                                    script.size(), APE_SCENE_DIR);
}

class StudioRequestCorpus : public testing::TestWithParam<std::string> {};

TEST_P(StudioRequestCorpus, AnswersSoundly) {
  std::ifstream file(fs::path(APE_FUZZ_CORPUS_DIR) / "studio_request" / GetParam(),
                     std::ios::binary);
  std::stringstream bytes;
  bytes << file.rdbuf();
  EXPECT_EQ(RunScript(bytes.str()).Fault, "");
}

INSTANTIATE_TEST_SUITE_P(Corpus, StudioRequestCorpus, testing::ValuesIn(StudioCorpus()),
                         [](const auto& info) { return info.param; });

TEST(StudioRequests, CountsWhatWasMadeAndTaken) {
  struct Case {
    const char* Script;
    int Requests;
    int Accepted;
  };
  const Case cases[] = {
      {"GET /api/state\nPOST /api/step {}\n", 2, 2},
      {"!GET /api/state\n@GET /api/state\n~GET /api/state\n", 3, 0},
      {"POST /api/edit {\"path\": [\"channels\", \"sparks\", \"links\", \"Lifespan_Max\"], "
       "\"value\": \"lots\"}\n",
       1, 0},
      // Skipped: long re-simulation, a huge pool, the stream, lines without a path.
      {"POST /api/seek {\"frame\": 5000}\n"
       "POST /api/edit {\"path\": [\"channels\", \"sparks\", \"links\", \"ParticleCount\"], "
       "\"value\": 900000}\n"
       "POST /api/edit {\"path\": [\"duration\"], \"value\": 9}\n"
       "GET /api/stream\nnonsense\n",
       0, 0},
  };
  for (const Case& c : cases) {
    const apefuzz::StudioOutcome outcome = RunScript(c.Script);
    EXPECT_EQ(outcome.Fault, "") << c.Script;
    EXPECT_EQ(outcome.Requests, c.Requests) << c.Script;
    EXPECT_EQ(outcome.Accepted, c.Accepted) << c.Script;
  }
  std::string many;
  for (int i = 0; i < 40; ++i) many += "GET /api/state\n";
  EXPECT_EQ(RunScript(many).Requests, 16);
}

}  // namespace
