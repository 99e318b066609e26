// The loader tests' small plug-ins: test_plugin.cpp built once per variant below, as type
// TestPluginGuid(variant), into host_test_plugin_<variant>.so.
#pragma once

#include <cstdint>

#include "platform/windows_types.h"

#define TEST_PLUGIN_DEPENDENT 1        // declares a runtime library, two types and itself
#define TEST_PLUGIN_MISSING_LIBRARY 2  // declares a runtime library nobody has
#define TEST_PLUGIN_NULL_INIT 3        // InitDLL creates nothing
#define TEST_PLUGIN_NO_INIT 4          // exports no InitDLL
#define TEST_PLUGIN_THROWING 5         // DoDependencyInit throws

constexpr GUID TestPluginGuid(int variant) {
  const auto n = static_cast<std::uint8_t>(variant);
  return GUID{0xD0000000u + n, 0, 0x4000, {0x80, 0, 0, 0, 0, 0, 0, n}};
}
