// The renderable mesh channel ("3D ObjectData"): vertex and index lists with a world matrix,
// built into Direct3D buffers in the 36-byte position/normal/colour/texcoord layout and drawn
// as an indexed triangle list. The particle emitter derives from it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "host/qen_channel.h"
#include "platform/d3d9_interfaces.h"

class Tev_DX8_DeviceChannel;

struct VertTUVOffset {
  float Tu;
  float Tv;
};

// One vertex of the Direct3D buffer: D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_DIFFUSE | D3DFVF_TEX1.
struct ObjectVertex {
  D3DXVECTOR3 Position;
  D3DXVECTOR3 Normal;
  D3DCOLOR Color;
  float Tu;
  float Tv;
};
static_assert(sizeof(ObjectVertex) == 36);

// The device-use layer between the channel base and renderable channels.
class Tev_DX8_D3DDeviceUse : public Qen_Channel {
 public:
  Tev_DX8_D3DDeviceUse();
  virtual void InvalidateDeviceObjects();
  virtual void InvalidateDirectGraphics();
  // The host's device channel, looked up in the host context (null when it has none).
  Tev_DX8_DeviceChannel* FindDeviceChannel() const;
};

class Tev_DX8_ObjectDataChannel : public Tev_DX8_D3DDeviceUse {
 public:
  static constexpr DWORD kFvf = D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_DIFFUSE | D3DFVF_TEX1;
  static constexpr int kTextureSets = 1;
  // Texture mappings MapTexture applies (GetTextureMapping answers the last one).
  static constexpr int kMappingNone = 0;
  static constexpr int kMappingPlanar = 1;  // along Z: u from x, v from y
  static constexpr int kMappingSphere = 2;
  static constexpr int kMappingCylinder = 3;  // around Y
  static constexpr int kMappingCubic = 4;
  // More vertices than this need 32-bit indices.
  static constexpr std::size_t k16BitVertexLimit = 65536;

  Tev_DX8_ObjectDataChannel();
  Tev_DX8_ObjectDataChannel(const Tev_DX8_ObjectDataChannel& other);
  Tev_DX8_ObjectDataChannel& operator=(const Tev_DX8_ObjectDataChannel& other);
  ~Tev_DX8_ObjectDataChannel() override;

  ChannelType GetChannelType() override;
  bool SaveChannel(QenFileSaver& saver) override;
  bool LoadChannel(QenFileLoader& loader, Qen_ChannelGroup* group) override;

