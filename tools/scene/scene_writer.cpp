#include "tools/scene/scene_writer.h"

namespace apescene {
namespace {

// Lines are kept within this width where a value can be put on one line at all.
constexpr std::size_t kLineWidth = 100;

// One line: ", " between items and ": " after keys, as people write them.
std::string Inline(const Json& value) {
  if (value.is_array()) {
    std::string text = "[";
    for (std::size_t i = 0; i < value.size(); ++i) text += (i ? ", " : "") + Inline(value[i]);
    return text + "]";
  }
  if (value.is_object()) {
    std::string text = "{";
    bool first = true;
    for (const auto& item : value.items()) {
      text += (first ? "" : ", ") + Json(item.key()).dump() + ": " + Inline(item.value());
      first = false;
    }
    return text + "}";
  }
  return value.dump();
}

void Write(const Json& value, std::size_t indent, std::size_t used, std::string* out) {
  const std::string line = Inline(value);
  if (!value.is_structured() || value.empty() || indent + used + line.size() <= kLineWidth) {
    *out += line;
    return;
  }
  const std::string inner(indent + 2, ' ');
  const bool object = value.is_object();
  *out += object ? "{\n" : "[\n";
  std::size_t i = 0;
  for (const auto& item : value.items()) {
    *out += inner;
    std::size_t key_width = 0;
    if (object) {
      const std::string key = Json(item.key()).dump() + ": ";
      *out += key;
      key_width = key.size();
    }
    Write(item.value(), indent + 2, key_width, out);
    *out += ++i < value.size() ? ",\n" : "\n";
  }
  *out += std::string(indent, ' ') + (object ? "}" : "]");
}

}  // namespace

std::string WriteSceneText(const Json& root) {
  std::string text;
  Write(root, 0, 0, &text);
  return text + "\n";
}

}  // namespace apescene
