#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <stdlib.h>
#include <algorithm>
#include <memory>
#include <random>
#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

using Array = SlotView<DWXArray>;
using Packed = SlotView<DWXPackedArray>;
using Members = std::vector<DWXObject*>;

// Slot contents below the top, empty slots as null.
template <typename View>
Members Slots(const View& array) {
    Members slots;
    for (int i = 0; i < array.Top(); ++i) {
        slots.push_back(array[i]);
    }
    return slots;
}

int ByValue(const void* a, const void* b) {
    int x = static_cast<CountingObject*>(*static_cast<DWXObject* const*>(a))->nValue;
    int y = static_cast<CountingObject*>(*static_cast<DWXObject* const*>(b))->nValue;
    return x < y ? -1 : (x > y ? 1 : 0);
}

int IntOrder(const void* a, const void* b) {
    int x = *static_cast<const int*>(a);
    int y = *static_cast<const int*>(b);
    return x < y ? -1 : (x > y ? 1 : 0);
}

class ArrayTest : public ::testing::Test {
  protected:
    CountingObject a{1}, b{2}, c{3}, d{4}, x{9};
};

TEST_F(ArrayTest, GrowsTo64ThenDoubles) {
    std::vector<CountingObject> objects(129);
    Array array;
    EXPECT_EQ(array.Capacity(), 0);
    EXPECT_FALSE(array.HasBuffer());
    for (int i = 0; i < 129; ++i) {
        array.Add(&objects[i]);
        int expected = i < 64 ? 64 : (i < 128 ? 128 : 256);
        ASSERT_EQ(array.Capacity(), expected) << "after Add " << i + 1;
    }
    EXPECT_EQ(array.GetCount(), 129);
    EXPECT_EQ(array.GetMaxIndex(), 129);
}

TEST_F(ArrayTest, SetAtGrowsToTwiceTheIndex) {
    Array array;
    array.SetAt(10, &x);
    EXPECT_EQ(array.Capacity(), 20);
    EXPECT_EQ(array.Top(), 11);
    EXPECT_EQ(array.GetCount(), 1);
    for (int i = 0; i < 10; ++i) {
        EXPECT_EQ(array[i], nullptr);
    }
    array.SetAt(10, nullptr);
    EXPECT_EQ(array.GetCount(), 0);
    EXPECT_EQ(array.GetMaxIndex(), 0);

    Array far;
    far.SetAt(100, &x);
    EXPECT_EQ(far.Capacity(), 200);
    Array zero;
    zero.SetAt(0, &x);
    EXPECT_EQ(zero.Capacity(), 64);
}

TEST_F(ArrayTest, SetAtOverAnOccupiedSlotForgetsTheOldMember) {
    CountingObject::Reset();
    Array array;
    array.Add(new CountingObject(1));
    DWXObject* forgotten = array[0];
    array.SetAt(0, new CountingObject(2));
    EXPECT_EQ(array.GetCount(), 1);
    EXPECT_EQ(CountingObject::destroyed, 0);
    array.DestroyContents();
    EXPECT_EQ(CountingObject::destroyed, 1);
    EXPECT_EQ(array.GetCount(), 0);
    EXPECT_FALSE(array.HasBuffer());
    delete forgotten;
}

TEST_F(ArrayTest, RemoveLeavesHolesThatAddDoesNotFill) {
    Array array;
    array.Add(&a);
    array.Add(&b);
    array.Add(&c);
    EXPECT_EQ(array.Remove(&b), 1);
    EXPECT_EQ(array.GetCount(), 2);
    EXPECT_EQ(array.GetMaxIndex(), 3);
    EXPECT_EQ(array[1], nullptr);
    EXPECT_EQ(Walk(array), (Members{&a, &c}));
    array.Add(&d);
    EXPECT_EQ(array.GetIndex(&d), 3);

    // Trailing empty slots are reused, the hole at 1 too once it trails.
    EXPECT_EQ(array.Remove(&d), 1);
    array.Add(&x);
    EXPECT_EQ(Slots(array), (Members{&a, nullptr, &c, &x}));
    EXPECT_EQ(array.Remove(&x), 1);
    EXPECT_EQ(array.Remove(&c), 1);
    array.Add(&x);
    EXPECT_EQ(Slots(array), (Members{&a, &x}));
    EXPECT_EQ(array.Remove(&b), 0);
}

