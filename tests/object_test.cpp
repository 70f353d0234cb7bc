#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

// A member that can check itself and remembers whether it was asked.
class Checked : public DWXObject, public DWXValidatable {
  public:
    explicit Checked(int valid) : nValid(valid) {}
    const char* GetClassName() const override { return "Checked"; }
    int Validate() const override {
        ++nAsked;
        return nValid;
    }
    int nValid;
    mutable int nAsked = 0;
};

// A container written by a host: a plain vector without its own Empty, so the
// default Empty of DWXContainer runs.
class VectorContainer : public DWXContainer {
  public:
    const char* GetClassName() const override { return "VectorContainer"; }
    int IsMember(const DWXObject* object) override {
        for (DWXObject* member : members) {
            if (member == object) {
                return 1;
            }
        }
        return 0;
    }
    void Add(DWXObject* object) override {
        members.push_back(object);
        ++nCount;
    }
    int Remove(const DWXObject* object) override {
        if (refuseRemove) {
            return 0;
        }
        for (size_t i = 0; i < members.size(); ++i) {
            if (members[i] == object) {
                members.erase(members.begin() + i);
                --nCount;
                return 1;
            }
        }
        return 0;
    }
    std::vector<DWXObject*> members;
    bool refuseRemove = false;

  protected:
    DWXObject* Start(DWXIter* iter) const override {
        SetPosition(iter, 0);
        return Next(iter);
    }
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

    DWXBag bag;
    EXPECT_EQ(Captured([&](FILE* f) { bag.Dump(f); }), "DWXBag:\n");
    CountingObject a, b;
    bag.Add(&a);
    bag.Add(&b);
    EXPECT_EQ(Captured([&](FILE* f) { bag.Dump(f); }),
              "DWXBag:\n" + ObjectLine(&a) + ObjectLine(&b));

    // A null stream is not written to.
    iter.Dump(nullptr);
    bag.Dump(nullptr);
}

TEST(ObjectTest, UnboundIteratorsYieldNothing) {
    DWXIter unbound;
    DWXIter onNull(nullptr);
    for (DWXIter* iter : {&unbound, &onNull}) {
        EXPECT_EQ(iter->Start(nullptr), nullptr);
        EXPECT_EQ(iter->Next(), nullptr);
        EXPECT_EQ(**iter, nullptr);
        EXPECT_EQ((++*iter).Current(), nullptr);
    }
}

TEST(ObjectTest, IteratorRestartsAndCopiesWalkIndependently) {
    CountingObject a, b, c, d;
    DWXArray array;
    for (DWXObject* o : {&a, &b, &c, &d}) {
        array.Add(o);
    }
    DWXIter iter(&array);
    EXPECT_EQ(*iter, &a);  // a new iterator stands on the first member
    EXPECT_EQ(iter.Next(), &b);

    DWXIter copy(iter);
    EXPECT_EQ(copy.Current(), &b);
    EXPECT_EQ(copy.Next(), &c);
    EXPECT_EQ(copy.Next(), &d);
    EXPECT_EQ(copy.Next(), nullptr);
    EXPECT_EQ(copy.Next(), nullptr);
    EXPECT_EQ(iter.Current(), &b);  // the source did not move
    EXPECT_EQ((++iter).Current(), &c);

    DWXIter assigned;
    assigned = iter;
    EXPECT_EQ(assigned.Next(), &d);
    EXPECT_EQ(iter.Start(nullptr), &a);  // restarts the bound container
    EXPECT_EQ(iter.Next(), &b);

    // SetTarget binds without starting; Start begins the walk.
    DWXBag bag;
    bag.Add(&d);
    iter.SetTarget(&bag);
    EXPECT_EQ(iter.Current(), nullptr);
    EXPECT_EQ(iter.Start(), &d);
    EXPECT_EQ(iter.Next(), nullptr);
}

