// The scene check of one emitter: the mistakes that make an emitter render nothing, render
// black, invisible or huge particles, freeze, waste its pool, or ignore links it was given.
#include <algorithm>
#include <cmath>

#include "host/envelope_storage.h"
#include "host/link_channels.h"
#include "host/object_data_channel.h"
#include "host/smoke_settings.h"
#include "host/type_guids.h"
#include "plugin/link_table.h"
#include "tools/scene/scene_check_context.h"

namespace apescene {
namespace {

// Above these a per-step value is almost surely a per-second one written by mistake.
constexpr double kMostLikelySpeedPerSecond = 200.0;           // world units a second
constexpr double kMostLikelyAccelerationPerSecond2 = 1000.0;  // world units a second squared
// A pool this many times what the births can fill, and this much larger, is waste.
constexpr double kPoolWasteFactor = 10.0;
constexpr double kPoolWasteRecords = 10000.0;

float GreatestY(Tev_EnvelopeStorage& envelope) {
  float greatest = 0.0f;
  bool first = true;
  for (const Tev_EnvelopeStorage::Key& key : envelope.GetKeys()) {
    greatest = first ? key.Y : std::max(greatest, key.Y);
    first = false;
  }
  return greatest;
}

class EmitterCheck {
 public:
  EmitterCheck(CheckContext& context, Qen_Channel* emitter) : c_(context), e_(emitter) {}

  void Run() {
    if (!SimulationLinks()) return;
    Births();
    Lifespans();
    Pool();
    Look();
    Collision();
    Smoke();
    Spin();
    Magnitudes();
    LifetimeEnvelopeRanges();
  }

 private:
  bool Number(int index, NumberRange* range) const { return c_.Number(e_, index, range); }
  bool Linked(int index) const { return c_.Linked(e_, index); }
  bool CanBeYes(int index) const { return c_.CanBeYes(e_, index); }
  void At(int index, const std::string& message) { c_.AtLink(e_, index, message); }
  void AtEmitter(const std::string& message) { c_.AtChannel(e_, message); }

  // The three links without which the emitter does not simulate at all.
  bool SimulationLinks() {
    std::string missing;
    for (int index : {kLinkEmitterActive, kLinkBirthsPerSecond, kLinkLogicUpdatesPerSecond})
      if (!Linked(index)) missing += (missing.empty() ? "" : ", ") + EmitterLinkName(index);
    if (missing.empty()) return true;
    AtEmitter(missing +
              " not linked: without \"Emitter_Active?\", \"Births Per Second\" and "
              "\"Logic Updates Per Second\" the emitter does not simulate (nothing is "
              "born, moves or ages)");
    return false;
  }

  void Births() {
    NumberRange range;
    if (Number(kLinkEmitterActive, &range) && !(range.Greatest > 0.0f))
      At(kLinkEmitterActive, "never above 0: no particle is ever born");
    if (Number(kLinkBirthsPerSecond, &range)) {
      if (!(range.Greatest > 0.0f)) At(kLinkBirthsPerSecond, "never above 0: no particle is born");
      const double fps = c_.TheScene().Settings.Fps;
      if (range.Greatest / fps > 1001.0)
        At(kLinkBirthsPerSecond,
           ShowNumber(range.Greatest) + " births a second at " + ShowNumber(fps) +
               " frames a second is more than the 1001 births the emitter gives a frame: the "
               "rest are dropped");
    }
    if (Number(kLinkSimulationScaler, &range)) {
      if (!(range.Greatest > 0.0f))
        At(kLinkSimulationScaler, "never above 0: the emitter is paused for the whole shot");
      else if (range.Greatest > 3.0f)
        At(kLinkSimulationScaler, ShowNumber(range.Greatest) +
                                      " is above 3, which runs at 1 (the scaler's range is "
                                      "above 0 to 3)");
    }
    if (Number(kLinkLogicUpdatesPerSecond, &range) && !(range.Least > 0.0f))
      At(kLinkLogicUpdatesPerSecond,
         ShowNumber(range.Least) +
             " runs no logic step: particles are born but never move, change or die (frozen)");
    Qen_Channel* mesh = c_.Child(e_, kLinkEmitter);
    if (mesh == nullptr) {
      AtEmitter(
          "no \"Emitter\" link: no particle is ever born (link the 3D ObjectData mesh "
          "particles are born on)");
    } else if (IsType(mesh, kObjectDataGuid)) {
      auto* object = static_cast<Tev_DX8_ObjectDataChannel*>(mesh);
      if (CanBeYes(kLinkVertexEmissions) ? object->GetVertexCount() == 0
                                         : object->GetIndexCount() < 3)
        At(kLinkEmitter, "the mesh has no " +
                             std::string(CanBeYes(kLinkVertexEmissions) ? "vertex" : "triangle") +
                             " to be born on: no particle is ever born");
    }
    if (!Linked(kLinkParticleCount))
      AtEmitter("no \"ParticleCount\": the pool is empty and no particle is ever born");
  }

