// The "hostile host" script language: each operation is one opcode byte followed by its
// arguments, read with ByteReader. ScriptWriter writes scripts for the seed corpus and the tests.
#pragma once

#include <cstdint>
#include <vector>

#include "fuzz/byte_reader.h"

namespace apefuzz {

enum HostOp : std::uint8_t {
  kOpSetLink = 0,     // link, then the new channel's description (by the link's type)
  kOpSetValue,        // link, value or vector: sets the linked channel, linking one if none
  kOpUnlink,          // link
  kOpLinkExisting,    // emitter, link, channel: any channel the host holds (refused or not)
  kOpMutateChannel,   // channel, then a change that fits its type
  kOpDestroyChannel,  // channel: it goes away, unlinking itself everywhere
  kOpAdvanceClock,    // ClockStep, then its amount
  kOpCallChannel,     // emitter, new host frame first?
  kOpPublicCall,      // emitter, PublicCall, then its arguments
  kOpCopyEmitter,     // emitter: a copy joins the emitters
  kOpAssignEmitter,   // target emitter, source emitter
  kOpDestroyEmitter,  // emitter
  kOpCreateEmitter,   //
  kOpDevice,          // DeviceStep
  kOpRunFrames,       // frames (byte), milliseconds per frame (byte): every emitter, each frame
  kOpSeed,            // srand(the next four bytes)
  kOpReplaceContext,  // the host context goes while every channel lives; a new one takes over
  kHostOpCount,
};

// How far kOpAdvanceClock moves the test clock.
enum ClockStep : std::uint8_t {
  kClockNone = 0,
  kClockMs,       // byte: milliseconds
  kClockLongMs,   // word: milliseconds
  kClockHours,    // byte: hours
  kClockTicks,    // four bytes: 100 ns ticks, as a signed count
  kClockSeconds,  // a Value: seconds (NaN and the infinities included)
  kClockStepCount,
};

// The emitter's operations a host may call directly.
enum PublicCall : std::uint8_t {
  kCallGetIfParticleActive = 0,  // Index
  kCallGetParticlePosition,      // Index
  kCallBirthParticle,            // Index
  kCallEnableActiveTimer,        // Value
  kCallRandInt,                  // Index, Index
  kCallInitialize,
  kCallGetInactiveParticle,
  kCallGetOldestParticle,
  kCallSmokeCollisionResponse,  // four Values, position (3 Values), Value, direction (3 Values)
  kCallInterpolateParticles,    // Value
  kCallUpdateLocalVertexBuffer,
  kCallInitializeBaseClassBuffers,
  kCallInitializeLocalVertexBuffer,
  kCallWriteLocalVertexBufferToBaseClass,
  kCallInitializePointSpriteVertexBuffer,
  kCallUpdatePointSpriteVertexBuffer,
  kCallStreamPointSprites,
  kCallRenderPointSprites,
  kCallRenderSprites,
  kCallStreamTextureMatrices,
  kCallGetIfObjectIsVisible,
  kCallDoCustomPreRenderStates,
  kCallSetTextureTransform,  // Index, Index
  kCallGetChannelType,
  kCallDoDependencyInit,
  kPublicCallCount,
};

// What kOpDevice does to the host's device channel and its devices.
enum DeviceStep : std::uint8_t {
  kDeviceFailCreateVertexBuffer = 0,
  kDeviceFailCreateIndexBuffer,
  kDeviceFailCreateTexture,
  kDeviceFailBufferLock,
  kDeviceFailTextureLock,
  kDeviceNone,      // the channel holds no device
  kDeviceOther,     // a second device replaces the first
  kDeviceOriginal,  // the first device again
  kDeviceStepCount,
};

// Matrix descriptions (after a Matrix link or matrix change).
enum MatrixKind : std::uint8_t {
  kMatrixIdentity = 0,
  kMatrixTranslation,  // 3 Values
  kMatrixScale,        // 3 Values
  kMatrixAny,          // 16 Values
  kMatrixKindCount,
};

// Mesh descriptions ("3D ObjectData" links and collision meshes).
enum MeshKind : std::uint8_t {
  kMeshLists = 0,  // vertex count, positions and normals, index count, index bytes, matrix
  kMeshQuad,       // 2 Values
  kMeshBox,        // 3 Values
  kMeshSphere,     // Value, slices, stacks
  kMeshDisc,       // Value, segments
  kMeshKindCount,
};

class ScriptWriter {
 public:
  ScriptWriter& Op(HostOp op) { return Byte(op); }
  ScriptWriter& Byte(std::uint8_t byte);
  ScriptWriter& Word(std::uint16_t word);
  ScriptWriter& Dword(std::uint32_t dword);
  ScriptWriter& Special(ValueSelector selector) { return Byte(selector); }
  // A value in hundredths (|value| <= 327.67), exactly as ByteReader::Value reads it back.
  ScriptWriter& Value(double value);
  ScriptWriter& Bits(float value);  // any float, by bit pattern
  ScriptWriter& Vector(double x, double y, double z) { return Value(x).Value(y).Value(z); }
  ScriptWriter& SmallIndex(std::uint8_t index) { return Byte(kIndexSmall).Byte(index); }

  // Common whole operations.
  ScriptWriter& SetValue(int link, double value);
  ScriptWriter& SetVector(int link, double x, double y, double z);
  ScriptWriter& Frame(std::uint8_t emitter, std::uint8_t ms);  // clock, new frame, CallChannel
  ScriptWriter& Call(std::uint8_t emitter, PublicCall call) {
    return Op(kOpPublicCall).Byte(emitter).Byte(call);
  }

  const std::vector<std::uint8_t>& Bytes() const { return bytes_; }

 private:
  std::vector<std::uint8_t> bytes_;
};

}  // namespace apefuzz
