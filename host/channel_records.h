// The host's type and link records, byte for byte as plug-ins expect them.
#pragma once

#include <cstddef>
#include <cstdint>

#include "platform/windows_types.h"

// Describes a channel type (132 bytes).
struct ChannelType {
  char TypeName[80];  // NUL-terminated
  GUID TypeGuid;      // offset 80
  GUID BaseTypeGuid;  // offset 96
  std::uint8_t Reserved112[8];
  std::uint32_t TypeWord;  // offset 120; the emitter sets 1 in its own record
  std::uint8_t Reserved124[8];

  // Empty name, zero GUIDs and words.
  ChannelType();
  void SetTypeName(const char* name);  // truncates to 79 characters
};
static_assert(sizeof(ChannelType) == 132);
static_assert(offsetof(ChannelType, TypeName) == 0);
static_assert(offsetof(ChannelType, TypeGuid) == 80);
static_assert(offsetof(ChannelType, BaseTypeGuid) == 96);
static_assert(offsetof(ChannelType, Reserved112) == 112);
static_assert(offsetof(ChannelType, TypeWord) == 120);
static_assert(offsetof(ChannelType, Reserved124) == 124);

// Describes one child link of a channel (264 bytes, passed by value).
struct ChildCreation {
  ChannelType Type;           // the type the link accepts
  std::int32_t LinkPosition;  // offset 132: the link's index, or -1 for a many-channel link
  std::uint8_t Flag;          // offset 136
  std::uint8_t LinkFlag;      // offset 137
  char LinkName[102];         // offset 138, NUL-terminated
  GUID ExtraGuid;             // offset 240
  std::int32_t ExtraWord256;  // offset 256
  std::int32_t ExtraWord260;  // offset 260

  // Host type defaults with both GUIDs set to the 0x11 pattern; position -1, flags 0, empty
  // name, zero GUID, words 0 and 1.
  ChildCreation();
  void SetLinkName(const char* name);  // truncates to 101 characters
};
static_assert(sizeof(ChildCreation) == 264);
static_assert(offsetof(ChildCreation, Type) == 0);
static_assert(offsetof(ChildCreation, LinkPosition) == 132);
static_assert(offsetof(ChildCreation, Flag) == 136);
static_assert(offsetof(ChildCreation, LinkFlag) == 137);
static_assert(offsetof(ChildCreation, LinkName) == 138);
static_assert(offsetof(ChildCreation, ExtraGuid) == 240);
static_assert(offsetof(ChildCreation, ExtraWord256) == 256);
static_assert(offsetof(ChildCreation, ExtraWord260) == 260);

// The GUID with every byte 0x11, the record constructor's placeholder.
GUID PatternGuid11();
