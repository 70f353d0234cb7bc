#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

class BagTest : public ::testing::Test {
  protected:
    CountingObject a{1}, b{2}, c{3}, d{4};
};

// Capacities seen while adding, one entry per growth.
std::vector<int> Growth(BagView& bag, int adds) {
    std::vector<int> capacities{bag.Capacity()};
    for (int i = 0; i < adds; ++i) {
        bag.Add(nullptr);
        if (capacities.back() != bag.Capacity()) {
            capacities.push_back(bag.Capacity());
        }
    }
    return capacities;
}

TEST_F(BagTest, GrowsByThirtyPercentPlusFive) {
    BagView bag;
    EXPECT_EQ(Growth(bag, 344),
              (std::vector<int>{0, 5, 11, 19, 29, 42, 59, 81, 110, 148, 197, 261, 344}));
    DWXArray three;  // built from a container of three: 3, then 8, 15, 24
    AddAll(three, {&a, &b, &c});
    BagView built(&three);
    EXPECT_EQ(Growth(built, 16), (std::vector<int>{3, 8, 15, 24}));
}

TEST_F(BagTest, RemoveMovesTheLastMemberAndKeepsTheBuffer) {
    BagView bag;
    AddAll(bag, {&a, &b, &c, &d});
    EXPECT_EQ(bag.Remove(&b), 1);
    EXPECT_EQ(Walk(bag), (Members{&a, &d, &c}));
    EXPECT_EQ(bag.Remove(&b) + bag.IsMember(&b), 0);
    EXPECT_EQ(bag.Remove(&c), 1);
    EXPECT_EQ(Walk(bag), (Members{&a, &d}));
    EXPECT_EQ(bag.Remove(&a) + bag.Remove(&d), 2);
    EXPECT_EQ(bag.GetCount(), 0);
    EXPECT_EQ(bag.Capacity(), 5);
    bag.Add(&a);
    bag.Empty();
    EXPECT_EQ(bag.Capacity(), 0);
    EXPECT_EQ(bag.IsEmpty(), 1);
}

TEST_F(BagTest, NullMembersAreStoredAndEndWalks) {
    BagView bag;
    AddAll(bag, {&a, nullptr, &b});
    EXPECT_EQ(bag.GetCount(), 3);
    EXPECT_EQ(bag.IsMember(nullptr), 1);
    EXPECT_EQ(Walk(bag), (Members{&a}));
    EXPECT_EQ(Captured([&](FILE* f) { bag.Dump(f); }), "DWXBag:\n" + ObjectLine(&a));
    EXPECT_EQ(DWXBag(bag).GetCount(), 1);
    EXPECT_EQ(bag.Remove(nullptr), 1);
    EXPECT_EQ(Walk(bag), (Members{&a, &b}));
}

TEST_F(BagTest, WalksSurviveChanges) {
    DWXBag bag;
    AddAll(bag, {&a, &b, &c});
    DWXIter iter(&bag);
    EXPECT_EQ(*iter, &a);
    bag.Remove(&a);  // c moves into slot 0, behind the walk
    EXPECT_EQ(iter.Next(), &b);
    bag.Add(&d);  // appended, so visited
    EXPECT_EQ(iter.Next(), &d);
    EXPECT_EQ(iter.Next(), nullptr);

    bag.Add(&a);  // c, b, d, a
    DWXIter second(&bag);
    bag.Remove(&b);  // not yet reached: a moves forward and is still visited
    EXPECT_EQ(second.Next(), &a);
    EXPECT_EQ(second.Next(), &d);
    bag.Empty();
    EXPECT_EQ(second.Next(), nullptr);

    DWXIter third(&bag);  // started on an empty bag: sees what is added later
    bag.Add(&a);
    EXPECT_EQ(third.Next(), &a);
}

TEST_F(BagTest, CopiesShareMembersNotBuffers) {
    BagView source;
    AddAll(source, {&a, &b});
    BagView copy(source);
    EXPECT_EQ(copy.Capacity(), 2);
    copy.Remove(&a);
    EXPECT_EQ(Walk(source), (Members{&a, &b}));

    BagView assigned;
    AddAll(assigned, {&c, &c, &c, &c, &c, &c, &c});
    assigned = source;
    assigned = *&assigned;
    EXPECT_EQ(Walk(assigned), (Members{&a, &b}));
    EXPECT_EQ(assigned.Capacity(), 2);

    BagView fromNull(nullptr);
    EXPECT_EQ(fromNull.GetCount() + fromNull.Capacity(), 0);
    fromNull.Add(&a);
    EXPECT_EQ(fromNull.Capacity(), 5);
}

}  // namespace
