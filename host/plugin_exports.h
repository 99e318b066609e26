// The entry points every channel plug-in library exports, written once. A plug-in source file
// says APE_CHANNEL_PLUGIN(Class, "TypeName", kTypeGuid, kBaseTypeGuid, type_word) and gets:
//   extern "C" ChannelType* GetType();   fills the library's static record, returns its address
//   extern "C" Qen_Channel* InitDLL();   a new channel, or null if construction threw
//   a load-time constructor that makes the DisableThreadLibraryCalls call of library attach
//   Class::GetChannelType(), answering a copy of the same record
#pragma once

#include <cstring>
#include <new>

#include "host/channel_records.h"
#include "host/qen_channel.h"
#include "platform/windows_types.h"

namespace ape_plugin {
// Fills `record` as GetType does: name, type GUID, base type GUID and the word at offset 120;
// every other byte keeps what the record's constructor gave it.
void FillTypeRecord(ChannelType* record, const char* type_name, const GUID& type,
                    const GUID& base_type, std::uint32_t type_word);
}  // namespace ape_plugin

#define APE_CHANNEL_PLUGIN(Class, type_name, type_guid, base_guid, type_word)                    \
  namespace {                                                                                    \
  ChannelType& PluginTypeRecord() {                                                              \
    static ChannelType record;                                                                   \
    return record;                                                                               \
  }                                                                                              \
  [[gnu::constructor]] void PluginAttach() {                                                     \
    PluginTypeRecord();                                                                          \
    DisableThreadLibraryCalls(nullptr);                                                          \
  }                                                                                              \
  }                                                                                              \
  extern "C" ChannelType* GetType() {                                                            \
    ape_plugin::FillTypeRecord(&PluginTypeRecord(), type_name, type_guid, base_guid, type_word); \
    return &PluginTypeRecord();                                                                  \
  }                                                                                              \
  extern "C" Qen_Channel* InitDLL() {                                                            \
    try {                                                                                        \
      return new Class();                                                                        \
    } catch (...) {                                                                              \
      return nullptr;                                                                            \
    }                                                                                            \
  }                                                                                              \
  ChannelType Class::GetChannelType() {                                                          \
    return *GetType();                                                                           \
  }
