// The channel base: declared links, type-checked linking, many-channel links, unlinking when a
// channel goes away, copies and dependency declarations.
#include <gtest/gtest.h>

#include <climits>
#include <memory>

#include "host/tests/test_channels.h"

namespace {

constexpr int kSingleA = 0;  // one channel of type A
constexpr int kManyB = 1;    // any number of channels of type B
constexpr int kUndeclared = 2;
constexpr int kSecondA = 3;

// A parent with links 0, 1 and 3 declared and 2 left out.
class ChannelLinks : public HostContextTest {
 protected:
  ChannelLinks() {
    parent_.SetChannelName("parent");
    parent_.SetChildCreationCount(4);
    parent_.SetChildCreateType(LinkRecord(kTypeA, kSingleA, "Single A"), kSingleA);
    parent_.SetChildCreateType(LinkRecord(kTypeB, -1, "Many B"), kManyB);
    parent_.SetChildCreateType(LinkRecord(kTypeA, kSecondA, "Second A"), kSecondA);
  }
  TypedChannel parent_{kTypeC};
};

TEST_F(ChannelLinks, FreshChannelAnswersNullForEveryIndex) {
  for (int index : {INT_MIN, -1000, -1, 0, 1, 2, 3, 4, 54, 1000, INT_MAX}) {
    EXPECT_EQ(parent_.GetChild(index), nullptr) << index;
    EXPECT_EQ(parent_.GetChildLinkPositionCount(index), 0) << index;
    EXPECT_EQ(parent_.GetChildFromLinkPosition(index, 0), nullptr) << index;
  }
}

TEST_F(ChannelLinks, DeclarationsCanBeListed) {
  EXPECT_EQ(parent_.GetChildCreationCount(), 4);
  ASSERT_NE(parent_.GetChildCreation(kManyB), nullptr);
  EXPECT_STREQ(parent_.GetChildCreation(kManyB)->LinkName, "Many B");
  EXPECT_EQ(parent_.GetChildCreation(kManyB)->LinkPosition, -1);
  EXPECT_EQ(parent_.GetChildCreation(kUndeclared), nullptr);
  EXPECT_EQ(parent_.GetChildCreation(-1), nullptr);
  EXPECT_EQ(parent_.GetChildCreation(4), nullptr);
  EXPECT_EQ(parent_.FindChildLinkByName("Second A"), kSecondA);
  EXPECT_EQ(parent_.FindChildLinkByName("Second"), -1);
  EXPECT_EQ(parent_.FindChildLinkByName(""), -1);
  EXPECT_EQ(parent_.GetChannelName(), "parent");
}

struct LinkCase {
  const char* what;
  GUID type;
  GUID base;
  int index;
  bool accepted;
};

class SetChildTypeCheck : public ChannelLinks, public ::testing::WithParamInterface<LinkCase> {};

TEST_P(SetChildTypeCheck, AcceptsOnlyTheDeclaredTypeOrItsDerivedTypes) {
  const LinkCase& c = GetParam();
  TypedChannel child(c.type, c.base);
  EXPECT_EQ(parent_.SetChild(c.index, &child), c.accepted) << c.what;
  EXPECT_EQ(parent_.GetChild(c.index), c.accepted ? &child : nullptr) << c.what;
}

INSTANTIATE_TEST_SUITE_P(
    Cases, SetChildTypeCheck,
    ::testing::Values(LinkCase{"same type", kTypeA, GUID{}, kSingleA, true},
                      LinkCase{"derived from the type", kTypeC, kTypeA, kSingleA, true},
                      LinkCase{"other type", kTypeB, GUID{}, kSingleA, false},
                      LinkCase{"other type, other base", kTypeB, kTypeC, kSingleA, false},
                      LinkCase{"untyped channel", GUID{}, GUID{}, kSingleA, false},
                      LinkCase{"undeclared index", kTypeA, GUID{}, kUndeclared, false},
                      LinkCase{"index past the table", kTypeA, GUID{}, 4, false},
                      LinkCase{"negative index", kTypeA, GUID{}, -1, false},
                      LinkCase{"many link, right type", kTypeB, GUID{}, kManyB, true}));

TEST_F(ChannelLinks, LinkDeclaredWithZeroTypeDoesNotTakeEveryBaselessChannel) {
  parent_.SetChildCreateType(LinkRecord(GUID{}, kUndeclared, "Zero"), kUndeclared);
  TypedChannel baseless(kTypeB);
  TypedChannel zero(GUID{});
  EXPECT_FALSE(parent_.SetChild(kUndeclared, &baseless));
  EXPECT_TRUE(parent_.SetChild(kUndeclared, &zero));
}

TEST_F(ChannelLinks, SetChildNullUnlinks) {
  TypedChannel a(kTypeA);
  ASSERT_TRUE(parent_.SetChild(kSingleA, &a));
  EXPECT_TRUE(parent_.SetChild(kSingleA, nullptr));
  EXPECT_EQ(parent_.GetChild(kSingleA), nullptr);
  EXPECT_EQ(parent_.GetChildLinkPositionCount(kSingleA), 0);
}

TEST_F(ChannelLinks, RefusedChannelLeavesThePresentLinkAlone) {
  TypedChannel a(kTypeA), b(kTypeB);
  ASSERT_TRUE(parent_.SetChild(kSingleA, &a));
  EXPECT_FALSE(parent_.SetChild(kSingleA, &b));
  EXPECT_EQ(parent_.GetChild(kSingleA), &a);
}

TEST_F(ChannelLinks, ManyChannelLinkKeepsOrderAndCountsNullEntries) {
  TypedChannel b1(kTypeB), b2(kTypeB);
  EXPECT_TRUE(parent_.AddChild(kManyB, &b1));
  EXPECT_TRUE(parent_.AddChild(kManyB, nullptr));
  EXPECT_TRUE(parent_.AddChild(kManyB, &b2));

  EXPECT_EQ(parent_.GetChildLinkPositionCount(kManyB), 3);
  EXPECT_EQ(parent_.GetChildFromLinkPosition(kManyB, 0), &b1);
  EXPECT_EQ(parent_.GetChildFromLinkPosition(kManyB, 1), nullptr);
  EXPECT_EQ(parent_.GetChildFromLinkPosition(kManyB, 2), &b2);
  for (int position : {-1, 3, INT_MAX})
    EXPECT_EQ(parent_.GetChildFromLinkPosition(kManyB, position), nullptr) << position;
  EXPECT_EQ(parent_.GetChild(kManyB), &b1);
}

TEST_F(ChannelLinks, AddChildRefusesSingleLinksWrongTypesAndUndeclaredIndices) {
  TypedChannel a(kTypeA), b(kTypeB);
  EXPECT_FALSE(parent_.AddChild(kSingleA, &a));
  EXPECT_FALSE(parent_.AddChild(kManyB, &a));
  EXPECT_FALSE(parent_.AddChild(kUndeclared, &b));
  EXPECT_FALSE(parent_.AddChild(-1, &b));
  EXPECT_EQ(parent_.GetChildLinkPositionCount(kManyB), 0);
  EXPECT_EQ(parent_.GetChild(kSingleA), nullptr);
}

TEST_F(ChannelLinks, SetChildOnManyLinkLeavesJustThatChannel) {
  TypedChannel b1(kTypeB), b2(kTypeB);
  ASSERT_TRUE(parent_.AddChild(kManyB, &b1));
  ASSERT_TRUE(parent_.AddChild(kManyB, nullptr));
  ASSERT_TRUE(parent_.SetChild(kManyB, &b2));
  EXPECT_EQ(parent_.GetChildLinkPositionCount(kManyB), 1);
  EXPECT_EQ(parent_.GetChild(kManyB), &b2);
}

TEST_F(ChannelLinks, ClearChildEmptiesEitherKind) {
  TypedChannel a(kTypeA), b(kTypeB);
  ASSERT_TRUE(parent_.SetChild(kSingleA, &a));
  ASSERT_TRUE(parent_.AddChild(kManyB, &b));
  parent_.ClearChild(kSingleA);
  parent_.ClearChild(kManyB);
  parent_.ClearChild(kUndeclared);
  EXPECT_EQ(parent_.GetChild(kSingleA), nullptr);
  EXPECT_EQ(parent_.GetChildLinkPositionCount(kManyB), 0);
}

TEST_F(ChannelLinks, DestroyedChildIsUnlinkedEverywhere) {
  auto a = std::make_unique<TypedChannel>(kTypeA);
  auto b = std::make_unique<TypedChannel>(kTypeB);
  TypedChannel b_other(kTypeB);
  ASSERT_TRUE(parent_.SetChild(kSingleA, a.get()));
  ASSERT_TRUE(parent_.SetChild(kSecondA, a.get()));
  ASSERT_TRUE(parent_.AddChild(kManyB, b.get()));
  ASSERT_TRUE(parent_.AddChild(kManyB, &b_other));
  ASSERT_TRUE(parent_.AddChild(kManyB, b.get()));

  a.reset();
  b.reset();
  EXPECT_EQ(parent_.GetChild(kSingleA), nullptr);
  EXPECT_EQ(parent_.GetChild(kSecondA), nullptr);
  EXPECT_EQ(parent_.GetChildLinkPositionCount(kManyB), 1);
  EXPECT_EQ(parent_.GetChildFromLinkPosition(kManyB, 0), &b_other);
}

TEST_F(ChannelLinks, ChildOfAnotherContextIsUnlinkedToo) {
  Qen_HostContext other;
  std::unique_ptr<TypedChannel> a;
  {
    Qen_HostContext::ScopedCurrent in_other(&other);
    a = std::make_unique<TypedChannel>(kTypeA);
  }
  ASSERT_TRUE(parent_.SetChild(kSingleA, a.get()));
  a.reset();
  EXPECT_EQ(parent_.GetChild(kSingleA), nullptr);
}

TEST_F(ChannelLinks, ParentMayGoBeforeItsChildren) {
  TypedChannel a(kTypeA);
  {
    TypedChannel short_lived(kTypeC);
    short_lived.SetChildCreateType(LinkRecord(kTypeA, 0, "A"), 0);
    ASSERT_TRUE(short_lived.SetChild(0, &a));
  }
  // `a` is destroyed after its parent; under ASan a stale back-link would show here.
  TypedChannel later(kTypeC);
  later.SetChildCreateType(LinkRecord(kTypeA, 0, "A"), 0);
  EXPECT_TRUE(later.SetChild(0, &a));
}

TEST_F(ChannelLinks, ChannelLinkingItselfCanBeDestroyed) {
  auto self = std::make_unique<TypedChannel>(kTypeA);
  self->SetChildCreateType(LinkRecord(kTypeA, -1, "Self"), 0);
  ASSERT_TRUE(self->AddChild(0, self.get()));
  ASSERT_TRUE(parent_.SetChild(kSingleA, self.get()));
  self.reset();
  EXPECT_EQ(parent_.GetChild(kSingleA), nullptr);
}

TEST_F(ChannelLinks, RedeclaringALinkDropsChannelsItNoLongerTakes) {
  TypedChannel a(kTypeA), b(kTypeB);
  ASSERT_TRUE(parent_.SetChild(kSingleA, &a));
  parent_.SetChildCreateType(LinkRecord(kTypeB, kSingleA, "Now B"), kSingleA);
  EXPECT_EQ(parent_.GetChild(kSingleA), nullptr);
  EXPECT_TRUE(parent_.SetChild(kSingleA, &b));
  EXPECT_EQ(parent_.FindChildLinkByName("Now B"), kSingleA);
}

TEST_F(ChannelLinks, ShrinkingTheTableUnlinksTheDroppedLinks) {
  auto a = std::make_unique<TypedChannel>(kTypeA);
  ASSERT_TRUE(parent_.SetChild(kSecondA, a.get()));
  parent_.SetChildCreationCount(2);
  EXPECT_EQ(parent_.GetChildCreationCount(), 2);
  EXPECT_EQ(parent_.GetChild(kSecondA), nullptr);
  a.reset();  // must not touch the dropped slot
  parent_.SetChildCreationCount(-5);
  EXPECT_EQ(parent_.GetChildCreationCount(), 0);
}

TEST_F(ChannelLinks, DeclarationsBeyondTheLimitAreRefused) {
  parent_.SetChildCreateType(LinkRecord(kTypeA, 0, "far"), Qen_Channel::kMaximumLinkCount);
  parent_.SetChildCreateType(LinkRecord(kTypeA, 0, "negative"), -1);
  parent_.SetChildCreationCount(INT_MAX);
  EXPECT_EQ(parent_.GetChildCreationCount(), Qen_Channel::kMaximumLinkCount);
  EXPECT_EQ(parent_.FindChildLinkByName("far"), -1);
  EXPECT_EQ(parent_.FindChildLinkByName("negative"), -1);
}

TEST_F(ChannelLinks, CopyHasNameDeclarationsAndLinksAndIsRegistered) {
  auto a = std::make_unique<TypedChannel>(kTypeA);
  TypedChannel b(kTypeB);
  ASSERT_TRUE(parent_.SetChild(kSingleA, a.get()));
  ASSERT_TRUE(parent_.AddChild(kManyB, nullptr));
  ASSERT_TRUE(parent_.AddChild(kManyB, &b));

  auto copy = std::make_unique<TypedChannel>(parent_);
  EXPECT_EQ(copy->GetChannelName(), "parent");
  EXPECT_EQ(copy->GetChildCreationCount(), 4);
  EXPECT_EQ(copy->FindChildLinkByName("Many B"), kManyB);
  EXPECT_EQ(copy->GetChild(kSingleA), a.get());
  EXPECT_EQ(copy->GetChildLinkPositionCount(kManyB), 2);
  EXPECT_EQ(copy->GetChildFromLinkPosition(kManyB, 1), &b);
  EXPECT_EQ(copy->GetHostContext(), &context_);
  EXPECT_EQ(context_.GetChannelByType(kTypeC, 1), copy.get());

  // The copy's links are its own: both are unlinked when the child goes.
  a.reset();
  EXPECT_EQ(parent_.GetChild(kSingleA), nullptr);
  EXPECT_EQ(copy->GetChild(kSingleA), nullptr);
  copy.reset();
  EXPECT_EQ(context_.GetChannelByType(kTypeC, 1), nullptr);
  EXPECT_EQ(parent_.GetChildFromLinkPosition(kManyB, 1), &b);
}

TEST_F(ChannelLinks, AssignmentReplacesLinksAndKeepsTargetLinkedByOthers) {
  TypedChannel a1(kTypeA), a2(kTypeA);
  TypedChannel target(kTypeC);
  target.SetChildCreateType(LinkRecord(kTypeA, 0, "Old"), 0);
  ASSERT_TRUE(target.SetChild(0, &a2));
  ASSERT_TRUE(parent_.SetChild(kSingleA, &a1));

  TypedChannel grandparent(kTypeB);
  grandparent.SetChildCreateType(LinkRecord(kTypeC, 0, "Target"), 0);
  ASSERT_TRUE(grandparent.SetChild(0, &target));

  target = parent_;
  EXPECT_EQ(target.GetChild(kSingleA), &a1);
  EXPECT_EQ(target.FindChildLinkByName("Old"), -1);
  EXPECT_EQ(grandparent.GetChild(0), &target);
}

TEST(ChannelDependencies, AppendInDeclarationOrder) {
  TypedChannel channel(kTypeA);
  Qen_List list;
  channel.AddDLLDepend("libc.so.6", &list);
  channel.AddChannelGuidDepend(kTypeB, &list);
  channel.AddDLLDepend("libstdc++.so.6", &list);
  channel.AddChannelGuidDepend(kTypeC, &list);
  channel.AddDLLDepend(nullptr, &list);  // nothing to declare
  channel.AddDLLDepend("ignored", nullptr);
  channel.AddChannelGuidDepend(kTypeA, nullptr);

  using Kind = Qen_Dependency::Kind;
  ASSERT_EQ(list.Entries.size(), 4u);
  EXPECT_EQ(list.Entries[0].DependencyKind, Kind::Library);
  EXPECT_EQ(list.Entries[0].LibraryName, "libc.so.6");
  EXPECT_EQ(list.Entries[1].DependencyKind, Kind::ChannelType);
  EXPECT_EQ(list.Entries[1].TypeGuid, kTypeB);
  EXPECT_EQ(list.Entries[2].LibraryName, "libstdc++.so.6");
  EXPECT_EQ(list.Entries[3].TypeGuid, kTypeC);
}

TEST(ChannelBase, DefaultTypeRecordIsEmptyAndTimeStampFollowsTheFrame) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Qen_Channel channel;
  EXPECT_EQ(channel.GetChannelType().TypeGuid, GUID{});
  EXPECT_STREQ(channel.GetChannelType().TypeName, "");
  context.AdvanceFrame();
  context.AdvanceFrame();
  channel.SetTimeStamp();
  EXPECT_EQ(channel.GetTimeStamp(), 3u);
}

}  // namespace