TEST_F(ArrayTest, RemovingTheLastMemberFreesTheBuffer) {
    Array array;
    array.Add(&a);
    array.Add(&a);
    EXPECT_EQ(array.Remove(&a), 1);  // only the first occurrence goes
    EXPECT_EQ(Slots(array), (Members{nullptr, &a}));
    EXPECT_EQ(array.Remove(&a), 1);
    EXPECT_EQ(array.GetCount(), 0);
    EXPECT_EQ(array.GetMaxIndex(), 0);
    EXPECT_EQ(array.Capacity(), 0);
    EXPECT_FALSE(array.HasBuffer());
    EXPECT_EQ(array[0], nullptr);
}

TEST_F(ArrayTest, NullPointerIsNeverAMember) {
    Array array;
    array.Add(nullptr);
    EXPECT_EQ(array.GetCount(), 0);
    array.SetAt(3, &a);  // slots 0 to 2 empty
    EXPECT_EQ(array.IsMember(nullptr), 0);
    EXPECT_EQ(array.GetIndex(nullptr), -1);
    EXPECT_EQ(array.Remove(nullptr), 0);
    EXPECT_EQ(array.GetCount(), 1);
    EXPECT_EQ(array.IsMember(&a), 1);
    EXPECT_EQ(array.GetIndex(&b), -1);
}

TEST_F(ArrayTest, IndexBoundsAreTheCapacity) {
    Array array;
    EXPECT_EQ(array[0], nullptr);
    array.Add(&a);
    EXPECT_EQ(array[-1], nullptr);
    EXPECT_EQ(array[63], nullptr);
    EXPECT_EQ(array[64], nullptr);
    EXPECT_EQ(array[0], &a);
}

TEST_F(ArrayTest, NegativeIndexesChangeNothing) {
    Array array;
    array.Add(&a);
    array.SetAt(-1, &b);
    array.InsertAt(-5, &b);
    EXPECT_EQ(array.GetCount(), 1);
    EXPECT_EQ(Slots(array), (Members{&a}));
    EXPECT_EQ(array.Capacity(), 64);
}

TEST_F(ArrayTest, InsertAtShiftsOrLeavesHoles) {
    Array array;
    array.Add(&a);
    array.Add(&b);
    array.InsertAt(0, &x);
    EXPECT_EQ(Slots(array), (Members{&x, &a, &b}));

    Array sparse;
    sparse.Add(&a);
    sparse.Add(&b);
    sparse.InsertAt(5, &x);
    EXPECT_EQ(Slots(sparse), (Members{&a, &b, nullptr, nullptr, nullptr, &x}));
    EXPECT_EQ(sparse.Top(), 6);
    EXPECT_EQ(sparse.GetCount(), 3);

    // A null object inserts an empty slot.
    sparse.InsertAt(1, nullptr);
    EXPECT_EQ(Slots(sparse), (Members{&a, nullptr, &b, nullptr, nullptr, nullptr, &x}));
    EXPECT_EQ(sparse.GetCount(), 3);

    // Inserting into a full buffer grows it.
    std::vector<CountingObject> objects(64);
    Array full;
    for (auto& o : objects) {
        full.Add(&o);
    }
    full.InsertAt(10, &x);
    EXPECT_EQ(full.Capacity(), 128);
    EXPECT_EQ(full[10], &x);
    EXPECT_EQ(full[64], &objects[63]);
    EXPECT_EQ(full.GetCount(), 65);
}

TEST_F(ArrayTest, PackAndReverseCloseHoles) {
    Array array;
    array.SetAt(0, &a);
    array.SetAt(2, &b);
    array.SetAt(4, &c);
    array.Pack();
    EXPECT_EQ(Slots(array), (Members{&a, &b, &c}));
    EXPECT_EQ(array.Capacity(), 64);

    Array reversed;
    reversed.SetAt(0, &a);
    reversed.SetAt(2, &b);
    reversed.Reverse();
    EXPECT_EQ(Slots(reversed), (Members{&b, &a}));
    EXPECT_EQ(reversed[2], nullptr);
    Array empty;
    empty.Reverse();
    empty.Pack();
    EXPECT_FALSE(empty.HasBuffer());
}

