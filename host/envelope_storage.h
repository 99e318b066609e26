// "EnvelopeStorage": a curve of (x, y) keys that plug-ins sample, e.g. a particle's size over its
// normalised age.
//
// The curve holds its end values outside the key range: no key gives 0, one key gives its y
// everywhere, a NaN x gives the first key's y, -inf and +inf give the first and last key's y.
// Keys with equal x keep the order they were given in; at exactly such an x the curve takes the
// last of them (it is continuous from the right). Non-finite keys are refused by every setter
// (AddKey and SetKeys skip them, ReplaceKey answers false), so the curve is always finite.
#pragma once

#include <cstddef>
#include <vector>

#include "host/envelope_sampler.h"
#include "host/qen_channel.h"

class Tev_EnvelopeStorage : public Qen_Channel {
 public:
  // How the curve runs from a key to the next one.
  enum class Interpolation { Linear, Step, Smooth };

  struct Key {
    float X;
    float Y;
    Interpolation Mode = Interpolation::Linear;
  };

  Tev_EnvelopeStorage();
  ChannelType GetChannelType() override;

  // Contract used by plug-ins; none of these allocates or throws.
  void Initialize();  // prepares the curve for sampling; cheap when nothing changed
  // Inline: a plug-in may sample several curves per particle and logic step.
  float GetEnvelopeValue(float x) { return GetSampler().At(x); }
  float GetMinIndex();  // the first key's x (0 without keys)
  float GetMaxIndex();  // the last key's x (0 without keys)

  // Host API. The setters may throw std::bad_alloc like any container.
  void AddKey(float x, float y, Interpolation mode = Interpolation::Linear);  // after equal x
  void SetKeys(const std::vector<Key>& keys);  // any order; non-finite keys are dropped
  bool RemoveKey(int index);                   // index in x order
  bool ReplaceKey(int index, const Key& key);  // index in x order; false when out of range
  void ClearKeys();
  int GetKeyCount() const;
  const std::vector<Key>& GetKeys() const;  // in x order

  // A view for sampling many times, valid until the keys are edited or the curve is destroyed.
  // Linear and step spans sample from what Initialize prepared; before Initialize, after an edit
  // and with smooth spans the view takes the general path. Both give the same values.
  EnvelopeSampler GetSampler() const {
    if (!Prepared) return EnvelopeSampler(*this);
    return EnvelopeSampler(*this, PreparedLookup, KeyX.data(), static_cast<int>(Keys.size()),
                           Segments.data(), Keys.empty() ? 0.0f : Keys.front().X, InverseSpacing);
  }
  // The general path: any interpolation, prepared or not.
  float SampleGeneral(float x) const;

 private:
  // Index of the last key whose x is at most `x`, for x strictly inside the key range.
  std::size_t FindSpan(float x) const;
  void InsertSorted(const Key& key);
  // After any edit: drops the prepared data and sizes its arrays for the new keys.
  void KeysChanged();
  void PrepareSegments();

  std::vector<Key> Keys;  // kept sorted by x
  bool Dirty = true;
  // What Initialize prepares for the inline path; sized by the setters, so that Initialize does
  // not allocate. Prepared only while the sizes match the keys and no span is smooth.
  std::vector<float> KeyX;  // the keys' x in order, then NaN up to the counting lookup's slots
  std::vector<EnvelopeSegment> Segments;  // before the first key, one per span, from the last on
  bool Prepared = false;
  EnvelopeSampler::Lookup PreparedLookup = EnvelopeSampler::Lookup::General;
  // Set by Initialize when the keys are evenly spaced: the span is then found by one division.
  bool EvenlySpaced = false;
  double InverseSpacing = 0.0;  // spans per unit of x
};
