// A DWXObject that counts constructions and destructions, so tests can prove
// that owned members are deleted exactly once.
#pragma once

#include <dwxcore/dwxobject.h>

class CountingObject : public DWXObject {
  public:
    static int constructed;
    static int destroyed;
    static void Reset() { constructed = destroyed = 0; }
    static int Alive() { return constructed - destroyed; }

    explicit CountingObject(int value = 0) : nValue(value) { ++constructed; }
    CountingObject(const CountingObject&) = delete;  // a copy would not be counted
    ~CountingObject() override { ++destroyed; }
    const char* GetClassName() const override { return "CountingObject"; }

    int nValue;
};

// Define the counters once per test executable.
#define DEFINE_COUNTING_OBJECT_COUNTERS() \
    int CountingObject::constructed = 0;  \
    int CountingObject::destroyed = 0
