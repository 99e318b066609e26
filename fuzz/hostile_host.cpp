#include "fuzz/hostile_host.h"

#include <cmath>
#include <cstdlib>
#include <exception>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "fuzz/byte_reader.h"
#include "fuzz/channel_factory.h"
#include "fuzz/channel_pool.h"
#include "fuzz/host_script.h"
#include "fuzz/invariants.h"
#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/type_guids.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

namespace apefuzz {

namespace {

constexpr std::size_t kMaximumEmitters = 4;
// Bounds that keep one input within seconds even when every frame catches up 1000 logic steps
// with particles born late in it (about 2000 updates per record per frame):
// "ParticleCount" values above kPoolLimit are folded below it before each operation (the cap at
// the largest pool has tests of its own), an input runs at most kMaximumCalls CallChannel calls,
// and an emitter takes at most kMaximumAttractors attractors.
constexpr float kPoolLimit = 32.0f;
constexpr int kMaximumFramesPerRun = 8;
constexpr int kMaximumCalls = 64;
constexpr int kMaximumAttractors = 8;
constexpr std::int64_t kTicksPerMs = TestClock::kTicksPerSecond / 1000;
constexpr std::int64_t kTicksPerHour = TestClock::kTicksPerSecond * 3600;

class HostileHost {
 public:
  HostileHost();
  ~HostileHost();
  HostileHost(const HostileHost&) = delete;
  HostileHost& operator=(const HostileHost&) = delete;

  std::string Run(ByteReader& in);
  // Destroys every emitter and channel; then no device object may be left.
  std::string TearDown();

 private:
  void Step(ByteReader& in);
  std::string Check() const;
  std::string MessageFault() const;
  void TameParticleCounts();

  Tev_AdvancedParticleEmitter* EmitterAt(std::uint8_t selector) const;
  Qen_Channel* AnyChannelAt(std::uint8_t selector) const;
  void SetLink(Tev_AdvancedParticleEmitter& emitter, int link, Qen_Channel* channel);
  void Call(Tev_AdvancedParticleEmitter& emitter);
  void SetValue(Tev_AdvancedParticleEmitter& emitter, int link, ByteReader& in);
  void AdvanceClock(ByteReader& in);
  void PublicCall(Tev_AdvancedParticleEmitter& emitter, ByteReader& in);
  void DeviceStep(ByteReader& in);
  MemoryDevice* HeldDevice() const;

  void ReplaceContext();

