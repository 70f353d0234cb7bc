#include "../fuzz/container_model.h"
#include "../fuzz/fuzz_input.h"
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
