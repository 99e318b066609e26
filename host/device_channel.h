// The host-side channel that owns the Direct3D device every renderable channel draws on.
#pragma once

#include "host/qen_channel.h"
#include "platform/d3d9_interfaces.h"

class Tev_DX8_DeviceChannel : public Qen_Channel {
 public:
  // Takes a reference of its own on `device` (may be null: then nothing can draw).
  explicit Tev_DX8_DeviceChannel(IDirect3DDevice9* device = nullptr);
  ~Tev_DX8_DeviceChannel() override;
  Tev_DX8_DeviceChannel(const Tev_DX8_DeviceChannel&) = delete;
  Tev_DX8_DeviceChannel& operator=(const Tev_DX8_DeviceChannel&) = delete;
  ChannelType GetChannelType() override;
  static ChannelType TypeRecord();  // what GetChannelType answers

  virtual IDirect3DDevice9* GetDevice();
  virtual HRESULT SetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type, DWORD value);
  virtual HRESULT SetRenderState(D3DRENDERSTATETYPE state, DWORD value);

  // Replaces the device (takes a reference, releases the old one).
  void SetDevice(IDirect3DDevice9* device);

 private:
  IDirect3DDevice9* Device = nullptr;
};

class Qen_HostContext;

// The context's device channel (the first channel of the device channel type), or null; null
// for a null context.
Tev_DX8_DeviceChannel* FindDeviceChannel(Qen_HostContext* context);
// Its device, or null when there is no device channel or it holds no device.
IDirect3DDevice9* FindDevice(Qen_HostContext* context);
