#include "../fuzz/container_model.h"
#include "../fuzz/fuzz_input.h"
#include "container_test_util.h"
#include "counting_object.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

// The fuzz target's runs, on seeded random bytes: every operation of the four
// containers, an open walk, dumps and DestroyContents agree with the plain
// models at every step.
TEST(ContainerModelTest, RandomRunsAgreeWithTheModels) {
    container_model::gFail = [](int line, const char* what) {
        throw std::runtime_error("container_model.h:" + std::to_string(line) + ": " + what);
    };
    for (unsigned seed = 1; seed <= 400; ++seed) {
        std::mt19937 random(seed);
        std::vector<uint8_t> bytes(1500);
        for (uint8_t& byte : bytes) {
            byte = static_cast<uint8_t>(random());
        }
        FuzzInput in(bytes.data(), bytes.size());
        try {
            container_model::Run(in, 200);
        } catch (const std::exception& failure) {
            FAIL() << "seed " << seed << ": " << failure.what();
        }
    }
}

// 64 slots first, then twice the index that does not fit; a copy holds room
// for its members only, and the last member out frees the buffer.
TEST(ArrayTest, Capacity) {
    std::vector<CountingObject> objects(129);
    View<DWXArray> array, set;
    for (int i = 0; i < 128; ++i) {
        array.Add(&objects[i]);
        ASSERT_EQ(array.Capacity(), i < 64 ? 64 : 128) << "Add " << i + 1;
    }
    array.InsertAt(10, &objects[128]);  // a full buffer grows for an insert too
    EXPECT_EQ(array.Capacity(), 256);
    EXPECT_EQ(array[128], &objects[127]);
    set.SetAt(10, &objects[0]);
    EXPECT_EQ(set.Capacity(), 20);
    set.SetAt(100, &objects[1]);
    EXPECT_EQ(set.Capacity(), 200);
    View<DWXArray> copy(set);
    EXPECT_EQ(copy.Capacity(), 2);
    copy.Add(&objects[2]);
    EXPECT_EQ(copy.Capacity(), 4);
    set.Remove(&objects[0]);
    set.Remove(&objects[1]);
    EXPECT_FALSE(set.HasBuffer() || View<DWXArray>(nullptr).HasBuffer());
}

// Capacities seen while adding, one entry per growth.
std::vector<int> Growth(View<DWXBag>& bag, int adds) {
    std::vector<int> capacities{bag.Capacity()};
    for (int i = 0; i < adds; ++i) {
        bag.Add(nullptr);
        if (capacities.back() != bag.Capacity()) {
            capacities.push_back(bag.Capacity());
        }
    }
    return capacities;
}

// About 1.3 times plus five; a copy holds room for its members only,
// removals keep the buffer and Empty frees it.
TEST(BagTest, Capacity) {
    CountingObject a, b, c;
    View<DWXBag> bag, assigned;
    EXPECT_EQ(Growth(bag, 344),
              (std::vector<int>{0, 5, 11, 19, 29, 42, 59, 81, 110, 148, 197, 261, 344}));
    DWXArray three;
    AddAll(three, {&a, &b, &c});
    View<DWXBag> built(&three);
    AddAll(assigned, {&c, &c, &c, &c, &c, &c, &c});
    assigned = built;
    EXPECT_EQ(Growth(built, 16), (std::vector<int>{3, 8, 15, 24}));
    EXPECT_EQ(assigned.Remove(&a) + assigned.Remove(&b) + assigned.Remove(&c), 3);
    EXPECT_EQ(assigned.Capacity(), 3);
    assigned.Empty();
    EXPECT_FALSE(assigned.HasBuffer() || View<DWXBag>(nullptr).HasBuffer());
}

int ByValue(const void* a, const void* b) {
    int x = static_cast<CountingObject*>(*static_cast<DWXObject* const*>(a))->nValue;
    int y = static_cast<CountingObject*>(*static_cast<DWXObject* const*>(b))->nValue;
    return (x > y) - (x < y);
}

// Large inputs: random with few distinct values, then sorted, reversed and
// organ-pipe orders, which push a naive quicksort deep.
TEST(ArrayTest, SortsOrderLargeAndAdversarialInputs) {
    std::mt19937 random(20240611);
    for (int shape = 0; shape < 4; ++shape) {
        std::vector<CountingObject> objects(20000);
        std::vector<int> values;
        for (int i = 0; i < 20000; ++i) {
            const int organ = i < 10000 ? i : 20000 - i;
            objects[i].nValue = shape == 0   ? random() % 3
                                : shape == 1 ? i
                                : shape == 2 ? -i
                                             : organ;
            values.push_back(objects[i].nValue);
        }
        std::sort(values.begin(), values.end());
        for (bool standard : {false, true}) {
            DWXArray array;
            for (CountingObject& o : objects) {
                array.Add(&o);
            }
            standard ? array.StandartSort(ByValue) : array.Sort(ByValue);
            std::vector<int> sorted;
            for (DWXObject* o : array) {
                sorted.push_back(static_cast<CountingObject*>(o)->nValue);
            }
            ASSERT_EQ(sorted, values) << "shape " << shape << ", standard " << standard;
        }
    }
}

}  // namespace
