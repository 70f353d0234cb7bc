// Helpers shared by the tests: dumps and written text captured the way a host
// reads them, and views of the protected bookkeeping of the containers.
#pragma once

#include <dwxcore/dwxobject.h>

#include <stdio.h>
#include <stdlib.h>

#include <initializer_list>
#include <string>

// What `write` writes to a stream, read back through open_memstream.
template <typename Writer>
std::string Captured(Writer write) {
    char* buffer = nullptr;
    size_t length = 0;
    FILE* stream = open_memstream(&buffer, &length);
    write(stream);
    fclose(stream);
    std::string text(buffer, length);
    free(buffer);
    return text;
}

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
