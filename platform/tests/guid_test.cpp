#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "platform/windows_types.h"

namespace {

constexpr GUID kSample = GuidFromRegistryText("0123ABCD-4567-89EF-FEDC-BA9876543210");

TEST(GuidText, FormatsRegistryFormUpperCase) {
  EXPECT_EQ(FormatGuid(kSample), "0123ABCD-4567-89EF-FEDC-BA9876543210");
  const GUID low{0x0000000Au, 0x000B, 0x00C0, {0x0D, 0, 0, 0, 0, 0, 0, 0xEF}};
  EXPECT_EQ(FormatGuid(low), "0000000A-000B-00C0-0D00-0000000000EF");
}

struct AcceptedCase {
  const char* text;
};

class GuidAccepts : public testing::TestWithParam<AcceptedCase> {};

TEST_P(GuidAccepts, ParsesToTheSampleGuid) {
  GUID parsed{};
  ASSERT_TRUE(ParseGuid(GetParam().text, &parsed));
  EXPECT_EQ(parsed, kSample);
}

INSTANTIATE_TEST_SUITE_P(Forms, GuidAccepts,
                         testing::Values(AcceptedCase{"0123ABCD-4567-89EF-FEDC-BA9876543210"},
                                         AcceptedCase{"0123abcd-4567-89ef-fedc-ba9876543210"},
                                         AcceptedCase{"{0123ABCD-4567-89EF-FEDC-BA9876543210}"},
                                         AcceptedCase{"{0123aBcD-4567-89eF-FeDc-bA9876543210}"}));

class GuidRejects : public testing::TestWithParam<const char*> {};

TEST_P(GuidRejects, AnswersFalseAndLeavesTheOutputAlone) {
  GUID parsed = kSample;
  EXPECT_FALSE(ParseGuid(GetParam(), &parsed));
  EXPECT_EQ(parsed, kSample);
}

INSTANTIATE_TEST_SUITE_P(Malformed, GuidRejects,
                         testing::Values("", "{}", "{0123ABCD-4567-89EF-FEDC-BA9876543210",
                                         "0123ABCD-4567-89EF-FEDC-BA9876543210}",
                                         "{{0123ABCD-4567-89EF-FEDC-BA9876543210}}",
                                         "0123ABCD-4567-89EF-FEDC-BA987654321",  // one digit short
                                         "0123ABCD-4567-89EF-FEDC-BA98765432100",  // one digit long
                                         "0123ABCD4567-89EF-FEDC-BA9876543210-",   // dash moved
                                         "0123ABCD-4567-89EF-FEDCBA-9876543210",   // dash moved
                                         "0123ABCG-4567-89EF-FEDC-BA9876543210",   // not hex
                                         " 0123ABCD-4567-89EF-FEDC-BA987654321",   // leading space
                                         "0123ABCD-4567-89EF-FEDC-BA9876543210\n",
                                         "0123ABCD_4567_89EF_FEDC_BA9876543210",
                                         "+123ABCD-4567-89EF-FEDC-BA9876543210"));

TEST(GuidText, RoundTripsRandomGuids) {
  std::srand(1234);
  for (int n = 0; n < 200; ++n) {
    GUID g{};
    g.Data1 =
        static_cast<std::uint32_t>(std::rand()) << 16 ^ static_cast<std::uint32_t>(std::rand());
    g.Data2 = static_cast<std::uint16_t>(std::rand());
    g.Data3 = static_cast<std::uint16_t>(std::rand());
    for (std::uint8_t& b : g.Data4) b = static_cast<std::uint8_t>(std::rand());
    GUID back{};
    ASSERT_TRUE(ParseGuid(FormatGuid(g), &back)) << FormatGuid(g);
    EXPECT_EQ(back, g) << FormatGuid(g);
  }
}

}  // namespace
