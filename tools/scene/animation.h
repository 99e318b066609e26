// Values that change over a shot: keys (time in seconds, value), blended linearly between keys
// (or held until the next key), holding the first and last values outside the keys.
#pragma once

#include <algorithm>
#include <functional>
#include <vector>

#include "tools/scene/json_values.h"

namespace apescene {

float Blend(float a, float b, float f);
D3DXVECTOR3 Blend(const D3DXVECTOR3& a, const D3DXVECTOR3& b, float f);
// Transforms of the same rotation order blend part by part; anything else element by element.
MatrixValue Blend(const MatrixValue& a, const MatrixValue& b, float f);

template <typename T>
struct Track {
  struct Key {
    double Seconds;
    T Value;
  };
  std::vector<Key> Keys;  // sorted by time, at least one
  bool Hold = false;      // step from key to key instead of blending

  bool IsAnimated() const { return Keys.size() > 1; }

  T Sample(double seconds) const {
    if (seconds <= Keys.front().Seconds) return Keys.front().Value;
    if (seconds >= Keys.back().Seconds) return Keys.back().Value;
    // The first key after `seconds`; the one before it starts the span.
    const auto next = std::upper_bound(Keys.begin(), Keys.end(), seconds,
                                       [](double s, const Key& key) { return s < key.Seconds; });
    const Key& from = *(next - 1);
    if (Hold) return from.Value;
    const double span = next->Seconds - from.Seconds;
    const float f = static_cast<float>((seconds - from.Seconds) / span);
    return Blend(from.Value, next->Value, f);
  }
};

// Reads either a plain value (one key) or {"keys": [[seconds, value], ...], "interpolation":
// "linear" | "hold"}, the value read by `read_value`.
template <typename T>
Track<T> ReadTrack(const Json& json, const DocPath& path,
                   const std::function<T(const Json&, const DocPath&)>& read_value);

// Whether a value is written in the animated form (an object with "keys").
bool IsAnimatedForm(const Json& json);

}  // namespace apescene
