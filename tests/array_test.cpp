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

int ByValue(const void* a, const void* b) {
    int x = static_cast<CountingObject*>(*static_cast<DWXObject* const*>(a))->nValue;
    int y = static_cast<CountingObject*>(*static_cast<DWXObject* const*>(b))->nValue;
    return (x > y) - (x < y);
}

int IntOrder(const void* a, const void* b) {
    return (*static_cast<const int*>(a) > *static_cast<const int*>(b)) -
           (*static_cast<const int*>(a) < *static_cast<const int*>(b));
}

class ArrayTest : public ::testing::Test {
  protected:
    CountingObject a{1}, b{2}, c{3}, d{4}, x{9};
};

TEST_F(ArrayTest, Growth) {
    std::vector<CountingObject> objects(129);
    Array array;
    for (int i = 0; i < 129; ++i) {
        array.Add(&objects[i]);
        ASSERT_EQ(array.Capacity(), i < 64 ? 64 : (i < 128 ? 128 : 256)) << "Add " << i + 1;
    }
    Array set;
    set.SetAt(10, &x);  // twice the index
    EXPECT_EQ(set.Capacity(), 20);
    Members expected(10, nullptr);
    expected.push_back(&x);
    EXPECT_EQ(set.Slots(), expected);
    EXPECT_EQ(set.GetCount(), 1);
    set.SetAt(10, nullptr);
    EXPECT_EQ(set.GetCount() + set.GetMaxIndex(), 0);
    set.SetAt(100, &x);
    EXPECT_EQ(set.Capacity(), 200);
}

TEST_F(ArrayTest, HolesAndTrailingSlots) {
    Array array;
    AddAll(array, {&a, &b, &c});
    EXPECT_EQ(array.Remove(&b), 1);
    EXPECT_EQ(array.GetCount(), 2);
    EXPECT_EQ(array.GetMaxIndex(), 3);
    EXPECT_EQ(Walk(array), (Members{&a, &c}));
    array.Add(&d);  // a hole below an occupied slot stays
    EXPECT_EQ(array.Slots(), (Members{&a, nullptr, &c, &d}));
    array.Remove(&d);
    array.Remove(&c);
    array.Add(&x);  // trailing empty slots are reused
    EXPECT_EQ(array.Slots(), (Members{&a, &x}));
    array.Add(&a);  // only the first of two occurrences goes
    EXPECT_EQ(array.Remove(&a), 1);
    EXPECT_EQ(array.GetIndex(&a), 2);
    array.Remove(&x);
    array.Remove(&a);  // the last member frees the buffer
    EXPECT_EQ(array.GetMaxIndex() + array.Capacity(), 0);
    EXPECT_FALSE(array.HasBuffer());
    EXPECT_EQ(array[0], nullptr);
}

TEST_F(ArrayTest, BadArgumentsChangeNothing) {
    Array array;
    array.Add(nullptr);
    EXPECT_EQ(array.GetCount(), 0);
    array.SetAt(3, &a);  // slots 0 to 2 empty; null must not match them
    EXPECT_EQ(array.IsMember(nullptr), 0);
    EXPECT_EQ(array.GetIndex(nullptr), -1);
    EXPECT_EQ(array.Remove(nullptr), 0);
    array.SetAt(-1, &b);
    array.InsertAt(-5, &b);
    EXPECT_EQ(array.Slots(), (Members{nullptr, nullptr, nullptr, &a}));
    EXPECT_EQ(array.GetCount(), 1);
    EXPECT_EQ(array[-1], nullptr);
    EXPECT_EQ(array[array.Capacity()], nullptr);
    Array fromNull(nullptr);
    Packed packedFromNull(nullptr);
    EXPECT_EQ(fromNull.GetCount() + packedFromNull.GetCount(), 0);
    EXPECT_FALSE(fromNull.HasBuffer());
}

