#include "../fuzz/container_model.h"
#include "container_test_util.h"
#include "counting_object.h"

#include <dwxcore/dwxobject.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

using container_model::Members;
using container_model::Walk;
using Array = SlotView<DWXArray>;

// The fuzz target's input, drawn from a seeded generator instead.
struct Seeded {
    std::mt19937 random;
    bool Empty() const { return false; }
    int Range(int low, int high) { return low + static_cast<int>(random() % (high - low + 1)); }
    bool Flag() { return random() & 1; }
};

// Adds, removals, stores, inserts, packs, sorts, copies and walks of every
// container agree with the plain models at every step.
TEST(ContainerModelTest, RandomRunsAgreeWithTheModels) {
    container_model::gFail = [](int line, const char* what) {
        throw std::runtime_error("container_model.h:" + std::to_string(line) + ": " + what);
    };
    for (unsigned seed = 1; seed <= 800; ++seed) {
        Seeded in{std::mt19937(seed)};
        try {
            container_model::Run(in, 200);
        } catch (const std::exception& failure) {
            FAIL() << "seed " << seed << ": " << failure.what();
        }
    }
}

TEST(ArrayTest, CapacityGrowsAndIsFreed) {
    std::vector<CountingObject> objects(129);
    Array array;
    for (int i = 0; i < 129; ++i) {
        array.Add(&objects[i]);
        ASSERT_EQ(array.Capacity(), i < 64 ? 64 : (i < 128 ? 128 : 256)) << "Add " << i + 1;
    }
    EXPECT_EQ(array[256], nullptr);
    Array inserted;
    for (int i = 0; i < 64; ++i) {
        inserted.SetAt(i, &objects[0]);
    }
    inserted.InsertAt(10, &objects[1]);  // a full buffer grows
    EXPECT_EQ(inserted.Capacity(), 128);
    EXPECT_EQ(inserted[64], &objects[0]);
    Array set;
    set.SetAt(10, &objects[0]);  // twice the index
    EXPECT_EQ(set.Capacity(), 20);
    set.SetAt(100, &objects[0]);
    EXPECT_EQ(set.Capacity(), 200);
    Array copy(set);  // room for the members only
    EXPECT_EQ(copy.Capacity(), 2);
    copy.Add(&objects[1]);
    EXPECT_EQ(copy.Capacity(), 4);
    set.Remove(&objects[0]);
    set.Remove(&objects[0]);  // the last member frees the buffer
    EXPECT_FALSE(set.HasBuffer());
    EXPECT_EQ(set.Capacity() + set.GetMaxIndex(), 0);
    SlotView<DWXPackedArray> packed;
    packed.Add(&objects[0]);
    packed.Remove(&objects[0]);
    EXPECT_FALSE(packed.HasBuffer());
    EXPECT_FALSE(Array(nullptr).HasBuffer());
}

int ByValue(const void* a, const void* b) {
    int x = static_cast<CountingObject*>(*static_cast<DWXObject* const*>(a))->nValue;
    int y = static_cast<CountingObject*>(*static_cast<DWXObject* const*>(b))->nValue;
    return (x > y) - (x < y);
}

// Large inputs with many or few equal values, and sorted, reversed and
// organ-pipe orders, which push a naive quicksort deep.
TEST(ArrayTest, SortsOrderLargeAndAdversarialInputs) {
    std::mt19937 random(20240611);
    std::vector<std::vector<int>> inputs;
    for (int size : {17, 100, 1000, 5000}) {
        for (int range : {3, 1000000}) {
            inputs.emplace_back();
            for (int i = 0; i < size; ++i) {
                inputs.back().push_back(static_cast<int>(random() % range));
            }
        }
    }
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
        std::sort(values.begin(), values.end());
        for (bool standard : {false, true}) {
            Array array;
            for (auto& o : objects) {
                array.Add(o.get());
            }
            standard ? array.StandartSort(ByValue) : array.Sort(ByValue);
            std::vector<int> sorted;
            for (DWXObject* o : Walk(array)) {
                sorted.push_back(static_cast<CountingObject*>(o)->nValue);
            }
            ASSERT_EQ(sorted, values) << "standard " << standard;
        }
    }
}

TEST(ArrayTest, DumpPrefixesEachOccupiedSlot) {
    CountingObject a, b;
    DWXArray array;
    EXPECT_EQ(Captured([&](FILE* f) { array.Dump(f); }), "");
    array.SetAt(0, &a);
    array.SetAt(2, &b);
    EXPECT_EQ(Captured([&](FILE* f) { array.Dump(f); }),
              "DWXArray[0]:" + ObjectLine(&a) + "DWXArray[2]:" + ObjectLine(&b));
    DWXPackedArray packed(&array);
    EXPECT_EQ(Captured([&](FILE* f) { packed.Dump(f); }),
              "DWXPackedArray[0]:" + ObjectLine(&a) + "DWXPackedArray[1]:" + ObjectLine(&b));
}

TEST(ArrayTest, WalksSurviveChanges) {
    CountingObject a, b, c, d;
    DWXArray array;
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

TEST(ArrayTest, DestroyContentsDeletesEachHeldMemberOnce) {
    CountingObject::Reset();
    Array array;
    auto* shared = new CountingObject(0);
    auto* forgotten = new CountingObject(1);
    array.Add(shared);
    array.SetAt(4, forgotten);
    array.SetAt(4, new CountingObject(2));  // forgets, does not delete
    array.SetAt(6, shared);
    static_cast<DWXArray&>(array).DestroyContents();  // the array's own
    EXPECT_EQ(CountingObject::destroyed, 2);
    EXPECT_EQ(array.GetCount(), 0);
    EXPECT_FALSE(array.HasBuffer());
    delete forgotten;
}

}  // namespace
