// Who may drive the studio: every request carries the random token printed in the address, and
// its Host (and Origin, when a browser sends one) must name this server, so that a page served
// from elsewhere, or a name rebound to this machine, cannot reach it.
#pragma once

#include <string>
#include <vector>

namespace apestudio {

class RequestGuard {
 public:
  // `hosts` are the host names this server answers to (e.g. "127.0.0.1", "localhost"); `port`
  // is the port it listens on.
  RequestGuard(std::string token, std::vector<std::string> hosts, int port);

  // A new random token: 32 hexadecimal digits from the system's random source.
  static std::string NewToken();

  // Empty when the request may proceed, else why not (for the 403 answer).
  std::string Refusal(const std::string& token, const std::string& host,
                      const std::string& origin) const;

  const std::string& Token() const { return token_; }
  // The port, once binding has chosen it.
  void SetPort(int port) { port_ = port; }

 private:
  bool TokenMatches(const std::string& given) const;
  bool HostAllowed(const std::string& host_and_port) const;

  std::string token_;
  std::vector<std::string> hosts_;
  int port_;
};

}  // namespace apestudio