  // Virtual operations in slot order (after the device-use layer's two).
  virtual void Release();  // drops every vertex, index and buffer
  virtual void ReleaseVertexData();
  virtual void UpdateData();
  virtual void StreamVertexData();
  virtual void StreamTextureMatrices();
  virtual bool CreateVertexBuffer();
  virtual void SetVertexCount(int count);
  virtual int GetVertexCount();
  virtual void SetIndexCount(int count);
  virtual int GetIndexCount();
  virtual bool SetIndex(DWORD vertex, int position);
  virtual DWORD GetIndexes(DWORD position);
  virtual bool SetVertexPosition(D3DXVECTOR3 position, int vertex);
  virtual D3DXVECTOR3 GetVertexPosition(DWORD vertex);
  virtual bool SetVertexNormal(D3DXVECTOR3 normal, int vertex);
  virtual D3DXVECTOR3 GetVertexNormals(DWORD vertex);
  virtual bool SetVertexTUCoord(int set, D3DXVECTOR2 uv, int vertex);
  virtual D3DXVECTOR2 GetVertexTUV(int set, DWORD vertex);
  virtual bool SetVertexColor(DWORD color, int vertex);
  virtual DWORD GetVertexColor(DWORD vertex);
  virtual void SetPolygonType(int type);
  virtual int GetPolygonType();
  virtual void MapTexture(int set, int mapping, bool normalize);
  virtual int GetTextureMapping(int set);
  virtual void MakeSphereTexture(int set);
  virtual void MakeCylinderTexture(int set);
  virtual void CubicTexture(int set, bool normalize);
  virtual void PlanarTexture(int set, int axis);
  virtual void MakeObjectSizeBoundrys(D3DXVECTOR3& minimum, D3DXVECTOR3& maximum);
  virtual bool GetVertexPositionUse();
  virtual bool GetVertexNormalUse();
  virtual bool GetVertexTUUse(int set);
  virtual bool GetVertexColorUse();
  virtual DWORD GetFVFlags();
  virtual int GetVertexSize();
  virtual void NormalizeTexture(int set);
  virtual void RemapTexture();
  virtual void CalculateTextureCoords(int set);
  virtual VertTUVOffset GetTUVOffSet(int set);
  virtual void SetTUVOffSet(int set, VertTUVOffset offset);
  virtual D3DXVECTOR3 GetBoundingBoxMin();
  virtual D3DXVECTOR3 GetBoundingBoxMax();
  virtual void CalculateBoundingBox();
  virtual bool GetIfObjectIsVisible();
  virtual void GetObjectTransformedMinMaxBox(D3DXMATRIX matrix);
  virtual void GetObjectTransformedMinMaxBox();
  virtual void SetDataToStream(int stream);
  virtual void DoCustomPreRenderStates();
  virtual void SetWorldMatrix(D3DXMATRIX matrix);
  virtual D3DXMATRIX GetWorldMatrix();
  virtual void SetTextureTransform(int set, int transform);
  virtual int GetTextureTransform(int set);
  virtual void RenderForShader();
  virtual void AddCustomDataChannel(Qen_Channel* channel);
  virtual Qen_Channel* GetCustomDataChannel(int index);
  virtual int GetCustomDataChannelCount();
  virtual IDirect3DVertexBuffer9* GetVertexBuffer();
  virtual IDirect3DIndexBuffer9* GetIndexBuffer();

  // Built-in shapes for hosts and tools (replace the present mesh; world matrix untouched).
  void BuildQuad(float width, float depth);  // in the XZ plane, facing +Y
  void BuildBox(D3DXVECTOR3 half_extents);
  void BuildUvSphere(float radius, int slices, int stacks);
  void BuildDisc(float radius, int segments);  // in the XZ plane, facing +Y

  // The box GetObjectTransformedMinMaxBox computed last (zero before).
  D3DXVECTOR3 GetTransformedBoxMin() const { return TransformedBoxMin; }
  D3DXVECTOR3 GetTransformedBoxMax() const { return TransformedBoxMax; }
  bool UsesIndexBuffer32() const { return IndexBuffer32; }

  // The Direct3D vertex buffer once CreateVertexBuffer has run (null before and after Release).
  // Derived channels write it directly.
  IDirect3DVertexBuffer9* VertexBuffer = nullptr;

 protected:
  IDirect3DIndexBuffer9* IndexBuffer = nullptr;
  bool IndexBuffer32 = false;  // 32-bit indices (the vertex count needs more than 16 bits)
  std::vector<ObjectVertex> Vertices;
  std::vector<std::uint32_t> Indices;
  D3DXMATRIX WorldMatrix;
  D3DXVECTOR3 BoundingBoxMin{0.0f, 0.0f, 0.0f};
  D3DXVECTOR3 BoundingBoxMax{0.0f, 0.0f, 0.0f};
  VertTUVOffset TuvOffset{0.0f, 0.0f};
  int PolygonType = static_cast<int>(D3DPT_TRIANGLELIST);
  int TextureTransform = 0;
  std::vector<Qen_Channel*> CustomDataChannels;  // not owned
  int TextureMapping = kMappingNone;
  D3DXVECTOR3 TransformedBoxMin{0.0f, 0.0f, 0.0f};
  D3DXVECTOR3 TransformedBoxMax{0.0f, 0.0f, 0.0f};
  // What the buffers were built with: drawing never reaches past them, whatever the lists do
  // after CreateVertexBuffer.
  UINT BufferVertexCount = 0;
  UINT BufferIndexCount = 0;

 private:
  void ReleaseBuffers();
  void CopyMeshFrom(const Tev_DX8_ObjectDataChannel& other);
  bool FillVertexBuffer(IDirect3DDevice9* device);
  bool FillIndexBuffer(IDirect3DDevice9* device);
};
