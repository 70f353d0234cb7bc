// Helpers shared by the container sources. Internal; not installed.
#pragma once

#include <dwxcore/dwxobject.h>

#include <stddef.h>

namespace dwxcore_detail {

// Deletes every non-null pointer of members[0, count) in order, each distinct
// pointer once: a container may hold the same object in several places.
void DeleteEachOnce(DWXObject* const* members, size_t count);

}  // namespace dwxcore_detail
