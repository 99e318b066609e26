// Reads a fuzzer's input as a stream of small decisions. Past the end every read answers zero, so
// any byte string is a complete script.
#pragma once

#include <cstddef>
#include <cstdint>

namespace apefuzz {

class ByteReader {
 public:
  ByteReader(const std::uint8_t* data, std::size_t size) : data_(data), size_(size) {}

  bool Empty() const { return position_ >= size_; }
  std::uint8_t Byte();
  std::uint16_t Word();  // little-endian
  std::uint32_t Dword();
  bool Flag() { return (Byte() & 1) != 0; }
  // A number below `count` (0 for a count of 0).
  int Below(int count);

  // A value a host might hand a link: one of the troublesome ones (0, -0, +-1, NaN, +-inf, +-1e30,
  // the float range's ends, a denormal...), a moderate number in hundredths, or any bit pattern.
  float Value();
  // An index for the emitter's public queries: small ones, the ends of the int range, -1, or any.
  std::int32_t Index();

 private:
  const std::uint8_t* data_;
  std::size_t size_;
  std::size_t position_ = 0;
};

// Selectors of ByteReader::Value, for writing scripts.
enum ValueSelector : std::uint8_t {
  kValueZero = 0,
  kValueNegativeZero,
  kValueOne,
  kValueMinusOne,
  kValueNaN,
  kValueInfinity,
  kValueMinusInfinity,
  kValueHuge,       // 1e30
  kValueMinusHuge,  // -1e30
  kValueFloatMax,
  kValueMinusFloatMax,
  kValueDenormal,
  kValueTiny,  // 1e-30
  kValueHalf,
  kValueThousand,
  kValueMinusThousand,
  kSpecialValueCount,
  kValueHundredths = 64,  // followed by a signed 16-bit count of hundredths
  kValueBits = 192,       // followed by the float's four bytes
};

// Selectors of ByteReader::Index.
enum IndexSelector : std::uint8_t {
  kIndexSmall = 0,  // followed by a byte: that index
  kIndexMinusOne,
  kIndexMinimum,
  kIndexMaximum,
  kIndexBits,  // followed by four bytes
  kIndexSelectorCount,
};

}  // namespace apefuzz
