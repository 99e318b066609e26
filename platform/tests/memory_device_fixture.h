// A fresh MemoryDevice per test; what the helpers create is released at the end, and the device
// must then hold nothing, so that leaks show.
#pragma once

#include <gtest/gtest.h>

#include <vector>

#include "platform/memory_device.h"

class MemoryDeviceTest : public testing::Test {
 protected:
  void TearDown() override {
    ReleaseOwned();
    EXPECT_EQ(device_->LiveObjectCount(), 0);
    ASSERT_EQ(device_->Release(), 0u);
  }
  void ReleaseOwned() {
    for (IUnknown* object : owned_) object->Release();
    owned_.clear();
  }
  template <typename Object>
  Object* Own(HRESULT created, Object*& object) {  // object read after the creation
    EXPECT_EQ(created, S_OK);
    if (object != nullptr) owned_.push_back(object);
    return object;
  }
  IDirect3DVertexBuffer9* NewVertexBuffer(UINT length) {
    IDirect3DVertexBuffer9* b = nullptr;
    return Own(device_->CreateVertexBuffer(length, 0, D3DFVF_XYZ, D3DPOOL_MANAGED, &b, nullptr), b);
  }
  IDirect3DIndexBuffer9* NewIndexBuffer(UINT length) {
    IDirect3DIndexBuffer9* b = nullptr;
    return Own(device_->CreateIndexBuffer(length, 0, D3DFMT_INDEX16, D3DPOOL_MANAGED, &b, nullptr),
               b);
  }
  IDirect3DTexture9* NewTexture(UINT width, UINT height, UINT levels = 1,
                                D3DFORMAT format = D3DFMT_A8R8G8B8) {
    IDirect3DTexture9* t = nullptr;
    return Own(
        device_->CreateTexture(width, height, levels, 0, format, D3DPOOL_MANAGED, &t, nullptr), t);
  }

  MemoryDevice* device_ = MemoryDevice::Create();
  std::vector<IUnknown*> owned_;
};
