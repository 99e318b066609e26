// The HTTP interface as the server hands it requests: who is let in, what bodies are taken, and
// what each answer holds.
#include <gtest/gtest.h>

#include "tools/studio/studio_api.h"
#include "tools/studio/tests/studio_fixture.h"

namespace apestudio {
namespace {

using apescene::Json;

constexpr char kToken[] = "feedfacefeedfacefeedfacefeedface";
constexpr char kHost[] = "127.0.0.1:4567";

class StudioApiTest : public ::testing::Test {
 protected:
  void SetUp() override {
    engine_ = studiotest::OpenStudio(folder_, "fountain.json", "null");
    ASSERT_NE(engine_, nullptr);
    api_ = std::make_unique<StudioApi>(*engine_, guard_, "/* chart */");
  }

  HttpRequest Request(const std::string& method, const std::string& path,
                      const std::string& body = "") {
    HttpRequest request;
    request.Method = method;
    request.Path = path;
    request.Host = kHost;
    request.TokenHeader = kToken;
    request.Body = body;
    return request;
  }

  Json JsonOf(const HttpResponse& response) { return Json::parse(response.Body); }

  studiotest::ScratchFolder folder_;
  std::unique_ptr<StudioEngine> engine_;
  RequestGuard guard_{kToken, {"127.0.0.1", "localhost"}, 4567};
  std::unique_ptr<StudioApi> api_;
};

TEST_F(StudioApiTest, OnlyRequestsOfThisStudioAreAnswered) {
  struct Case {
    const char* What;
    void (*Change)(HttpRequest*);
    int Status;
  };
  const Case cases[] = {
      {"as the page sends them", [](HttpRequest*) {}, 200},
      {"token in the address",
       [](HttpRequest* r) {
         r->TokenHeader.clear();
         r->Query["token"] = kToken;
       },
       200},
      {"no token", [](HttpRequest* r) { r->TokenHeader.clear(); }, 403},
      {"wrong token in the address",
       [](HttpRequest* r) {
         r->TokenHeader.clear();
         r->Query["token"] = "feedface";
       },
       403},
      {"another host name", [](HttpRequest* r) { r->Host = "attacker.example:4567"; }, 403},
      {"another site's page", [](HttpRequest* r) { r->Origin = "http://attacker.example"; }, 403},
  };
  for (const Case& c : cases) {
    for (const char* method : {"GET", "POST"}) {
      HttpRequest request =
          Request(method, std::string(method) == "GET" ? "/api/state" : "/api/step",
                  method == std::string("POST") ? "{}" : "");
      c.Change(&request);
      const HttpResponse response = api_->Handle(request);
      EXPECT_EQ(response.Status, c.Status) << c.What << " " << method;
      EXPECT_EQ(response.FrameStream, false);
    }
  }
  HttpRequest stream = Request("GET", "/api/stream");
  stream.TokenHeader.clear();
  EXPECT_FALSE(api_->Handle(stream).FrameStream) << "a stream without the token";
}

TEST_F(StudioApiTest, BadBodiesAreRefusedWithAReason) {
  std::string deep =
      "{\"path\": [\"fps\"], \"value\": " + std::string(100, '[') + std::string(100, ']') + "}";
  struct Case {
    const char* What;
    std::string Method, Path, Body;
    int Status;
  };
  const Case cases[] = {
      {"malformed JSON", "POST", "/api/edit", "{\"path\": [\"fps\"], \"value\": ", 400},
      {"NaN is no JSON", "POST", "/api/edit", "{\"path\": [\"fps\"], \"value\": NaN}", 400},
      {"a number beyond a double", "POST", "/api/edit", "{\"path\": [\"fps\"], \"value\": 1e400}",
       400},
      {"not an object", "POST", "/api/edit", "[1, 2]", 400},
      {"no value", "POST", "/api/edit", "{\"path\": [\"fps\"]}", 400},
      {"nested too deeply", "POST", "/api/edit", deep, 400},
      {"too large", "POST", "/api/edit", std::string(StudioApi::kMaximumBodyBytes + 1, ' '), 413},
      {"a refused value", "POST", "/api/edit", "{\"path\": [\"fps\"], \"value\": -1}", 422},
      {"a frame that is no number", "POST", "/api/seek", "{\"frame\": \"10\"}", 400},
      {"a frame beyond any timeline", "POST", "/api/seek", "{\"frame\": 1e12}", 400},
      {"a view with the eye on the target", "POST", "/api/view",
       "{\"eye\": [1, 1, 1], \"target\": [1, 1, 1]}", 400},
      {"a view out of range", "POST", "/api/view", "{\"eye\": [1e9, 1, 1], \"target\": [0, 0, 0]}",
       400},
      {"playing as a number", "POST", "/api/play", "{\"playing\": 1}", 400},
      {"an unknown request", "POST", "/api/explode", "{}", 404},
      {"an unknown page", "GET", "/etc/passwd", "", 404},
      {"another method", "PUT", "/api/edit", "{}", 405},
  };
  for (const Case& c : cases) {
    const Json before = engine_->Document();
    const HttpResponse response = api_->Handle(Request(c.Method, c.Path, c.Body));
    EXPECT_EQ(response.Status, c.Status) << c.What << ": " << response.Body;
    const Json answer = JsonOf(response);
    EXPECT_EQ(answer["ok"], false) << c.What;
    EXPECT_FALSE(answer["error"].get<std::string>().empty()) << c.What;
    EXPECT_EQ(engine_->Document(), before) << c.What;
  }
}

TEST_F(StudioApiTest, AnswersCarryWhatThePageNeeds) {
  const HttpResponse page = api_->Handle(Request("GET", "/"));
  EXPECT_EQ(page.ContentType.rfind("text/html", 0), 0u);
  EXPECT_NE(page.Body.find(std::string("content=\"") + kToken + "\""), std::string::npos);
  EXPECT_EQ(page.Body.find("{{TOKEN}}"), std::string::npos);
  EXPECT_EQ(api_->Handle(Request("GET", "/chart.js")).Body, "/* chart */");
  EXPECT_TRUE(api_->Handle(Request("GET", "/api/stream")).FrameStream);
  const HttpResponse frame = api_->Handle(Request("GET", "/api/frame"));
  ASSERT_EQ(frame.ContentType, "image/jpeg");
  EXPECT_EQ(frame.Body.substr(0, 2), "\xFF\xD8");

  const Json edit = JsonOf(api_->Handle(
      Request("POST", "/api/edit",
              R"({"path": ["channels", "sparks", "links", "Births Per Second"], "value": 123})")));
  EXPECT_EQ(edit["ok"], true);
  EXPECT_EQ(edit["state"]["undo"], 1);
  const Json document = JsonOf(api_->Handle(Request("GET", "/api/document")));
  EXPECT_EQ(document["channels"]["sparks"]["links"]["Births Per Second"], 123);

  const Json inspector = JsonOf(api_->Handle(Request("GET", "/api/inspector")));
  const Json* sparks = nullptr;
  for (const Json& channel : inspector["channels"])
    if (channel["name"] == "sparks") sparks = &channel;
  ASSERT_NE(sparks, nullptr);
  ASSERT_EQ((*sparks)["links"].size(), 54u);
  struct Expected {
    int Index;
    const char* Kind;
  };
  for (const Expected& e :
       {Expected{0, "channel"}, Expected{1, "matrix"}, Expected{2, "yesno"}, Expected{6, "number"},
        Expected{16, "vector"}, Expected{18, "envelope"}, Expected{53, "channel"}}) {
    const Json& link = (*sparks)["links"][e.Index];
    EXPECT_EQ(link["kind"], e.Kind) << link["name"];
  }
  EXPECT_EQ((*sparks)["links"][6]["value"], 123);
  EXPECT_EQ((*sparks)["links"][0]["choices"], Json::array({"floor", "nozzle"}));
  EXPECT_TRUE((*sparks)["links"][53]["many"].get<bool>());
}

}  // namespace
}  // namespace apestudio
