#include <dwxcore/dwxobject.h>

#include "internal/dwxcontainer_internal.h"

#include "internal/dwxquicksort.h"

#include <services/rtprim.h>

#include <stdlib.h>
#include <climits>

namespace {

const int kFirstCapacity = 64;

}  // namespace

DWXArray::DWXArray() : nCapacity(0), nTop(0), ppoItems(nullptr) {}

DWXArray::DWXArray(const DWXContainer* container) : DWXArray() {
    if (!container) {
        return;
    }
    // Room for the members the container counts; a walk that yields more
    // (a container whose count lags) still fits because Add grows.
    if (container->GetCount() > 0) {
        nCapacity = container->GetCount();
        ppoItems = static_cast<DWXObject**>(HCalloc(nCapacity, sizeof(DWXObject*)));
    }
    DWXIter iter;
    for (DWXObject* member = iter.Start(container); member; member = iter.Next()) {
        Add(member);
    }
}

DWXArray::DWXArray(const DWXArray& other) : DWXArray(static_cast<const DWXContainer*>(&other)) {}

DWXArray& DWXArray::operator=(const DWXArray& other) {
    if (&other == this) {
        return *this;
    }
    free(ppoItems);
    ppoItems = nullptr;
    nCount = nCapacity = nTop = 0;
    if (other.nCount > 0) {
        nCapacity = other.nCount;
        ppoItems = static_cast<DWXObject**>(HCalloc(nCapacity, sizeof(DWXObject*)));
    }
    DWXIter iter;
    for (DWXObject* member = iter.Start(&other); member; member = iter.Next()) {
        Add(member);
    }
    return *this;
}

DWXArray::~DWXArray() {
    free(ppoItems);
}

void DWXArray::Dump(FILE* stream) const {
    if (!stream) {
        return;
    }
    for (int i = 0; i < nTop; ++i) {
        if (ppoItems[i]) {
            fprintf(stream, "%s[%d]:", GetClassName(), i);
            ppoItems[i]->Dump(stream);
        }
    }
}

const char* DWXArray::GetClassName() const {
    return "DWXArray";
}

// The walk keeps the index of the next slot to examine, so the array may
// change under it: members added at or above that slot are still visited.
// The position is the iterator's nPosition, read and written directly.
DWXObject* DWXArray::Start(DWXIter* iter) const {
    for (int i = 0; i < nTop; ++i) {
        if (ppoItems[i]) {
            iter->nPosition = i + 1;
            return ppoItems[i];
        }
    }
    iter->nPosition = 0;
    return nullptr;
}

DWXObject* DWXArray::Next(DWXIter* iter) const {
    int64_t position = iter->nPosition;
    if (position < 0) {
        return nullptr;
    }
    DWXObject* const* items = ppoItems;
    for (int64_t i = position, top = nTop; i < top; ++i) {
        if (DWXObject* member = items[i]) {
            iter->nPosition = i + 1;
            return member;
        }
    }
    return nullptr;
}

int DWXArray::IsMember(const DWXObject* object) {
    return GetIndex(object) >= 0 ? 1 : 0;
}

void DWXArray::AddSlowly(DWXObject* object) {
    if (!object) {
        return;
    }
    if (nTop == nCapacity) {
        ExpandToHold(nCapacity);
        if (nTop == nCapacity) {
            return;  // the slot index range is exhausted
        }
    }
    while (nTop > 0 && !ppoItems[nTop - 1]) {
        --nTop;
    }
    ppoItems[nTop++] = object;
    ++nCount;
}

int DWXArray::Remove(const DWXObject* object) {
    int index = GetIndex(object);
    if (index < 0) {
        return 0;
    }
    ppoItems[index] = nullptr;
    if (--nCount == 0) {
        free(ppoItems);
        ppoItems = nullptr;
        nCapacity = nTop = 0;
    }
    return 1;
}

void DWXArray::Empty() {
    free(ppoItems);
    ppoItems = nullptr;
    nCount = nCapacity = nTop = 0;
}