TEST_F(ArrayTest, BothSortsPackFirst) {
    for (bool standard : {false, true}) {
        Array array;
        array.SetAt(0, &c);
        array.SetAt(2, &a);
        array.SetAt(3, &b);
        standard ? array.StandartSort(ByValue) : array.Sort(ByValue);
        EXPECT_EQ(Slots(array), (Members{&a, &b, &c}));
        array.Sort(nullptr);  // no comparator: nothing happens
        EXPECT_EQ(Slots(array), (Members{&a, &b, &c}));
    }
}

TEST_F(ArrayTest, SortsAgreeWithQsortOnRandomData) {
    std::mt19937 random(20240611);
    for (int size : {0, 1, 2, 3, 5, 8, 17, 64, 100, 1000, 5000}) {
        for (int range : {3, 1000000}) {  // many equal values, then few
            std::vector<std::unique_ptr<CountingObject>> objects;
            std::vector<int> values;
            for (int i = 0; i < size; ++i) {
                values.push_back(static_cast<int>(random() % range));
                objects.push_back(std::make_unique<CountingObject>(values.back()));
            }
            qsort(values.data(), values.size(), sizeof(int), IntOrder);
            for (bool standard : {false, true}) {
                Array array;
                for (auto& o : objects) {
                    array.Add(o.get());
                }
                standard ? array.StandartSort(ByValue) : array.Sort(ByValue);
                ASSERT_EQ(array.GetCount(), size);
                std::vector<int> sorted;
                for (int i = 0; i < size; ++i) {
                    sorted.push_back(static_cast<CountingObject*>(array[i])->nValue);
                    ASSERT_EQ(array.IsMember(objects[i].get()), 1);
                }
                ASSERT_EQ(sorted, values) << "size " << size << " standard " << standard;
            }
        }
    }
}

TEST_F(ArrayTest, SortHandlesAdversarialOrders) {
    // Already sorted, reversed, all equal and organ-pipe inputs.
    const int n = 20000;
    std::vector<std::vector<int>> inputs(4);
    for (int i = 0; i < n; ++i) {
        inputs[0].push_back(i);
        inputs[1].push_back(n - i);
        inputs[2].push_back(7);
        inputs[3].push_back(i < n / 2 ? i : n - i);
    }
    for (auto& input : inputs) {
        std::vector<std::unique_ptr<CountingObject>> objects;
        Array array;
        for (int v : input) {
            objects.push_back(std::make_unique<CountingObject>(v));
            array.Add(objects.back().get());
        }
        array.Sort(ByValue);
        std::sort(input.begin(), input.end());
        for (int i = 0; i < n; ++i) {
            ASSERT_EQ(static_cast<CountingObject*>(array[i])->nValue, input[i]);
        }
    }
}

TEST_F(ArrayTest, DumpPrefixesEachOccupiedSlot) {
    Array array;
    EXPECT_EQ(Captured([&](FILE* f) { array.Dump(f); }), "");
    array.SetAt(0, &a);
    array.SetAt(2, &b);
    EXPECT_EQ(Captured([&](FILE* f) { array.Dump(f); }),
              "DWXArray[0]:" + ObjectLine(&a) + "DWXArray[2]:" + ObjectLine(&b));

    Packed packed;
    packed.Add(&c);
    EXPECT_EQ(Captured([&](FILE* f) { packed.Dump(f); }), "DWXPackedArray[0]:" + ObjectLine(&c));
}

TEST_F(ArrayTest, CopiesHaveOwnBuffersWithoutHoles) {
    Array source;
    source.SetAt(1, &a);
    source.SetAt(5, &b);

    Array copy(source);
    EXPECT_EQ(Slots(copy), (Members{&a, &b}));
    Array assigned;
    assigned.Add(&c);
    assigned = source;
    EXPECT_EQ(Slots(assigned), (Members{&a, &b}));
    EXPECT_EQ(assigned.Capacity(), 2);
    assigned = *&assigned;
    EXPECT_EQ(Slots(assigned), (Members{&a, &b}));

    // Each copy frees its own buffer; changing one leaves the other alone.
    copy.Remove(&a);
    EXPECT_EQ(Walk(source), (Members{&a, &b}));
    assigned.Add(&d);
    EXPECT_EQ(assigned.Capacity(), 4);

    DWXArray empty;
    assigned = empty;
    EXPECT_EQ(assigned.GetCount(), 0);
    assigned.Add(&a);
    EXPECT_EQ(assigned.Capacity(), 64);
}