  void Lifespans() {
    NumberRange low, high;
    const bool has_low = Number(kLinkLifespanMin, &low);
    const bool has_high = Number(kLinkLifespanMax, &high);
    if (!has_low && !has_high) {
      AtEmitter(
          "no \"Lifespan_Min\" or \"Lifespan_Max\": every life is 0 s and each particle "
          "dies in its first logic step");
      return;
    }
    const float longest = std::max(has_low ? low.Greatest : 0.0f, has_high ? high.Greatest : 0.0f);
    const int where = has_low ? kLinkLifespanMin : kLinkLifespanMax;
    if (!(longest > 0.0f)) {
      At(where, "every life is 0 s or less: each particle dies in its first logic step");
    } else if (has_low && has_high && low.Least > high.Greatest) {
      At(kLinkLifespanMin, ShowNumber(low.Least) + " s is above \"Lifespan_Max\" (" +
                               ShowNumber(high.Greatest) +
                               " s): every particle lives Lifespan_Min and the maximum is "
                               "ignored");
    } else if (has_low && low.Least < 0.0f) {
      At(kLinkLifespanMin,
         "negative: particles given a life below 0 die in their first logic "
         "step");
    }
  }

  // Seconds a record stays taken at most: the free life, and the attached life after it; a
  // negative answer when stuck particles keep their records for ever.
  double LongestRecordSeconds() const {
    NumberRange low{}, high{}, attach{}, attached_life{};
    Number(kLinkLifespanMin, &low);
    Number(kLinkLifespanMax, &high);
    double seconds = std::max(low.Greatest, high.Greatest);
    if (Linked(kLinkMultiCollisionManager) && Number(kLinkAttachRate, &attach) &&
        attach.Greatest > 0.0f) {
      if (!Number(kLinkAttachedLifespan, &attached_life) || !(attached_life.Greatest > 0.0f))
        return -1.0;
      seconds += attached_life.Greatest;
    }
    return seconds;
  }

  void Pool() {
    NumberRange count, births;
    if (!Number(kLinkParticleCount, &count)) return;
    if (count.Greatest > 1'000'000.0f)
      At(kLinkParticleCount,
         ShowNumber(count.Greatest) + " is above the emitter's largest pool, 1000000");
    if (!Number(kLinkBirthsPerSecond, &births) || !(births.Greatest > 0.0f)) return;
    const double seconds = LongestRecordSeconds();
    if (!(seconds > 0.0)) return;
    const double alive = std::ceil(births.Greatest * seconds);
    const double pool = std::min<double>(count.Greatest, 1'000'000.0);
    if (pool > kPoolWasteFactor * alive && pool - alive > kPoolWasteRecords)
      At(kLinkParticleCount,
         ShowNumber(pool) + " records, but the births fill at most about " + ShowNumber(alive) +
             " (" + ShowNumber(births.Greatest) + " a second for " + ShowNumber(seconds) +
             " s each): every logic step visits every record of the pool, so its size, not the "
             "number alive, is what each step costs");
  }

