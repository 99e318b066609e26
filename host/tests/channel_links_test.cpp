// The channel base: type-checked linking, bounded declarations, single and many-channel links,
// and unlinking when a channel goes away or a link is dropped. (Copies are tested with the
// emitter's.)
#include <climits>

#include "host/tests/test_channels.h"

namespace {

constexpr int kSingleA = 0;  // one channel of type A
constexpr int kManyB = 1;    // any number of channels of type B
constexpr int kUndeclared = 2;
constexpr int kSecondA = 3;

class ChannelLinks : public HostContextTest {
 protected:
  ChannelLinks() {
    parent_.SetChildCreateType(LinkRecord(kTypeA, kSingleA), kSingleA);
    parent_.SetChildCreateType(LinkRecord(kTypeB, -1), kManyB);
    parent_.SetChildCreateType(LinkRecord(kTypeA, kSecondA), kSecondA);
  }
  TypedChannel parent_{kTypeC};
};

TEST_F(ChannelLinks, SetChildTakesOnlyTheDeclaredTypeOrTypesBasedOnIt) {
  for (int index : {INT_MIN, -1, kSingleA, kManyB, kUndeclared, 4, INT_MAX})
    EXPECT_TRUE(!parent_.GetChild(index) && !parent_.GetChildFromLinkPosition(index, 0)) << index;
  struct Case {
    GUID type, base;
    int index;
    bool accepted;
  };
  const Case cases[] = {{kTypeA, GUID{}, kSingleA, true},  {kTypeC, kTypeA, kSingleA, true},
                        {kTypeB, GUID{}, kManyB, true},    {kTypeB, kTypeC, kSingleA, false},
                        {GUID{}, GUID{}, kSingleA, false}, {kTypeA, GUID{}, kUndeclared, false},
                        {kTypeA, GUID{}, 4, false},        {kTypeA, GUID{}, -1, false}};
  for (const Case& c : cases) {
    TypedChannel child(c.type, c.base);
    EXPECT_EQ(parent_.SetChild(c.index, &child), c.accepted) << &c - cases;
    EXPECT_EQ(parent_.GetChild(c.index), c.accepted ? &child : nullptr) << &c - cases;
  }
  // A zero base GUID means "no base": it never matches a link declared with the zero type.
  parent_.SetChildCreateType(LinkRecord(GUID{}, kUndeclared), kUndeclared);
  TypedChannel baseless(kTypeB), untyped(GUID{});
  EXPECT_FALSE(parent_.SetChild(kUndeclared, &baseless));
  EXPECT_TRUE(parent_.SetChild(kUndeclared, &untyped));
  // Indices and counts are bounded, so that no declaration can exhaust memory.
  parent_.SetChildCreateType(LinkRecord(kTypeA, 0), Qen_Channel::kMaximumLinkCount);
  parent_.SetChildCreateType(LinkRecord(kTypeA, 0), -1);
  EXPECT_EQ(parent_.GetChildCreationCount(), 4);
  parent_.SetChildCreationCount(INT_MAX);
  EXPECT_EQ(parent_.GetChildCreationCount(), Qen_Channel::kMaximumLinkCount);
}

TEST_F(ChannelLinks, SingleLinkHoldsOneAndManyLinkKeepsOrderAndNullEntries) {
  TypedChannel a1(kTypeA), a2(kTypeA), b1(kTypeB), b2(kTypeB);
  ASSERT_TRUE(parent_.SetChild(kSingleA, &a1) && parent_.SetChild(kSingleA, &a2));
  EXPECT_FALSE(parent_.SetChild(kSingleA, &b1));  // refused: the present one stays
  EXPECT_TRUE(parent_.GetChild(kSingleA) == &a2 && parent_.GetChildLinkPositionCount(0) == 1);
  ASSERT_TRUE(parent_.AddChild(kManyB, &b1) && parent_.AddChild(kManyB, nullptr) &&
              parent_.AddChild(kManyB, &b2));
  const Qen_Channel* expected[] = {nullptr, &b1, nullptr, &b2, nullptr};  // positions -1..3
  for (int position = -1; position <= 3; ++position)
    EXPECT_EQ(parent_.GetChildFromLinkPosition(kManyB, position), expected[position + 1]);
  EXPECT_FALSE(parent_.AddChild(kSingleA, &a1) || parent_.AddChild(kManyB, &a1));
  ASSERT_TRUE(parent_.SetChild(kManyB, &b2));  // leaves exactly this one
  EXPECT_EQ(parent_.GetChildLinkPositionCount(kManyB), 1);
  parent_.ClearChild(kManyB);
  EXPECT_TRUE(parent_.SetChild(kSingleA, nullptr));
  EXPECT_EQ(parent_.GetChildLinkPositionCount(kManyB) + parent_.GetChildLinkPositionCount(0), 0);
}

// Whichever goes first, nothing keeps a pointer to a destroyed channel (ASan checks the rest).
TEST_F(ChannelLinks, DestroyedChannelsLeaveNoLinksBehind) {
  Qen_HostContext other;
  std::unique_ptr<TypedChannel> a;
  {
    Qen_HostContext::ScopedCurrent in_other(&other);  // parents of any context are found
    a = std::make_unique<TypedChannel>(kTypeA);
  }
  auto b = std::make_unique<TypedChannel>(kTypeB);
  TypedChannel b_kept(kTypeB);
  ASSERT_TRUE(parent_.SetChild(kSingleA, a.get()) && parent_.SetChild(kSecondA, a.get()) &&
              parent_.AddChild(kManyB, b.get()) && parent_.AddChild(kManyB, &b_kept) &&
              parent_.AddChild(kManyB, b.get()));
  a.reset();
  b.reset();
  EXPECT_TRUE(!parent_.GetChild(kSingleA) && !parent_.GetChild(kSecondA));
  EXPECT_TRUE(parent_.GetChildLinkPositionCount(kManyB) == 1 && parent_.GetChild(1) == &b_kept);
  {
    TypedChannel short_lived(kTypeC);
    short_lived.SetChildCreateType(LinkRecord(kTypeA, -1), 0);
    short_lived.SetChildCreateType(LinkRecord(kTypeB, -1), 1);
    short_lived.SetChildCreateType(LinkRecord(kTypeB, -1), 2);
    auto self = std::make_unique<TypedChannel>(kTypeA);
    self->SetChildCreateType(LinkRecord(kTypeA, -1), 0);
    ASSERT_TRUE(self->AddChild(0, self.get()) && short_lived.AddChild(0, self.get()));
    self.reset();
    EXPECT_EQ(short_lived.GetChildLinkPositionCount(0), 0);
    ASSERT_TRUE(short_lived.AddChild(1, &b_kept) && short_lived.AddChild(2, &b_kept));
    short_lived.SetChildCreationCount(2);  // drops one link to `b_kept`
  }  // the parent goes before its child `b_kept`, which must hold no pointer to it
}

}  // namespace
