#include "host/envelope_storage.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>

namespace {

bool IsFiniteKey(float x, float y) {
  return std::isfinite(x) && std::isfinite(y);
}

bool KeyBefore(float x, const Tev_EnvelopeStorage::Key& key) {
  return x < key.X;
}

// The slope of a linear span, worked in double so that neither the x distance nor the y
// difference can overflow. The prepared segments and the general path both use it.
double LinearSlope(const Tev_EnvelopeStorage::Key& from, const Tev_EnvelopeStorage::Key& to) {
  return (static_cast<double>(to.Y) - from.Y) / (static_cast<double>(to.X) - from.X);
}

// A span as a segment: the value at x is Y + (x - X) * Slope, kept between the two y values.
EnvelopeSegment SpanSegment(const Tev_EnvelopeStorage::Key& from,
                            const Tev_EnvelopeStorage::Key& to) {
  // A span between keys of equal x is never sampled (the later key decides there): no slope.
  const bool flat = from.Mode == Tev_EnvelopeStorage::Interpolation::Step || !(to.X > from.X);
  return {from.X, from.Y, flat ? 0.0 : LinearSlope(from, to), std::min(from.Y, to.Y),
          std::max(from.Y, to.Y)};
}

// A held end: y everywhere.
EnvelopeSegment HeldSegment(const Tev_EnvelopeStorage::Key& key) {
  return {key.X, key.Y, 0.0, key.Y, key.Y};
}

// The value on the span from `from` to `to` at `x` (from.X <= x < to.X), kept between the two y
// values. Linear and step spans give exactly what their prepared segment gives.
float SpanValue(const Tev_EnvelopeStorage::Key& from, const Tev_EnvelopeStorage::Key& to, float x) {
  if (from.Mode == Tev_EnvelopeStorage::Interpolation::Step) return from.Y;
  double y = 0.0;
  if (from.Mode == Tev_EnvelopeStorage::Interpolation::Smooth) {
    // The cubic Hermite curve with zero tangents at both keys.
    const double t = (static_cast<double>(x) - from.X) / (static_cast<double>(to.X) - from.X);
    y = from.Y + (static_cast<double>(to.Y) - from.Y) * (t * t * (3.0 - 2.0 * t));
  } else {
    y = from.Y + (static_cast<double>(x) - from.X) * LinearSlope(from, to);
  }
  const double low = std::min(from.Y, to.Y);
  const double high = std::max(from.Y, to.Y);
  return static_cast<float>(y < low ? low : (high < y ? high : y));
}

// Few keys are found quickest by counting over four or eight slots; more by the even spacing or
// a binary search.
std::size_t KeySlots(std::size_t keys) {
  return keys <= 4 ? 4 : keys <= 8 ? 8 : keys;
}

}  // namespace

Tev_EnvelopeStorage::Tev_EnvelopeStorage() {
  KeysChanged();
}

void Tev_EnvelopeStorage::KeysChanged() {
  Dirty = true;
  Prepared = false;
  KeyX.resize(KeySlots(Keys.size()));
  Segments.resize(Keys.size() + 1);
}

void Tev_EnvelopeStorage::Initialize() {
  if (!Dirty) return;
  EvenlySpaced = false;
  const std::size_t count = Keys.size();
  if (count >= 2) {
    const double first = Keys.front().X;
    const double spacing = (static_cast<double>(Keys.back().X) - first) / (count - 1);
    if (spacing > 0.0) {
      // Near-even spacing is enough: a guess is then at most one span off, and both lookups
      // correct it.
      const double tolerance = spacing * 0.01;
      EvenlySpaced = true;
      for (std::size_t i = 1; i + 1 < count && EvenlySpaced; ++i)
        EvenlySpaced = std::fabs(Keys[i].X - (first + spacing * i)) <= tolerance;
      InverseSpacing = 1.0 / spacing;
    }
  }
  PrepareSegments();
  Dirty = false;
}

void Tev_EnvelopeStorage::PrepareSegments() {
  Prepared = false;
  const std::size_t count = Keys.size();
  // A setter that failed to size the arrays leaves the general path in charge.
  if (KeyX.size() != KeySlots(count) || Segments.size() != count + 1) return;
  for (std::size_t i = 0; i + 1 < count; ++i)
    if (Keys[i].Mode == Interpolation::Smooth) return;
  std::fill(KeyX.begin(), KeyX.end(), std::numeric_limits<float>::quiet_NaN());
  if (count == 0) {
    Segments[0] = EnvelopeSegment{};
  } else {
    for (std::size_t i = 0; i < count; ++i) KeyX[i] = Keys[i].X;
    Segments[0] = HeldSegment(Keys.front());
    for (std::size_t i = 0; i + 1 < count; ++i) Segments[i + 1] = SpanSegment(Keys[i], Keys[i + 1]);
    Segments[count] = HeldSegment(Keys.back());
  }
  if (count <= 4)
    PreparedLookup = EnvelopeSampler::Lookup::Count4;
  else if (count <= 8)
    PreparedLookup = EnvelopeSampler::Lookup::Count8;
  else if (EvenlySpaced)
    PreparedLookup = EnvelopeSampler::Lookup::Direct;
  else
    PreparedLookup = EnvelopeSampler::Lookup::Search;
  Prepared = true;
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

int EnvelopeSampler::SearchedSegment(float x) const {
  if (!(x >= First_)) return 0;
  return static_cast<int>(std::upper_bound(KeyX_, KeyX_ + Keys_, x) - KeyX_);
}

bool EnvelopeSampler::SharesLookupWith(const EnvelopeSampler& other) const {
  if (Lookup_ == Lookup::General || Lookup_ != other.Lookup_ || Keys_ != other.Keys_ ||
      First_ != other.First_ || InverseSpacing_ != other.InverseSpacing_)
    return false;
  const int slots = Lookup_ == Lookup::Count4 ? 4 : Lookup_ == Lookup::Count8 ? 8 : Keys_;
  // Bit for bit: the NaN padding compares equal, and -0 and +0 keys are kept apart.
  return std::memcmp(KeyX_, other.KeyX_, static_cast<std::size_t>(slots) * sizeof(float)) == 0;
}

float SampleEnvelopeGeneral(const Tev_EnvelopeStorage& envelope, float x) {
  return envelope.SampleGeneral(x);
}

float Tev_EnvelopeStorage::SampleGeneral(float x) const {
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
  KeysChanged();
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
  KeysChanged();
}

bool Tev_EnvelopeStorage::RemoveKey(int index) {
  if (index < 0 || index >= GetKeyCount()) return false;
  Keys.erase(Keys.begin() + index);
  KeysChanged();
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
  KeysChanged();
}

int Tev_EnvelopeStorage::GetKeyCount() const {
  return static_cast<int>(Keys.size());
}

const std::vector<Tev_EnvelopeStorage::Key>& Tev_EnvelopeStorage::GetKeys() const {
  return Keys;
}