  void Look() {
    const int colours[] = {kLinkRedColorEnvelope, kLinkGreenColorEnvelope, kLinkBlueColorEnvelope};
    if (std::none_of(std::begin(colours), std::end(colours), [&](int i) { return Linked(i); }))
      AtEmitter(
          "no colour envelopes (\"Red Color Envelope\", \"Green Color Envelope\", \"Blue "
          "Color Envelope\"): every particle is black");
    for (int index : {kLinkVertexAlphaEnvelope, kLinkRedColorEnvelope, kLinkGreenColorEnvelope,
                      kLinkBlueColorEnvelope}) {
      Tev_EnvelopeStorage* envelope = c_.Envelope(e_, index);
      if (envelope == nullptr) continue;
      const float greatest = GreatestY(*envelope);
      if (greatest > 0.0f && greatest <= 1.0f)
        At(index,
           "its values stay within 0..1, but colour and alpha envelopes run 0..255: at "
           "most " +
               ShowNumber(greatest) + " of 255 (multiply by 255)");
    }
    const bool fading = CanBeYes(kLinkUseVertexAlphaFading);
    if (fading && !Linked(kLinkVertexAlphaEnvelope))
      At(kLinkUseVertexAlphaFading,
         "on, but no \"Vertex Alpha Envelope\" is linked: alpha is 0 and every particle is "
         "invisible");
    if (!fading && Linked(kLinkVertexAlphaEnvelope))
      At(kLinkVertexAlphaEnvelope,
         "does nothing without \"Use Vertex Alpha Fading?\" on: particles are drawn unblended");
    if (!fading && Linked(kLinkParticleTexture))
      At(kLinkParticleTexture,
         "without \"Use Vertex Alpha Fading?\" on, the texture's alpha (its shape) is ignored "
         "and particles are drawn as opaque squares");
    if (Linked(kLinkAttachedTexture) && !Linked(kLinkParticleTexture))
      At(kLinkAttachedTexture, "used only together with \"Particle Texture\": ignored here");
    if (!Linked(kLinkSizeEnvelope))
      AtEmitter(
          "no \"Size Envelope\": every particle is 1 world unit wide (times its size "
          "multiplier)");
    if (!Linked(kLinkLookAt) && !CanBeYes(kLinkHardwareParticles))
      AtEmitter(
          "no \"LookAt\": every quad faces the point [0, 0, 0] and is seen edge-on from "
          "some places; link \"camera.eye\" to face the camera");
  }

