// Text forms of GUIDs: the registry form names plug-in files and type records.
#include <cstdio>
#include <string>

#include "platform/windows_types.h"

namespace {

// Length of "XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX".
constexpr std::size_t kRegistryFormLength = 36;

bool IsDashPosition(std::size_t i) {
  return i == 8 || i == 13 || i == 18 || i == 23;
}

}  // namespace

std::string FormatGuid(const GUID& guid) {
  char text[kRegistryFormLength + 1];
  std::snprintf(text, sizeof text, "%08X-%04X-%04X-%02X%02X-%02X%02X%02X%02X%02X%02X",
                static_cast<unsigned>(guid.Data1), static_cast<unsigned>(guid.Data2),
                static_cast<unsigned>(guid.Data3), guid.Data4[0], guid.Data4[1], guid.Data4[2],
                guid.Data4[3], guid.Data4[4], guid.Data4[5], guid.Data4[6], guid.Data4[7]);
  return std::string(text, kRegistryFormLength);
}

bool ParseGuid(const std::string& text, GUID* out) {
  std::string body = text;
  if (!body.empty() && body.front() == '{') {
    // Braces come in pairs or not at all.
    if (body.size() < 2 || body.back() != '}') return false;
    body = body.substr(1, body.size() - 2);
  }
  if (body.size() != kRegistryFormLength) return false;
  for (std::size_t i = 0; i < body.size(); ++i) {
    const bool ok = IsDashPosition(i) ? body[i] == '-' : guid_detail::HexDigit(body[i]) >= 0;
    if (!ok) return false;
  }
  if (out == nullptr) return true;

  using guid_detail::HexField;
  const char* s = body.c_str();
  GUID g{};
  g.Data1 = HexField(s, 8);
  g.Data2 = static_cast<std::uint16_t>(HexField(s + 9, 4));
  g.Data3 = static_cast<std::uint16_t>(HexField(s + 14, 4));
  g.Data4[0] = static_cast<std::uint8_t>(HexField(s + 19, 2));
  g.Data4[1] = static_cast<std::uint8_t>(HexField(s + 21, 2));
  for (int i = 0; i < 6; ++i)
    g.Data4[2 + i] = static_cast<std::uint8_t>(HexField(s + 24 + 2 * i, 2));
  *out = g;
  return true;
}
