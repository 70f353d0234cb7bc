// The node pool behind DWXParseTreeNode's operator new and delete. Internal
// to the library.
#pragma once

#include <stddef.h>

namespace dwxcore::internal {

// A block of at least `size` bytes, aligned to 16; null when memory is out.
void* Allocate(size_t size) noexcept;
// Gives back a block from Allocate; null is ignored. `size` is the size it
// was allocated with, or 0 when unknown (it only tells the memory checkers
// what became inaccessible). Any thread may give back any block, also one
// that another thread allocated.
void Release(void* block, size_t size) noexcept;

}  // namespace dwxcore::internal
