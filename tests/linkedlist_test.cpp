#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

// Every member from StartNode to EndNode, nulls included.
Members Nodes(const DWXLinkedList& list) {
    Members members;
    for (DWXListNode* node = list.StartNode(); node != list.EndNode(); node = node->poNext) {
        members.push_back(node->poObject);
        EXPECT_EQ(node->poNext->poPrev, node);
    }
    return members;
}

class LinkedListTest : public ::testing::Test {
  protected:
    CountingObject a{1}, b{2}, c{3}, d{4}, e{5};
};

TEST_F(LinkedListTest, PlacesAndRemovesNodes) {
    DWXLinkedList list;
    EXPECT_EQ(list.StartNode(), list.EndNode());
    EXPECT_EQ(Captured([&](FILE* f) { list.Dump(f); }), "nCount=0\n");
    AddAll(list, {&a, &b});
    list.Prepend(&c);
    list.Insert(&d, list.Find(&a));
    list.Insert(&e, list.EndNode());
    list.Append(&a);
    EXPECT_EQ(Nodes(list), (Members{&c, &d, &a, &b, &e, &a}));
    EXPECT_EQ(Walk(list), Nodes(list));

    list.Remove(list.Find(&d));
    EXPECT_EQ(list.Remove(&a), 1);  // the first of two only
    EXPECT_EQ(Nodes(list), (Members{&c, &b, &e, &a}));
    EXPECT_EQ(list.Remove(&a), 1);
    EXPECT_EQ(list.Remove(&a) + list.IsMember(&a), 0);
    EXPECT_EQ(list.Find(&a), nullptr);

    list.Insert(&a, nullptr);  // null nodes and the sentinel are ignored
    list.Remove(static_cast<DWXListNode*>(nullptr));
    list.Remove(list.EndNode());
    EXPECT_EQ(Nodes(list), (Members{&c, &b, &e}));
    EXPECT_EQ(list.GetCount(), 3);
}

TEST_F(LinkedListTest, NullMembersAreStoredDumpedAndEndWalks) {
    DWXLinkedList list;
    AddAll(list, {&a, nullptr, &b});
    EXPECT_EQ(list.GetCount(), 3);
    EXPECT_EQ(Walk(list), (Members{&a}));
    EXPECT_EQ(list.IsMember(nullptr), 1);
    EXPECT_EQ(Captured([&](FILE* f) { list.Dump(f); }),
              "nCount=3\n" + ObjectLine(&a) + "\nNULL\n" + ObjectLine(&b) + "\n");
    EXPECT_EQ(DWXArray(&list).GetCount(), 1);
    EXPECT_EQ(list.Remove(static_cast<const DWXObject*>(nullptr)), 1);
    EXPECT_EQ(Walk(list), (Members{&a, &b}));
    list.Empty();  // unlinks without deleting and leaves a usable list
    EXPECT_EQ(list.GetCount(), 0);
    EXPECT_EQ(list.StartNode(), list.EndNode());
    list.Append(&d);
    EXPECT_EQ(Nodes(list), (Members{&d}));
}

TEST_F(LinkedListTest, WalksSurviveChangesAwayFromTheirNode) {
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

TEST_F(LinkedListTest, CopiesOwnTheirNodes) {
    DWXLinkedList source;
    AddAll(source, {&a, nullptr, &b});
    DWXLinkedList copy(source);
    EXPECT_NE(copy.StartNode(), source.StartNode());
    copy.Remove(&a);
    EXPECT_EQ(Nodes(copy), (Members{nullptr, &b}));
    EXPECT_EQ(Nodes(source), (Members{&a, nullptr, &b}));

    DWXLinkedList assigned;
    assigned.Append(&c);
    assigned = source;
    assigned = *&assigned;
    EXPECT_EQ(Nodes(assigned), (Members{&a, nullptr, &b}));
    EXPECT_EQ(assigned.GetCount(), 3);
    assigned = DWXLinkedList();
    EXPECT_EQ(assigned.GetCount(), 0);
    EXPECT_EQ(assigned.StartNode(), assigned.EndNode());
}

TEST_F(LinkedListTest, DestroyContentsDeletesMembersAndNodes) {
    CountingObject::Reset();
    DWXLinkedList list;
    for (int i = 0; i < 4; ++i) {
        list.Append(new CountingObject(i));
    }
    list.Prepend(list.StartNode()->poObject);  // the same member twice
    list.DestroyContents();
    EXPECT_EQ(CountingObject::destroyed, 4);
    EXPECT_EQ(list.GetCount(), 0);
    EXPECT_EQ(list.StartNode(), list.EndNode());
}

}  // namespace
