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
    const int sequence[] = {5, 11, 19, 29, 42, 59, 81, 110, 148, 197, 261, 344};
    std::vector<CountingObject> objects(344);
    BagView bag;
    EXPECT_EQ(bag.Capacity(), 0);
    int step = 0;
    for (int i = 0; i < 344; ++i) {
        bag.Add(&objects[i]);
        if (i == (step == 0 ? 0 : sequence[step - 1])) {
            ++step;
        }
        ASSERT_EQ(bag.Capacity(), sequence[step - 1]) << "after Add " << i + 1;
    }
    EXPECT_EQ(bag.GetCount(), 344);

    // Built from a container of three: 3, then 8, 15, 24.
    DWXArray three;
    three.Add(&a);
    three.Add(&b);
    three.Add(&c);
    BagView built(&three);
    EXPECT_EQ(built.Capacity(), 3);
    std::vector<int> capacities;
    for (int i = 0; i < 16; ++i) {
        built.Add(&d);
        if (capacities.empty() || capacities.back() != built.Capacity()) {
            capacities.push_back(built.Capacity());
        }
    }
    EXPECT_EQ(capacities, (std::vector<int>{8, 15, 24}));
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

    DWXIter second(&bag);
    bag.Remove(&d);  // not yet reached: d is last, nothing moves
    bag.Remove(&b);  // not yet reached: the last member moves forward
    EXPECT_EQ(Walk(bag), (Members{&c}));
    bag.Empty();
    EXPECT_EQ(second.Next(), nullptr);
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

TEST_F(BagTest, DestroyContentsDeletesTheMembersBeforeTheFirstNull) {
    CountingObject::Reset();
    BagView bag;
    bag.Add(new CountingObject(1));
    bag.Add(new CountingObject(2));
    EXPECT_EQ(bag.Validate(), 1);
    bag.DestroyContents();
    EXPECT_EQ(CountingObject::destroyed, 2);
    EXPECT_EQ(bag.GetCount(), 0);
    EXPECT_EQ(bag.Capacity(), 0);
}

}  // namespace
