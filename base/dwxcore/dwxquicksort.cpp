#include "internal/dwxquicksort.h"

#include <services/rtprim.h>

#include <stdlib.h>
#include <string.h>

namespace dwxcore::internal {
namespace {

typedef int (*Compare)(const void*, const void*);

struct Range {
    char* base;
    size_t count;
};

class Sorter {
  public:
    Sorter(size_t size, Compare compare)
        : nSize(size), pCompare(compare), pTemp(static_cast<char*>(HMalloc(size))) {}
    ~Sorter() { free(pTemp); }
    Sorter(const Sorter&) = delete;
    Sorter& operator=(const Sorter&) = delete;

    void Sort(char* base, size_t count) {
        for (;;) {
            if (count < 2) {
                return;
            }
            size_t before = Partition(base, count);
            Range left{base, before};
            Range right{base + (before + 1) * nSize, count - before - 1};
            // Recurse into the smaller part and loop on the larger one, so the
            // depth stays logarithmic whatever the input. The parts are
            // disjoint, so the order in which they are sorted does not change
            // the result.
            if (left.count > right.count) {
                Range t = left;
                left = right;
                right = t;
            }
            if (left.count > 1) {
                Sort(left.base, left.count);
            }
            if (right.count <= 1) {
                return;
            }
            base = right.base;
            count = right.count;
        }
    }

  private:
    char* At(char* base, size_t position) const { return base + position * nSize; }

    void Exchange(char* a, char* b) {
        memcpy(pTemp, a, nSize);
        memcpy(a, b, nSize);
        memcpy(b, pTemp, nSize);
    }

    // Partitions around the middle element, which is first moved to the last
    // position; returns the final position of that pivot.
    size_t Partition(char* base, size_t count) {
        size_t lastPos = count - 1;
        char* last = At(base, lastPos);
        char* middle = At(base, count / 2);
        if (pCompare(middle, last) != 0) {
            Exchange(middle, last);
        }
        char* pivot = last;

        // i starts one before the base; it is kept as a signed position.
        long long i = -1;
        long long j = static_cast<long long>(lastPos);
        do {
            do {
                ++i;
            } while (i != static_cast<long long>(lastPos) && pCompare(At(base, i), pivot) < 0);
            do {
                --j;
            } while (j != 0 && pCompare(At(base, j), pivot) > 0);
            if (pCompare(At(base, i), At(base, j)) != 0) {
                Exchange(At(base, i), At(base, j));
            }
        } while (i < j);
        // The last exchange was made with i and j crossed: undo it.
        if (pCompare(At(base, i), At(base, j)) != 0) {
            Exchange(At(base, i), At(base, j));
        }
        if (pCompare(At(base, i), pivot) != 0) {
            Exchange(At(base, i), pivot);
        }
        return static_cast<size_t>(i);
    }

    size_t nSize;
    Compare pCompare;
    char* pTemp;
};

}  // namespace

void QuickSort(void* base, size_t count, size_t size, int (*compare)(const void*, const void*)) {
    if (!base || count < 2 || size == 0 || !compare) {
        return;
    }
    Sorter sorter(size, compare);
    sorter.Sort(static_cast<char*>(base), count);
}

}  // namespace dwxcore::internal
