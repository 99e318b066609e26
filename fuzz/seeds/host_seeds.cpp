#include "fuzz/seeds/host_seeds.h"

#include <climits>
#include <initializer_list>
#include <limits>
#include <utility>

#include "fuzz/host_script.h"
#include "platform/d3dx_math.h"
#include "plugin/link_table.h"

namespace apefuzz {

namespace {

using W = ScriptWriter;
using KeyList = std::initializer_list<std::pair<double, double>>;

constexpr std::uint8_t kFirst = 0;  // emitter selectors
constexpr std::uint8_t kSecond = 1;

// Byte values the reader turns back into counts: Below(n) - 1 for mesh lists.
std::uint8_t MeshCount(int count) {
  return static_cast<std::uint8_t>(count + 1);
}

W& LinkEnvelope(W& w, std::uint8_t emitter, int link, KeyList keys) {
  w.Op(kOpSetLink).Byte(emitter).Byte(static_cast<std::uint8_t>(link));
  w.Byte(static_cast<std::uint8_t>(keys.size())).Byte(0);  // added one by one
  for (const auto& [x, y] : keys) w.Value(x).Value(y).Byte(0);
  return w;
}

// A "3D ObjectData" of listed vertices (normals up) and index entries at `link`.
W& LinkMesh(W& w, std::uint8_t emitter, int link, std::initializer_list<D3DXVECTOR3> vertices,
            std::initializer_list<std::uint8_t> indices) {
  w.Op(kOpSetLink).Byte(emitter).Byte(static_cast<std::uint8_t>(link)).Byte(kMeshLists);
  w.Byte(MeshCount(static_cast<int>(vertices.size()))).Byte(1);
  for (const D3DXVECTOR3& v : vertices) w.Vector(v.x, v.y, v.z).Vector(0, 1, 0);
  w.Byte(MeshCount(static_cast<int>(indices.size())));
  for (std::uint8_t index : indices) w.Byte(index);
  return w.Byte(0);  // no world matrix
}

// A running emitter: 64 records, 60 logic steps and 200 births per second, one vertex.
W Basics() {
  W w;
  w.SetValue(kLinkParticleCount, 64)
      .SetValue(kLinkLogicUpdatesPerSecond, 60)
      .SetValue(kLinkBirthsPerSecond, 200)
      .SetValue(kLinkEmitterActive, 1)
      .SetValue(kLinkVertexEmissions, 1)
      .SetValue(kLinkLifespanMin, 1)
      .SetValue(kLinkLifespanMax, 2)
      .SetValue(kLinkInitialForceStrength, 0.05)
      .SetVector(kLinkGlobalForce, 0, -0.01, 0);
  LinkMesh(w, kFirst, kLinkEmitter, {{0, 0, 0}}, {});
  return w;
}

W& Frames(W& w, int count, std::uint8_t ms = 16) {
  for (int f = 0; f < count; ++f) w.Frame(kFirst, ms);
  return w;
}

W BasicFountain() {
  W w = Basics();
  Frames(w, 10);
  return w;
}

// Every link of one kind set to the same troublesome value, then frames.
W EveryValueLinkAt(ValueSelector value) {
  W w = Basics();
  Frames(w, 3);
  for (int link = 0; link < kEmitterLinkCount; ++link) {
    w.Op(kOpSetValue).Byte(static_cast<std::uint8_t>(link));
    // Three values, enough for a vector link; a value link leaves two for the next opcode
    // bytes, which then read as harmless operations.
    w.Special(value).Special(value).Special(value);
  }
  Frames(w, 6);
  return w;
}

W LinksComeAndGo() {
  W w = Basics();
  LinkEnvelope(w, kFirst, kLinkSizeEnvelope, {{0, 0.2}, {1, 0.05}});
  LinkEnvelope(w, kFirst, kLinkVertexAlphaEnvelope, {{0, 255}, {1, 0}});
  LinkEnvelope(w, kFirst, kLinkRedColorEnvelope, {{0, 255}});
  Frames(w, 4);
  // The envelopes (channels 10 to 12, after eight values, a vector and the mesh) go away between
  // frames; the host then asks for births directly.
  for (int k = 0; k < 3; ++k) w.Op(kOpDestroyChannel).Byte(10);
  w.Call(kFirst, kCallBirthParticle).SmallIndex(0);
  w.Call(kFirst, kCallBirthParticle).SmallIndex(3);
  w.Op(kOpUnlink).Byte(kFirst).Byte(kLinkEmitter);
  w.Call(kFirst, kCallBirthParticle).SmallIndex(0);
  Frames(w, 3);
  LinkMesh(w, kFirst, kLinkEmitter, {{0, 0, 0}, {1, 0, 0}}, {});
  Frames(w, 3);
  return w;
}

W DegenerateMeshes() {
  W w = Basics();
  w.SetValue(kLinkVertexEmissions, 0);
  LinkMesh(w, kFirst, kLinkEmitter, {}, {});
  Frames(w, 3);
  LinkMesh(w, kFirst, kLinkEmitter, {{1, 1, 1}}, {0, 0});
  Frames(w, 3);
  LinkMesh(w, kFirst, kLinkEmitter, {{0, 0, 0}, {1, 0, 0}, {0, 1, 0}}, {0, 1, 2, 0});
  Frames(w, 3);
  LinkMesh(w, kFirst, kLinkEmitter, {{0, 0, 0}, {1, 0, 0}}, {0, 1, 9, 255, 0, 1});
  Frames(w, 3);
  w.SetValue(kLinkVertexEmissions, 1);
  LinkMesh(w, kFirst, kLinkEmitter, {}, {0, 1, 2});
  Frames(w, 3);
  return w;
}

W OddEnvelopes() {
  W w = Basics();
  LinkEnvelope(w, kFirst, kLinkSizeEnvelope, {});
  LinkEnvelope(w, kFirst, kLinkVertexAlphaEnvelope, {{0.5, 300}});
  LinkEnvelope(w, kFirst, kLinkRedColorEnvelope, {{0, -50}, {0, 500}, {0, 20}});
  LinkEnvelope(w, kFirst, kLinkGreenColorEnvelope, {{1, 10}, {-1, 255}});
  LinkEnvelope(w, kFirst, kLinkBlueColorEnvelope, {{0, 1}, {0.0001, 255}, {300, 3}});
  w.SetValue(kLinkUseVertexAlphaFading, 1);
  Frames(w, 20, 40);
  // Keys by bit pattern: the setters drop what is not finite.
  w.Op(kOpSetLink).Byte(kFirst).Byte(kLinkSizeEnvelope).Byte(3).Byte(1);
  w.Special(kValueNaN).Value(1).Byte(2);
  w.Special(kValueInfinity).Special(kValueHuge).Byte(1);
  w.Special(kValueDenormal).Special(kValueFloatMax).Byte(0);
  Frames(w, 10, 40);
  return w;
}

W HugeAttractors() {
  W w = Basics();
  for (int k = 0; k < 3; ++k) {
    w.Op(kOpSetLink).Byte(kFirst).Byte(kLinkAttractors).Byte(1);
    w.Byte(0);  // the fields
    w.Vector(0, 0.01 * k, 0).Special(kValueFloatMax).Byte(k & 1).Special(kValueTiny);
    w.Special(kValueHuge).Special(kValueMinusHuge).Vector(0, 1, 0);
  }
  Frames(w, 30);
  return w;
}

W OddTextures() {
  W w = Basics();
  w.Op(kOpSetLink).Byte(kFirst).Byte(kLinkParticleTexture).Byte(1).Byte(1).Byte(1);
  w.Op(kOpSetLink)
      .Byte(kFirst)
      .Byte(kLinkAttachedTexture)
      .Byte(2)
      .Byte(3)
      .Byte(0)
      .Byte(63)
      .Byte(17);
  Frames(w, 3);
  w.Op(kOpSetLink).Byte(kFirst).Byte(kLinkAttachedTexture).Byte(0);
  w.Op(kOpCallChannel).Byte(kFirst).Byte(1);
  w.Call(kFirst, kCallInitialize);
  w.Op(kOpSetLink).Byte(kFirst).Byte(kLinkParticleTexture).Byte(2).Byte(2).Byte(2).Byte(5).Byte(0);
  w.Call(kFirst, kCallInitialize);
  w.Op(kOpDevice).Byte(kDeviceFailTextureLock);
  w.Call(kFirst, kCallInitialize);
  Frames(w, 3);
  return w;
}

W CollisionsAndSmoke() {
  W w = Basics();
  // A manager with a ground plane and a linked triangle.
  w.Op(kOpSetLink).Byte(kFirst).Byte(kLinkMultiCollisionManager).Byte(2);
  w.Byte(0).Vector(0, -0.2, 0).Vector(0, 1, 0);
  w.Byte(3).Byte(kMeshLists).Byte(MeshCount(3)).Byte(0);
  w.Vector(-1, -0.1, -1).Vector(1, -0.1, -1).Vector(0, -0.1, 1).Byte(MeshCount(3));
  w.Byte(0).Byte(2).Byte(1).Byte(0);
  w.SetValue(kLinkBounceRate, 0.5).SetValue(kLinkAttachRate, 0.5);
  w.SetValue(kLinkAttachedLifespan, 0.5).SetValue(kLinkAttachedSlideRate, 0.5);
  w.SetValue(kLinkCollisionReportRate, 1).SetValue(kLinkBouncingReportCollisions, 1);
  w.SetValue(kLinkOutCollisionId, 0).SetVector(kLinkOutCollisionPosition, 0, 0, 0);
  w.SetVector(kLinkOutCollisionNormal, 0, 0, 0);
  w.SetVector(kLinkGlobalForce, 0, -0.05, 0);
  Frames(w, 30);
  // Smoke on, with every setting linked.
  w.SetValue(kLinkSmoke, 1);
  w.Op(kOpSetLink).Byte(kFirst).Byte(kLinkSmokeSettings).Byte(5);
  w.Byte(0).Byte(1).Byte(2).Byte(0).Value(0).Value(1).Byte(0).Value(1).Value(0).Byte(0);
  w.Byte(6).Byte(1).Value(1);
  w.Byte(8).Byte(1).Value(1);
  w.Byte(9).Byte(1).Value(0.9);
  w.Byte(13).Byte(1).Value(1);
  Frames(w, 30);
  return w;
}

W CopiesAndAssignments() {
  W w = Basics();
  Frames(w, 5);
  w.Op(kOpCopyEmitter).Byte(kFirst);
  w.Op(kOpCallChannel).Byte(kSecond).Byte(1);
  w.Op(kOpRunFrames).Byte(4).Byte(16);
  w.Op(kOpCreateEmitter);
  w.Op(kOpAssignEmitter).Byte(2).Byte(kFirst);
  w.Op(kOpAssignEmitter).Byte(kFirst).Byte(kFirst);
  w.Op(kOpDestroyEmitter).Byte(kFirst);
  w.Op(kOpRunFrames).Byte(4).Byte(16);
  w.Op(kOpAssignEmitter).Byte(kFirst).Byte(kSecond);
  // An emitter as another one's emitter mesh, and as its own.
  w.Op(kOpLinkExisting).Byte(kFirst).Byte(kLinkEmitter).Byte(0xFF);
  w.Op(kOpLinkExisting).Byte(kSecond).Byte(kLinkEmitter).Byte(0xFE);
  w.Op(kOpRunFrames).Byte(6).Byte(16);
  return w;
}

W EveryPublicCall() {
  W w = Basics();
  Frames(w, 3);
  for (int call = 0; call < kPublicCallCount; ++call) {
    for (std::uint8_t index : {kIndexMinusOne, kIndexMinimum, kIndexMaximum}) {
      w.Call(kFirst, static_cast<PublicCall>(call));
      // Arguments enough for any call: indices and values alike.
      for (int k = 0; k < 12; ++k) w.Byte(index);
    }
  }
  w.SetValue(kLinkHardwareParticles, 1);
  Frames(w, 2);
  for (int call = 0; call < kPublicCallCount; ++call) w.Call(kFirst, static_cast<PublicCall>(call));
  Frames(w, 2);
  return w;
}

W DeviceTrouble() {
  W w = Basics();
  w.Op(kOpDevice).Byte(kDeviceFailCreateVertexBuffer);
  Frames(w, 2);
  w.Op(kOpDevice).Byte(kDeviceFailBufferLock);
  Frames(w, 2);
  w.Op(kOpDevice).Byte(kDeviceNone);
  w.Call(kFirst, kCallInitialize);
  Frames(w, 2);
  w.Op(kOpDevice).Byte(kDeviceOther);
  Frames(w, 2);
  w.SetValue(kLinkHardwareParticles, 1);
  w.Op(kOpDevice).Byte(kDeviceFailCreateVertexBuffer);
  Frames(w, 2);
  w.Op(kOpDevice).Byte(kDeviceOriginal);
  Frames(w, 3);
  return w;
}

W PoolChanges() {
  W w = Basics();
  for (ValueSelector count : {kValueNaN, kValueMinusOne, kValueZero, kValueInfinity, kValueHalf,
                              kValueMinusInfinity, kValueHuge, kValueThousand}) {
    w.Op(kOpSetValue).Byte(kLinkParticleCount).Special(count);
    Frames(w, 2);
    w.Op(kOpSetValue).Byte(kLinkHardwareParticles).Special(count);
    Frames(w, 2);
  }
  return w;
}

W ClockExtremes() {
  W w = Basics();
  Frames(w, 2);
  w.Op(kOpAdvanceClock).Byte(kClockHours).Byte(5);
  w.Op(kOpCallChannel).Byte(kFirst).Byte(1);
  w.Op(kOpAdvanceClock).Byte(kClockNone);
  w.Op(kOpCallChannel).Byte(kFirst).Byte(1);
  w.Op(kOpCallChannel).Byte(kFirst).Byte(0);  // the same host frame again
  w.Op(kOpAdvanceClock).Byte(kClockTicks).Dword(0x80000000u);
  w.Op(kOpCallChannel).Byte(kFirst).Byte(1);
  w.Op(kOpAdvanceClock).Byte(kClockSeconds).Special(kValueHuge);
  w.Op(kOpCallChannel).Byte(kFirst).Byte(1);
  w.Op(kOpAdvanceClock).Byte(kClockSeconds).Special(kValueMinusHuge);
  w.Op(kOpCallChannel).Byte(kFirst).Byte(1);
  w.SetValue(kLinkSimulationScaler, 3);
  w.Call(kFirst, kCallEnableActiveTimer).Special(kValueInfinity);
  w.SetValue(kLinkEmitterActive, 0);
  w.Op(kOpAdvanceClock).Byte(kClockLongMs).Word(60000);
  w.Op(kOpCallChannel).Byte(kFirst).Byte(1);
  Frames(w, 3);
  return w;
}

W SpinAndLookAt() {
  W w = Basics();
  w.SetValue(kLinkSpinSpeedMin, 0.5).SetValue(kLinkSpinSpeedMax, -0.5).SetValue(kLinkSpinStart, 7);
  w.SetVector(kLinkLookAt, 0, 0, -5).SetValue(kLinkLookAtLocal, 1);
  w.Op(kOpSetValue).Byte(kLinkSizeOffsetMax).Special(kValueHuge);
  w.SetValue(kLinkMaximumSpeed, 0.01).SetValue(kLinkReplaceOldParticles, 1);
  w.SetVector(kLinkInitialForceOverride, 0, 0.1, 0).SetValue(kLinkInitialForceAlongNormal, 1);
  w.Op(kOpSetLink).Byte(kFirst).Byte(kLinkEmitterMotion).Byte(kMatrixScale).Vector(2, 0, -1);
  Frames(w, 20);
  return w;
}

}  // namespace

ScriptWriter BirthAfterEnvelopeWentAway() {
  W w;
  w.SetValue(kLinkParticleCount, 8).SetValue(kLinkLogicUpdatesPerSecond, 60);
  w.SetValue(kLinkBirthsPerSecond, 0).SetValue(kLinkEmitterActive, 1);
  w.SetValue(kLinkVertexEmissions, 1);
  // The mesh (channel 5), then one envelope per colour link and the size (channels 6 to 10).
  LinkMesh(w, kFirst, kLinkEmitter, {{0, 0, 0}}, {});
  for (int link : {kLinkSizeEnvelope, kLinkVertexAlphaEnvelope, kLinkRedColorEnvelope,
                   kLinkGreenColorEnvelope, kLinkBlueColorEnvelope})
    LinkEnvelope(w, kFirst, link, {{0, 100}, {1, 200}});
  w.Frame(kFirst, 20).Frame(kFirst, 20);
  for (int k = 0; k < 5; ++k) w.Op(kOpDestroyChannel).Byte(6);
  w.Call(kFirst, kCallBirthParticle).SmallIndex(0);
  w.Call(kFirst, kCallBirthParticle).SmallIndex(1);
  w.Frame(kFirst, 20);
  return w;
}

ScriptWriter InfiniteLogicRate() {
  W w = Basics();
  Frames(w, 3);
  w.Op(kOpSetValue).Byte(kLinkLogicUpdatesPerSecond).Special(kValueInfinity);
  Frames(w, 3);
  return w;
}

ScriptWriter HostContextGoesFirst() {
  W w = Basics();
  Frames(w, 3);
  w.Op(kOpReplaceContext);
  Frames(w, 2);
  w.Call(kFirst, kCallGetParticlePosition).SmallIndex(0);
  w.Call(kFirst, kCallBirthParticle).SmallIndex(0);
  w.Op(kOpCreateEmitter);
  w.Op(kOpRunFrames).Byte(2).Byte(16);
  return w;
}

std::vector<NamedScript> HostSeeds() {
  std::vector<std::pair<std::string, W>> scripts;
  scripts.emplace_back("basic_fountain", BasicFountain());
  scripts.emplace_back("every_link_nan", EveryValueLinkAt(kValueNaN));
  scripts.emplace_back("every_link_infinity", EveryValueLinkAt(kValueInfinity));
  scripts.emplace_back("every_link_minus_infinity", EveryValueLinkAt(kValueMinusInfinity));
  scripts.emplace_back("every_link_huge", EveryValueLinkAt(kValueHuge));
  scripts.emplace_back("every_link_minus_huge", EveryValueLinkAt(kValueMinusHuge));
  scripts.emplace_back("every_link_zero", EveryValueLinkAt(kValueZero));
  scripts.emplace_back("every_link_negative", EveryValueLinkAt(kValueMinusThousand));
  scripts.emplace_back("links_come_and_go", LinksComeAndGo());
  scripts.emplace_back("degenerate_meshes", DegenerateMeshes());
  scripts.emplace_back("odd_envelopes", OddEnvelopes());
  scripts.emplace_back("huge_attractors", HugeAttractors());
  scripts.emplace_back("odd_textures", OddTextures());
  scripts.emplace_back("collisions_and_smoke", CollisionsAndSmoke());
  scripts.emplace_back("copies_and_assignments", CopiesAndAssignments());
  scripts.emplace_back("every_public_call", EveryPublicCall());
  scripts.emplace_back("device_trouble", DeviceTrouble());
  scripts.emplace_back("pool_changes", PoolChanges());
  scripts.emplace_back("clock_extremes", ClockExtremes());
  scripts.emplace_back("spin_and_look_at", SpinAndLookAt());
  scripts.emplace_back("finding_birth_after_envelope_gone", BirthAfterEnvelopeWentAway());
  scripts.emplace_back("finding_infinite_logic_rate", InfiniteLogicRate());
  scripts.emplace_back("finding_host_context_goes_first", HostContextGoesFirst());
  std::vector<NamedScript> seeds;
  for (auto& [name, writer] : scripts) seeds.push_back({name, writer.Bytes()});
  return seeds;
}

}  // namespace apefuzz
