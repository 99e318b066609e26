#include "host/envelope_storage.h"

#include <algorithm>
#include <cmath>

namespace {

bool IsFiniteKey(float x, float y) {
  return std::isfinite(x) && std::isfinite(y);
}

bool KeyBefore(float x, const Tev_EnvelopeStorage::Key& key) {
  return x < key.X;
}

// The value on the span from `from` to `to` at `x` (from.X <= x < to.X). Worked in double so that
// neither the x distances nor the y difference can overflow, and kept between the two y values.
float SpanValue(const Tev_EnvelopeStorage::Key& from, const Tev_EnvelopeStorage::Key& to, float x) {
  if (from.Mode == Tev_EnvelopeStorage::Interpolation::Step) return from.Y;
  const double t = (static_cast<double>(x) - from.X) / (static_cast<double>(to.X) - from.X);
  // Smooth is the cubic Hermite curve with zero tangents at both keys.
  const double weight =
      from.Mode == Tev_EnvelopeStorage::Interpolation::Smooth ? t * t * (3.0 - 2.0 * t) : t;
  const double y = from.Y + (static_cast<double>(to.Y) - from.Y) * weight;
  const double low = std::min(from.Y, to.Y);
  const double high = std::max(from.Y, to.Y);
  return static_cast<float>(std::clamp(y, low, high));
}

}  // namespace

Tev_EnvelopeStorage::Tev_EnvelopeStorage() = default;

void Tev_EnvelopeStorage::Initialize() {
  if (!Dirty) return;
  EvenlySpaced = false;
  const std::size_t count = Keys.size();
  if (count >= 2) {
    const double first = Keys.front().X;
    const double spacing = (static_cast<double>(Keys.back().X) - first) / (count - 1);
    if (spacing > 0.0) {
      // Near-even spacing is enough: FindSpan corrects a guess that is one span off.
      const double tolerance = spacing * 0.01;
      EvenlySpaced = true;
      for (std::size_t i = 1; i + 1 < count && EvenlySpaced; ++i)
        EvenlySpaced = std::fabs(Keys[i].X - (first + spacing * i)) <= tolerance;
      InverseSpacing = 1.0 / spacing;
    }
  }
  Dirty = false;
}

std::size_t Tev_EnvelopeStorage::FindSpan(float x) const {
  if (Dirty || !EvenlySpaced) {
    const auto after = std::upper_bound(Keys.begin(), Keys.end(), x, KeyBefore);
    return static_cast<std::size_t>(after - Keys.begin()) - 1;
  }
  // x lies inside the key range, so the guess is within [0, count - 1] before the clamp.
  const double position = (static_cast<double>(x) - Keys.front().X) * InverseSpacing;
  std::size_t span = std::min(static_cast<std::size_t>(position), Keys.size() - 2);
  while (span + 2 < Keys.size() && Keys[span + 1].X <= x) ++span;
  while (span > 0 && Keys[span].X > x) --span;
  return span;
}

float Tev_EnvelopeStorage::GetEnvelopeValue(float x) {
  if (Keys.empty()) return 0.0f;
  if (std::isnan(x) || x < Keys.front().X) return Keys.front().Y;
  if (x >= Keys.back().X) return Keys.back().Y;
  const std::size_t span = FindSpan(x);
  return SpanValue(Keys[span], Keys[span + 1], x);
}

float Tev_EnvelopeStorage::GetMinIndex() {
  return Keys.empty() ? 0.0f : Keys.front().X;
}

float Tev_EnvelopeStorage::GetMaxIndex() {
  return Keys.empty() ? 0.0f : Keys.back().X;
}

void Tev_EnvelopeStorage::InsertSorted(const Key& key) {
  Keys.insert(std::upper_bound(Keys.begin(), Keys.end(), key.X, KeyBefore), key);
  Dirty = true;
}

void Tev_EnvelopeStorage::AddKey(float x, float y, Interpolation mode) {
  if (IsFiniteKey(x, y)) InsertSorted(Key{x, y, mode});
}

void Tev_EnvelopeStorage::SetKeys(const std::vector<Key>& keys) {
  std::vector<Key> sorted;
  sorted.reserve(keys.size());
  for (const Key& key : keys)
    if (IsFiniteKey(key.X, key.Y)) sorted.push_back(key);
  std::stable_sort(sorted.begin(), sorted.end(),
                   [](const Key& a, const Key& b) { return a.X < b.X; });
  Keys = std::move(sorted);
  Dirty = true;
}

bool Tev_EnvelopeStorage::RemoveKey(int index) {
  if (index < 0 || index >= GetKeyCount()) return false;
  Keys.erase(Keys.begin() + index);
  Dirty = true;
  return true;
}

bool Tev_EnvelopeStorage::ReplaceKey(int index, const Key& key) {
  if (index < 0 || index >= GetKeyCount() || !IsFiniteKey(key.X, key.Y)) return false;
  Keys.erase(Keys.begin() + index);
  InsertSorted(key);
  return true;
}

void Tev_EnvelopeStorage::ClearKeys() {
  Keys.clear();
  Dirty = true;
}

int Tev_EnvelopeStorage::GetKeyCount() const {
  return static_cast<int>(Keys.size());
}

const std::vector<Tev_EnvelopeStorage::Key>& Tev_EnvelopeStorage::GetKeys() const {
  return Keys;
}
