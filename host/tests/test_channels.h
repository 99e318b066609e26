// Channels and fixtures shared by the host framework tests.
#pragma once

#include <gtest/gtest.h>

#include "host/channel_records.h"
#include "host/host_context.h"
#include "host/plugin_exports.h"
#include "host/qen_channel.h"

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
inline ChildCreation LinkRecord(GUID type, int position, const char* name) {
  ChildCreation record;
  record.Type.TypeGuid = type;
  record.LinkPosition = position;
  record.SetLinkName(name);
  return record;
}

// Every test runs in a host context of its own, current while it runs.
class HostContextTest : public ::testing::Test {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
};
