// "EnvelopeStorage": a curve of (x, y) keys that plug-ins sample, e.g. a particle's size over its
// normalised age.
#pragma once

#include <vector>

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

  // Contract used by plug-ins.
  void Initialize();  // prepares the curve for sampling; cheap when nothing changed
  float GetEnvelopeValue(float x);
  float GetMinIndex();  // the first key's x (0 without keys)
  float GetMaxIndex();  // the last key's x (0 without keys)

  // Host API.
  void AddKey(float x, float y, Interpolation mode = Interpolation::Linear);
  void SetKeys(const std::vector<Key>& keys);  // any order
  bool RemoveKey(int index);                    // index in x order
  bool ReplaceKey(int index, const Key& key);   // index in x order
  void ClearKeys();
  int GetKeyCount() const;
  const std::vector<Key>& GetKeys() const;  // in x order

 private:
  std::vector<Key> Keys;  // kept sorted by x
  bool Dirty = true;
};
