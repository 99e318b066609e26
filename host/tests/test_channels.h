// Channels, fixtures and checks shared by the host tests.
#pragma once

#include <gtest/gtest.h>

#include <limits>
#include <memory>
#include <string>
#include <vector>

#include "host/channel_records.h"
#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/plugin_exports.h"
#include "platform/d3dx_math.h"
#include "platform/memory_device.h"

inline constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
inline constexpr float kInf = std::numeric_limits<float>::infinity();
inline constexpr GUID kTypeA = GuidFromRegistryText("A0000000-0000-4000-8000-00000000000A");
inline constexpr GUID kTypeB = GuidFromRegistryText("B0000000-0000-4000-8000-00000000000B");
inline constexpr GUID kTypeC = GuidFromRegistryText("C0000000-0000-4000-8000-00000000000C");

// A channel answering the type and base type a test gives it.
class TypedChannel : public Qen_Channel {
 public:
  explicit TypedChannel(GUID type, GUID base = GUID{}) {
    ape_plugin::FillTypeRecord(&record_, "Typed", type, base, 0);
  }
  ChannelType GetChannelType() override { return record_; }

 private:
  ChannelType record_;
};

// A link declaration accepting `type`; position -1 makes it a many-channel link.
inline ChildCreation LinkRecord(GUID type, int position) {
  ChildCreation record;
  record.Type.TypeGuid = type;
  record.LinkPosition = position;
  return record;
}

// Every test runs in a host context of its own, current while it runs.
class HostContextTest : public ::testing::Test {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
};

// ... whose device channel holds a MemoryDevice.
class DeviceTest : public HostContextTest {
 protected:
  DeviceTest() : device_(MemoryDevice::Create()), device_channel_(device_) {}
  ~DeviceTest() override { device_->Release(); }
  MemoryDevice* device_;
  Tev_DX8_DeviceChannel device_channel_;
};

inline void ExpectNear(const D3DXVECTOR3& actual, const D3DXVECTOR3& expected) {
  EXPECT_NEAR(actual.x, expected.x, 1e-5f);
  EXPECT_NEAR(actual.y, expected.y, 1e-5f);
  EXPECT_NEAR(actual.z, expected.z, 1e-5f);
}
