#include "container_test_util.h"
#include "counting_object.h"

#include <gtest/gtest.h>

#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

// Capacities seen while adding, one entry per growth.
std::vector<int> Growth(View<DWXBag>& bag, int adds) {
    std::vector<int> capacities{bag.Capacity()};
    for (int i = 0; i < adds; ++i) {
        bag.Add(nullptr);
        if (capacities.back() != bag.Capacity()) {
            capacities.push_back(bag.Capacity());
        }
    }
    return capacities;
}

// About 1.3 times plus five; a copy holds room for its members only,
// removals keep the buffer and Empty frees it.
TEST(BagTest, Capacity) {
    CountingObject a, b, c;
    View<DWXBag> bag, assigned;
    EXPECT_EQ(Growth(bag, 344),
              (std::vector<int>{0, 5, 11, 19, 29, 42, 59, 81, 110, 148, 197, 261, 344}));
    DWXArray three;
    AddAll(three, {&a, &b, &c});
    View<DWXBag> built(&three);
    AddAll(assigned, {&c, &c, &c, &c, &c, &c, &c});
    assigned = built;
    EXPECT_EQ(Growth(built, 16), (std::vector<int>{3, 8, 15, 24}));
    EXPECT_EQ(assigned.Remove(&a) + assigned.Remove(&b) + assigned.Remove(&c), 3);
    EXPECT_EQ(assigned.Capacity(), 3);
    assigned.Empty();
    EXPECT_FALSE(assigned.HasBuffer() || View<DWXBag>(nullptr).HasBuffer());
}

}  // namespace
