// Channels described by a fuzzer's input: every type the emitter links, with the awkward cases
// within reach (envelopes with odd keys, meshes without triangles, textures of odd sizes and
// formats, attractors with huge forces, collision managers with degenerate shapes).
#pragma once

#include "fuzz/byte_reader.h"
#include "fuzz/channel_pool.h"
#include "platform/d3dx_math.h"

class Qen_Channel;

namespace apefuzz {

D3DXVECTOR3 ReadVector(ByteReader& in);
D3DXMATRIX ReadMatrix(ByteReader& in);  // a MatrixKind and its values

// A new channel of the type the emitter's link `link` takes, described by the input, kept in
// `pool` (with any channels it links in turn). Null when the pool is full.
Qen_Channel* MakeChannelForLink(int link, ByteReader& in, ChannelPool& pool);

// Changes the channel in a way that fits its type, as a host may between frames.
void MutateChannel(Qen_Channel& channel, ByteReader& in, ChannelPool& pool);

}  // namespace apefuzz
