#include "fuzz/byte_reader.h"

#include <array>
#include <cstring>
#include <limits>

namespace apefuzz {

namespace {

constexpr float kInfinity = std::numeric_limits<float>::infinity();

constexpr std::array<float, kSpecialValueCount> kSpecialValues = {
    0.0f,
    -0.0f,
    1.0f,
    -1.0f,
    std::numeric_limits<float>::quiet_NaN(),
    kInfinity,
    -kInfinity,
    1e30f,
    -1e30f,
    std::numeric_limits<float>::max(),
    std::numeric_limits<float>::lowest(),
    std::numeric_limits<float>::denorm_min(),
    1e-30f,
    0.5f,
    1000.0f,
    -1000.0f,
};

}  // namespace

std::uint8_t ByteReader::Byte() {
  return position_ < size_ ? data_[position_++] : 0;
}

std::uint16_t ByteReader::Word() {
  const std::uint16_t low = Byte();
  return static_cast<std::uint16_t>(low | (Byte() << 8));
}

std::uint32_t ByteReader::Dword() {
  const std::uint32_t low = Word();
  return low | (static_cast<std::uint32_t>(Word()) << 16);
}

int ByteReader::Below(int count) {
  return count > 0 ? Byte() % count : 0;
}

float ByteReader::Value() {
  const std::uint8_t selector = Byte();
  if (selector < kSpecialValueCount) return kSpecialValues[selector];
  if (selector < kValueBits) {
    const auto hundredths = static_cast<std::int16_t>(Word());
    return static_cast<float>(hundredths) / 100.0f;
  }
  const std::uint32_t bits = Dword();
  float value;
  std::memcpy(&value, &bits, sizeof value);
  return value;
}

std::int32_t ByteReader::Index() {
  switch (Byte() % kIndexSelectorCount) {
    case kIndexSmall:
      return Byte();
    case kIndexMinusOne:
      return -1;
    case kIndexMinimum:
      return std::numeric_limits<std::int32_t>::min();
    case kIndexMaximum:
      return std::numeric_limits<std::int32_t>::max();
    default:
      return static_cast<std::int32_t>(Dword());
  }
}

}  // namespace apefuzz
