// Helpers shared by the container sources. Internal; not installed.
#pragma once

#include <dwxcore/dwxobject.h>

#include <stddef.h>

namespace dwxcore::internal {

// Clears every entry of items[0, count) that repeats an earlier non-null
// entry, so that a pointer held in several places is deleted once; returns
// the number of entries cleared. O(n log n), with one allocation of n
// pointers.
size_t ClearRepeats(DWXObject** items, size_t count);

// DestroyContents of a linked list: in list order, each node is unlinked
// before its member is deleted, and the next member is read from the list
// as that destructor left it. O(n).
void DestroyListContents(DWXLinkedList& list);

}  // namespace dwxcore::internal
