// How far the drawing blends into the next logic step, shared by the frame driver and the checks
// that hold it to its range.
#pragma once

class Tev_AdvancedParticleEmitter;

namespace sim {

// Only a finite rate above 0 runs logic steps.
bool LogicRateUsable(float logicUpdatesPerSecond);

// The banked logic time as a fraction of one logic step, in [0, 1]; 0 without a usable rate.
float BlendFactor(const Tev_AdvancedParticleEmitter& e);

}  // namespace sim
