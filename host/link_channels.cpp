// The host's link channels: a float, a vector, a matrix and a texture that hosts set and
// plug-ins read.
#include "host/link_channels.h"

#include "host/device_channel.h"
#include "host/plugin_exports.h"
#include "host/type_guids.h"

namespace {

ChannelType LinkTypeRecord(const char* name, const GUID& type) {
  ChannelType record;
  ape_plugin::FillTypeRecord(&record, name, type, GUID{}, 0);
  return record;
}

// Texture operations work on the one level the host's textures are made with.
bool IsBaseLevel(int level) {
  return level == 0;
}

}  // namespace

// --- Value ---

Qen_ValueChannel::Qen_ValueChannel(float value) : Value(value), PreviousValue(value) {}
ChannelType Qen_ValueChannel::TypeRecord() {
  return LinkTypeRecord("Value", kValueGuid);
}
ChannelType Qen_ValueChannel::GetChannelType() {
  return TypeRecord();
}
float Qen_ValueChannel::GetValue() {
  return Value;
}
float Qen_ValueChannel::GetPreviousValue() {
  return PreviousValue;
}
void Qen_ValueChannel::SetValue(float value) {
  PreviousValue = Value;
  Value = value;
}

// --- Value Vector ---

Qen_ValueVectorChannel::Qen_ValueVectorChannel(D3DXVECTOR3 vector) : Vector(vector) {}
ChannelType Qen_ValueVectorChannel::TypeRecord() {
  return LinkTypeRecord("Value Vector", kValueVectorGuid);
}
ChannelType Qen_ValueVectorChannel::GetChannelType() {
  return TypeRecord();
}
D3DXVECTOR3 Qen_ValueVectorChannel::GetVector() {
  return Vector;
}
void Qen_ValueVectorChannel::SetVector(D3DXVECTOR3 vector) {
  Vector = vector;
}

// --- Matrix ---

Qen_MatrixChannel::Qen_MatrixChannel() {
  D3DXMatrixIdentity(&Matrix);
}
Qen_MatrixChannel::Qen_MatrixChannel(const D3DXMATRIX& matrix) : Matrix(matrix) {}
ChannelType Qen_MatrixChannel::TypeRecord() {
  return LinkTypeRecord("Matrix", kMatrixGuid);
}
ChannelType Qen_MatrixChannel::GetChannelType() {
  return TypeRecord();
}
void Qen_MatrixChannel::SetMatrix(const D3DXMATRIX& matrix) {
  Matrix = matrix;
}
D3DXMATRIX Qen_MatrixChannel::GetMatrix() {
  return Matrix;
}

// --- Texture ---

Qen_TextureChannel::Qen_TextureChannel() = default;

Qen_TextureChannel::Qen_TextureChannel(IDirect3DTexture9* texture) {
  SetTexture(texture);
}

Qen_TextureChannel::~Qen_TextureChannel() {
  ReleaseTexture();
}

Qen_TextureChannel::Qen_TextureChannel(const Qen_TextureChannel& other) : Qen_Channel(other) {
  SetTexture(other.Texture);
}

Qen_TextureChannel& Qen_TextureChannel::operator=(const Qen_TextureChannel& other) {
  Qen_Channel::operator=(other);
  SetTexture(other.Texture);
  return *this;
}

ChannelType Qen_TextureChannel::TypeRecord() {
  return LinkTypeRecord("Texture", kTextureGuid);
}
ChannelType Qen_TextureChannel::GetChannelType() {
  return TypeRecord();
}

// AddRef before Release, so that setting the held texture again never frees it.
void Qen_TextureChannel::SetTexture(IDirect3DTexture9* texture) {
  if (texture != nullptr) texture->AddRef();
  if (Texture != nullptr) Texture->Release();
  Texture = texture;
}

IDirect3DTexture9* Qen_TextureChannel::GetTexture() {
  return Texture;
}

HRESULT Qen_TextureChannel::CreateTexture(UINT width, UINT height) {
  IDirect3DDevice9* device = FindDevice(HostContext);
  if (device == nullptr) return D3DERR_INVALIDCALL;
  IDirect3DTexture9* created = nullptr;
  const HRESULT result = device->CreateTexture(width, height, 1, 0, D3DFMT_A8R8G8B8,
                                               D3DPOOL_MANAGED, &created, nullptr);
  if (FAILED(result) || created == nullptr) return FAILED(result) ? result : E_FAIL;
  ReleaseTexture();
  Texture = created;  // the creation's reference is ours
  return S_OK;
}

HRESULT Qen_TextureChannel::SetToStage(int stage) {
  IDirect3DDevice9* device = FindDevice(HostContext);
  if (device == nullptr || stage < 0) return D3DERR_INVALIDCALL;
  return device->SetTexture(static_cast<DWORD>(stage), Texture);
}

UINT Qen_TextureChannel::GetWidth() {
  return GetLevelDesc(0).Width;
}
UINT Qen_TextureChannel::GetHeight() {
  return GetLevelDesc(0).Height;
}
DWORD Qen_TextureChannel::GetLevelCount() {
  return Texture != nullptr ? Texture->GetLevelCount() : 0;
}

void Qen_TextureChannel::ReleaseTexture() {
  if (Texture != nullptr) Texture->Release();
  Texture = nullptr;
}

bool Qen_TextureChannel::IsLoaded() {
  return Texture != nullptr;
}

D3DSURFACE_DESC Qen_TextureChannel::GetLevelDesc(int level) {
  D3DSURFACE_DESC desc{};
  if (Texture == nullptr || !IsBaseLevel(level)) return desc;
  if (FAILED(Texture->GetLevelDesc(0, &desc))) desc = D3DSURFACE_DESC{};
  return desc;
}

HRESULT Qen_TextureChannel::LockLevel(int level, D3DLOCKED_RECT* out) {
  if (Texture == nullptr || out == nullptr || !IsBaseLevel(level)) return D3DERR_INVALIDCALL;
  return Texture->LockRect(0, out, nullptr, 0);
}

HRESULT Qen_TextureChannel::UnlockLevel(int level) {
  if (Texture == nullptr || !IsBaseLevel(level)) return D3DERR_INVALIDCALL;
  return Texture->UnlockRect(0);
}