  void Collision() {
    const bool manager = Linked(kLinkMultiCollisionManager);
    const int rates[] = {kLinkBounceRate, kLinkAttachRate, kLinkCollisionReportRate};
    for (int index : rates)
      if (!manager && Linked(index))
        At(index, "does nothing without a \"MultiCollisionManager\" link");
    if (manager && !SmokeUsesSurfaces() &&
        std::none_of(std::begin(rates), std::end(rates), [&](int i) { return Linked(i); }))
      At(kLinkMultiCollisionManager,
         "particles pass through its surfaces: a hit does something only with \"Bounce Rate\" "
         "or \"Attach Rate\" linked (or is reported with \"Collision Report Rate\")");
    for (int index :
         {kLinkBounceRate, kLinkAttachRate, kLinkAttachedSlideRate, kLinkCollisionReportRate}) {
      NumberRange rate;
      if (!Number(index, &rate)) continue;
      if (rate.Greatest > 1.0f)
        At(index, "a chance from 0 to 1: " + ShowNumber(rate.Greatest) + " acts as 1 (always)");
      else if (rate.Least < 0.0f)
        At(index, "a chance from 0 to 1: " + ShowNumber(rate.Least) + " acts as 0 (never)");
    }
    if (Linked(kLinkBouncingReportCollisions))
      At(kLinkBouncingReportCollisions,
         "has no effect: every particle that is not sliding may report a hit");

    const bool attaches = manager && CanBeYes(kLinkAttachRate);
    if (!attaches) {
      std::string unused;
      int first = -1;
      for (int index = kLinkAttachedLifespan; index <= kLinkSlidingSizeOffsetEnvelope; ++index) {
        if (index == kLinkAttachedSlidingHeight || !Linked(index)) continue;
        unused += (unused.empty() ? "" : ", ") + EmitterLinkName(index);
        if (first < 0) first = index;
      }
      if (first >= 0)
        At(first,
           "no particle ever attaches (it needs \"MultiCollisionManager\" and \"Attach "
           "Rate\" above 0), so " +
               unused + " do nothing");
      return;
    }
    NumberRange slide{}, attached_life;
    const bool slides = Number(kLinkAttachedSlideRate, &slide) && slide.Greatest > 0.0f;
    const bool sticks = !(slide.Least >= 1.0f);
    if (sticks &&
        (!Number(kLinkAttachedLifespan, &attached_life) || !(attached_life.Greatest > 0.0f)))
      At(kLinkAttachRate,
         "stuck particles never end (\"Attached Lifespan\" is not linked or not above 0) and "
         "keep their records: once the pool is full of them no particle is born");
    if (slides && !Linked(kLinkSlidingSizeOffsetEnvelope)) {
      Tev_EnvelopeStorage* size = c_.Envelope(e_, kLinkSizeEnvelope);
      const double flight = size != nullptr ? GreatestY(*size) : 1.0;
      At(kLinkAttachedSlideRate,
         "sliding particles are drawn at \"Sliding Size Offset Envelope\" + their size "
         "multiplier (at least 1) + their size when they began to slide; without that envelope "
         "that is about " +
             ShowNumber(1.0 + flight) + " world units against " + ShowNumber(flight) +
             " in flight: link \"Sliding Size Offset Envelope\": [[0, -1], [1, -1]] to keep "
             "the flight size");
    }
  }

  // Smoke collision and surface repulsion use the collision manager without any rate.
  bool SmokeUsesSurfaces() const {
    Qen_Channel* settings = c_.Child(e_, kLinkSmokeSettings);
    using Smoke = Tev_AdvPE_SmokeSettings;
    return settings != nullptr && CanBeYes(kLinkSmoke) &&
           (c_.CanBeYes(settings, Smoke::kLinkCollisionEnabled) ||
            c_.Linked(settings, Smoke::kLinkSurfaceRepulsionEnvelope));
  }

  void Smoke() {
    Qen_Channel* settings = c_.Child(e_, kLinkSmokeSettings);
    const bool on = CanBeYes(kLinkSmoke);
    if (on && settings == nullptr) At(kLinkSmoke, "does nothing without \"SmokeSettings\"");
    if (settings == nullptr) return;
    if (!on) {
      At(kLinkSmokeSettings, "unused while \"Smoke?\" is not on");
      return;
    }
    using Smoke = Tev_AdvPE_SmokeSettings;
    const bool forces = c_.Linked(settings, Smoke::kLinkRepulsionEnvelope) ||
                        c_.Linked(settings, Smoke::kLinkAttractionEnvelope) ||
                        c_.Linked(settings, Smoke::kLinkSurfaceRepulsionEnvelope);
    if (forces && !c_.Linked(settings, Smoke::kLinkForceStrengthEnvelope))
      c_.AtChannel(settings,
                   "no \"Force Strength Envelope\": the repulsion, attraction and surface forces "
                   "are all multiplied by 0");
    if (!Linked(kLinkMultiCollisionManager)) {
      if (c_.CanBeYes(settings, Smoke::kLinkCollisionEnabled))
        c_.AtLink(settings, Smoke::kLinkCollisionEnabled,
                  "smoke collision needs the emitter's \"MultiCollisionManager\" link");
      if (c_.Linked(settings, Smoke::kLinkSurfaceRepulsionEnvelope))
        c_.AtLink(settings, Smoke::kLinkSurfaceRepulsionEnvelope,
                  "surface repulsion needs the emitter's \"MultiCollisionManager\" link");
    }
  }

