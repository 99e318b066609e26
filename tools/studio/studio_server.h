// The studio's web server (cpp-httplib): hands every request to StudioApi and streams the
// viewport as a multipart JPEG stream (multipart/x-mixed-replace, one part per frame with the
// frame's statistics in an X-Stats header).
#pragma once

#include <atomic>
#include <memory>
#include <string>

#include "tools/studio/studio_api.h"

namespace httplib {
class Server;
}

namespace apestudio {

class StudioServer {
 public:
  // Streams open at once; more are refused so that requests always find a worker.
  static constexpr int kMaximumStreams = 3;

  StudioServer(StudioEngine& engine, StudioApi& api);
  ~StudioServer();

  // Binds to host:port (port 0: any free one); the port, or -1 with *error.
  int Bind(const std::string& host, int port, std::string* error);
  // Serves until Stop (from another thread).
  void Serve();
  void Stop();

 private:
  StudioEngine& engine_;
  StudioApi& api_;
  std::unique_ptr<httplib::Server> server_;
  std::atomic<int> streams_{0};
};

}  // namespace apestudio
