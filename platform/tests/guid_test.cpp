#include <gtest/gtest.h>

#include "platform/windows_types.h"

namespace {

constexpr GUID kSample = GuidFromRegistryText("0123ABCD-4567-89EF-FEDC-BA9876543210");

TEST(GuidText, FormatsUpperCaseAndParsesEitherCaseWithOrWithoutBraces) {
  EXPECT_EQ(FormatGuid(kSample), "0123ABCD-4567-89EF-FEDC-BA9876543210");
  for (const char* text :
       {"0123abcd-4567-89ef-fedc-ba9876543210", "{0123aBcD-4567-89eF-FeDc-bA9876543210}"}) {
    GUID parsed{};
    EXPECT_TRUE(ParseGuid(text, &parsed)) << text;
    EXPECT_EQ(parsed, kSample) << text;
  }
}

TEST(GuidText, RefusesMalformedTextAndLeavesTheOutputAlone) {
  for (const char* text :
       {"", "{}", "{0123ABCD-4567-89EF-FEDC-BA9876543210",
        "{{0123ABCD-4567-89EF-FEDC-BA9876543210}}", "0123ABCD-4567-89EF-FEDC-BA987654321",
        "0123ABCD-4567-89EF-FEDC-BA98765432100", "0123ABCD-4567-89EF-FEDCBA-9876543210",
        "0123ABCG-4567-89EF-FEDC-BA9876543210", "+123ABCD-4567-89EF-FEDC-BA9876543210",
        "0123ABCD-4567-89EF-FEDC-BA9876543210\n"}) {
    GUID parsed = kSample;
    parsed.Data1 = 7;
    EXPECT_FALSE(ParseGuid(text, &parsed)) << text;
    EXPECT_EQ(parsed.Data1, 7u) << text;
  }
}

TEST(GuidText, RoundTripsEveryFieldWithLeadingZeros) {
  const GUID low{0x0000000Au, 0x000B, 0x00C0, {0x0D, 1, 2, 3, 4, 5, 6, 0xEF}};
  EXPECT_EQ(FormatGuid(low), "0000000A-000B-00C0-0D01-0203040506EF");
  GUID back{};
  ASSERT_TRUE(ParseGuid(FormatGuid(low), &back));
  EXPECT_EQ(back, low);
}

}  // namespace
