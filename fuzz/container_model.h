// Plain models of the four containers, checked after every step of a run of
// random operations. Members come from a small pool and repeat. The fuzz
// target draws a run from its input, a unit test from seeded random bytes
// (any source with Empty(), Range(low, high) and Flag() would do).
#pragma once

#include <dwxcore/dwxobject.h>

#include "captured.h"

#include <stdio.h>
#include <stdlib.h>

#include <algorithm>
#include <string>
#include <type_traits>
#include <vector>

namespace container_model {

using Members = std::vector<DWXObject*>;

// Called on a broken property; prints and aborts unless a test replaces it.
inline void (*gFail)(int line, const char* what) = [](int line, const char* what) {
    fprintf(stderr, "container_model.h:%d: check failed: %s\n", line, what);
    abort();
};

#define MODEL_CHECK(condition) \
    ((condition) ? (void)0 : (container_model::gFail(__LINE__, #condition), abort()))

// Pool members have keys 0 to 4, so sorts meet equal keys; those of key 4
// fail Validate. A run allocates the pool, so that DestroyContents can delete
// members: gDeleted counts the deletions of each.
inline constexpr int kPool = 12;
inline int gDeleted[kPool];
inline int gAsked;  // Validate calls

class Item : public DWXObject, public DWXValidatable {
  public:
    explicit Item(int index) : nIndex(index) {}
    ~Item() override { ++gDeleted[nIndex]; }
    const char* GetClassName() const override { return "Item"; }
    int Validate() const override { return ++gAsked, Key(this) != 4; }
    static int Key(const DWXObject* o) { return static_cast<const Item*>(o)->nIndex % 5; }
    const int nIndex;
};

inline Item* gPool[kPool];

inline int CompareKeys(const void* a, const void* b) {
    const int x = Item::Key(*static_cast<DWXObject* const*>(a));
    const int y = Item::Key(*static_cast<DWXObject* const*>(b));
    return (x > y) - (x < y);
}

// A pool member or null.
template <typename Source>
DWXObject* Pick(Source& in) {
    const int index = in.Range(0, kPool);
    return index == kPool ? nullptr : gPool[index];
}

// The members met by a DWXIter walk, in order.
inline Members Walk(const DWXContainer& container) {
    Members members;
    DWXIter iter;
    for (DWXObject* o = iter.Start(&container); o && members.size() <= 100000; o = iter.Next()) {
        members.push_back(o);
    }
    return members;
}

inline Members WithoutNulls(Members items) {
    items.erase(std::remove(items.begin(), items.end(), nullptr), items.end());
    return items;
}

// The operations only arrays have, on `slots`: holes as null, none past the
// highest member. Returns the slot a store must hold (-1 for none): an
// insert moves the slots up to `top`, the array's own.
template <typename Source>
int ArrayStep(DWXArray& array, Members& slots, Source& in, DWXObject* o, int op, int top) {
    if (op == 6) {
        const bool insert = in.Flag();
        const int index = in.Range(-1, 40);
        insert ? array.InsertAt(index, o) : array.SetAt(index, o);
        if (index < 0) {
            return -1;
        }
        const size_t at = static_cast<size_t>(index);
        slots.resize(std::max(slots.size(), insert ? at : at + 1));
        insert ? (void)slots.insert(slots.begin() + index, o) : (void)(slots[at] = o);
        return insert ? std::max(index, top) : index;
    } else if (op == 7) {
        const bool pack = in.Flag();
        pack ? array.Pack() : array.Reverse();
        slots = WithoutNulls(slots);
        std::reverse(slots.begin(), pack ? slots.begin() : slots.end());
    } else if (op == 8) {
        // Without a comparator a sort only packs. Equal keys may come in any
        // order: take the array's, once it is sorted and holds the members.
        int (*compare)(const void*, const void*) = in.Flag() ? CompareKeys : nullptr;
        in.Flag() ? array.Sort(compare) : array.StandartSort(compare);
        slots = WithoutNulls(slots);
        const Members sorted = Walk(array);
        MODEL_CHECK(std::is_permutation(sorted.begin(), sorted.end(), slots.begin(), slots.end()));
        auto keyLess = [](DWXObject* x, DWXObject* y) { return CompareKeys(&x, &y) < 0; };
        MODEL_CHECK(compare ? std::is_sorted(sorted.begin(), sorted.end(), keyLess)
                            : sorted == slots);
        slots = sorted;
    } else {
        // Checked only here: GetMaxIndex trims the top, which would hide an
        // Add that fails to reuse trailing empty slots.
        MODEL_CHECK(array.GetMaxIndex() == static_cast<int>(slots.size()));
    }
    return -1;
}

// The operations only lists have.
template <typename Source>
void ListStep(DWXLinkedList& list, Members& items, Source& in, DWXObject* o, int op) {
    if (op == 6) {
        list.Prepend(o);
        items.insert(items.begin(), o);
    } else if (op == 7) {
        // Before the node of some member, or at the end; a null node is ignored.
        DWXObject* anchor = Pick(in);
        DWXListNode* node = list.Find(anchor);
        auto found = std::find(items.begin(), items.end(), anchor);
        MODEL_CHECK((node != nullptr) == (found != items.end()));
        list.Insert(o, node ? node : list.EndNode());
        items.insert(found, o);
        list.Insert(o, nullptr);
    } else {
        DWXListNode* node = list.Find(o);
        list.Remove(node);  // null when not found: ignored, like the sentinel
        list.Remove(list.EndNode());
        if (node) {
            items.erase(std::find(items.begin(), items.end(), o));
        }
    }
}

// The buffer bookkeeping a host may read.
template <typename C>
struct Viewed : C {
    int Capacity() const { return this->nCapacity; }
    int Top() const { return this->nTop; }
};

// The capacity grown to hold slot `index`: twice the index, 64 for slot 0
// (arrays), or about 1.3 times plus five (bags, when full).
template <typename C>
int Grown(int index) {
    return std::is_same_v<C, DWXBag> ? static_cast<int>(index * 1.3 + 5.0) : index ? 2 * index : 64;
}

// A run of operations on a C, checked against `items`: the slots of an array,
// or the members of a bag or list in order, stored nulls included. A walk
// kept open across the steps of an array or bag is checked too: its position
// is the next slot (or bag index) to look at.
template <typename C, typename Source>
void RunContainer(Source& in, int steps) {
    constexpr bool kArray = std::is_base_of_v<DWXArray, C>;
    constexpr bool kList = std::is_same_v<C, DWXLinkedList>;
    constexpr bool kMovesLast = std::is_same_v<C, DWXPackedArray> || std::is_same_v<C, DWXBag>;
    for (int i = 0; i < kPool; ++i) {
        gPool[i] = new Item(i);
    }
    Viewed<C> c;
    Members items;
    DWXIter live(&c);
    size_t at = 0;
    for (int step = 0; step < steps && !in.Empty(); ++step) {
        DWXObject* o = Pick(in);
        const int op = in.Range(0, kArray || kList ? 9 : 5);
        // The buffer bookkeeping before the step: where an Add goes, and a
        // slot the step must hold.
        int capacity = 0, top = static_cast<int>(items.size()), hold = -1;
        if constexpr (kArray) {
            top = c.Top();
        }
        if constexpr (!kList) {
            capacity = c.Capacity();
        }
        if (op < 2) {
            c.Add(o);  // an array ignores null and appends after its highest member
            if (o || !kArray) {
                items.push_back(o);
                hold = top;
            }
        } else if (op == 2) {
            // An array's null is never a member; the bag and the packed array
            // move their last member into the gap.
            auto found = o || !kArray ? std::find(items.begin(), items.end(), o) : items.end();
            MODEL_CHECK(c.Remove(o) == (found != items.end() ? 1 : 0));
            if (found != items.end() && kList) {
                items.erase(found);
            } else if (found != items.end()) {
                *found = kMovesLast ? items.back() : nullptr;
                kMovesLast ? items.pop_back() : (void)0;
                // The last member to leave an array frees its buffer.
                capacity = kArray && WithoutNulls(items).empty() ? 0 : capacity;
            }
        } else if (op == 3) {
            // Copies are made from a walk (a list's node by node); a change to
            // a copy leaves the original alone.
            C copy(c);
            Viewed<C> assigned;
            assigned.Add(gPool[0]);
            static_cast<C&>(assigned) = c;
            c = *&c;
            if constexpr (!kList) {
                MODEL_CHECK(assigned.Capacity() == c.GetCount());  // room for the members only
            }
            const Members walk = Walk(c);
            MODEL_CHECK(Walk(copy) == walk && Walk(assigned) == walk);
            MODEL_CHECK(Walk(DWXBag(&c)) == walk && Walk(DWXArray(&c)) == walk);
            MODEL_CHECK(copy.GetCount() == (kList ? c.GetCount() : static_cast<int>(walk.size())));
            copy.Remove(o);
            assigned.Empty();
        } else if (op == 4) {
            // Adding a container to itself doubles it: past 512 members the
            // step adds null instead, so that runs stay small.
            const Members walk = Walk(c);
            DWXBag other(&c);
            const int drawn = in.Range(0, 2);
            const int source = items.size() > 512 ? 2 : drawn;
            const DWXContainer* added[] = {&c, &other, nullptr};
            c.AddContainer(added[source]);
            items.insert(items.end(), walk.begin(), source < 2 ? walk.end() : walk.begin());
        } else if (op == 5) {
            // DestroyContents deletes each member a walk meets once, then empties.
            const bool destroy = in.Flag();
            const Members walk = Walk(c);
            std::fill(gDeleted, gDeleted + kPool, 0);
            destroy ? static_cast<DWXContainer&>(c).DestroyContents() : c.Empty();
            for (int i = 0; i < kPool; ++i) {
                const bool met = std::count(walk.begin(), walk.end(), gPool[i]) > 0;
                MODEL_CHECK(gDeleted[i] == (destroy && met ? 1 : 0));
                gPool[i] = gDeleted[i] ? new Item(i) : gPool[i];
            }
            items.clear();
            capacity = 0;
        } else if constexpr (kArray) {
            hold = ArrayStep(c, items, in, o, op, top);
        } else if constexpr (kList) {
            ListStep(c, items, in, o, op);
        }
        while (kArray && !items.empty() && !items.back()) {
            items.pop_back();
        }
        // The buffer grows for a slot past it (AddContainer's adds are not
        // followed).
        if constexpr (!kList) {
            capacity = hold >= capacity ? Grown<C>(hold) : capacity;
            MODEL_CHECK(op == 4 || c.Capacity() == capacity);
        }
        const Members walk =
            kArray ? WithoutNulls(items)
                   : Members(items.begin(), std::find(items.begin(), items.end(), nullptr));
        MODEL_CHECK(Walk(c) == walk);
        // A dump shows an array's slots, a bag's walk and a list's nodes.
        std::string dump = kArray  ? ""
                           : kList ? "nCount=" + std::to_string(items.size()) + "\n"
                                   : "DWXBag:\n";
        const Members& dumped = kArray || kList ? items : walk;
        for (size_t i = 0; i < dumped.size(); ++i) {
            char line[64];
            snprintf(line, sizeof line, "Item:%p\n", static_cast<const void*>(dumped[i]));
            const std::string slot =
                kArray ? c.GetClassName() + ("[" + std::to_string(i) + "]:") : "";
            dump += !dumped[i] ? (kList ? "NULL\n" : "") : slot + line + (kList ? "\n" : "");
        }
        MODEL_CHECK(Captured([&](FILE* f) { c.Dump(f), c.Dump(nullptr); }) == dump);
        MODEL_CHECK(Members(c.begin(), c.end()) == walk);  // the walk of range-for
        MODEL_CHECK(c.GetCount() == static_cast<int>(kArray ? walk.size() : items.size()));
        // Validate asks the members in walk order until one fails.
        auto invalid =
            std::find_if(walk.begin(), walk.end(), [](DWXObject* m) { return Item::Key(m) == 4; });
        gAsked = 0;
        MODEL_CHECK(c.Validate() == (invalid == walk.end() ? 1 : 0));
        MODEL_CHECK(gAsked == (invalid - walk.begin()) + (invalid == walk.end() ? 0 : 1));
        for (int i = 0; i <= kPool; ++i) {
            DWXObject* m = i < kPool ? gPool[i] : nullptr;
            const Members& held = kArray ? walk : items;
            MODEL_CHECK(c.IsMember(m) == (std::count(held.begin(), held.end(), m) > 0));
            if constexpr (kArray) {
                auto found = m ? std::find(items.begin(), items.end(), m) : items.end();
                MODEL_CHECK(c.GetIndex(m) == (found == items.end() ? -1 : found - items.begin()));
            }
        }
        if constexpr (kArray) {
            const int end = static_cast<int>(items.size());
            for (int i = -1; i <= end + 1; ++i) {
                MODEL_CHECK(c[i] == (i >= 0 && i < end ? items[static_cast<size_t>(i)] : nullptr));
            }
        }
        if (const int walkStep = in.Range(0, 3); !kList && walkStep < 2) {
            // An array skips its empty slots; a bag yields what its slot holds.
            at = walkStep == 0 ? 0 : at;
            size_t next = at;
            while (kArray && next < items.size() && !items[next]) {
                ++next;
            }
            DWXObject* expected = next < items.size() ? items[next] : nullptr;
            MODEL_CHECK((walkStep == 0 ? live.Start() : (++live).Current()) == expected);
            MODEL_CHECK(*live == expected);
            at = next < items.size() ? next + 1 : at;
        }
    }
    c.Empty();
    for (Item* item : gPool) {
        delete item;
    }
}

// One run on a container the source picks.
template <typename Source>
void Run(Source& in, int steps) {
    void (*const runs[])(Source&, int) = {
        RunContainer<DWXArray, Source>, RunContainer<DWXPackedArray, Source>,
        RunContainer<DWXBag, Source>, RunContainer<DWXLinkedList, Source>};
    runs[in.Range(0, 3)](in, steps);
}

}  // namespace container_model
