#include "tools/scene/animation.h"

#include "tools/scene/scene_error.h"

namespace apescene {

float Blend(float a, float b, float f) {
  return a + (b - a) * f;
}

D3DXVECTOR3 Blend(const D3DXVECTOR3& a, const D3DXVECTOR3& b, float f) {
  return {Blend(a.x, b.x, f), Blend(a.y, b.y, f), Blend(a.z, b.z, f)};
}

MatrixValue Blend(const MatrixValue& a, const MatrixValue& b, float f) {
  MatrixValue out;
  if (a.IsTransform && b.IsTransform && a.Parts.Order == b.Parts.Order) {
    out.IsTransform = true;
    out.Parts.Order = a.Parts.Order;
    out.Parts.Translation = Blend(a.Parts.Translation, b.Parts.Translation, f);
    out.Parts.RotationDegrees = Blend(a.Parts.RotationDegrees, b.Parts.RotationDegrees, f);
    out.Parts.Scale = Blend(a.Parts.Scale, b.Parts.Scale, f);
    out.Matrix = ComposeTransform(out.Parts);
    return out;
  }
  for (int row = 0; row < 4; ++row)
    for (int col = 0; col < 4; ++col)
      out.Matrix.m[row][col] = Blend(a.Matrix.m[row][col], b.Matrix.m[row][col], f);
  return out;
}

bool IsAnimatedForm(const Json& json) {
  return json.is_object() && json.contains("keys");
}

template <typename T>
Track<T> ReadTrack(const Json& json, const DocPath& path,
                   const std::function<T(const Json&, const DocPath&)>& read_value) {
  Track<T> track;
  if (!IsAnimatedForm(json)) {
    track.Keys.push_back({0.0, read_value(json, path)});
    return track;
  }
  CheckObject(json, path, {"keys", "interpolation"});
  if (const Json* mode = Find(json, "interpolation")) {
    const std::string text = ReadString(*mode, path.Key("interpolation"));
    if (text != "linear" && text != "hold")
      throw SceneError(path.Key("interpolation"),
                       "expected \"linear\" or \"hold\", got \"" + text + "\"");
    track.Hold = text == "hold";
  }
  const DocPath keys_path = path.Key("keys");
  const Json& keys = json["keys"];
  if (!keys.is_array() || keys.empty())
    ThrowExpected(keys_path, "a list of keys [[seconds, value], ...]", keys);
  for (std::size_t i = 0; i < keys.size(); ++i) {
    const DocPath key_path = keys_path.Index(i);
    const Json& key = keys[i];
    if (!key.is_array() || key.size() != 2) ThrowExpected(key_path, "a key [seconds, value]", key);
    const double seconds = ReadNumber(key[0], key_path.Index(0));
    if (!track.Keys.empty() && seconds <= track.Keys.back().Seconds)
      throw SceneError(key_path.Index(0), "key times must increase, got " + key[0].dump() +
                                              " after " + keys[i - 1][0].dump());
    track.Keys.push_back({seconds, read_value(key[1], key_path.Index(1))});
  }
  return track;
}

template Track<float> ReadTrack(const Json&, const DocPath&,
                                const std::function<float(const Json&, const DocPath&)>&);
template Track<D3DXVECTOR3> ReadTrack(
    const Json&, const DocPath&, const std::function<D3DXVECTOR3(const Json&, const DocPath&)>&);
template Track<MatrixValue> ReadTrack(
    const Json&, const DocPath&, const std::function<MatrixValue(const Json&, const DocPath&)>&);

}  // namespace apescene
