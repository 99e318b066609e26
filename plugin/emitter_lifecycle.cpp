// Construction (the link table declared to the host), destruction and the message helpers.
#include <cstring>

#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/type_guids.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

Tev_AdvancedParticleEmitter::Tev_AdvancedParticleEmitter() {
  SetChannelName("AdvancedParticleEmitter");
  // One record, refilled per link: the fields the table does not set keep the record
  // constructor's values for every link.
  ChildCreation record;
  SetChildCreationCount(0);
  for (int i = 0; i < kEmitterLinkCount; ++i) {
    const EmitterLinkSpec& link = GetEmitterLinkSpec(i);
    record.Type.SetTypeName(link.TypeName);
    record.Type.TypeGuid = link.TypeGuid;
    record.LinkPosition = link.LinkPosition;
    record.LinkFlag = link.LinkFlag;
    record.SetLinkName(link.LinkName);
    SetChildCreateType(record, i);
  }
  // Without an "Emitter Motion" link births stay where the emitter mesh puts them.
  D3DXMatrixIdentity(&EmitterMotion);
  if (HostContext != nullptr)
    DeviceChannel = static_cast<Tev_DX8_DeviceChannel*>(
        HostContext->GetChannelByType(kDeviceChannelGuid, 0));
}

Tev_AdvancedParticleEmitter::~Tev_AdvancedParticleEmitter() {
  ReleaseDrawingResources();
  Tev_DX8_ObjectDataChannel::Release();
}

void Tev_AdvancedParticleEmitter::ReleaseDrawingResources() {
  delete[] LocalVertices;
  LocalVertices = nullptr;
  delete[] PointSpriteVertices;
  PointSpriteVertices = nullptr;
  if (PointSpriteVertexBuffer != nullptr) {
    PointSpriteVertexBuffer->Release();
    PointSpriteVertexBuffer = nullptr;
  }
  if (CompositeTexture != nullptr) {
    CompositeTexture->Release();
    CompositeTexture = nullptr;
  }
}

void Tev_AdvancedParticleEmitter::ShowDebug(const char* text) {
  if (HostContext != nullptr) HostContext->DebugMessages(text);
}

void Tev_AdvancedParticleEmitter::ShowOverload(const char* text) {
  if (HostContext != nullptr) HostContext->OverloadMessages(text);
}
