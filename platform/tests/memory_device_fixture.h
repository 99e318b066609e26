// A fresh MemoryDevice per test, released at the end so that leaks show under the sanitizers.
#pragma once

#include <gtest/gtest.h>

#include "platform/memory_device.h"

class MemoryDeviceTest : public testing::Test {
 protected:
  void TearDown() override { ASSERT_EQ(device_->Release(), 0u); }

  IDirect3DVertexBuffer9* NewVertexBuffer(UINT length) {
    IDirect3DVertexBuffer9* buffer = nullptr;
    EXPECT_EQ(device_->CreateVertexBuffer(length, D3DUSAGE_WRITEONLY, D3DFVF_XYZ, D3DPOOL_MANAGED,
                                          &buffer, nullptr),
              S_OK);
    return buffer;
  }
  IDirect3DIndexBuffer9* NewIndexBuffer(UINT length) {
    IDirect3DIndexBuffer9* buffer = nullptr;
    EXPECT_EQ(
        device_->CreateIndexBuffer(length, 0, D3DFMT_INDEX16, D3DPOOL_MANAGED, &buffer, nullptr),
        S_OK);
    return buffer;
  }
  IDirect3DTexture9* NewTexture(UINT width, UINT height, UINT levels = 1,
                                D3DFORMAT format = D3DFMT_A8R8G8B8) {
    IDirect3DTexture9* texture = nullptr;
    EXPECT_EQ(device_->CreateTexture(width, height, levels, 0, format, D3DPOOL_MANAGED, &texture,
                                     nullptr),
              S_OK);
    return texture;
  }

  MemoryDevice* device_ = MemoryDevice::Create();
};
