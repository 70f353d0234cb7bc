#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

// A member that can check itself and counts how often it was asked.
class Checked : public DWXObject, public DWXValidatable {
  public:
    explicit Checked(int valid) : nValid(valid) {}
    const char* GetClassName() const override { return "Checked"; }
    int Validate() const override { return ++nAsked, nValid; }
    int nValid;
    mutable int nAsked = 0;
};

// A container written by a host, without an Empty of its own.
class HostContainer : public DWXContainer {
  public:
    const char* GetClassName() const override { return "HostContainer"; }
    int IsMember(const DWXObject* o) override {
        return std::count(members.begin(), members.end(), o) ? 1 : 0;
    }
    void Add(DWXObject* o) override { members.push_back(o), ++nCount; }
    int Remove(const DWXObject* o) override {
        auto found = std::find(members.begin(), members.end(), o);
        if (refuseRemove || found == members.end()) {
            return 0;
        }
        members.erase(found), --nCount;
        return 1;
    }
    Members members;
    bool refuseRemove = false;

  protected:
    DWXObject* Start(DWXIter* iter) const override { return SetPosition(iter, 0), Next(iter); }
    DWXObject* Next(DWXIter* iter) const override {
        size_t position = static_cast<size_t>(GetPosition(iter));
        if (position >= members.size()) {
            return nullptr;
        }
        SetPosition(iter, position + 1);
        return members[position];
    }
};

TEST(ObjectTest, DumpsWriteClassNameAndAddress) {
    DWXIter iter;
    EXPECT_EQ(Captured([&](FILE* f) { iter.Dump(f); }), ObjectLine(&iter));
    EXPECT_EQ(ObjectLine(&iter).rfind("DWXIter:", 0), 0u);
    HostContainer host;
    EXPECT_EQ(Captured([&](FILE* f) { host.Dump(f); }), "HostContainer:\n");
    iter.Dump(nullptr);  // a null stream is not written to
    host.Dump(nullptr);
}

TEST(ObjectTest, IteratorProtocol) {
    for (DWXIter iter : {DWXIter(), DWXIter(nullptr)}) {
        EXPECT_EQ(iter.Start(nullptr), nullptr);
        EXPECT_EQ(iter.Next(), nullptr);
        EXPECT_EQ(*iter, nullptr);
    }
    CountingObject a, b, c, d;
    DWXArray array;
    array.AddContainer(nullptr);
    AddAll(array, {&a, &b, &c, &d});
    DWXIter iter(&array);
    EXPECT_EQ(*iter, &a);  // a new iterator stands on the first member
    EXPECT_EQ(iter.Next(), &b);
    DWXIter copy(iter);  // goes on from the same place, independently
    EXPECT_EQ(copy.Next(), &c);
    EXPECT_EQ(copy.Next(), &d);
    EXPECT_EQ(copy.Next(), nullptr);
    EXPECT_EQ((++iter).Current(), &c);
    EXPECT_EQ(iter.Start(nullptr), &a);  // restarts the bound container

    DWXBag bag;
    bag.Add(&d);
    iter.SetTarget(&bag);  // binds without starting
    EXPECT_EQ(iter.Current(), nullptr);
    EXPECT_EQ(iter.Start(), &d);
    EXPECT_EQ(iter.Next(), nullptr);
}

TEST(ObjectTest, ValidateAsksValidatableMembersUntilOneFails) {
    DWXArray array;
    EXPECT_EQ(array.Validate(), 1);
    CountingObject plain;
    Checked bad(0), good1(1), good2(1);
    AddAll(array, {&plain, &bad, &good1, &good2});
    EXPECT_EQ(array.Validate(), 0);
    EXPECT_EQ(bad.nAsked + good1.nAsked + good2.nAsked, 1);
    array.Remove(&bad);
    EXPECT_EQ(array.Validate(), 1);
    EXPECT_EQ(good2.nAsked, 1);
}

TEST(ObjectTest, AddContainerOfItselfAddsEachMemberOnceMore) {
    CountingObject a, b;
    DWXArray array;
    DWXBag bag;
    DWXLinkedList list;
    HostContainer host;
    for (DWXContainer* container : std::vector<DWXContainer*>{&array, &bag, &list, &host}) {
        AddAll(*container, {&a, &b});
        container->AddContainer(container);
        EXPECT_EQ(Walk(*container), (Members{&a, &b, &a, &b})) << container->GetClassName();
        EXPECT_EQ(container->GetCount(), 4);
    }
}

TEST(ObjectTest, DestroyContentsDeletesEachMemberOnce) {
    DWXBag bag;
    DWXLinkedList list;
    DWXArray array;
    DWXPackedArray packed;
    HostContainer host;
    for (DWXContainer* container :
         std::vector<DWXContainer*>{&bag, &list, &array, &packed, &host}) {
        CountingObject::Reset();
        for (int i = 0; i < 5; ++i) {
            container->Add(new CountingObject(i));
        }
        container->AddContainer(container);  // every pointer twice
        container->DestroyContents();        // the non-virtual one
        EXPECT_EQ(container->IsEmpty(), 1) << container->GetClassName();
        EXPECT_EQ(CountingObject::destroyed, 5) << container->GetClassName();
    }
}

TEST(ObjectTest, DefaultEmptyStopsWhenRemoveRefuses) {
    CountingObject a, b;
    HostContainer host;
    AddAll(host, {&a, &b});
    host.Empty();
    EXPECT_EQ(host.GetCount(), 0);
    host.Add(&a);
    host.refuseRemove = true;
    host.Empty();  // must not spin for ever
    EXPECT_EQ(host.GetCount(), 1);
}

TEST(ObjectTest, RangeForVisitsWhatDWXIterVisits) {
    CountingObject a, b, c, d;
    DWXArray array, empty;
    DWXPackedArray packed;
    DWXBag bag;
    DWXLinkedList list;
    HostContainer host;
    for (DWXContainer* container :
         std::vector<DWXContainer*>{&array, &packed, &bag, &list, &host}) {
        AddAll(*container, {&a, &b, &c, &d});
        container->Remove(&b);  // a hole in the array, a move in the others
    }
    AddAll(bag, {nullptr, &b});  // a stored null ends a walk
    list.Insert(nullptr, list.Find(&c));
    for (const DWXContainer* container :
         std::vector<const DWXContainer*>{&array, &packed, &bag, &list, &host, &empty}) {
        Members visited;
        for (DWXObject* o : *container) {
            visited.push_back(o);
        }
        EXPECT_EQ(visited, Walk(*container)) << container->GetClassName();
        EXPECT_EQ(container->begin() == container->end(), visited.empty());
    }
    EXPECT_EQ(std::count(array.begin(), array.end(), &c), 1);
}

}  // namespace