TEST_F(ArrayTest, ConstructsFromAnyContainer) {
    DWXLinkedList list;
    list.Append(&a);
    list.Append(&b);
    Array array(&list);
    EXPECT_EQ(Slots(array), (Members{&a, &b}));
    EXPECT_EQ(array.Capacity(), 2);
    array.Add(&c);
    EXPECT_EQ(array.Capacity(), 4);

    Array fromNull(nullptr);
    EXPECT_EQ(fromNull.GetCount(), 0);
    EXPECT_FALSE(fromNull.HasBuffer());
    Packed packedFromNull(nullptr);
    EXPECT_EQ(packedFromNull.GetCount(), 0);
}

TEST_F(ArrayTest, WalksSurviveChanges) {
    Array array;
    array.Add(&a);
    array.Add(&b);
    array.Add(&c);
    DWXIter iter(&array);
    EXPECT_EQ(*iter, &a);
    array.Remove(&a);  // the member just yielded
    array.Remove(&b);  // a member not yet reached
    array.Add(&d);     // added above the walk's position
    EXPECT_EQ(iter.Next(), &c);
    EXPECT_EQ(iter.Next(), &d);
    EXPECT_EQ(iter.Next(), nullptr);
    EXPECT_EQ(iter.Next(), nullptr);

    // The walk ends when the buffer goes.
    DWXIter second(&array);
    array.Empty();
    EXPECT_EQ(second.Next(), nullptr);
    array.Add(&a);
    DWXIter third(&array);
    array.Remove(&a);
    EXPECT_EQ(third.Next(), nullptr);
}

TEST_F(ArrayTest, DestroyContentsDeletesEachSlotOnce) {
    CountingObject::Reset();
    Array array;
    auto* shared = new CountingObject(0);
    array.Add(shared);
    array.SetAt(4, new CountingObject(1));
    array.SetAt(6, shared);
    DWXArray* asArray = &array;
    asArray->DestroyContents();  // the array's own, virtual one
    EXPECT_EQ(CountingObject::constructed, 2);
    EXPECT_EQ(CountingObject::destroyed, 2);
    EXPECT_EQ(array.GetCount(), 0);
    EXPECT_FALSE(array.HasBuffer());
}

TEST_F(ArrayTest, PackedRemoveMovesTheLastMember) {
    Packed packed;
    for (DWXObject* o : {&a, &b, &c, &d}) {
        packed.Add(o);
    }
    EXPECT_EQ(packed.Remove(&b), 1);
    EXPECT_EQ(Slots(packed), (Members{&a, &d, &c}));
    EXPECT_EQ(packed.Remove(&b), 0);
    EXPECT_EQ(Slots(packed), (Members{&a, &d, &c}));
    EXPECT_EQ(packed.Remove(&c), 1);
    EXPECT_EQ(Slots(packed), (Members{&a, &d}));
    EXPECT_EQ(packed[2], nullptr);
    EXPECT_EQ(packed.Remove(nullptr), 0);

    // A trailing empty slot left by SetAt does not fill the gap.
    packed.SetAt(5, &x);
    packed.SetAt(5, nullptr);
    EXPECT_EQ(packed.Remove(&a), 1);
    EXPECT_EQ(Slots(packed), (Members{&d}));
    EXPECT_EQ(packed.GetCount(), 1);

    EXPECT_EQ(packed.Remove(&d), 1);
    EXPECT_EQ(packed.Capacity(), 0);
    EXPECT_FALSE(packed.HasBuffer());

    Packed source;
    source.SetAt(3, &a);
    Packed copy(source);
    EXPECT_EQ(Slots(copy), (Members{&a}));
    copy = source;
    copy = *&copy;
    EXPECT_EQ(Slots(copy), (Members{&a}));
}

}  // namespace
