#include "tools/studio/edit_rules.h"

#include <cmath>
#include <cstdio>

namespace apestudio {
namespace {

using apescene::Json;

// Links whose values size the pool or the work per frame: a slip of the slider there should be
// refused rather than stall the studio.
struct LinkRange {
  const char* Name;
  double Minimum;
  double Maximum;
};
constexpr LinkRange kLinkRanges[] = {
    {"ParticleCount", 0.0, 1'000'000.0},   {"Logic Updates Per Second", 0.0, 1000.0},
    {"Births Per Second", 0.0, 100'000.0}, {"Lifespan_Min", 0.0, 3600.0},
    {"Lifespan_Max", 0.0, 3600.0},
};

std::string Number(double value) {
  char text[32];
  std::snprintf(text, sizeof text, "%.10g", value);
  return text;
}

// The first number of `value` that is not finite or beyond the studio's range, as a message.
std::string CheckNumbers(const Json& value, int depth) {
  if (depth > kMaximumValueDepth) return "the value nests too deeply";
  if (value.is_number_float()) {
    const double number = value.get<double>();
    if (!std::isfinite(number)) return "numbers must be finite";
    if (std::fabs(number) > kMaximumMagnitude)
      return Number(number) + " is out of range (the studio takes -1000000 to 1000000)";
  } else if (value.is_number()) {
    const double number = value.get<double>();
    if (std::fabs(number) > kMaximumMagnitude)
      return Number(number) + " is out of range (the studio takes -1000000 to 1000000)";
  }
  if (value.is_structured())
    for (const Json& item : value) {
      const std::string problem = CheckNumbers(item, depth + 1);
      if (!problem.empty()) return problem;
    }
  return "";
}

// The link name when the path is channels.<name>.links.<link>.
const std::string* LinkNameOf(const Json& path) {
  if (path.size() != 4 || !path[0].is_string() || !path[2].is_string() || !path[3].is_string())
    return nullptr;
  if (path[0] != "channels" || path[2] != "links") return nullptr;
  return &path[3].get_ref<const std::string&>();
}

}  // namespace

std::string CheckEditValue(const Json& path, const Json& value) {
  // A link's own range first: it says more than the studio's general one.
  const std::string* link = LinkNameOf(path);
  if (link != nullptr && value.is_number() && std::isfinite(value.get<double>())) {
    const double number = value.get<double>();
    for (const LinkRange& range : kLinkRanges)
      if (*link == range.Name && !(number >= range.Minimum && number <= range.Maximum))
        return "\"" + *link + "\" takes " + Number(range.Minimum) + " to " + Number(range.Maximum) +
               ", got " + Number(number);
  }
  return CheckNumbers(value, 0);
}

std::string CheckStudioLimits(const Json& root) {
  if (!root.is_object()) return "";
  const auto resolution = root.find("resolution");
  if (resolution != root.end() && resolution->is_array() && resolution->size() == 2 &&
      (*resolution)[0].is_number() && (*resolution)[1].is_number()) {
    const double width = (*resolution)[0].get<double>(), height = (*resolution)[1].get<double>();
    if (width > kMaximumWidth || height > kMaximumHeight)
      return "the studio shows at most " + std::to_string(kMaximumWidth) + "x" +
             std::to_string(kMaximumHeight) + " pixels";
  }
  const auto frames = root.find("frames");
  if (frames != root.end() && frames->is_number() && frames->get<double>() > kMaximumFrames)
    return "the studio's timeline holds at most " + std::to_string(kMaximumFrames) + " frames";
  const auto duration = root.find("duration");
  const auto fps = root.find("fps");
  const double rate = fps != root.end() && fps->is_number() ? fps->get<double>() : 30.0;
  if (duration != root.end() && duration->is_number() &&
      duration->get<double>() * rate > kMaximumFrames)
    return "the studio's timeline holds at most " + std::to_string(kMaximumFrames) + " frames";
  return "";
}

}  // namespace apestudio
