#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

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

// About 1.3 times plus five; removals keep the buffer, Empty frees it, and a
// copy holds room for the members only.
TEST(BagTest, Capacity) {
    CountingObject a, b, c;
    BagView bag;
    EXPECT_EQ(Growth(bag, 344),
              (std::vector<int>{0, 5, 11, 19, 29, 42, 59, 81, 110, 148, 197, 261, 344}));
    DWXArray three;
    AddAll(three, {&a, &b, &c});
    BagView built(&three);
    BagView assigned;
    AddAll(assigned, {&c, &c, &c, &c, &c, &c, &c});
    assigned = built;
    EXPECT_EQ(Growth(built, 16), (std::vector<int>{3, 8, 15, 24}));
    EXPECT_EQ(assigned.Capacity(), 3);
    EXPECT_EQ(assigned.Remove(&a) + assigned.Remove(&b) + assigned.Remove(&c), 3);
    EXPECT_EQ(assigned.Capacity(), 3);
    assigned.Empty();
    EXPECT_EQ(assigned.Capacity(), 0);
    BagView fromNull(nullptr);
    EXPECT_EQ(fromNull.GetCount() + fromNull.Capacity(), 0);
}

TEST(BagTest, DumpStopsAtANullMember) {
    CountingObject a, b;
    DWXBag bag;
    AddAll(bag, {&a, nullptr, &b});
    EXPECT_EQ(Captured([&](FILE* f) { bag.Dump(f); }), "DWXBag:\n" + ObjectLine(&a));
}

TEST(BagTest, WalksSurviveChanges) {
    CountingObject a, b, c, d;
    DWXBag bag;
    AddAll(bag, {&a, &b, &c});
    DWXIter iter(&bag);
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

}  // namespace
