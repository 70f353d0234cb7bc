// The library's own in-place quicksort, used by DWXArray::Sort. Internal.
#pragma once

#include <stddef.h>

namespace dwxcore::internal {

// Sorts `count` elements of `size` bytes at `base` with the contract of qsort.
// Equal elements are never exchanged, but their order is not kept.
void QuickSort(void* base, size_t count, size_t size, int (*compare)(const void*, const void*));

}  // namespace dwxcore::internal
