#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

using Members = std::vector<DWXObject*>;

class BagTest : public ::testing::Test {
  protected:
    CountingObject a{1}, b{2}, c{3}, d{4};
};

TEST_F(BagTest, GrowsByThirtyPercentPlusFive) {
    // Capacities seen while adding, one entry per growth.
    auto growth = [](BagView& bag, int adds) {
        std::vector<int> capacities{bag.Capacity()};
        for (int i = 0; i < adds; ++i) {
            bag.Add(nullptr);
            if (capacities.back() != bag.Capacity()) {
                capacities.push_back(bag.Capacity());
            }
        }
        return capacities;
    };
    BagView bag;
    EXPECT_EQ(growth(bag, 344),
              (std::vector<int>{0, 5, 11, 19, 29, 42, 59, 81, 110, 148, 197, 261, 344}));
    EXPECT_EQ(bag.GetCount(), 344);

    DWXArray three;  // built from a container of three: 3, then 8, 15, 24
    three.Add(&a);
    three.Add(&b);
    three.Add(&c);
    BagView built(&three);
    EXPECT_EQ(growth(built, 16), (std::vector<int>{3, 8, 15, 24}));
}

TEST_F(BagTest, RemoveMovesTheLastMemberAndKeepsTheBuffer) {
    BagView bag;
    for (DWXObject* o : {&a, &b, &c, &d}) {
        bag.Add(o);
    }
    EXPECT_EQ(bag.Remove(&b), 1);
    EXPECT_EQ(Walk(bag), (Members{&a, &d, &c}));
    EXPECT_EQ(bag.Remove(&b), 0);
    EXPECT_EQ(bag.IsMember(&b), 0);
    EXPECT_EQ(bag.Remove(&c), 1);
    EXPECT_EQ(Walk(bag), (Members{&a, &d}));
    EXPECT_EQ(bag.Remove(&a), 1);
    EXPECT_EQ(bag.Remove(&d), 1);
    EXPECT_EQ(bag.GetCount(), 0);
    EXPECT_EQ(bag.Capacity(), 5);
    bag.Add(&a);
    bag.Empty();
    EXPECT_EQ(bag.Capacity(), 0);
    EXPECT_EQ(bag.IsEmpty(), 1);
}

TEST_F(BagTest, NullMembersAreStoredAndEndWalks) {
    BagView bag;
    bag.Add(&a);
    bag.Add(nullptr);
    bag.Add(&b);
    EXPECT_EQ(bag.GetCount(), 3);
    EXPECT_EQ(bag.IsMember(nullptr), 1);
    EXPECT_EQ(Walk(bag), (Members{&a}));
    EXPECT_EQ(Captured([&](FILE* f) { bag.Dump(f); }), "DWXBag:\n" + ObjectLine(&a));
    DWXBag copy(bag);
    EXPECT_EQ(copy.GetCount(), 1);
    EXPECT_EQ(bag.Remove(nullptr), 1);
    EXPECT_EQ(Walk(bag), (Members{&a, &b}));
}

TEST_F(BagTest, WalksSurviveChanges) {
    DWXBag bag;
    bag.Add(&a);
    bag.Add(&b);
    bag.Add(&c);
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
    bag.Add(&b);
    EXPECT_EQ(third.Next(), &a);
}

TEST_F(BagTest, CopiesShareMembersNotBuffers) {
    BagView source;
    source.Add(&a);
    source.Add(&b);
    BagView copy(source);
    EXPECT_EQ(copy.Capacity(), 2);
    copy.Remove(&a);
    EXPECT_EQ(Walk(source), (Members{&a, &b}));

    BagView assigned;
    for (int i = 0; i < 7; ++i) {
        assigned.Add(&c);
    }
    assigned = source;
    EXPECT_EQ(Walk(assigned), (Members{&a, &b}));
    EXPECT_EQ(assigned.Capacity(), 2);
    assigned = *&assigned;
    EXPECT_EQ(Walk(assigned), (Members{&a, &b}));

    BagView fromNull(nullptr);
    EXPECT_EQ(fromNull.GetCount(), 0);
    EXPECT_EQ(fromNull.Capacity(), 0);
    fromNull.Add(&a);
    EXPECT_EQ(fromNull.Capacity(), 5);
}

}  // namespace
