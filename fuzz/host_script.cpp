#include "fuzz/host_script.h"

#include <cmath>
#include <cstring>

namespace apefuzz {

ScriptWriter& ScriptWriter::Byte(std::uint8_t byte) {
  bytes_.push_back(byte);
  return *this;
}

ScriptWriter& ScriptWriter::Word(std::uint16_t word) {
  return Byte(static_cast<std::uint8_t>(word & 0xFF)).Byte(static_cast<std::uint8_t>(word >> 8));
}

ScriptWriter& ScriptWriter::Dword(std::uint32_t dword) {
  return Word(static_cast<std::uint16_t>(dword & 0xFFFF))
      .Word(static_cast<std::uint16_t>(dword >> 16));
}

ScriptWriter& ScriptWriter::Value(double value) {
  const auto hundredths = static_cast<std::int16_t>(std::lround(value * 100.0));
  return Byte(kValueHundredths).Word(static_cast<std::uint16_t>(hundredths));
}

ScriptWriter& ScriptWriter::Bits(float value) {
  std::uint32_t bits;
  std::memcpy(&bits, &value, sizeof bits);
  return Byte(kValueBits).Dword(bits);
}

ScriptWriter& ScriptWriter::SetValue(int link, double value) {
  return Op(kOpSetValue).Byte(static_cast<std::uint8_t>(link)).Value(value);
}

ScriptWriter& ScriptWriter::SetVector(int link, double x, double y, double z) {
  return Op(kOpSetValue).Byte(static_cast<std::uint8_t>(link)).Vector(x, y, z);
}

ScriptWriter& ScriptWriter::Frame(std::uint8_t emitter, std::uint8_t ms) {
  Op(kOpAdvanceClock).Byte(kClockMs).Byte(ms);
  return Op(kOpCallChannel).Byte(emitter).Byte(1);
}

}  // namespace apefuzz
