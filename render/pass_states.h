// What the two render passes share: texture choice, the fading blend states and their restore,
// and the device lookup every Direct3D call goes through.
#pragma once

#include "platform/d3d9_interfaces.h"

class Tev_AdvancedParticleEmitter;
class Tev_DX8_DeviceChannel;

// The channel's current device, or null without a channel or device. Fetched before every use,
// never kept: the host may replace the device between calls.
IDirect3DDevice9* CurrentDevice(Tev_DX8_DeviceChannel* channel);

// The draw a pass wraps in its states: the base's mesh or the point sprites.
using PassDraw = void (*)(Tev_AdvancedParticleEmitter& emitter);

// What the fading pass sets after the draw: the quad path turns on depth test and depth writes,
// the point path only the depth test.
enum class DepthAfterFading { TestAndWrite, TestOnly };

// One textured pass. Fading off: the base's own pre-draw states, the "Particle Texture" on stage
// 0, the draw; nothing restored. Fading on: blend states kept, the fading texture and states set,
// the draw, depth states, blend states put back. Does nothing without a device channel.
void RunTexturedPass(Tev_AdvancedParticleEmitter& emitter, PassDraw draw, DepthAfterFading depth);
