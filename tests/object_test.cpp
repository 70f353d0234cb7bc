#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxcmdline.h>
#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <type_traits>
#include <utility>
#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

// A container written by a host, on the defaults of DWXContainer.
class HostContainer : public DWXContainer {
  public:
    const char* GetClassName() const override { return "HostContainer"; }
    int IsMember(const DWXObject* o) override {
        return std::count(members.begin(), members.end(), o) > 0;
    }
    void Add(DWXObject* o) override { members.push_back(o), ++nCount; }
    int Remove(const DWXObject* o) override {
        auto found = std::find(members.begin(), members.end(), o);
        return refuseRemove || found == members.end() ? 0 : (members.erase(found), --nCount, 1);
    }
    std::vector<DWXObject*> members;
    bool refuseRemove = false;

  protected:
    DWXObject* Start(DWXIter* iter) const override { return SetPosition(iter, 0), Next(iter); }
    DWXObject* Next(DWXIter* iter) const override {
        const size_t at = static_cast<size_t>(GetPosition(iter));
        return at < members.size() ? (SetPosition(iter, at + 1), members[at]) : nullptr;
    }
};

// An unbound iterator yields nothing, and a position belongs to the container
// that set it: retargeted, a walk starts on the new container.
TEST(ObjectTest, Iterators) {
    DWXIter unbound(nullptr);
    EXPECT_EQ(unbound.Start(nullptr), nullptr);
    EXPECT_EQ(unbound.Next(), nullptr);
    CountingObject a, b, c;
    DWXArray array;
    DWXBag bag;
    DWXLinkedList list;
    const std::vector<DWXContainer*> all = {&array, &bag, &list};
    for (DWXContainer* container : all) {
        AddAll(*container, {&a, &b, &c});
    }
    for (DWXContainer* from : all) {
        for (DWXContainer* to : all) {
            DWXIter walk = from;
            walk.Next();
            walk.SetTarget(to);  // binds without starting
            EXPECT_EQ(walk.Current(), nullptr);
            EXPECT_EQ(walk.Next(), to == from ? &c : &a)
                << from->GetClassName() << " to " << to->GetClassName();
            walk.SetTarget(nullptr);
            walk.SetTarget(to);
            EXPECT_EQ(walk.Next(), &a);
        }
    }
}

// A list walk holds its node: changes elsewhere in the list are safe.
TEST(ObjectTest, ListWalksSurviveChangesAwayFromTheirNode) {
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
    // Bound with SetTarget and never started, a walk begins at the front.
    DWXIter unstarted;
    unstarted.SetTarget(&list);
    EXPECT_EQ(unstarted.Next(), &e);
    EXPECT_EQ(unstarted.Next(), &a);
}

// Hosts write `DWXIter iter = &array;` and pass containers where arrays are expected.
static_assert(std::is_convertible_v<DWXArray*, DWXIter> &&
                  std::is_convertible_v<DWXLinkedList*, DWXArray> &&
                  std::is_convertible_v<DWXBag*, DWXPackedArray> &&
                  std::is_convertible_v<DWXArray*, DWXBag> &&
                  std::is_convertible_v<const char*, DWXCmdLine>,
              "constructors from a container or a command string are implicit");

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
    bool bRemoveSelf = false, bSpawn = false;
    static std::vector<int> log;
};
std::vector<int> Meddler::log;

TEST(ObjectTest, DestroyContentsSurvivesDestructorsThatChangeTheContainer) {
    DWXArray array;
    DWXPackedArray packed;
    DWXBag bag;
    DWXLinkedList list;
    HostContainer host;
    // Removing sibling 1 moves the last member, 5, into its slot, ahead of the walk.
    const std::vector<int> ordered = {0, 1, 2, 3, 4, 5, 99}, moved = {0, 1, 5, 2, 3, 4, 99};
    const std::pair<DWXContainer*, std::vector<int>> cases[] = {
        {&array, ordered}, {&packed, moved}, {&bag, moved}, {&list, ordered}, {&host, ordered}};
    for (const auto& [container, log] : cases) {
        CountingObject::Reset();
        Meddler::log.clear();
        std::vector<Meddler*> m;
        for (int i = 0; i < 6; ++i) {
            m.push_back(new Meddler(i, container));
            container->Add(m.back());
        }
        container->Add(m[4]);    // held twice, and removes itself
        m[0]->poSibling = m[1];  // owner before its sibling
        m[3]->poSibling = m[2];  // owner after its sibling
        m[4]->bRemoveSelf = true;
        m[5]->bSpawn = true;
        container->DestroyContents();
        EXPECT_EQ(Meddler::log, log) << container->GetClassName();
        EXPECT_EQ(CountingObject::constructed, 7);
        EXPECT_EQ(CountingObject::Alive(), 0) << container->GetClassName();
        EXPECT_EQ(container->GetCount(), 0);
    }
}

// Empty and DestroyContents of a host's container, also when its Remove
// refuses; members that cannot check themselves pass Validate.
TEST(ObjectTest, HostContainerDefaults) {
    CountingObject a;
    HostContainer host;
    AddAll(host, {&a, &a});
    host.Empty();
    EXPECT_EQ(host.GetCount(), 0);
    auto* twice = new CountingObject;
    AddAll(host, {twice, new CountingObject, twice});
    host.refuseRemove = true;
    host.Empty();  // must not spin for ever
    EXPECT_EQ(host.GetCount(), 3);
    EXPECT_EQ(host.Validate(), 1);
    CountingObject::Reset();
    host.DestroyContents();  // deletes what the walk meets, each pointer once
    EXPECT_EQ(CountingObject::destroyed, 2);
    host.members.clear();
}

}  // namespace