  void Spin() {
    const bool low = Linked(kLinkSpinSpeedMin), high = Linked(kLinkSpinSpeedMax);
    if (low != high)
      At(low ? kLinkSpinSpeedMin : kLinkSpinSpeedMax,
         "spin needs both \"SpinSpeed_Min\" and \"SpinSpeed_Max\": this one alone is ignored");
    NumberRange a, b;
    if (Number(kLinkSpinSpeedMin, &a) && Number(kLinkSpinSpeedMax, &b) && a.Least > b.Greatest)
      At(kLinkSpinSpeedMin,
         "above \"SpinSpeed_Max\": every particle spins at SpinSpeed_Min and the emitter sends "
         "a message at every birth");
  }

  // Values per logic step that are far too large are per-second values written as per-step ones.
  void Magnitudes() {
    NumberRange rate;
    if (!Number(kLinkLogicUpdatesPerSecond, &rate) || !(rate.Greatest > 0.0f)) return;
    const double r = rate.Greatest;
    if (auto* force = dynamic_cast<Qen_ValueVectorChannel*>(c_.Child(e_, kLinkGlobalForce))) {
      const D3DXVECTOR3 g = force->GetVector();
      const double per_second2 =
          std::sqrt(double(g.x) * g.x + double(g.y) * g.y + double(g.z) * g.z) * r * r;
      if (per_second2 > kMostLikelyAccelerationPerSecond2)
        At(kLinkGlobalForce, "per logic step per logic step: at " + ShowNumber(r) +
                                 " steps a second this is " + ShowNumber(per_second2) +
                                 " units/s^2 (9.8 units/s^2 is 9.8 / " + ShowNumber(r) +
                                 "^2 = " + ShowNumber(9.8 / (r * r)) +
                                 "; or write {\"per_second_squared\": [x, y, z]})");
    }
    NumberRange strength;
    if (Number(kLinkInitialForceStrength, &strength)) {
      const double per_second =
          std::max(std::fabs(strength.Least), std::fabs(strength.Greatest)) * r;
      if (per_second > kMostLikelySpeedPerSecond)
        At(kLinkInitialForceStrength,
           "per logic step: at " + ShowNumber(r) + " steps a second this is a speed of " +
               ShowNumber(per_second) + " units/s (or write {\"per_second\": ...})");
    }
  }

  // Lifetime envelopes are read at the fraction of a life: keys beyond 1 are never reached.
  void LifetimeEnvelopeRanges() {
    for (int index : {kLinkSizeEnvelope, kLinkVertexAlphaEnvelope, kLinkRedColorEnvelope,
                      kLinkGreenColorEnvelope, kLinkBlueColorEnvelope,
                      kLinkAttachedSizeOffsetEnvelope, kLinkAttachedAlphaOffsetEnvelope,
                      kLinkAttachedRedOffsetEnvelope, kLinkAttachedGreenOffsetEnvelope,
                      kLinkAttachedBlueOffsetEnvelope, kLinkSlidingSizeOffsetEnvelope}) {
      Tev_EnvelopeStorage* envelope = c_.Envelope(e_, index);
      if (envelope == nullptr || envelope->GetKeyCount() == 0) continue;
      const float last = envelope->GetMaxIndex();
      if (last > 1.0f)
        At(index, "x is the fraction of a life, 0 to 1 (not seconds), but the keys reach x = " +
                      ShowNumber(last) + ": what lies beyond x = 1 is never read");
    }
  }

  CheckContext& c_;
  Qen_Channel* e_;
};

}  // namespace

void CheckEmitter(CheckContext& context, Qen_Channel* emitter) {
  EmitterCheck(context, emitter).Run();
}

}  // namespace apescene
