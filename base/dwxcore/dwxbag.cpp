#include <dwxcore/dwxobject.h>

#include "internal/dwxcontainer_internal.h"

#include <services/rtprim.h>

#include <stdlib.h>
#include <string.h>
#include <climits>

DWXBag::DWXBag() : nCapacity(0), ppoItems(nullptr) {}

DWXBag::DWXBag(const DWXContainer* container) : DWXBag() {
    if (!container) {
        return;
    }
    if (container->GetCount() > 0) {
        nCapacity = container->GetCount();
        ppoItems = static_cast<DWXObject**>(HMalloc(nCapacity * sizeof(DWXObject*)));
    }
    DWXIter iter;
    for (DWXObject* member = iter.Start(container); member; member = iter.Next()) {
        Add(member);
    }
}

DWXBag::DWXBag(const DWXBag& other) : DWXBag(static_cast<const DWXContainer*>(&other)) {}

DWXBag& DWXBag::operator=(const DWXBag& other) {
    if (&other == this) {
        return *this;
    }
    Empty();
    if (other.nCount > 0) {
        nCapacity = other.nCount;
        ppoItems = static_cast<DWXObject**>(HMalloc(nCapacity * sizeof(DWXObject*)));
    }
    DWXIter iter;
    for (DWXObject* member = iter.Start(&other); member; member = iter.Next()) {
        Add(member);
    }
    return *this;
}

DWXBag::~DWXBag() {
    free(ppoItems);
}

const char* DWXBag::GetClassName() const {
    return "DWXBag";
}

// The walk keeps the index of the next slot. Members added during a walk are
// visited; removing the member just yielded makes the walk miss the last
// member, which moved into the slot behind it.
DWXObject* DWXBag::Start(DWXIter* iter) const {
    // On an empty bag the walk stays before slot 0, so that members added
    // afterwards are all visited, as in an array.
    if (nCount == 0) {
        SetPosition(iter, 0);
        return nullptr;
    }
    SetPosition(iter, 1);
    return ppoItems[0];
}

DWXObject* DWXBag::Next(DWXIter* iter) const {
    int64_t position = GetPosition(iter);
    if (position < 0 || position >= nCount) {
        return nullptr;
    }
    SetPosition(iter, position + 1);
    return ppoItems[position];
}

int DWXBag::IsMember(const DWXObject* object) {
    for (int i = 0; i < nCount; ++i) {
        if (ppoItems[i] == object) {
            return 1;
        }
    }
    return 0;
}

void DWXBag::Add(DWXObject* object) {
    if (nCount == nCapacity) {
        // Grows by about 1.3: 0, 5, 11, 19, 29, 42, ...
        double wanted = nCapacity * 1.3 + 5.0;
        if (nCapacity == INT_MAX) {
            return;  // the count cannot go higher
        }
        int capacity = wanted > INT_MAX ? INT_MAX : static_cast<int>(wanted);
        ppoItems = static_cast<DWXObject**>(HRealloc(ppoItems, capacity * sizeof(DWXObject*)));
        nCapacity = capacity;
    }
    ppoItems[nCount++] = object;
}

int DWXBag::Remove(const DWXObject* object) {
    for (int i = 0; i < nCount; ++i) {
        if (ppoItems[i] == object) {
            ppoItems[i] = ppoItems[nCount - 1];
            --nCount;
            return 1;
        }
    }
    return 0;
}

void DWXBag::Empty() {
    free(ppoItems);
    ppoItems = nullptr;
    nCount = nCapacity = 0;
}

void DWXBag::DestroyInOrder() {
    // A walk ends at the first null member: only the members before it are
    // deleted, a pointer held twice among them once. Its repeats are taken
    // out first, keeping the order of the rest.
    int walked = 0;
    while (walked < nCount && ppoItems[walked]) {
        ++walked;
    }
    int repeats = static_cast<int>(dwxcore::internal::ClearRepeats(ppoItems, walked));
    if (repeats > 0) {
        int kept = 0;
        for (int i = 0; i < walked; ++i) {
            if (ppoItems[i]) {
                ppoItems[kept++] = ppoItems[i];
            }
        }
        memmove(ppoItems + kept, ppoItems + walked, (nCount - walked) * sizeof(DWXObject*));
        nCount -= repeats;
    }
    // The bag is read afresh at every step, since a destructor may remove or
    // add members. The slots cleared so far all lie behind the walk, so a null
    // ahead of it is a stored one, where the walk ends. O(n).
    for (int i = 0; i < nCount; ++i) {
        DWXObject* member = ppoItems[i];
        if (!member) {
            break;
        }
        ppoItems[i] = nullptr;
        delete member;
    }
    Empty();
}
