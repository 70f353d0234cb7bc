#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxcmdline.h>
#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <type_traits>
#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

// A container written by a host, on the defaults of DWXContainer.
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
    std::vector<DWXObject*> members;
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

TEST(ObjectTest, IteratorProtocol) {
    for (DWXIter iter : {DWXIter(), DWXIter(nullptr)}) {
        EXPECT_EQ(iter.Start(nullptr), nullptr);
        EXPECT_EQ(iter.Next(), nullptr);
        EXPECT_EQ(*iter, nullptr);
    }
    CountingObject a, b, c, d;
    DWXArray array;
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
    EXPECT_EQ(Captured([&](FILE* f) { iter.Dump(f), iter.Dump(nullptr); }), ObjectLine(&iter));
    EXPECT_EQ(ObjectLine(&iter).rfind("DWXIter:", 0), 0u);
}

// Hosts write `DWXIter iter = &array;` and pass containers where arrays are expected.
static_assert(std::is_convertible_v<DWXArray*, DWXIter> &&
                  std::is_convertible_v<DWXLinkedList*, DWXArray> &&
                  std::is_convertible_v<DWXBag*, DWXPackedArray> &&
                  std::is_convertible_v<DWXArray*, DWXBag> &&
                  std::is_convertible_v<const char*, DWXCmdLine>,
              "constructors from a container or a command string are implicit");

TEST(ObjectTest, RetargetingAnIteratorStartsOnTheNewContainer) {
    CountingObject a, b, c;
    DWXArray array;
    DWXBag bag;
    DWXLinkedList list;
    std::vector<DWXContainer*> all = {&array, &bag, &list};
    for (DWXContainer* container : all) {
        AddAll(*container, {&a, &b, &c});
    }
    for (DWXContainer* from : all) {
        for (DWXContainer* to : all) {
            DWXIter iter = from;
            iter.Next();
            iter.SetTarget(to);
            EXPECT_EQ(iter.Next(), to == from ? &c : &a)
                << from->GetClassName() << " to " << to->GetClassName();
            iter.SetTarget(nullptr);
            iter.SetTarget(to);
            EXPECT_EQ(iter.Next(), &a);
        }
    }
}

// A member that can check itself and counts how often it was asked.
class Checked : public DWXObject, public DWXValidatable {
  public:
    explicit Checked(int valid) : nValid(valid) {}
    const char* GetClassName() const override { return "Checked"; }
    int Validate() const override { return ++nAsked, nValid; }
    int nValid;
    mutable int nAsked = 0;
};

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

// Small and large containers, with no repeat, one pointer held twice far
// apart, and every pointer held twice; a host container whose Remove refuses
// is emptied through its walk instead.
TEST(ObjectTest, DestroyContentsDeletesEachMemberOnce) {
    struct Shape {
        int members;
        bool allTwice;
        int repeated;  // the member also added at the end, or -1
    } shapes[] = {{1, false, -1},  {1, true, -1},  {5, true, -1}, {2, false, 0},
                  {40, false, -1}, {40, false, 3}, {40, true, -1}};
    for (const Shape& shape : shapes) {
        DWXBag bag;
        DWXLinkedList list;
        DWXArray array;
        DWXPackedArray packed;
        HostContainer host, refusing;
        for (DWXContainer* container :
             std::vector<DWXContainer*>{&bag, &list, &array, &packed, &host, &refusing}) {
            CountingObject::Reset();
            std::vector<DWXObject*> added;
            for (int i = 0; i < shape.members; ++i) {
                added.push_back(new CountingObject(i));
                container->Add(added.back());
            }
            if (shape.allTwice) {
                container->AddContainer(container);
            }
            if (shape.repeated >= 0) {
                container->Add(added[static_cast<size_t>(shape.repeated)]);
            }
            refusing.refuseRemove = container == &refusing;
            container->DestroyContents();  // the non-virtual one
            const std::string where =
                std::string(container->GetClassName()) + " of " + std::to_string(shape.members);
            EXPECT_EQ(CountingObject::destroyed, shape.members) << where;
            EXPECT_EQ(container->IsEmpty(), container != &refusing) << where;
        }
        refusing.members.clear();  // what it would not give up is deleted
    }
}

// A member whose destructor changes the container it sits in, as members that
// own siblings do: it removes and deletes a sibling, removes itself, or adds a
// new member. Destructions are logged by id.
class Meddler : public CountingObject {
  public:
    Meddler(int id, DWXContainer* in) : CountingObject(id), poIn(in) {}
    ~Meddler() override {
        log.push_back(nValue);
        if (poSibling && poIn->Remove(poSibling)) {
            delete poSibling;
        }
        if (bRemoveSelf) {
            poIn->Remove(this);
        }
        if (bSpawn) {
            poIn->Add(new Meddler(99, poIn));
        }
    }
    DWXContainer* poIn;
    Meddler* poSibling = nullptr;
    bool bRemoveSelf = false;
    bool bSpawn = false;
    static std::vector<int> log;
};
std::vector<int> Meddler::log;

TEST(ObjectTest, DestroyContentsSurvivesDestructorsThatChangeTheContainer) {
    DWXArray array;
    DWXPackedArray packed;
    DWXBag bag;
    DWXLinkedList list;
    HostContainer host;
    const std::vector<int> inOrder = {0, 1, 2, 3, 4, 5, 99};
    // Removing sibling 1 moves the last member, 5, into its slot, ahead of the walk.
    const std::vector<int> lastMoved = {0, 1, 5, 2, 3, 4, 99};
    struct Case {
        DWXContainer* container;
        const std::vector<int>& log;
    } cases[] = {{&array, inOrder},
                 {&packed, lastMoved},
                 {&bag, lastMoved},
                 {&list, inOrder},
                 {&host, inOrder}};
    for (const Case& c : cases) {
        CountingObject::Reset();
        Meddler::log.clear();
        std::vector<Meddler*> m;
        for (int i = 0; i < 6; ++i) {
            m.push_back(new Meddler(i, c.container));
            c.container->Add(m.back());
        }
        c.container->Add(m[4]);  // held twice, and removes itself
        m[0]->poSibling = m[1];  // owner before its sibling
        m[3]->poSibling = m[2];  // owner after its sibling
        m[4]->bRemoveSelf = true;
        m[5]->bSpawn = true;
        c.container->DestroyContents();
        EXPECT_EQ(Meddler::log, c.log) << c.container->GetClassName();
        EXPECT_EQ(CountingObject::constructed, 7);
        EXPECT_EQ(CountingObject::Alive(), 0) << c.container->GetClassName();
        EXPECT_EQ(c.container->GetCount(), 0);
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
    EXPECT_EQ(Captured([&](FILE* f) { host.Dump(f), host.Dump(nullptr); }),
              "HostContainer:\n" + ObjectLine(&a));
}

}  // namespace
