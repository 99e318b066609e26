// The device channel: one counted reference on the host's Direct3D device.
#include "host/device_channel.h"

#include "host/host_context.h"
#include "host/plugin_exports.h"
#include "host/type_guids.h"

Tev_DX8_DeviceChannel::Tev_DX8_DeviceChannel(IDirect3DDevice9* device) {
  SetDevice(device);
}

Tev_DX8_DeviceChannel::~Tev_DX8_DeviceChannel() {
  SetDevice(nullptr);
}

ChannelType Tev_DX8_DeviceChannel::TypeRecord() {
  ChannelType record;
  ape_plugin::FillTypeRecord(&record, "DX8 Device", kDeviceChannelGuid, GUID{}, 0);
  return record;
}

ChannelType Tev_DX8_DeviceChannel::GetChannelType() {
  return TypeRecord();
}

IDirect3DDevice9* Tev_DX8_DeviceChannel::GetDevice() {
  return Device;
}

HRESULT Tev_DX8_DeviceChannel::SetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type,
                                                    DWORD value) {
  if (Device == nullptr) return D3DERR_INVALIDCALL;
  return Device->SetTextureStageState(stage, type, value);
}

HRESULT Tev_DX8_DeviceChannel::SetRenderState(D3DRENDERSTATETYPE state, DWORD value) {
  if (Device == nullptr) return D3DERR_INVALIDCALL;
  return Device->SetRenderState(state, value);
}

// AddRef before Release, so that setting the held device again never frees it.
void Tev_DX8_DeviceChannel::SetDevice(IDirect3DDevice9* device) {
  if (device != nullptr) device->AddRef();
  if (Device != nullptr) Device->Release();
  Device = device;
}

Tev_DX8_DeviceChannel* FindDeviceChannel(Qen_HostContext* context) {
  if (context == nullptr) return nullptr;
  // Only this class answers the device channel's type GUID.
  return static_cast<Tev_DX8_DeviceChannel*>(context->GetChannelByType(kDeviceChannelGuid, 0));
}

IDirect3DDevice9* FindDevice(Qen_HostContext* context) {
  Tev_DX8_DeviceChannel* channel = FindDeviceChannel(context);
  return channel != nullptr ? channel->GetDevice() : nullptr;
}
