// The type and link records: constructor bytes, name truncation and the plug-in filler.
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

TEST(ChannelRecords, NamesAreTruncatedAndFillersWriteOnlyTheirFields) {
  ChildCreation link;
  link.SetLinkName(std::string(150, 'L').c_str());
  EXPECT_TRUE(link.LinkName[100] == 'L' && link.LinkName[101] == '\0');
  ChannelType record;
  std::memset(static_cast<void*>(&record), 0xAB, sizeof(record));
  ape_plugin::FillTypeRecord(&record, std::string(90, 'n').c_str(), kObjectDataGuid,
                             kDeviceChannelGuid, 7);
  EXPECT_TRUE(record.TypeName[78] == 'n' && record.TypeName[79] == '\0');
  ape_plugin::FillTypeRecord(&record, "3D ObjectData", kObjectDataGuid, kDeviceChannelGuid, 7);
  ChannelType expected;
  std::memset(static_cast<void*>(&expected), 0xAB, sizeof(expected));
  std::memset(expected.TypeName, 0, sizeof(expected.TypeName));  // no stale bytes after the name
  std::strcpy(expected.TypeName, "3D ObjectData");
  expected.TypeGuid = kObjectDataGuid;
  expected.BaseTypeGuid = kDeviceChannelGuid;
  expected.TypeWord = 7;
  EXPECT_EQ(std::memcmp(&record, &expected, sizeof(record)), 0);
}

}  // namespace
