// The type and link records: constructor bytes, name truncation and the plug-in filler.
#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "host/channel_records.h"
#include "host/plugin_exports.h"
#include "host/type_guids.h"

namespace {

// Bytes [begin, end) of a record all hold `value`.
struct ByteRange {
  std::size_t begin;
  std::size_t end;
  std::uint8_t value;
};

template <typename Record>
void ExpectBytes(const Record& record, std::initializer_list<ByteRange> ranges) {
  const auto* bytes = reinterpret_cast<const std::uint8_t*>(&record);
  std::size_t covered = 0;
  for (const ByteRange& range : ranges) {
    EXPECT_EQ(range.begin, covered) << "ranges must tile the record";
    for (std::size_t i = range.begin; i < range.end; ++i)
      EXPECT_EQ(bytes[i], range.value) << "byte " << i;
    covered = range.end;
  }
  EXPECT_EQ(covered, sizeof(Record));
}

TEST(ChannelRecords, ChannelTypeConstructorZeroesEveryByte) {
  ExpectBytes(ChannelType(), {{0, 132, 0x00}});
}

TEST(ChannelRecords, ChildCreationConstructorBytes) {
  ExpectBytes(ChildCreation(), {
                                   {0, 80, 0x00},     // type name
                                   {80, 112, 0x11},   // type and base type GUIDs
                                   {112, 132, 0x00},  // reserved, word, reserved
                                   {132, 136, 0xFF},  // link position -1
                                   {136, 138, 0x00},  // flag bytes
                                   {138, 240, 0x00},  // link name
                                   {240, 256, 0x00},  // trailing GUID
                                   {256, 260, 0x00},  // word 0
                                   {260, 261, 0x01},  // word 1, little-endian
                                   {261, 264, 0x00},
                               });
}

TEST(ChannelRecords, PatternGuidHasEveryByte0x11) {
  const GUID guid = PatternGuid11();
  const auto* bytes = reinterpret_cast<const std::uint8_t*>(&guid);
  for (std::size_t i = 0; i < sizeof(GUID); ++i) EXPECT_EQ(bytes[i], 0x11) << i;
}

struct NameCase {
  std::size_t length;
  std::size_t kept;
};

class TypeNameTruncation : public ::testing::TestWithParam<NameCase> {};

TEST_P(TypeNameTruncation, KeepsAtMost79CharactersAndTerminates) {
  ChannelType record;
  std::memset(record.TypeName, 'z', sizeof(record.TypeName));  // stale bytes must go
  const std::string name(GetParam().length, 'n');
  record.SetTypeName(name.c_str());
  EXPECT_EQ(std::string(record.TypeName), std::string(GetParam().kept, 'n'));
  for (std::size_t i = GetParam().kept; i < sizeof(record.TypeName); ++i)
    EXPECT_EQ(record.TypeName[i], '\0') << i;
}

INSTANTIATE_TEST_SUITE_P(Lengths, TypeNameTruncation,
                         ::testing::Values(NameCase{0, 0}, NameCase{5, 5}, NameCase{79, 79},
                                           NameCase{80, 79}, NameCase{300, 79}));

TEST(ChannelRecords, LinkNameKeepsAtMost101Characters) {
  ChildCreation record;
  record.SetLinkName(std::string(150, 'L').c_str());
  EXPECT_EQ(std::strlen(record.LinkName), 101u);
  record.SetLinkName("Emitter");
  EXPECT_STREQ(record.LinkName, "Emitter");
  record.SetLinkName(nullptr);
  EXPECT_STREQ(record.LinkName, "");
}

TEST(ChannelRecords, FillTypeRecordWritesOnlyItsFields) {
  ChannelType record;
  std::memset(record.Reserved112, 0xAB, sizeof(record.Reserved112));
  std::memset(record.Reserved124, 0xCD, sizeof(record.Reserved124));
  ape_plugin::FillTypeRecord(&record, "3D ObjectData", kObjectDataGuid, kDeviceChannelGuid, 7);

  EXPECT_STREQ(record.TypeName, "3D ObjectData");
  EXPECT_EQ(record.TypeGuid, kObjectDataGuid);
  EXPECT_EQ(record.BaseTypeGuid, kDeviceChannelGuid);
  EXPECT_EQ(record.TypeWord, 7u);
  for (std::uint8_t byte : record.Reserved112) EXPECT_EQ(byte, 0xAB);
  for (std::uint8_t byte : record.Reserved124) EXPECT_EQ(byte, 0xCD);
}

}  // namespace
