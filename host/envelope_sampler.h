// A prepared envelope's sampling view: what Tev_EnvelopeStorage::Initialize worked out once (one
// segment per span, plus one before the first key and one from the last key on), sampled inline.
// Plug-ins that sample many times per frame take a view once and keep it while nothing edits the
// curve; Tev_EnvelopeStorage::GetEnvelopeValue samples through a fresh view itself.
#pragma once

#include <cstdint>
#include <limits>

class Tev_EnvelopeStorage;

// y = Y + (x - X) * Slope kept within [Low, High]: a linear span, or with Slope 0 a step span or
// a held end. Worked in double so that neither the x distances nor the y difference overflow.
struct EnvelopeSegment {
  double X = 0.0;
  double Y = 0.0;
  double Slope = 0.0;
  double Low = 0.0;
  double High = 0.0;
};

// The value at x through the general path (any interpolation, prepared or not).
float SampleEnvelopeGeneral(const Tev_EnvelopeStorage& envelope, float x);

class EnvelopeSampler {
 public:
  // How the segment of an x is found.
  enum class Lookup : std::uint8_t {
    Count4,  // at most four keys: count the key x's at or below x (padded with NaN, never counted)
    Count8,  // at most eight keys: the same
    Direct,  // evenly spaced keys: one multiplication, then at most one step either way
    Search,  // binary search
    General  // not prepared, or smooth spans: the storage's general path
  };

  // A curve of one value, 0 unless `held` says otherwise: the stand-in for an absent envelope.
  // `held` must outlive the view.
  explicit EnvelopeSampler(const EnvelopeSegment& held = kZero)
      : Envelope_(nullptr), Lookup_(Lookup::Count4), KeyX_(kNoKeys), Segments_(&held) {}
  // A view of `envelope` through its general path.
  explicit EnvelopeSampler(const Tev_EnvelopeStorage& envelope) : Envelope_(&envelope) {}
  // A view of prepared data: `keyX` holds the `keys` key x's in order (then NaN up to four or
  // eight for the counting lookups), `segments` keys + 1 segments; the arrays must outlive the
  // view.
  EnvelopeSampler(const Tev_EnvelopeStorage& envelope, Lookup lookup, const float* keyX, int keys,
                  const EnvelopeSegment* segments, float first, double inverseSpacing)
      : Envelope_(&envelope),
        Lookup_(lookup),
        Keys_(keys),
        KeyX_(keyX),
        Segments_(segments),
        First_(first),
        InverseSpacing_(inverseSpacing) {}

  // Always inline: the hot loops call it several times per particle.
  [[gnu::always_inline]] float At(float x) const {
    if (Lookup_ == Lookup::General) return SampleEnvelopeGeneral(*Envelope_, x);
    return AtSegment(SegmentOf(x), x);
  }

  // Views whose key x's are the same find the same segment for every x: a caller sampling
  // several such curves at one x finds it once. Never true for a general view.
  bool SharesLookupWith(const EnvelopeSampler& other) const;

  // For a view that is not general: the segment of x (the number of key x's at or below x: 0
  // before the first key and for NaN, the key count from the last key on; the last of equal key
  // x's decides), and the value at x on segment k.
  [[gnu::always_inline]] int SegmentOf(float x) const {
    if (Lookup_ == Lookup::Count4) return CountAtOrBelow<4>(x);
    if (Lookup_ == Lookup::Count8) return CountAtOrBelow<8>(x);
    if (Lookup_ == Lookup::Direct) {
      // Keys are within 1% of a spacing of their even place: the guess is at most one off.
      double p = (static_cast<double>(x) - First_) * InverseSpacing_;
      p = p > 0.0 ? p : 0.0;
      const double lastSpan = Keys_ - 2;
      p = p < lastSpan ? p : lastSpan;
      int k = static_cast<int>(p) + 1;
      k -= !(x >= KeyX_[k - 1]);
      k += x >= KeyX_[k];
      return k;
    }
    return SearchedSegment(x);
  }
  [[gnu::always_inline]] float AtSegment(int k, float x) const {
    const EnvelopeSegment& s = Segments_[k];
    const double y = s.Y + (static_cast<double>(x) - s.X) * s.Slope;
    // Kept within the span's y values. Only a held end meets a NaN y (its slope 0 times an
    // infinite distance, NaN x included): it takes Low, which is its y.
    return static_cast<float>(!(y >= s.Low) ? s.Low : (s.High < y ? s.High : y));
  }

  Lookup GetLookup() const { return Lookup_; }

 private:
  template <int kSlots>
  [[gnu::always_inline]] int CountAtOrBelow(float x) const {
    int k = 0;
    for (int i = 0; i < kSlots; ++i) k += x >= KeyX_[i];
    return k;
  }
  // Out of line: a binary search is long, and its curves are long too.
  int SearchedSegment(float x) const;

  static constexpr EnvelopeSegment kZero{};
  static constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
  static constexpr float kNoKeys[4] = {kNaN, kNaN, kNaN, kNaN};

  const Tev_EnvelopeStorage* Envelope_;
  Lookup Lookup_ = Lookup::General;
  int Keys_ = 0;
  const float* KeyX_ = nullptr;
  const EnvelopeSegment* Segments_ = nullptr;
  float First_ = 0.0f;  // the first key's x (direct and searched lookups)
  double InverseSpacing_ = 0.0;
};
