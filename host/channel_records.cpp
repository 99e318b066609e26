// Constructors of the host's type and link records, and the plug-in type-record filler.
#include "host/channel_records.h"

#include <cstring>

#include "host/plugin_exports.h"

namespace {

// Copies `text` into a fixed field, NUL-terminated, truncated to capacity - 1 characters; the
// rest of the field is zeroed so that no stale bytes follow the name.
template <std::size_t N>
void CopyFixedText(char (&field)[N], const char* text) {
  std::memset(field, 0, N);
  if (text == nullptr) return;
  const std::size_t length = strnlen(text, N - 1);
  std::memcpy(field, text, length);
}

}  // namespace

ChannelType::ChannelType() {
  std::memset(static_cast<void*>(this), 0, sizeof(*this));
}

void ChannelType::SetTypeName(const char* name) {
  CopyFixedText(TypeName, name);
}

ChildCreation::ChildCreation() : Type() {
  Type.TypeGuid = PatternGuid11();
  Type.BaseTypeGuid = PatternGuid11();
  LinkPosition = -1;
  Flag = 0;
  LinkFlag = 0;
  std::memset(LinkName, 0, sizeof(LinkName));
  ExtraGuid = GUID{};
  ExtraWord256 = 0;
  ExtraWord260 = 1;
}

void ChildCreation::SetLinkName(const char* name) {
  CopyFixedText(LinkName, name);
}

GUID PatternGuid11() {
  GUID guid;
  std::memset(&guid, 0x11, sizeof(guid));
  return guid;
}

namespace ape_plugin {

void FillTypeRecord(ChannelType* record, const char* type_name, const GUID& type,
                    const GUID& base_type, std::uint32_t type_word) {
  if (record == nullptr) return;
  record->SetTypeName(type_name);
  record->TypeGuid = type;
  record->BaseTypeGuid = base_type;
  record->TypeWord = type_word;
}

}  // namespace ape_plugin
