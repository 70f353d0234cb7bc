// Helpers shared by the tests: written text captured the way a host reads it,
// and views of the protected bookkeeping of the containers.
#pragma once

#include "../fuzz/container_model.h"

#include <dwxcore/dwxobject.h>

#include <initializer_list>

using container_model::Captured;  // what a writer callback writes to a stream

inline void AddAll(DWXContainer& container, std::initializer_list<DWXObject*> members) {
    for (DWXObject* member : members) {
        container.Add(member);
    }
}

// Exposes the buffer of an array or bag class for assertions.
template <typename C>
class View : public C {
  public:
    using C::C;
    int Capacity() const { return this->nCapacity; }
    bool HasBuffer() const { return this->ppoItems != nullptr; }
};
