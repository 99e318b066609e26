// Stand-ins for the handful of Windows types and calls the plug-ins were written against.
#pragma once

#include <cstdint>
#include <string>

using DWORD = std::uint32_t;
using UINT = std::uint32_t;
using INT = std::int32_t;
using ULONG = std::uint32_t;
using BOOL = std::int32_t;
using BYTE = std::uint8_t;
using WORD = std::uint16_t;
using FLOAT = float;
using HRESULT = std::int32_t;
using HANDLE = void*;
using HMODULE = void*;

#ifndef TRUE
#define TRUE 1
#endif
#ifndef FALSE
#define FALSE 0
#endif

constexpr HRESULT S_OK = 0;
constexpr HRESULT E_FAIL = static_cast<HRESULT>(0x80004005u);
constexpr HRESULT E_OUTOFMEMORY = static_cast<HRESULT>(0x8007000Eu);
constexpr HRESULT E_INVALIDARG = static_cast<HRESULT>(0x80070057u);

constexpr bool SUCCEEDED(HRESULT hr) { return hr >= 0; }
constexpr bool FAILED(HRESULT hr) { return hr < 0; }

union LARGE_INTEGER {
  struct {
    std::uint32_t LowPart;
    std::int32_t HighPart;
  } u;
  std::int64_t QuadPart;
};
static_assert(sizeof(LARGE_INTEGER) == 8);

struct RECT {
  std::int32_t left, top, right, bottom;
};

// 16 bytes, laid out as Windows lays it out.
struct GUID {
  std::uint32_t Data1;
  std::uint16_t Data2;
  std::uint16_t Data3;
  std::uint8_t Data4[8];

  friend constexpr bool operator==(const GUID& a, const GUID& b) {
    if (a.Data1 != b.Data1 || a.Data2 != b.Data2 || a.Data3 != b.Data3) return false;
    for (int i = 0; i < 8; ++i)
      if (a.Data4[i] != b.Data4[i]) return false;
    return true;
  }
};
static_assert(sizeof(GUID) == 16);

namespace guid_detail {
constexpr int HexDigit(char c) {
  return c >= '0' && c <= '9'   ? c - '0'
         : c >= 'A' && c <= 'F' ? c - 'A' + 10
         : c >= 'a' && c <= 'f' ? c - 'a' + 10
                                : -1;
}
constexpr std::uint32_t HexField(const char* s, int digits) {
  std::uint32_t v = 0;
  for (int i = 0; i < digits; ++i) v = (v << 4) | static_cast<std::uint32_t>(HexDigit(s[i]));
  return v;
}
}  // namespace guid_detail

// Compile-time GUID from the registry form "XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX".
constexpr GUID GuidFromRegistryText(const char (&s)[37]) {
  using guid_detail::HexField;
  GUID g{HexField(s, 8), static_cast<std::uint16_t>(HexField(s + 9, 4)),
         static_cast<std::uint16_t>(HexField(s + 14, 4)), {}};
  g.Data4[0] = static_cast<std::uint8_t>(HexField(s + 19, 2));
  g.Data4[1] = static_cast<std::uint8_t>(HexField(s + 21, 2));
  for (int i = 0; i < 6; ++i) g.Data4[2 + i] = static_cast<std::uint8_t>(HexField(s + 24 + 2 * i, 2));
  return g;
}

// Registry form, upper-case hex, no braces: 8-4-4-4-12.
std::string FormatGuid(const GUID& guid);
// Accepts the registry form with or without braces, either case. False on anything else.
bool ParseGuid(const std::string& text, GUID* out);

BOOL QueryPerformanceFrequency(LARGE_INTEGER* frequency);
BOOL QueryPerformanceCounter(LARGE_INTEGER* count);
BOOL DisableThreadLibraryCalls(HMODULE module);

// Replaces the monotonic clock behind QueryPerformanceCounter while it lives, so that tests and
// offline renders advance time in exact ticks. Not nestable: one at a time.
class TestClock {
 public:
  static constexpr std::int64_t kTicksPerSecond = 10'000'000;  // 100 ns ticks

  explicit TestClock(std::int64_t start_ticks = 0);
  ~TestClock();
  TestClock(const TestClock&) = delete;
  TestClock& operator=(const TestClock&) = delete;

  void Advance(std::int64_t ticks);
  void AdvanceMs(double ms);
  void AdvanceSeconds(double seconds);
  std::int64_t Now() const;
};
