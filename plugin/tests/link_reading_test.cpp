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
      {0.0f, 0},
      {0.7f, 0},
      {-0.7f, 0},
      {250.9f, 250},
      {-3.0f, -3},
      {-3.9f, -3},
      {1002.0f, 1002},
      {2147483520.0f, 2147483520},  // largest float below 2^31
      {2147483648.0f, std::numeric_limits<std::int32_t>::max()},
      {1e30f, std::numeric_limits<std::int32_t>::max()},
      {inf, std::numeric_limits<std::int32_t>::max()},
      {-2147483648.0f, std::numeric_limits<std::int32_t>::min()},
      {-1e30f, std::numeric_limits<std::int32_t>::min()},
      {-inf, std::numeric_limits<std::int32_t>::min()},
      {std::nanf(""), 0},
  };
  for (const TruncateCase& c : cases) EXPECT_EQ(TruncateToInt(c.In), c.Out) << c.In;
}

TEST(ColorComponent, CapsAt255WithoutLowerBound) {
  EXPECT_EQ(ColorComponent(300.0f), 255);
  EXPECT_EQ(ColorComponent(255.9f), 255);
  EXPECT_EQ(ColorComponent(254.9f), 254);
  EXPECT_EQ(ColorComponent(128.9f), 128);
  EXPECT_EQ(ColorComponent(-1.0f), -1);
  EXPECT_EQ(ColorComponent(std::nanf("")), 0);
  EXPECT_EQ(ColorComponent(1e30f), 255);
}

TEST(IsYes, OnlyStrictlyPositiveIsYes) {
  EXPECT_TRUE(IsYes(0.001f));
  EXPECT_TRUE(IsYes(1.0f));
  EXPECT_FALSE(IsYes(0.0f));
  EXPECT_FALSE(IsYes(-0.0f));
  EXPECT_FALSE(IsYes(-1.0f));
  EXPECT_FALSE(IsYes(std::nanf("")));
}

}  // namespace
