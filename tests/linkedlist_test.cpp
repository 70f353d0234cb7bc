#include "container_test_util.h"
#include "counting_object.h"

#include <gtest/gtest.h>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

// A list walk holds its node: changes elsewhere in the list are safe.
TEST(LinkedListTest, WalksSurviveChangesAwayFromTheirNode) {
    CountingObject a, b, c, d, e;
    DWXLinkedList list;
    AddAll(list, {&a, &b, &c});
    DWXIter iter(&list);
    list.Insert(&d, list.Find(&b));  // after the walk's node: visited
    list.Prepend(&e);                // before it: not visited
    list.Remove(&c);                 // another node
    EXPECT_EQ(iter.Next(), &d);
    EXPECT_EQ(iter.Next(), &b);
    EXPECT_EQ(iter.Next(), nullptr);
    list.Append(&c);
    EXPECT_EQ(iter.Next(), nullptr);  // an ended walk stays ended
    DWXIter unstarted;                // bound with SetTarget and never started: begins at the front
    unstarted.SetTarget(&list);
    EXPECT_EQ(unstarted.Next(), &e);
    EXPECT_EQ(unstarted.Next(), &a);
}

}  // namespace
