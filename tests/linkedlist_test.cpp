#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

TEST(LinkedListTest, DumpWritesTheCountAndEveryNode) {
    CountingObject a, b;
    DWXLinkedList list;
    EXPECT_EQ(Captured([&](FILE* f) { list.Dump(f); }), "nCount=0\n");
    AddAll(list, {&a, nullptr, &b});
    EXPECT_EQ(Captured([&](FILE* f) { list.Dump(f); }),
              "nCount=3\n" + ObjectLine(&a) + "\nNULL\n" + ObjectLine(&b) + "\n");
}

TEST(LinkedListTest, WalksSurviveChangesAwayFromTheirNode) {
    CountingObject a, b, c, d, e;
    DWXLinkedList list;
    AddAll(list, {&a, &b, &c});
    DWXIter iter(&list);
    EXPECT_EQ(*iter, &a);
    list.Insert(&d, list.Find(&b));  // after the walk's node: visited
    list.Prepend(&e);                // before it: not visited
    list.Remove(&c);                 // another node: safe
    EXPECT_EQ(iter.Next(), &d);
    EXPECT_EQ(iter.Next(), &b);
    EXPECT_EQ(iter.Next(), nullptr);
    list.Append(&c);
    EXPECT_EQ(iter.Next(), nullptr);  // an ended walk stays ended

    // Bound with SetTarget and never started, a walk begins at the front.
    DWXIter unstarted;
    unstarted.SetTarget(&list);
    EXPECT_EQ(unstarted.Next(), &e);
    EXPECT_EQ(unstarted.Next(), &a);
}

// A walk ends at a null member, so DestroyContents deletes only the members
// before it, each once, and unlinks every node.
TEST(LinkedListTest, DestroyContentsStopsAtANullMember) {
    CountingObject::Reset();
    DWXLinkedList list;
    for (int i = 0; i < 3; ++i) {
        list.Append(new CountingObject(i));
    }
    list.Prepend(list.StartNode()->poObject);  // the same member twice
    auto* after = new CountingObject(9);
    AddAll(list, {nullptr, after});
    list.DestroyContents();
    EXPECT_EQ(CountingObject::destroyed, 3);
    EXPECT_EQ(list.GetCount(), 0);
    EXPECT_EQ(list.StartNode(), list.EndNode());
    delete after;
}

}  // namespace
