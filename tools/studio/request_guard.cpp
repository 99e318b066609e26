#include "tools/studio/request_guard.h"

#include <random>

namespace apestudio {

RequestGuard::RequestGuard(std::string token, std::vector<std::string> hosts, int port)
    : token_(std::move(token)), hosts_(std::move(hosts)), port_(port) {}

std::string RequestGuard::NewToken() {
  std::random_device source;
  static constexpr char kHex[] = "0123456789abcdef";
  std::string token;
  for (int i = 0; i < 32; ++i) token += kHex[source() & 0xF];
  return token;
}

bool RequestGuard::TokenMatches(const std::string& given) const {
  // Compared in time independent of where they differ, so the token cannot be guessed piecewise.
  if (given.size() != token_.size() || token_.empty()) return false;
  unsigned char difference = 0;
  for (std::size_t i = 0; i < given.size(); ++i)
    difference |= static_cast<unsigned char>(given[i] ^ token_[i]);
  return difference == 0;
}

bool RequestGuard::HostAllowed(const std::string& host_and_port) const {
  for (const std::string& host : hosts_)
    if (host_and_port == host + ":" + std::to_string(port_)) return true;
  return false;
}

std::string RequestGuard::Refusal(const std::string& token, const std::string& host,
                                  const std::string& origin) const {
  if (!HostAllowed(host)) return "the Host header does not name this studio";
  if (!origin.empty()) {
    const std::string prefix = "http://";
    if (origin.compare(0, prefix.size(), prefix) != 0 || !HostAllowed(origin.substr(prefix.size())))
      return "requests from other sites are refused";
  }
  if (!TokenMatches(token)) return "missing or wrong token (open the address the studio printed)";
  return "";
}

}  // namespace apestudio