TEST_F(ArrayTest, InsertAt) {
    Array array;
    AddAll(array, {&a, &b});
    array.InsertAt(0, &x);
    array.InsertAt(6, &c);
    array.InsertAt(1, nullptr);  // an empty slot
    EXPECT_EQ(array.Slots(), (Members{&x, nullptr, &a, &b, nullptr, nullptr, nullptr, &c}));
    EXPECT_EQ(array.GetCount(), 4);
    while (array.Top() < 64) {
        array.SetAt(array.Top(), &d);
    }
    array.InsertAt(10, &x);  // a full buffer grows
    EXPECT_EQ(array.Capacity(), 128);
    EXPECT_EQ(array.Top(), 65);
    EXPECT_EQ(array[10], &x);
}

TEST_F(ArrayTest, ReorderingClosesHoles) {
    Array array;
    array.SetAt(0, &a);
    array.SetAt(2, &b);
    array.SetAt(4, &c);
    array.Pack();
    array.Reverse();
    EXPECT_EQ(array.Slots(), (Members{&c, &b, &a}));
    EXPECT_EQ(array.Capacity(), 64);
    using Compare = int (*)(const void*, const void*);
    for (Compare compare : {Compare(ByValue), Compare(nullptr)}) {
        for (bool standard : {false, true}) {
            Array sorted;
            sorted.SetAt(0, &c);
            sorted.SetAt(2, &a);
            sorted.SetAt(3, &b);
            standard ? sorted.StandartSort(compare) : sorted.Sort(compare);
            // Without a comparator the array is still packed.
            EXPECT_EQ(sorted.Slots(), compare ? (Members{&a, &b, &c}) : (Members{&c, &a, &b}));
        }
    }
}

