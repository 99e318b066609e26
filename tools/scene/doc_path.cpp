#include "tools/scene/doc_path.h"

#include <cctype>

namespace apescene {
namespace {

bool IsPlainKey(const std::string& key) {
  if (key.empty()) return false;
  for (unsigned char c : key)
    if (!std::isalnum(c) && c != '_' && c != '-') return false;
  return true;
}

std::string QuoteKey(const std::string& key) {
  std::string quoted = "\"";
  for (char c : key) {
    if (c == '"' || c == '\\') quoted += '\\';
    quoted += c;
  }
  return quoted + "\"";
}

}  // namespace

DocPath DocPath::Key(const std::string& key) const {
  DocPath path = *this;
  path.steps_.emplace_back(key);
  return path;
}

DocPath DocPath::Index(std::size_t index) const {
  DocPath path = *this;
  path.steps_.emplace_back(index);
  return path;
}

std::string DocPath::Text() const {
  std::string text;
  for (const Step& step : steps_) {
    if (const auto* key = std::get_if<std::string>(&step)) {
      if (!text.empty()) text += '.';
      text += IsPlainKey(*key) ? *key : QuoteKey(*key);
    } else {
      text += "[" + std::to_string(std::get<std::size_t>(step)) + "]";
    }
  }
  return text;
}

}  // namespace apescene
