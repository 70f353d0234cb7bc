// DWXArray::Add and a full walk against std::vector<DWXObject*>, and
// DWXLinkedList::Append against std::list. Every iteration starts from an
// empty container, so growth and release are part of the figure.
#include "bench_register.h"

#include <dwxcore/dwxobject.h>

#include <benchmark/benchmark.h>

#include <stdint.h>

#include <list>
#include <vector>

namespace dwxbench {
namespace {

constexpr int kMembers = 1 << 20;
constexpr int kListMembers = 1 << 18;

class Item : public DWXObject {
  public:
    const char* GetClassName() const override { return "Item"; }
};

// A pool of distinct members; containers hold their pointers in turn.
const std::vector<Item>& Pool() {
    static const std::vector<Item> pool(1024);
    return pool;
}

DWXObject* Member(int i) {
    return const_cast<Item*>(&Pool()[static_cast<size_t>(i) & 1023]);
}

void ArrayAddOurs(benchmark::State& state) {
    Pool();
    for (auto _ : state) {
        DWXArray array;
        for (int i = 0; i < kMembers; ++i) {
            array.Add(Member(i));
        }
        benchmark::DoNotOptimize(array.GetCount());
    }
    state.SetItemsProcessed(state.iterations() * kMembers);
}

void ArrayAddVector(benchmark::State& state) {
    Pool();
    for (auto _ : state) {
        std::vector<DWXObject*> array;
        for (int i = 0; i < kMembers; ++i) {
            array.push_back(Member(i));
        }
        benchmark::DoNotOptimize(array.data());
    }
    state.SetItemsProcessed(state.iterations() * kMembers);
}

void ArrayWalkOurs(benchmark::State& state) {
    DWXArray array;
    for (int i = 0; i < kMembers; ++i) {
        array.Add(Member(i));
    }
    for (auto _ : state) {
        uintptr_t sum = 0;
        DWXIter iter(&array);
        for (DWXObject* object = iter.Current(); object; object = iter.Next()) {
            sum += reinterpret_cast<uintptr_t>(object);
        }
        benchmark::DoNotOptimize(sum);
    }
    state.SetItemsProcessed(state.iterations() * kMembers);
}

void ArrayWalkVector(benchmark::State& state) {
    std::vector<DWXObject*> array;
    for (int i = 0; i < kMembers; ++i) {
        array.push_back(Member(i));
    }
    for (auto _ : state) {
        uintptr_t sum = 0;
        for (DWXObject* object : array) {
            sum += reinterpret_cast<uintptr_t>(object);
        }
        benchmark::DoNotOptimize(sum);
    }
    state.SetItemsProcessed(state.iterations() * kMembers);
}

void ListAppendOurs(benchmark::State& state) {
    Pool();
    for (auto _ : state) {
        DWXLinkedList list;
        for (int i = 0; i < kListMembers; ++i) {
            list.Append(Member(i));
        }
        benchmark::DoNotOptimize(list.GetCount());
    }
    state.SetItemsProcessed(state.iterations() * kListMembers);
}

void ListAppendStd(benchmark::State& state) {
    Pool();
    for (auto _ : state) {
        std::list<DWXObject*> list;
        for (int i = 0; i < kListMembers; ++i) {
            list.push_back(Member(i));
        }
        benchmark::DoNotOptimize(list.size());
    }
    state.SetItemsProcessed(state.iterations() * kListMembers);
}

void Register(const char* name, void (*function)(benchmark::State&)) {
    benchmark::RegisterBenchmark(name, function)->Unit(benchmark::kMillisecond);
}

}  // namespace

void RegisterContainerBenchmarks() {
    Register("ArrayAdd/ours", ArrayAddOurs);
    Register("ArrayAdd/vector", ArrayAddVector);
    Register("ArrayWalk/ours", ArrayWalkOurs);
    Register("ArrayWalk/vector", ArrayWalkVector);
    Register("ListAppend/ours", ListAppendOurs);
    Register("ListAppend/std", ListAppendStd);
}

}  // namespace dwxbench
