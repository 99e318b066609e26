// The host's link channel types: "Value", "Value Vector", "Matrix" and "Texture". Hosts set them;
// plug-ins read them (and write the output links).
#pragma once

#include "host/qen_channel.h"
#include "platform/d3d9_interfaces.h"

class Qen_ValueChannel : public Qen_Channel {
 public:
  explicit Qen_ValueChannel(float value = 0.0f);
  ChannelType GetChannelType() override;
  static ChannelType TypeRecord();  // what GetChannelType answers

  virtual float GetValue();
  virtual float GetPreviousValue();  // the value before the last SetValue
  virtual void SetValue(float value);

 private:
  float Value;
  float PreviousValue;
};

class Qen_ValueVectorChannel : public Qen_Channel {
 public:
  explicit Qen_ValueVectorChannel(D3DXVECTOR3 vector = {0.0f, 0.0f, 0.0f});
  ChannelType GetChannelType() override;
  static ChannelType TypeRecord();  // what GetChannelType answers

  virtual D3DXVECTOR3 GetVector();
  virtual void SetVector(D3DXVECTOR3 vector);

 private:
  D3DXVECTOR3 Vector;
};

class Qen_MatrixChannel : public Qen_Channel {
 public:
  Qen_MatrixChannel();  // identity
  explicit Qen_MatrixChannel(const D3DXMATRIX& matrix);
  ChannelType GetChannelType() override;
  static ChannelType TypeRecord();  // what GetChannelType answers

  virtual void SetMatrix(const D3DXMATRIX& matrix);
  virtual D3DXMATRIX GetMatrix();

 private:
  D3DXMATRIX Matrix;
};

// Holds one IDirect3DTexture9 (one reference). Level operations work on level 0 only; other
// levels fail.
class Qen_TextureChannel : public Qen_Channel {
 public:
  Qen_TextureChannel();
  // Takes a reference of its own on `texture`.
  explicit Qen_TextureChannel(IDirect3DTexture9* texture);
  ~Qen_TextureChannel() override;
  Qen_TextureChannel(const Qen_TextureChannel& other);
  Qen_TextureChannel& operator=(const Qen_TextureChannel& other);
  ChannelType GetChannelType() override;
  static ChannelType TypeRecord();  // what GetChannelType answers

  virtual void SetTexture(IDirect3DTexture9* texture);  // null drops it
  virtual IDirect3DTexture9* GetTexture();
  // Creates a width x height A8R8G8B8 texture on the host's device and holds it.
  virtual HRESULT CreateTexture(UINT width, UINT height);
  // Binds the texture to `stage` of the host's device (null unbinds).
  virtual HRESULT SetToStage(int stage);
  virtual UINT GetWidth();
  virtual UINT GetHeight();
  virtual DWORD GetLevelCount();
  virtual void ReleaseTexture();
  virtual bool IsLoaded();
  virtual D3DSURFACE_DESC GetLevelDesc(int level);
  virtual HRESULT LockLevel(int level, D3DLOCKED_RECT* out);
  virtual HRESULT UnlockLevel(int level);

 private:
  IDirect3DTexture9* Texture = nullptr;
};
