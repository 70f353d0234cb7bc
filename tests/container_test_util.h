// Helpers shared by the tests: written text captured the way a host reads it,
// and containers filled in one call.
#pragma once

#include "../fuzz/captured.h"

#include <dwxcore/dwxobject.h>

#include <initializer_list>

inline void AddAll(DWXContainer& container, std::initializer_list<DWXObject*> members) {
    for (DWXObject* member : members) {
        container.Add(member);
    }
}