TEST_F(ArrayTest, SortsAgreeWithQsort) {
    std::mt19937 random(20240611);
    std::vector<std::vector<int>> inputs;
    for (int size : {0, 1, 2, 3, 5, 8, 17, 100, 1000, 5000}) {
        for (int range : {3, 1000000}) {  // many equal values, then few
            inputs.emplace_back();
            for (int i = 0; i < size; ++i) {
                inputs.back().push_back(static_cast<int>(random() % range));
            }
        }
    }
    // Sorted, reversed and organ-pipe orders, which push a naive quicksort deep.
    inputs.resize(inputs.size() + 3);
    for (int i = 0; i < 20000; ++i) {
        inputs[inputs.size() - 3].push_back(i);
        inputs[inputs.size() - 2].push_back(-i);
        inputs[inputs.size() - 1].push_back(i < 10000 ? i : 20000 - i);
    }
    for (std::vector<int>& values : inputs) {
        std::vector<std::unique_ptr<CountingObject>> objects;
        for (int v : values) {
            objects.push_back(std::make_unique<CountingObject>(v));
        }
        if (!values.empty()) {  // qsort takes no null array, even empty
            qsort(values.data(), values.size(), sizeof(int), IntOrder);
        }
        for (bool standard : {false, true}) {
            Array array;
            for (auto& o : objects) {
                array.Add(o.get());
            }
            standard ? array.StandartSort(ByValue) : array.Sort(ByValue);
            std::vector<int> sorted;
            for (DWXObject* o : array.Slots()) {
                sorted.push_back(static_cast<CountingObject*>(o)->nValue);
            }
            ASSERT_EQ(sorted, values) << "standard " << standard;
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
    copy.Remove(&a);
    EXPECT_EQ(Walk(source), (Members{&a, &b}));
    Array assigned;
    assigned.Add(&c);
    assigned = source;
    assigned = *&assigned;
    EXPECT_EQ(assigned.Slots(), (Members{&a, &b}));
    EXPECT_EQ(assigned.Capacity(), 2);
    assigned.Add(&d);
    EXPECT_EQ(assigned.Capacity(), 4);
    assigned = DWXArray();
    EXPECT_EQ(assigned.GetCount(), 0);
}

TEST_F(ArrayTest, WalksSurviveChanges) {
    Array array;
    AddAll(array, {&a, &b, &c});
    DWXIter iter(&array);
    array.Remove(&a);  // the member just yielded
    array.Remove(&b);  // a member not yet reached
    array.Add(&d);     // added above the walk's position
    EXPECT_EQ(iter.Next(), &c);
    EXPECT_EQ(iter.Next(), &d);
    EXPECT_EQ(iter.Next(), nullptr);
    EXPECT_EQ(iter.Next(), nullptr);
    iter.Start();
    array.Empty();  // the walk ends with the buffer
    EXPECT_EQ(iter.Next(), nullptr);
}

TEST_F(ArrayTest, DestroyContentsDeletesEachHeldMemberOnce) {
    CountingObject::Reset();
    Array array;
    auto* shared = new CountingObject(0);
    auto* forgotten = new CountingObject(1);
    array.Add(shared);
    array.SetAt(4, forgotten);
    array.SetAt(4, new CountingObject(2));  // forgets, does not delete
    array.SetAt(6, shared);
    EXPECT_EQ(array.GetCount(), 3);
    EXPECT_EQ(CountingObject::destroyed, 0);
    static_cast<DWXArray&>(array).DestroyContents();  // the array's own
    EXPECT_EQ(CountingObject::destroyed, 2);
    EXPECT_EQ(array.GetCount(), 0);
    EXPECT_FALSE(array.HasBuffer());
    delete forgotten;
}

TEST_F(ArrayTest, PackedRemoveMovesTheLastMember) {
    Packed packed;
    AddAll(packed, {&a, &b, &c, &d});
    EXPECT_EQ(packed.Remove(&b), 1);
    EXPECT_EQ(packed.Slots(), (Members{&a, &d, &c}));
    EXPECT_EQ(packed.Remove(&b), 0);
    EXPECT_EQ(packed.Remove(&c), 1);
    EXPECT_EQ(packed[2], nullptr);
    packed.SetAt(5, &x);  // a trailing empty slot must not fill the gap
    packed.SetAt(5, nullptr);
    EXPECT_EQ(packed.Remove(&a), 1);
    EXPECT_EQ(packed.Slots(), (Members{&d}));
    EXPECT_EQ(packed.Remove(&d), 1);
    EXPECT_FALSE(packed.HasBuffer());
    EXPECT_EQ(packed.Capacity(), 0);
}

}  // namespace

namespace {

// Random adds, removals, stores and inserts against a plain list of slots: the
// members, their slots and the walk must agree after every step, so an Add
// that skipped the reuse of trailing empty slots would show.
TEST_F(ArrayTest, AddsAgreeWithASlotModel) {
    std::vector<CountingObject> items(24);
    std::mt19937 random(917);
    SlotView<DWXArray> array;
    std::vector<DWXObject*> slots;
    for (int step = 0; step < 2000; ++step) {
        DWXObject* item = random() % 5 ? &items[random() % items.size()] : nullptr;
        size_t index = random() % (slots.size() + 4);  // mostly near the top
        unsigned operation = random() % 6;
        if (operation < 3) {
            array.Add(item);
            while (item && !slots.empty() && !slots.back())
                slots.pop_back();  // Add reuses trailing empty slots
            if (item)
                slots.push_back(item);
        } else if (operation == 3) {
            if (array.Remove(item)) {
                *std::find(slots.begin(), slots.end(), item) = nullptr;
            }
        } else if (operation == 4) {
            array.SetAt(static_cast<int>(index), item);
            slots.resize(std::max(slots.size(), index + 1));
            slots[index] = item;
        } else {
            array.InsertAt(static_cast<int>(index), item);
            slots.resize(std::max(slots.size(), index));
            slots.insert(slots.begin() + static_cast<long>(index), item);
        }
        std::vector<DWXObject*> members;
        for (size_t i = 0; i < slots.size() + 2; ++i) {
            DWXObject* slot = i < slots.size() ? slots[i] : nullptr;
            ASSERT_EQ(array[static_cast<int>(i)], slot) << "slot " << i << " at step " << step;
            if (slot)
                members.push_back(slot);
        }
        ASSERT_EQ(Walk(array), members) << "step " << step;
        ASSERT_EQ(array.GetCount(), static_cast<int>(members.size()));
    }
}

}  // namespace