  // The context can go while channels live (kOpReplaceContext); a message fault of an earlier
  // context is kept.
  std::unique_ptr<Qen_HostContext> context_ = std::make_unique<Qen_HostContext>();
  std::optional<Qen_HostContext::ScopedCurrent> current_{std::in_place, context_.get()};
  std::unique_ptr<MessageWatch> messages_ = std::make_unique<MessageWatch>(*context_);
  std::string earlier_message_fault_;
  // The first fault a frame call left in what it drew from.
  std::string frame_fault_;
  TestClock clock_;
  MemoryDevice* device_;
  MemoryDevice* other_device_;
  std::unique_ptr<Tev_DX8_DeviceChannel> device_channel_;
  ChannelPool pool_;
  std::vector<std::unique_ptr<Tev_AdvancedParticleEmitter>> emitters_;
  int calls_ = 0;
};

HostileHost::HostileHost()
    : device_(MemoryDevice::Create()), other_device_(MemoryDevice::Create()) {
  device_channel_ = std::make_unique<Tev_DX8_DeviceChannel>(device_);
  emitters_.push_back(std::make_unique<Tev_AdvancedParticleEmitter>());
  std::srand(1);
}

HostileHost::~HostileHost() {
  TearDown();
  device_channel_.reset();
  device_->Release();
  other_device_->Release();
}

std::string HostileHost::Run(ByteReader& in) {
  while (!in.Empty()) {
    TameParticleCounts();
    try {
      Step(in);
    } catch (const std::exception& e) {
      return std::string("an exception escaped: ") + e.what();
    } catch (...) {
      return "an exception of unknown type escaped";
    }
    std::string fault = Check();
    if (!fault.empty()) return fault;
    // The devices log every call; nothing here reads the log, and a long script would fill it.
    device_->ClearCalls();
    other_device_->ClearCalls();
  }
  return TearDown();
}

std::string HostileHost::TearDown() {
  emitters_.clear();
  pool_.Clear();
  std::string fault = MessageFault();
  for (MemoryDevice* device : {device_, other_device_}) {
    if (fault.empty() && device->LiveObjectCount() != 0)
      fault = std::to_string(device->LiveObjectCount()) +
              " device objects outlive every channel that made them";
  }
  return fault;
}

std::string HostileHost::Check() const {
  for (const auto& emitter : emitters_) {
    std::string fault = CheckEmitter(*emitter);
    if (fault.empty()) fault = CheckDrawnState(*emitter, false, false);
    if (!fault.empty()) return fault;
  }
  if (!frame_fault_.empty()) return frame_fault_;
  return MessageFault();
}

std::string HostileHost::MessageFault() const {
  return earlier_message_fault_.empty() ? messages_->Fault() : earlier_message_fault_;
}

void HostileHost::ReplaceContext() {
  if (earlier_message_fault_.empty()) earlier_message_fault_ = messages_->Fault();
  messages_.reset();
  current_.reset();
  context_ = std::make_unique<Qen_HostContext>();
  current_.emplace(context_.get());
  messages_ = std::make_unique<MessageWatch>(*context_);
}

void HostileHost::TameParticleCounts() {
  for (const auto& emitter : emitters_) {
    auto* count = dynamic_cast<Qen_ValueChannel*>(emitter->GetChild(kLinkParticleCount));
    if (count == nullptr) continue;
    const float value = count->GetValue();
    if (value > kPoolLimit)
      count->SetValue(std::isfinite(value) ? std::fmod(value, kPoolLimit) : kPoolLimit);
  }
}

Tev_AdvancedParticleEmitter* HostileHost::EmitterAt(std::uint8_t selector) const {
  if (emitters_.empty()) return nullptr;
  return emitters_[selector % emitters_.size()].get();
}

// The pool's channels, then the emitters (an emitter is a mesh too, so it may be linked).
Qen_Channel* HostileHost::AnyChannelAt(std::uint8_t selector) const {
  const std::size_t count = pool_.Size() + emitters_.size();
  if (count == 0) return nullptr;
  const std::size_t at = selector % count;
  if (at < pool_.Size()) return pool_.At(at);
  return emitters_[at - pool_.Size()].get();
}

void HostileHost::SetLink(Tev_AdvancedParticleEmitter& emitter, int link, Qen_Channel* channel) {
  if (channel == nullptr) return;
  if (link == kLinkAttractors) {
    if (emitter.GetChildLinkPositionCount(link) < kMaximumAttractors)
      emitter.AddChild(link, channel);
  } else {
    emitter.SetChild(link, channel);
  }
}

void HostileHost::Call(Tev_AdvancedParticleEmitter& emitter) {
  if (calls_ >= kMaximumCalls) return;
  ++calls_;
  // Whether this call passes the frame gate and simulates, judged before it runs.
  const bool working = emitter.Initialized && emitter.GetHostContext() != nullptr &&
                       emitter.GetHostContext()->GetFrameCounter() != emitter.LastFrameCounter;
  const bool simulates = working && emitter.GetChild(kLinkEmitterActive) &&
                         emitter.GetChild(kLinkLogicUpdatesPerSecond) &&
                         emitter.GetChild(kLinkBirthsPerSecond);
  emitter.CallChannel();
  if (frame_fault_.empty())
    frame_fault_ = CheckDrawnState(emitter, simulates, working && emitter.VerticesDirty);
}

void HostileHost::SetValue(Tev_AdvancedParticleEmitter& emitter, int link, ByteReader& in) {
  const GUID type = GetEmitterLinkSpec(link).TypeGuid;
  Qen_Channel* linked = emitter.GetChild(link);
  if (linked != nullptr && type == kValueGuid) {
    static_cast<Qen_ValueChannel*>(linked)->SetValue(in.Value());
  } else if (linked != nullptr && type == kValueVectorGuid) {
    static_cast<Qen_ValueVectorChannel*>(linked)->SetVector(ReadVector(in));
  } else {
    SetLink(emitter, link, MakeChannelForLink(link, in, pool_));
  }
}

void HostileHost::AdvanceClock(ByteReader& in) {
  switch (in.Below(kClockStepCount)) {
    case kClockNone:
      break;
    case kClockMs:
      clock_.Advance(in.Byte() * kTicksPerMs);
      break;
    case kClockLongMs:
      clock_.Advance(in.Word() * kTicksPerMs);
      break;
    case kClockHours:
      clock_.Advance(in.Byte() * kTicksPerHour);
      break;
    case kClockTicks:
      clock_.Advance(static_cast<std::int32_t>(in.Dword()));
      break;
    default:
      clock_.AdvanceSeconds(in.Value());
      break;
  }
}

void HostileHost::PublicCall(Tev_AdvancedParticleEmitter& e, ByteReader& in) {
  switch (in.Below(kPublicCallCount)) {
    case kCallGetIfParticleActive:
      e.GetIfParticleActive(in.Index());
      break;
    case kCallGetParticlePosition:
      e.GetParticlePosition(in.Index());
      break;
    case kCallBirthParticle:
      e.BirthParticle(in.Index());
      break;
    case kCallEnableActiveTimer:
      e.EnableActiveTimer(in.Value());
      break;
    case kCallRandInt: {
      const int low = in.Index();
      e.RandInt(low, in.Index());
      break;
    }
    case kCallInitialize:
      e.Initialize();
      break;
    case kCallGetInactiveParticle:
      e.GetInactiveParticle();
      break;
    case kCallGetOldestParticle:
      e.GetOldestParticle();
      break;
    case kCallSmokeCollisionResponse: {
      const float probe = in.Value(), approach = in.Value(), radius = in.Value();
      const float contact = in.Value();
      D3DXVECTOR3 position = ReadVector(in);
      const float speed = in.Value();
      D3DXVECTOR3 direction = ReadVector(in);
      D3DXVECTOR3 out_position, out_velocity, out_normal;
      e.SmokeCollisionResponse(probe, approach, radius, contact, &position, speed, &direction,
                               &out_position, &out_velocity, &out_normal);
      break;
    }
    case kCallInterpolateParticles:
      e.InterpolateParticles(in.Value());
      break;
    case kCallUpdateLocalVertexBuffer:
      e.UpdateLocalVertexBuffer();
      break;
    case kCallInitializeBaseClassBuffers:
      e.InitializeBaseClassBuffers();
      break;
    case kCallInitializeLocalVertexBuffer:
      e.InitializeLocalVertexBuffer();
      break;
    case kCallWriteLocalVertexBufferToBaseClass:
      e.WriteLocalVertexBufferToBaseClass();
      break;
    case kCallInitializePointSpriteVertexBuffer:
      e.InitializePointSpriteVertexBuffer();
      break;
    case kCallUpdatePointSpriteVertexBuffer:
      e.UpdatePointSpriteVertexBuffer();
      break;
    case kCallStreamPointSprites:
      e.StreamPointSprites();
      break;
    case kCallRenderPointSprites:
      e.RenderPointSprites();
      break;
    case kCallRenderSprites:
      e.RenderSprites();
      break;
    case kCallStreamTextureMatrices:
      e.StreamTextureMatrices();
      break;
    case kCallGetIfObjectIsVisible:
      e.GetIfObjectIsVisible();
      break;
    case kCallDoCustomPreRenderStates:
      e.DoCustomPreRenderStates();
      break;
    case kCallSetTextureTransform: {
      const int set = in.Index();
      e.SetTextureTransform(set, in.Index());
      break;
    }
    case kCallGetChannelType:
      e.GetChannelType();
      break;
    default: {
      Qen_List list;
      e.DoDependencyInit(&list);
      break;
    }
  }
}

MemoryDevice* HostileHost::HeldDevice() const {
  return device_channel_->GetDevice() == other_device_ ? other_device_ : device_;
}

void HostileHost::DeviceStep(ByteReader& in) {
  switch (in.Below(kDeviceStepCount)) {
    case kDeviceFailCreateVertexBuffer:
      HeldDevice()->FailNextCreateVertexBuffer();
      break;
    case kDeviceFailCreateIndexBuffer:
      HeldDevice()->FailNextCreateIndexBuffer();
      break;
    case kDeviceFailCreateTexture:
      HeldDevice()->FailNextCreateTexture();
      break;
    case kDeviceFailBufferLock:
      HeldDevice()->FailNextBufferLock();
      break;
    case kDeviceFailTextureLock:
      HeldDevice()->FailNextTextureLock();
      break;
    case kDeviceNone:
      device_channel_->SetDevice(nullptr);
      break;
    case kDeviceOther:
      device_channel_->SetDevice(other_device_);
      break;
    default:
      device_channel_->SetDevice(device_);
      break;
  }
}

void HostileHost::Step(ByteReader& in) {
  const auto op = static_cast<HostOp>(in.Below(kHostOpCount));
  switch (op) {
    case kOpSetLink: {
      Tev_AdvancedParticleEmitter* emitter = EmitterAt(in.Byte());
      const int link = in.Below(kEmitterLinkCount);
      if (emitter != nullptr) SetLink(*emitter, link, MakeChannelForLink(link, in, pool_));
      break;
    }
    case kOpSetValue: {
      Tev_AdvancedParticleEmitter* emitter = EmitterAt(0);
      const int link = in.Below(kEmitterLinkCount);
      if (emitter != nullptr) SetValue(*emitter, link, in);
      break;
    }
    case kOpUnlink: {
      Tev_AdvancedParticleEmitter* emitter = EmitterAt(in.Byte());
      const int link = in.Below(kEmitterLinkCount);
      if (emitter != nullptr) emitter->ClearChild(link);
      break;
    }
    case kOpLinkExisting: {
      Tev_AdvancedParticleEmitter* emitter = EmitterAt(in.Byte());
      const int link = in.Below(kEmitterLinkCount);
      Qen_Channel* channel = AnyChannelAt(in.Byte());
      if (emitter != nullptr) SetLink(*emitter, link, channel);
      break;
    }
    case kOpMutateChannel:
      if (Qen_Channel* channel = pool_.At(in.Byte())) MutateChannel(*channel, in, pool_);
      break;
    case kOpDestroyChannel:
      pool_.Destroy(in.Byte());
      break;
    case kOpAdvanceClock:
      AdvanceClock(in);
      break;
    case kOpCallChannel: {
      Tev_AdvancedParticleEmitter* emitter = EmitterAt(in.Byte());
      if (in.Flag()) context_->AdvanceFrame();
      if (emitter != nullptr) Call(*emitter);
      break;
    }
    case kOpPublicCall: {
      Tev_AdvancedParticleEmitter* emitter = EmitterAt(in.Byte());
      if (emitter != nullptr) PublicCall(*emitter, in);
      break;
    }
    case kOpCopyEmitter: {
      Tev_AdvancedParticleEmitter* source = EmitterAt(in.Byte());
      if (source != nullptr && emitters_.size() < kMaximumEmitters)
        emitters_.push_back(std::make_unique<Tev_AdvancedParticleEmitter>(*source));
      break;
    }
    case kOpAssignEmitter: {
      Tev_AdvancedParticleEmitter* target = EmitterAt(in.Byte());
      Tev_AdvancedParticleEmitter* source = EmitterAt(in.Byte());
      if (target != nullptr) *target = *source;
      break;
    }
    case kOpDestroyEmitter:
      if (!emitters_.empty())
        emitters_.erase(emitters_.begin() +
                        static_cast<std::ptrdiff_t>(in.Byte() % emitters_.size()));
      break;
    case kOpCreateEmitter:
      if (emitters_.size() < kMaximumEmitters)
        emitters_.push_back(std::make_unique<Tev_AdvancedParticleEmitter>());
      break;
    case kOpDevice:
      DeviceStep(in);
      break;
    case kOpRunFrames: {
      const int frames = in.Below(kMaximumFramesPerRun) + 1;
      const std::int64_t ticks = in.Byte() * kTicksPerMs;
      for (int f = 0; f < frames; ++f) {
        clock_.Advance(ticks);
        context_->AdvanceFrame();
        for (const auto& emitter : emitters_) Call(*emitter);
      }
      break;
    }
    case kOpReplaceContext:
      ReplaceContext();
      break;
    default:
      std::srand(in.Dword());
      break;
  }
}

}  // namespace

std::string RunHostScript(const std::uint8_t* data, std::size_t size) {
  ByteReader in(data, size);
  HostileHost host;
  return host.Run(in);
}

}  // namespace apefuzz
