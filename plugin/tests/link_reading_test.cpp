#include <cmath>
#include <limits>

#include <gtest/gtest.h>

#include "plugin/link_reading.h"

namespace {

struct TruncateCase {
  float In;
  std::int32_t Out;
};

TEST(TruncateToInt, TruncatesTowardZeroAndSaturates) {
  const float inf = std::numeric_limits<float>::infinity();
  const TruncateCase cases[] = {
      {0.7f, 0},
      {-3.9f, -3},
      {250.9f, 250},
      {2147483520.0f, 2147483520},  // largest float below 2^31
      {2147483648.0f, std::numeric_limits<std::int32_t>::max()},
      {inf, std::numeric_limits<std::int32_t>::max()},
      {-2147483648.0f, std::numeric_limits<std::int32_t>::min()},
      {-inf, std::numeric_limits<std::int32_t>::min()},
      {std::nanf(""), 0},
  };
  for (const TruncateCase& c : cases) EXPECT_EQ(TruncateToInt(c.In), c.Out) << c.In;
}

TEST(ColorComponent, CapsAt255WithoutLowerBound) {
  const TruncateCase cases[] = {
      {300.0f, 255}, {254.9f, 254}, {-1.0f, -1}, {std::nanf(""), 0}, {1e30f, 255}};
  for (const TruncateCase& c : cases) EXPECT_EQ(ColorComponent(c.In), c.Out) << c.In;
}

TEST(IsYes, OnlyStrictlyPositiveIsYes) {
  EXPECT_TRUE(IsYes(0.001f));
  for (float no : {0.0f, -0.0f, -1.0f, std::nanf("")}) EXPECT_FALSE(IsYes(no)) << no;
}

}  // namespace
