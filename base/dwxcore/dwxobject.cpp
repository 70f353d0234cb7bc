#include <dwxcore/dwxobject.h>

#include "internal/dwxcontainer_internal.h"

#include <algorithm>
#include <vector>

namespace {

// The members met by a walk of `container`, in walk order.
std::vector<DWXObject*> Snapshot(const DWXContainer* container) {
    std::vector<DWXObject*> members;
    DWXIter iter;
    for (DWXObject* member = iter.Start(container); member; member = iter.Next()) {
        members.push_back(member);
    }
    return members;
}

}  // namespace

// DWXObject

DWXObject::~DWXObject() {}

void DWXObject::Dump(FILE* stream) const {
    if (!stream) {
        return;
    }
    fprintf(stream, "%s:%p\n", GetClassName(), (const void*)this);
}

// DWXContainer

DWXContainer::~DWXContainer() {}

void DWXContainer::Dump(FILE* stream) const {
    if (!stream) {
        return;
    }
    fprintf(stream, "%s:\n", GetClassName());
    DWXIter iter;
    for (DWXObject* member = iter.Start(this); member; member = iter.Next()) {
        member->Dump(stream);
    }
}

void DWXContainer::DestroyIterator(DWXIter*) const {}

void DWXContainer::Empty() {
    // Restart after every removal so that the walk never steps from a member
    // that is gone. A Remove that refuses what Start yields would loop for
    // ever, so stop there.
    DWXIter iter;
    for (DWXObject* member = iter.Start(this); member; member = iter.Start(this)) {
        if (!Remove(member)) {
            break;
        }
    }
}

int DWXContainer::Validate() const {
    int result = 1;
    DWXIter iter;
    for (DWXObject* member = iter.Start(this); member; member = iter.Next()) {
        const DWXValidatable* validatable = dynamic_cast<const DWXValidatable*>(member);
        if (validatable && result == 1 && !validatable->Validate()) {
            result = 0;
        }
    }
    return result;
}

void DWXContainer::AddContainer(const DWXContainer* other) {
    if (!other) {
        return;
    }
    if (other == this) {
        // Walking ourselves while adding would meet the new members and
        // never end.
        for (DWXObject* member : Snapshot(this)) {
            Add(member);
        }
        return;
    }
    DWXIter iter;
    for (DWXObject* member = iter.Start(other); member; member = iter.Next()) {
        Add(member);
    }
}

void DWXContainer::DestroyContents() {
    // Every container of the library has a walk of its own that takes each
    // member out before deleting it, so a destructor that removes or deletes
    // other members never leaves a pointer behind to be deleted again.
    if (DWXArray* array = dynamic_cast<DWXArray*>(this)) {
        array->DWXArray::DestroyContents();
        return;
    }
    if (DWXBag* bag = dynamic_cast<DWXBag*>(this)) {
        bag->DestroyInOrder();
        return;
    }
    if (DWXLinkedList* list = dynamic_cast<DWXLinkedList*>(this)) {
        dwxcore::internal::DestroyListContents(*list);
        return;
    }
    // A host's container: take the first member out wherever it is held,
    // then delete it, and start again. O(n^2) in general.
    DWXIter iter;
    for (DWXObject* member = iter.Start(this); member; member = iter.Start(this)) {
        if (!Remove(member)) {
            // A Remove that refuses what Start yields: delete what the walk
            // still meets, each pointer once.
            std::vector<DWXObject*> rest = Snapshot(this);
            dwxcore::internal::ClearRepeats(rest.data(), rest.size());
            for (DWXObject* other : rest) {
                delete other;
            }
            break;
        }
        while (Remove(member)) {
        }
        delete member;
    }
    Empty();
}

int64_t DWXContainer::GetPosition(const DWXIter* iter) {
    return iter->nPosition;
}

void DWXContainer::SetPosition(DWXIter* iter, int64_t position) {
    iter->nPosition = position;
}

// DWXIter

DWXIter::DWXIter() : poTarget(nullptr), poCurrent(nullptr), nPosition(0) {}

DWXIter::DWXIter(const DWXContainer* container)
    : poTarget(container), poCurrent(nullptr), nPosition(0) {
    if (poTarget) {
        poCurrent = poTarget->Start(this);
    }
}

DWXIter::~DWXIter() {}

const char* DWXIter::GetClassName() const {
    return "DWXIter";
}

DWXObject* DWXIter::Start(const DWXContainer* container) {
    if (container) {
        poTarget = container;
        poCurrent = nullptr;
    }
    poCurrent = poTarget ? poTarget->Start(this) : nullptr;
    return poCurrent;
}

DWXObject* DWXIter::Next() {
    poCurrent = poTarget ? poTarget->Next(this) : nullptr;
    return poCurrent;
}

DWXIter& DWXIter::operator++() {
    Next();
    return *this;
}

void DWXIter::SetTarget(const DWXContainer* container) {
    if (container != poTarget) {
        // An array's slot index read as a list node would crash the list.
        nPosition = 0;
    }
    poTarget = container;
    poCurrent = nullptr;
}

// DWXValidatable

DWXValidatable::~DWXValidatable() {}

namespace dwxcore::internal {

size_t ClearRepeats(DWXObject** items, size_t count) {
    // One sorted copy of the pointers tells whether any repeats, which is
    // rare (AddContainer of a container into itself), and then marks the
    // first holder of each. A single way for every size: no bench row shows
    // a shortcut for small containers buying anything next to the deletes.
    std::vector<DWXObject*> sorted;
    sorted.reserve(count);
    for (size_t i = 0; i < count; ++i) {
        if (items[i]) {
            sorted.push_back(items[i]);
        }
    }
    std::sort(sorted.begin(), sorted.end());
    if (std::adjacent_find(sorted.begin(), sorted.end()) == sorted.end()) {
        return 0;
    }
    sorted.erase(std::unique(sorted.begin(), sorted.end()), sorted.end());
    std::vector<bool> seen(sorted.size());
    size_t cleared = 0;
    for (size_t i = 0; i < count; ++i) {
        if (!items[i]) {
            continue;
        }
        const size_t at = static_cast<size_t>(
            std::lower_bound(sorted.begin(), sorted.end(), items[i]) - sorted.begin());
        if (seen[at]) {
            items[i] = nullptr;
            ++cleared;
        } else {
            seen[at] = true;
        }
    }
    return cleared;
}

}  // namespace dwxcore::internal