TEST(ObjectTest, ValidateAsksValidatableMembersUntilOneFails) {
    DWXArray array;
    EXPECT_EQ(array.Validate(), 1);
    CountingObject plain;
    array.Add(&plain);
    EXPECT_EQ(array.Validate(), 1);

    Checked bad(0), good1(1), good2(1);
    array.Add(&bad);
    array.Add(&good1);
    array.Add(&good2);
    EXPECT_EQ(array.Validate(), 0);
    EXPECT_EQ(bad.nAsked, 1);
    EXPECT_EQ(good1.nAsked, 0);
    EXPECT_EQ(good2.nAsked, 0);

    array.Remove(&bad);
    EXPECT_EQ(array.Validate(), 1);
    EXPECT_EQ(good1.nAsked, 1);
    EXPECT_EQ(good2.nAsked, 1);
}

TEST(ObjectTest, AddContainerSharesMembersInWalkOrder) {
    CountingObject a, b, c;
    DWXLinkedList source;
    source.Append(&a);
    source.Append(&b);
    source.Append(&c);
    DWXArray array;
    EXPECT_EQ(array.IsEmpty(), 1);
    array.AddContainer(&source);
    EXPECT_EQ(Walk(array), (std::vector<DWXObject*>{&a, &b, &c}));
    EXPECT_EQ(array.IsEmpty(), 0);
    EXPECT_EQ(source.GetCount(), 3);
    EXPECT_EQ(Walk(source), (std::vector<DWXObject*>{&a, &b, &c}));

    array.AddContainer(nullptr);
    EXPECT_EQ(array.GetCount(), 3);
}

TEST(ObjectTest, AddContainerOfItselfAddsEachMemberOnceMore) {
    CountingObject a, b;
    DWXArray array;
    DWXBag bag;
    DWXLinkedList list;
    for (DWXContainer* container : std::vector<DWXContainer*>{&array, &bag, &list}) {
        container->Add(&a);
        container->Add(&b);
        container->AddContainer(container);
        EXPECT_EQ(container->GetCount(), 4) << container->GetClassName();
        EXPECT_EQ(Walk(*container), (std::vector<DWXObject*>{&a, &b, &a, &b}));
    }
}

TEST(ObjectTest, DestroyContentsDeletesEachMemberOnce) {
    CountingObject::Reset();
    DWXBag bag;
    DWXLinkedList list;
    DWXArray array;
    DWXPackedArray packed;
    for (DWXContainer* container : std::vector<DWXContainer*>{&bag, &list, &array, &packed}) {
        CountingObject::Reset();
        for (int i = 0; i < 5; ++i) {
            container->Add(new CountingObject(i));
        }
        // The same pointer twice must not be deleted twice.
        container->AddContainer(container);
        EXPECT_EQ(container->GetCount(), 10);
        container->DestroyContents();  // the non-virtual one, through DWXContainer*
        EXPECT_EQ(container->GetCount(), 0) << container->GetClassName();
        EXPECT_EQ(CountingObject::destroyed, 5) << container->GetClassName();
        EXPECT_EQ(CountingObject::Alive(), 0);
        container->Add(&bag);  // still usable
        EXPECT_EQ(container->GetCount(), 1);
    }
}

TEST(ObjectTest, DefaultEmptyRemovesEveryMemberWithoutDeleting) {
    CountingObject::Reset();
    CountingObject a, b, c;
    VectorContainer host;
    host.Add(&a);
    host.Add(&b);
    host.Add(&c);
    EXPECT_EQ(Captured([&](FILE* f) { host.Dump(f); }),
              "VectorContainer:\n" + ObjectLine(&a) + ObjectLine(&b) + ObjectLine(&c));
    host.Empty();
    EXPECT_EQ(host.GetCount(), 0);
    EXPECT_EQ(CountingObject::destroyed, 0);

    // A Remove that refuses must not make Empty spin for ever.
    host.Add(&a);
    host.refuseRemove = true;
    host.Empty();
    EXPECT_EQ(host.GetCount(), 1);
}

}  // namespace
