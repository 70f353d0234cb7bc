// Random sequences of operations on the four containers, each checked after
// every step against a plain model: a vector of slots for DWXArray (holes
// as null), a vector for DWXPackedArray and DWXBag, a vector in list order
// for DWXLinkedList. Members come from a small pool and repeat.
#include <dwxcore/dwxobject.h>

#include "fuzz_input.h"

#include <algorithm>
#include <vector>

namespace {

class Item : public DWXObject {
  public:
    const char* GetClassName() const override { return "Item"; }
    int nKey = 0;
};

const int kPool = 12;
Item gItems[kPool];

// A pool member or, at index kPool, null.
DWXObject* Pick(FuzzInput& input) {
    int index = input.Range(0, kPool);
    return index == kPool ? nullptr : &gItems[index];
}

int CompareKeys(const void* a, const void* b) {
    const int x = static_cast<const Item*>(*static_cast<DWXObject* const*>(a))->nKey;
    const int y = static_cast<const Item*>(*static_cast<DWXObject* const*>(b))->nKey;
    return (x > y) - (x < y);
}

bool KeyLess(DWXObject* a, DWXObject* b) {
    return static_cast<Item*>(a)->nKey < static_cast<Item*>(b)->nKey;
}

// The members met by a DWXIter walk.
std::vector<DWXObject*> Walk(const DWXContainer& container) {
    std::vector<DWXObject*> members;
    DWXIter iter;
    for (DWXObject* o = iter.Start(&container); o; o = iter.Next()) {
        members.push_back(o);
        FUZZ_CHECK(members.size() <= 100000);
    }
    return members;
}

std::vector<DWXObject*> WithoutNulls(const std::vector<DWXObject*>& slots) {
    std::vector<DWXObject*> members;
    for (DWXObject* o : slots) {
        if (o) {
            members.push_back(o);
        }
    }
    return members;
}

// The members up to the first null, as a walk of a bag or list sees them.
std::vector<DWXObject*> UpToNull(const std::vector<DWXObject*>& items) {
    return std::vector<DWXObject*>(items.begin(), std::find(items.begin(), items.end(), nullptr));
}

// Membership of three pool members per step keeps a run fast; over a run
// every member is probed.
void CheckMembership(DWXContainer& container, const std::vector<DWXObject*>& items) {
    static int next = 0;
    for (int k = 0; k < 3; ++k) {
        const int i = next++ % kPool;
        bool member = std::find(items.begin(), items.end(), &gItems[i]) != items.end();
        FUZZ_CHECK(container.IsMember(&gItems[i]) == (member ? 1 : 0));
    }
}

void CheckArray(DWXArray& array, const std::vector<DWXObject*>& slots) {
    const std::vector<DWXObject*> members = WithoutNulls(slots);
    FUZZ_CHECK(array.GetCount() == static_cast<int>(members.size()));
    FUZZ_CHECK(Walk(array) == members);
    int top = 0;
    for (size_t i = 0; i < slots.size(); ++i) {
        if (slots[i]) {
            top = static_cast<int>(i) + 1;
        }
    }
    FUZZ_CHECK(array.GetMaxIndex() == top);
    for (int i = -1; i <= top + 1; ++i) {
        DWXObject* expected = i >= 0 && i < static_cast<int>(slots.size()) ? slots[i] : nullptr;
        FUZZ_CHECK(array[i] == expected);
    }
    for (int k = 0; k < 3; ++k) {
        const int i = (array.GetCount() + k * 5) % kPool;
        auto found = std::find(slots.begin(), slots.end(), &gItems[i]);
        FUZZ_CHECK(array.GetIndex(&gItems[i]) ==
                   (found == slots.end() ? -1 : static_cast<int>(found - slots.begin())));
    }
    CheckMembership(array, members);
    FUZZ_CHECK(array.IsMember(nullptr) == 0);
}

void RunArray(FuzzInput& input) {
    DWXArray array;
    std::vector<DWXObject*> slots;
    for (int step = 0; step < 64 && !input.Empty(); ++step) {
        switch (input.Range(0, 9)) {
            case 0:
            case 1: {
                DWXObject* o = Pick(input);
                array.Add(o);
                if (o) {
                    slots.push_back(o);  // after the highest member
                }
                break;
            }
            case 2: {
                DWXObject* o = Pick(input);
                auto found = std::find(slots.begin(), slots.end(), o);
                bool member = o && found != slots.end();
                FUZZ_CHECK(array.Remove(o) == (member ? 1 : 0));
                if (member) {
                    *found = nullptr;
                }
                break;
            }
            case 3: {
                const int index = input.Range(-1, 40);
                DWXObject* o = Pick(input);
                array.InsertAt(index, o);
                if (index >= 0) {
                    if (slots.size() < static_cast<size_t>(index)) {
                        slots.resize(static_cast<size_t>(index));
                    }
                    slots.insert(slots.begin() + index, o);
                }
                break;
            }
            case 4: {
                const int index = input.Range(-1, 40);
                DWXObject* o = Pick(input);
                array.SetAt(index, o);
                if (index >= 0) {
                    if (slots.size() <= static_cast<size_t>(index)) {
                        slots.resize(static_cast<size_t>(index) + 1);
                    }
                    slots[static_cast<size_t>(index)] = o;
                }
                break;
            }
            case 5:
                array.Pack();
                slots = WithoutNulls(slots);
                break;
            case 6:
                array.Reverse();
                slots = WithoutNulls(slots);
                std::reverse(slots.begin(), slots.end());
                break;
            case 7:
                input.Flag() ? array.Sort(CompareKeys) : array.StandartSort(CompareKeys);
                slots = WithoutNulls(slots);
                std::stable_sort(slots.begin(), slots.end(), KeyLess);
                // Equal keys may come in any order: take the array's order
                // after checking that it is sorted and holds the same members.
                {
                    std::vector<DWXObject*> sorted = Walk(array);
                    FUZZ_CHECK(std::is_sorted(sorted.begin(), sorted.end(), KeyLess));
                    std::vector<DWXObject*> a(sorted), b(slots);
                    std::sort(a.begin(), a.end());
                    std::sort(b.begin(), b.end());
                    FUZZ_CHECK(a == b);
                    slots = sorted;
                }
                break;
            case 8: {
                DWXArray copy(array);
                DWXArray assigned;
                assigned.Add(&gItems[0]);
                assigned = array;
                FUZZ_CHECK(Walk(copy) == WithoutNulls(slots));
                FUZZ_CHECK(Walk(assigned) == WithoutNulls(slots));
                break;
            }
            default:
                array.Empty();
                slots.clear();
                break;
        }
        // Slots past the highest member carry no meaning.
        while (!slots.empty() && !slots.back()) {
            slots.pop_back();
        }
        CheckArray(array, slots);
    }
}

void RunPackedArray(FuzzInput& input) {
    DWXPackedArray array;
    std::vector<DWXObject*> items;
    for (int step = 0; step < 64 && !input.Empty(); ++step) {
        DWXObject* o = Pick(input);
        switch (input.Range(0, 3)) {
            case 0:
            case 1:
                array.Add(o);
                if (o) {
                    items.push_back(o);
                }
                break;
            case 2: {
                auto found = std::find(items.begin(), items.end(), o);
                bool member = o && found != items.end();
                FUZZ_CHECK(array.Remove(o) == (member ? 1 : 0));
                if (member) {
                    *found = items.back();
                    items.pop_back();
                }
                break;
            }
            default:
                array.Reverse();
                std::reverse(items.begin(), items.end());
                break;
        }
        CheckArray(array, items);
    }
}

void RunBag(FuzzInput& input) {
    DWXBag bag;
    std::vector<DWXObject*> items;
    for (int step = 0; step < 64 && !input.Empty(); ++step) {
        DWXObject* o = Pick(input);
        switch (input.Range(0, 4)) {
            case 0:
            case 1:
                bag.Add(o);
                items.push_back(o);
                break;
            case 2: {
                auto found = std::find(items.begin(), items.end(), o);
                FUZZ_CHECK(bag.Remove(o) == (found != items.end() ? 1 : 0));
                if (found != items.end()) {
                    *found = items.back();
                    items.pop_back();
                }
                break;
            }
            case 3: {
                DWXBag copy(bag);
                DWXBag assigned;
                assigned = bag;
                // Copies are made from a walk, which ends at the first null member.
                FUZZ_CHECK(copy.GetCount() == static_cast<int>(UpToNull(items).size()));
                FUZZ_CHECK(Walk(assigned) == UpToNull(items));
                break;
            }
            default:
                bag.Empty();
                items.clear();
                break;
        }
        FUZZ_CHECK(bag.GetCount() == static_cast<int>(items.size()));
        FUZZ_CHECK(Walk(bag) == UpToNull(items));
        CheckMembership(bag, items);
    }
}

void RunLinkedList(FuzzInput& input) {
    DWXLinkedList list;
    std::vector<DWXObject*> items;
    for (int step = 0; step < 64 && !input.Empty(); ++step) {
        DWXObject* o = Pick(input);
        switch (input.Range(0, 6)) {
            case 0:
                list.Add(o);
                items.push_back(o);
                break;
            case 1:
                list.Prepend(o);
                items.insert(items.begin(), o);
                break;
            case 2: {
                // Before the node of some member, or at the end.
                DWXObject* anchor = Pick(input);
                DWXListNode* node = list.Find(anchor);
                auto found = std::find(items.begin(), items.end(), anchor);
                FUZZ_CHECK((node != nullptr) == (found != items.end()));
                list.Insert(o, node ? node : list.EndNode());
                items.insert(node ? found : items.end(), o);
                break;
            }
            case 3: {
                auto found = std::find(items.begin(), items.end(), o);
                FUZZ_CHECK(list.Remove(o) == (found != items.end() ? 1 : 0));
                if (found != items.end()) {
                    items.erase(found);
                }
                break;
            }
            case 4: {
                DWXListNode* node = list.Find(o);
                list.Remove(node);
                list.Remove(list.EndNode());
                if (node) {
                    items.erase(std::find(items.begin(), items.end(), o));
                }
                break;
            }
            case 5: {
                DWXLinkedList copy(list);
                DWXLinkedList assigned;
                assigned.Add(&gItems[1]);
                assigned = list;
                FUZZ_CHECK(Walk(copy) == UpToNull(items));
                FUZZ_CHECK(assigned.GetCount() == static_cast<int>(items.size()));
                break;
            }
            default:
                list.Empty();
                items.clear();
                break;
        }
        FUZZ_CHECK(list.GetCount() == static_cast<int>(items.size()));
        FUZZ_CHECK(Walk(list) == UpToNull(items));
        std::vector<DWXObject*> nodes;
        for (DWXListNode* n = list.StartNode(); n != list.EndNode(); n = n->poNext) {
            nodes.push_back(n->poObject);
            FUZZ_CHECK(n->poNext->poPrev == n);
        }
        FUZZ_CHECK(nodes == items);
        CheckMembership(list, items);
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    for (int i = 0; i < kPool; ++i) {
        gItems[i].nKey = i % 5;
    }
    FuzzInput input(data, size);
    switch (input.Range(0, 3)) {
        case 0:
            RunArray(input);
            break;
        case 1:
            RunPackedArray(input);
            break;
        case 2:
            RunBag(input);
            break;
        default:
            RunLinkedList(input);
            break;
    }
    return 0;
}