void DWXArray::DestroyContents() {
    // Each slot is cleared before its member is deleted, and the array is
    // read afresh at every step: a destructor may remove, delete or add other
    // members, and whatever it leaves is what the walk goes on with. A walk
    // that passes the top starts again from slot 0 while members remain, for
    // those a destructor placed below it. O(n) without repeated pointers.
    nCount -=
        static_cast<int>(dwxcore::internal::ClearRepeats(ppoItems, static_cast<size_t>(nTop)));
    int slot = 0;
    while (nCount > 0) {
        if (slot >= nTop) {
            slot = 0;
        }
        DWXObject* member = ppoItems[slot];
        if (member) {
            ppoItems[slot] = nullptr;
            --nCount;
            delete member;
        }
        ++slot;
    }
    Empty();
}

DWXObject* DWXArray::operator[](int index) const {
    if (index < 0 || index >= nCapacity) {
        return nullptr;
    }
    return ppoItems[index];
}

int DWXArray::GetIndex(const DWXObject* object) const {
    // A null pointer would match the first empty slot; it is never a member.
    if (!object) {
        return -1;
    }
    for (int i = 0; i < nTop; ++i) {
        if (ppoItems[i] == object) {
            return i;
        }
    }
    return -1;
}

int DWXArray::GetMaxIndex() const {
    while (nTop > 0 && !ppoItems[nTop - 1]) {
        --nTop;
    }
    return nTop;
}

void DWXArray::InsertAt(int index, DWXObject* object) {
    if (index < 0) {
        return;
    }
    int highest = index > nTop ? index : nTop;
    if (highest >= nCapacity) {
        ExpandToHold(highest);
        if (highest >= nCapacity) {
            return;
        }
    }
    for (int i = nTop; i > index; --i) {
        ppoItems[i] = ppoItems[i - 1];
    }
    ppoItems[index] = object;
    if (object) {
        ++nCount;
    }
    nTop = index < nTop ? nTop + 1 : index + 1;
}

void DWXArray::SetAt(int index, DWXObject* object) {
    if (index < 0) {
        return;
    }
    if (index >= nCapacity) {
        ExpandToHold(index);
        if (index >= nCapacity) {
            return;
        }
    }
    if (ppoItems[index]) {
        --nCount;
    }
    ppoItems[index] = object;
    if (object) {
        ++nCount;
    }
    if (index >= nTop) {
        nTop = index + 1;
    }
}

void DWXArray::Pack() {
    int free_slot = 0;
    for (int i = 0; i < nTop; ++i) {
        if (ppoItems[i]) {
            if (i != free_slot) {
                ppoItems[free_slot] = ppoItems[i];
                ppoItems[i] = nullptr;
            }
            ++free_slot;
        }
    }
    nTop = free_slot;
}

void DWXArray::Reverse() {
    if (!ppoItems) {
        return;
    }
    DWXObject** reversed = static_cast<DWXObject**>(HCalloc(nCapacity, sizeof(DWXObject*)));
    int out = 0;
    for (int i = nTop - 1; i >= 0; --i) {
        if (ppoItems[i]) {
            reversed[out++] = ppoItems[i];
        }
    }
    free(ppoItems);
    ppoItems = reversed;
    nTop = nCount;
}

void DWXArray::Sort(int (*compare)(const void*, const void*)) {
    Pack();  // also without a comparator: callers rely on the holes being gone
    if (!compare) {
        return;
    }
    dwxcore::internal::QuickSort(ppoItems, nCount, sizeof(DWXObject*), compare);
}

void DWXArray::StandartSort(int (*compare)(const void*, const void*)) {
    Pack();  // also without a comparator: callers rely on the holes being gone
    if (!compare) {
        return;
    }
    if (nCount > 1) {
        TZN_qsort(ppoItems, nCount, sizeof(DWXObject*), compare);
    }
}

void DWXArray::ExpandToHold(int index) {
    if (index < nCapacity) {
        return;
    }
    // Twice the index, but never past the int range of slot indexes.
    long long wanted = index == 0 ? kFirstCapacity : 2LL * index;
    if (wanted > INT_MAX) {
        wanted = INT_MAX;
    }
    int capacity = static_cast<int>(wanted);
    if (capacity <= nCapacity) {
        return;
    }
    ppoItems = static_cast<DWXObject**>(HRealloc(ppoItems, capacity * sizeof(DWXObject*)));
    for (int i = nCapacity; i < capacity; ++i) {
        ppoItems[i] = nullptr;
    }
    nCapacity = capacity;
}
