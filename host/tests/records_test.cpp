// The type and link records: constructor bytes, name truncation and the plug-in filler.
#include <algorithm>
#include <cstring>

#include "host/tests/test_channels.h"
#include "host/type_guids.h"

namespace {

// Every byte of `record` against runs of (end offset, value) that tile it from offset 0.
template <typename Record>
void ExpectBytes(const Record& record, std::initializer_list<std::pair<std::size_t, int>> runs) {
  const auto* bytes = reinterpret_cast<const std::uint8_t*>(&record);
  std::size_t i = 0;
  for (const auto& [end, value] : runs)
    for (; i < end; ++i) EXPECT_EQ(bytes[i], value) << "byte " << i;
  EXPECT_EQ(i, sizeof(Record));
}

TEST(ChannelRecords, ConstructorsGiveTheHostDefaults) {
  ExpectBytes(ChannelType(), {{132, 0}});
  // Name 0, both GUIDs 0x11, reserved 0, position -1, flags, name and trailing GUID 0, then the
  // words 0 and 1 (little-endian).
  ExpectBytes(ChildCreation(),
              {{80, 0}, {112, 0x11}, {132, 0}, {136, 0xFF}, {260, 0}, {261, 1}, {264, 0}});
}

TEST(ChannelRecords, NamesAreTruncatedAndLeaveNoStaleBytes) {
  ChannelType type;
  std::memset(type.TypeName, 'z', sizeof(type.TypeName));
  type.SetTypeName(std::string(300, 'n').c_str());
  EXPECT_TRUE(type.TypeName[78] == 'n' && type.TypeName[79] == '\0');
  type.SetTypeName("ab");
  EXPECT_TRUE(std::all_of(type.TypeName + 2, type.TypeName + 80, [](char c) { return c == 0; }));
  ChildCreation link;
  link.SetLinkName(std::string(150, 'L').c_str());
  EXPECT_TRUE(link.LinkName[100] == 'L' && link.LinkName[101] == '\0');
}

TEST(ChannelRecords, FillTypeRecordWritesOnlyItsFields) {
  ChannelType record;
  std::memset(record.Reserved112, 0xAB, sizeof(record.Reserved112));
  std::memset(record.Reserved124, 0xAB, sizeof(record.Reserved124));
  ape_plugin::FillTypeRecord(&record, "3D ObjectData", kObjectDataGuid, kDeviceChannelGuid, 7);
  EXPECT_STREQ(record.TypeName, "3D ObjectData");
  EXPECT_TRUE(record.TypeGuid == kObjectDataGuid && record.BaseTypeGuid == kDeviceChannelGuid);
  EXPECT_EQ(record.TypeWord, 7u);
  for (std::uint8_t byte : record.Reserved112) EXPECT_EQ(byte, 0xAB);
  for (std::uint8_t byte : record.Reserved124) EXPECT_EQ(byte, 0xAB);
}

}  // namespace
