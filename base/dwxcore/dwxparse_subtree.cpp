// The subtree: ownership of children, lookups by name, deep copy and merge;
// and the exception list that steers the merge.
#include <dwxcore/dwxparse.h>

#include <services/portability.h>
#include <services/rtprim.h>

#include <limits.h>
#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#include <string>
#include <typeinfo>
#include <utility>
#include <vector>

namespace {

// Whole names, ignoring case; a null name on either side matches nothing.
bool NameMatches(const DWXParseTreeNode* node, const char* name) {
    return name != nullptr && node->GetName() != nullptr && _stricmp(node->GetName(), name) == 0;
}

// Eight bytes of a name with the ASCII letters A-Z folded to a-z, all
// eight at once; bytes from 0x80 up are left alone, as AsciiLower leaves them.
uint64_t FoldWord(uint64_t word) {
    constexpr uint64_t kOnes = 0x0101010101010101ull;
    constexpr uint64_t kHigh = 0x8080808080808080ull;
    const uint64_t low = word & ~kHigh;
    const uint64_t atLeastA = low + (0x80 - 'A') * kOnes;       // high bit: byte >= 'A'
    const uint64_t aboveZ = low + (0x80 - 'Z' - 1) * kOnes;     // high bit: byte > 'Z'
    const uint64_t upper = atLeastA & ~aboveZ & ~word & kHigh;  // and byte < 0x80
    return word | (upper >> 2);                                 // 0x80 >> 2 is 'a' - 'A'
}

// The last `rest` bytes of a name, [1, 7] of them, as the low bytes of one
// word (the rest zero), as a loop over them would build it: two loads of
// four bytes that may overlap, or single bytes below four. Names are hashed
// and compared a word at a time plus this tail, with no loop over bytes
// (names such as "key1234" are all tail).
uint64_t TailWord(const char* tail, size_t rest) {
    if (rest >= 4) {
        uint32_t low, high;
        memcpy(&low, tail, 4);
        memcpy(&high, tail + rest - 4, 4);
        // high holds bytes [rest - 4, rest); bytes [4, rest) are its top ones.
        return low | ((static_cast<uint64_t>(high) >> (8 * (8 - rest))) << 32);
    }
    uint64_t word = static_cast<unsigned char>(tail[0]);
    if (rest > 1) {
        word |= static_cast<uint64_t>(static_cast<unsigned char>(tail[1])) << 8;
    }
    if (rest > 2) {
        word |= static_cast<uint64_t>(static_cast<unsigned char>(tail[2])) << 16;
    }
    return word;
}

// A hash of the name with ASCII letters folded, so that two names that
// _stricmp calls equal always hash alike; a word at a time. The name's
// length goes to *length.
uint32_t FoldedHash(const char* name, size_t* length) {
    const size_t size = strlen(name);
    *length = size;
    uint64_t hash = 0x9e3779b97f4a7c15ull ^ size;
    size_t i = 0;
    for (; i + 8 <= size; i += 8) {
        uint64_t word;
        memcpy(&word, name + i, 8);
        hash = (hash ^ FoldWord(word)) * 0xff51afd7ed558ccdull;
        hash ^= hash >> 29;
    }
    const uint64_t tail = i < size ? TailWord(name + i, size - i) : 0;
    hash = (hash ^ FoldWord(tail)) * 0xc4ceb9fe1a85ec53ull;
    return static_cast<uint32_t>(hash ^ (hash >> 32));
}

uint32_t FoldedHash(const char* name) {
    size_t length;
    return FoldedHash(name, &length);
}

// Equal ignoring ASCII case, as _stricmp decides, for two names of
// `length` bytes (folding never changes a length, so names of different
// lengths never match). Names are mostly looked up as they are written, so
// the exact test comes first, a word at a time.
bool SameName(const char* a, const char* b, size_t length) {
    size_t i = 0;
    for (; i + 8 <= length; i += 8) {
        uint64_t x, y;
        memcpy(&x, a + i, 8);
        memcpy(&y, b + i, 8);
        if (x != y) {
            return _stricmp(a, b) == 0;
        }
    }
    if (i < length && TailWord(a + i, length - i) != TailWord(b + i, length - i)) {
        return _stricmp(a, b) == 0;
    }
    return true;
}

// Subtrees with no more children than this are searched by a walk; a walk of
// a few children is as quick as a hash and costs no memory.
constexpr int kIndexFrom = 9;

// Where DWXArray's own growth takes over from the children array's.
constexpr int kFirstCapacity = 64;

// The names of an exception list, hashed once for a whole merge; short
// lists are searched as they are.
class ExceptionSet {
  public:
    ExceptionSet(char* const* names, int count) : ppcNames(names), nCount(count) {
        if (count <= 8) {
            return;
        }
        size_t size = 16;
        while (size < 2 * static_cast<size_t>(count)) {
            size *= 2;
        }
        oSlots.assign(size, -1);
        for (int i = 0; i < count; ++i) {
            size_t slot = FoldedHash(names[i]) & (size - 1);
            while (oSlots[slot] >= 0) {
                slot = (slot + 1) & (size - 1);
            }
            oSlots[slot] = i;
        }
    }

    bool Contains(const char* name) const {
        if (oSlots.empty()) {
            for (int i = 0; i < nCount; ++i) {
                if (_stricmp(ppcNames[i], name) == 0) {
                    return true;
                }
            }
            return false;
        }
        const size_t mask = oSlots.size() - 1;
        for (size_t slot = FoldedHash(name) & mask; oSlots[slot] >= 0; slot = (slot + 1) & mask) {
            if (_stricmp(ppcNames[oSlots[slot]], name) == 0) {
                return true;
            }
        }
        return false;
    }

  private:
    char* const* ppcNames;
    int nCount;
    std::vector<int> oSlots;  // indexes into the names; -1 for an empty slot
};

// A subtree of exactly this library's class. Deep trees are walked with
// explicit work lists rather than recursion; only these subtrees are walked
// that way, so a host's subclass keeps its own Copy and destructor.
bool IsPlainSubTree(const DWXObject* node) {
    // The library's own type_info object, compared by address: a copy of it
    // elsewhere could only make a plain subtree look like a host's class,
    // which then destroys itself by recursion, as a host's class does.
    return &typeid(*node) == &typeid(PTNSubTree);
}

}  // namespace

// ---------------------------------------------------------------------------
// ExceptionList

ExceptionList::ExceptionList() : ppcNames(nullptr), nCount(0), nCapacity(0) {}

ExceptionList::ExceptionList(const ExceptionList& other) : ExceptionList() {
    for (int i = 0; i < other.nCount; ++i) {
        Append(other.ppcNames[i]);
    }
}

ExceptionList& ExceptionList::operator=(const ExceptionList& other) {
    if (this != &other) {
        Clear();
        for (int i = 0; i < other.nCount; ++i) {
            Append(other.ppcNames[i]);
        }
    }
    return *this;
}

ExceptionList::~ExceptionList() {
    Clear();
}

void ExceptionList::Add(const char* name) {
    if (name != nullptr) {
        Append(name);
    }
}

int ExceptionList::IsMember(const char* name) const {
    if (name == nullptr) {
        return 0;
    }
    for (int i = 0; i < nCount; ++i) {
        if (_stricmp(ppcNames[i], name) == 0) {
            return 1;
        }
    }
    return 0;
}

void ExceptionList::Append(const char* name) {
    if (nCount == nCapacity) {
        nCapacity = nCapacity == 0 ? 8 : 2 * nCapacity;
        ppcNames =
            static_cast<char**>(HRealloc(ppcNames, sizeof(char*) * static_cast<size_t>(nCapacity)));
    }
    ppcNames[nCount++] = HString(name);
}

void ExceptionList::Clear() {
    for (int i = 0; i < nCount; ++i) {
        free(ppcNames[i]);
    }
    free(ppcNames);
    ppcNames = nullptr;
    nCount = nCapacity = 0;
}

// ---------------------------------------------------------------------------
// PTNSubTree: the name index
//
// An open-addressing table with one entry per distinct name (folded), which
// holds the slots of the first and last child of that name and their count;
// the children of one name are chained in slot order through `next`. The
// table refers to children by slot in the children array: slots never move
// (taking a child out leaves an empty slot), so appending, renaming and
// taking out touch only the chain of the names concerned.

struct PTNSubTree::NameIndex {
    static constexpr int32_t kEmpty = -1;
    static constexpr int32_t kGone = -2;  // a name whose last child went
    struct Entry {
        uint32_t hash;
        int32_t first;  // slot, kEmpty or kGone
        int32_t last;
        int32_t count;
        uint32_t length;         // of the name
        DWXParseTreeNode* node;  // the child in `first`, so a lookup need not read the array
    };

    explicit NameIndex(const DWXArray& children) : oChildren(children) { Rebuild(); }

    DWXParseTreeNode* NodeAt(int32_t slot) const {
        return static_cast<DWXParseTreeNode*>(oChildren[slot]);
    }

    // The entry of that name, or null.
    const Entry* Find(const char* name) const {
        size_t length;
        const uint32_t hash = FoldedHash(name, &length);
        return const_cast<NameIndex*>(this)->FindEntry(name, hash, length);
    }

    Entry* FindEntry(const char* name) {
        size_t length;
        const uint32_t hash = FoldedHash(name, &length);
        return FindEntry(name, hash, length);
    }

    Entry* FindEntry(const char* name, uint32_t hash, size_t length) {
        const size_t mask = oEntries.size() - 1;
        for (size_t i = hash & mask;; i = (i + 1) & mask) {
            Entry& entry = oEntries[i];
            if (entry.first == kEmpty) {
                return nullptr;
            }
            if (entry.first >= 0 && entry.hash == hash && entry.length == length &&
                SameName(entry.node->GetName(), name, length)) {
                return &entry;
            }
        }
    }

    // Records the child in `slot` under its name, in slot order among its
    // namesakes: O(1) for the last slot, O(namesakes) otherwise.
    void Insert(int32_t slot) {
        DWXParseTreeNode* child = NodeAt(slot);
        const char* name = child->GetName();
        if (name == nullptr) {
            return;  // a null name is never found
        }
        if (static_cast<size_t>(slot) >= oNext.size()) {
            oNext.resize(static_cast<size_t>(slot) + 1 + oNext.size() / 2, kEmpty);
        }
        size_t length;
        const uint32_t hash = FoldedHash(name, &length);
        if (Entry* entry = FindEntry(name, hash, length)) {
            ++entry->count;
            if (slot > entry->last) {
                oNext[static_cast<size_t>(entry->last)] = slot;
                oNext[static_cast<size_t>(slot)] = kEmpty;
                entry->last = slot;
            } else if (slot < entry->first) {
                oNext[static_cast<size_t>(slot)] = entry->first;
                entry->first = slot;
                entry->node = child;
            } else {
                int32_t at = entry->first;
                while (oNext[static_cast<size_t>(at)] < slot) {
                    at = oNext[static_cast<size_t>(at)];
                }
                oNext[static_cast<size_t>(slot)] = oNext[static_cast<size_t>(at)];
                oNext[static_cast<size_t>(at)] = slot;
            }
            return;
        }
        if (4 * (nUsed + 1) > 3 * oEntries.size()) {
            Rebuild();  // `slot` is in the array already, so this records it
            return;
        }
        const size_t mask = oEntries.size() - 1;
        size_t i = hash & mask;
        while (oEntries[i].first >= 0) {  // a name's first gone entry is reused
            i = (i + 1) & mask;
        }
        if (oEntries[i].first == kEmpty) {
            ++nUsed;
        }
        oEntries[i] = {hash, slot, slot, 1, static_cast<uint32_t>(length), child};
        oNext[static_cast<size_t>(slot)] = kEmpty;
    }

    // Takes the child in `slot`, named `name`, out of its chain; false when
    // that slot is not in the chain of that name.
    bool Remove(int32_t slot, const char* name) {
        if (name == nullptr) {
            return false;
        }
        Entry* entry = FindEntry(name);
        if (entry == nullptr) {
            return false;
        }
        int32_t previous = kEmpty;
        int32_t at = entry->first;
        while (at != kEmpty && at != slot) {
            previous = at;
            at = oNext[static_cast<size_t>(at)];
        }
        if (at == kEmpty) {
            return false;
        }
        const int32_t after = oNext[static_cast<size_t>(slot)];
        if (previous == kEmpty) {
            entry->first = after;
            entry->node = after >= 0 ? NodeAt(after) : nullptr;
        } else {
            oNext[static_cast<size_t>(previous)] = after;
        }
        if (entry->last == slot) {
            entry->last = previous;
        }
        if (--entry->count == 0) {
            entry->first = kGone;
        }
        return true;
    }

    // The slot of `child`, found through the chain of its name; -1 when the
    // child is not recorded.
    int32_t SlotOf(const DWXParseTreeNode* child) const {
        if (child->GetName() == nullptr) {
            return -1;
        }
        const Entry* entry = Find(child->GetName());
        for (int32_t at = entry ? entry->first : kEmpty; at != kEmpty;
             at = oNext[static_cast<size_t>(at)]) {
            if (oChildren[at] == child) {
                return at;
            }
        }
        return -1;
    }

    // Every child again, in slot order, in a table sized for twice as many.
    void Rebuild() {
        const int top = oChildren.GetMaxIndex();
        size_t size = 16;
        while (size < 2 * static_cast<size_t>(top) + 2) {
            size *= 2;
        }
        oEntries.assign(size, Entry{0, kEmpty, kEmpty, 0, 0, nullptr});
        oNext.assign(static_cast<size_t>(top) + 1, kEmpty);
        nUsed = 0;
        for (int32_t slot = 0; slot < top; ++slot) {
            if (oChildren[slot] != nullptr) {
                Insert(slot);
            }
        }
    }

    const DWXArray& oChildren;
    std::vector<Entry> oEntries;  // size a power of two
    std::vector<int32_t> oNext;   // by slot: the next slot of the same name
    size_t nUsed = 0;             // entries not empty (gone ones included)
};

PTNSubTree::NameIndex* PTNSubTree::Index() const {
    if (poIndex == nullptr && oChildren.GetCount() >= kIndexFrom) {
        poIndex = new NameIndex(oChildren);
    }
    return poIndex;
}

void PTNSubTree::DropIndex() {
    delete poIndex;
    poIndex = nullptr;
}

// ---------------------------------------------------------------------------
// PTNSubTree: ownership and copies

PTNSubTree::PTNSubTree(const char* name) : DWXParseTreeNode(name), oChildren(), poIndex(nullptr) {}

PTNSubTree::PTNSubTree(const PTNSubTree& other)
    : DWXParseTreeNode(other), oChildren(), poIndex(nullptr) {
    CopyChildrenFrom(other);
}

PTNSubTree& PTNSubTree::operator=(const PTNSubTree& other) {
    if (this == &other) {
        return *this;
    }
    // The copy is made before the old children go: `other` may lie below this
    // subtree and would go with them.
    PTNSubTree copy(other);
    DWXParseTreeNode::operator=(other);
    DestroyChildren();
    const int top = copy.oChildren.GetMaxIndex();
    for (int i = 0; i < top; ++i) {
        if (auto* child = static_cast<DWXParseTreeNode*>(copy.oChildren[i])) {
            child->SetParent(nullptr);
            AppendChild(child);
        }
    }
    copy.oChildren.Empty();  // the children now belong to this subtree
    return *this;
}

PTNSubTree::~PTNSubTree() {
    DestroyChildren();
}

void PTNSubTree::DestroyChildren() {
    DropIndex();
    // Deleting a child subtree deletes its own children, so a deep tree would
    // recurse once per level. Instead a plain subtree's children array is
    // taken from it before it is deleted and walked next, from a stack of
    // taken arrays as deep as the tree: every node is visited once and no
    // destructor recurses. Each child is cut loose from its parent before it
    // is deleted, so that it does not try to take itself out of an array that
    // is going anyway. A node is never in two slots, as AddChild moves a node
    // it already holds.
    struct Taken {
        DWXObject** items;
        int top;
        int next;
    };
    Taken first{nullptr, 0, 0};
    first.items = oChildren.TakeSlots(&first.top);
    if (first.items == nullptr) {
        return;
    }
    std::vector<Taken> stack{first};
    while (!stack.empty()) {
        Taken& taken = stack.back();
        if (taken.next == taken.top) {
            free(taken.items);
            stack.pop_back();
            continue;
        }
        auto* child = static_cast<DWXParseTreeNode*>(taken.items[taken.next++]);
        if (child == nullptr) {
            continue;
        }
        child->poParent = nullptr;
        Taken below{nullptr, 0, 0};
        if (IsPlainSubTree(child)) {
            auto* subtree = static_cast<PTNSubTree*>(child);
            subtree->DropIndex();
            below.items = subtree->oChildren.TakeSlots(&below.top);
        }
        delete child;
        if (below.items != nullptr) {
            stack.push_back(below);  // `taken` is not used after this
        }
    }
}

void PTNSubTree::CopyChildrenFrom(const PTNSubTree& other) {
    // Plain subtrees are copied here, each new one with the name of its
    // source and filled later from the work list, so deep trees do not
    // recurse; every other child copies itself. Children keep their order.
    std::vector<std::pair<const PTNSubTree*, PTNSubTree*>> pending{{&other, this}};
    while (!pending.empty()) {
        const std::pair<const PTNSubTree*, PTNSubTree*> work = pending.back();
        pending.pop_back();
        const DWXArray& children = work.first->oChildren;
        const int top = children.GetMaxIndex();
        for (int i = 0; i < top; ++i) {
            auto* child = static_cast<DWXParseTreeNode*>(children[i]);
            if (child == nullptr) {
                continue;
            }
            if (IsPlainSubTree(child)) {
                auto* source = static_cast<const PTNSubTree*>(child);
                auto* copy = new PTNSubTree(child->GetName());
                source->KeepSource(copy);
                work.second->AppendChild(copy);
                pending.emplace_back(source, copy);
            } else if (DWXParseTreeNode* copy = child->Copy()) {
                // A host's class may hand back a node that is already placed;
                // a new one needs none of AddChild's checks.
                if (copy->poParent == nullptr) {
                    work.second->AppendChild(copy);
                } else {
                    work.second->AddChild(copy);
                }
            }
        }
    }
}

void PTNSubTree::AddChild(DWXParseTreeNode* child) {
    if (child == nullptr) {
        return;
    }
    for (const DWXParseTreeNode* node = this; node != nullptr; node = node->poParent) {
        if (node == child) {
            return;  // the subtree itself or an ancestor: a tree cannot hold itself
        }
    }
    if (child->poParent != nullptr) {
        child->poParent->ForgetChild(child);
        child->poParent = nullptr;
    }
    AppendChild(child);
}

void PTNSubTree::ChildArray::Append(DWXObject* child) {
    if (nTop == nCapacity && nCapacity < kFirstCapacity) {
        // DWXArray::Add grows an array that is full, from 64 slots; this
        // gives it its first few. Beyond them Add doubles as usual.
        const int capacity = nCapacity == 0 ? 8 : kFirstCapacity;
        ppoItems = static_cast<DWXObject**>(
            HRealloc(ppoItems, static_cast<size_t>(capacity) * sizeof(DWXObject*)));
        for (int i = nCapacity; i < capacity; ++i) {
            ppoItems[i] = nullptr;
        }
        nCapacity = capacity;
    }
    Add(child);
}

DWXObject** PTNSubTree::ChildArray::TakeSlots(int* top) {
    DWXObject** items = ppoItems;
    *top = nTop;
    ppoItems = nullptr;
    nCount = nCapacity = nTop = 0;
    return items;
}

void PTNSubTree::AppendChild(DWXParseTreeNode* child) {
    oChildren.Append(child);
    child->poParent = this;
    if (poIndex != nullptr) {
        poIndex->Insert(oChildren.GetMaxIndex() - 1);
    }
}

int PTNSubTree::SlotOf(const DWXParseTreeNode* child) const {
    const int slot = poIndex != nullptr ? poIndex->SlotOf(child) : -1;
    // Nameless children are not indexed; they are found by a walk.
    return slot >= 0 ? slot : oChildren.GetIndex(child);
}

void PTNSubTree::ForgetChild(DWXParseTreeNode* child) {
    Index();  // so that taking many children out of a large subtree is not quadratic
    const int slot = SlotOf(child);
    if (slot < 0) {
        return;  // a parent recorded with SetParent that does not hold the node
    }
    if (poIndex != nullptr) {
        poIndex->Remove(slot, child->GetName());
    }
    oChildren.SetAt(slot, nullptr);
}

void PTNSubTree::RenameChild(DWXParseTreeNode* child, const char* name) {
    const int slot = poIndex != nullptr ? SlotOf(child) : -1;
    if (slot >= 0) {
        poIndex->Remove(slot, child->GetName());
    }
    child->ReplaceName(name);
    if (slot >= 0) {
        poIndex->Insert(slot);
    }
}

const char* PTNSubTree::GetClassName() const {
    return "PTNSubTree";
}

DWXParseTreeNode* PTNSubTree::Copy() {
    return new PTNSubTree(*this);
}

PTNSubTree* PTNSubTree::DeepCopy() {
    return static_cast<PTNSubTree*>(Copy());
}

void PTNSubTree::SetFrom(DWXParseTreeNode*) {}

// ---------------------------------------------------------------------------
// Lookups

DWXParseTreeNode* PTNSubTree::GetChild(const char* name, const char* type) const {
    if (name == nullptr) {
        return nullptr;
    }
    // The index, once built, without the call that builds it (a tenth of a
    // lookup among 100,000 siblings).
    if (const NameIndex* index = poIndex != nullptr ? poIndex : Index()) {
        // The namesakes in child order; the first of the class asked for.
        const NameIndex::Entry* entry = index->Find(name);
        if (type == nullptr) {
            return entry != nullptr ? entry->node : nullptr;
        }
        for (int32_t at = entry ? entry->first : NameIndex::kEmpty; at != NameIndex::kEmpty;
             at = index->oNext[static_cast<size_t>(at)]) {
            auto* child = static_cast<DWXParseTreeNode*>(oChildren[at]);
            if (type == nullptr || _stricmp(child->GetClassName(), type) == 0) {
                return child;
            }
        }
        return nullptr;
    }
    DWXIter iter(&oChildren);
    for (DWXObject* object = iter.Current(); object != nullptr; object = iter.Next()) {
        auto* child = static_cast<DWXParseTreeNode*>(object);
        if (NameMatches(child, name) &&
            (type == nullptr || _stricmp(child->GetClassName(), type) == 0)) {
            return child;
        }
    }
    return nullptr;
}

int PTNSubTree::GetChildAsBool(const char* name) const {
    // PTNBool and PTNInteger both hold an int and are read alike.
    return GetChildAsInteger(name);
}

int PTNSubTree::GetChildAsInteger(const char* name) const {
    DWXParseTreeNode* child = GetChild(name);
    if (auto* integer = dynamic_cast<PTNInteger*>(child)) {
        return integer->GetValue();
    }
    if (auto* boolean = dynamic_cast<PTNBool*>(child)) {
        return boolean->GetValue();
    }
    return 0;
}

char PTNSubTree::GetChildAsChar(const char* name) const {
    auto* child = dynamic_cast<PTNChar*>(GetChild(name));
    return child != nullptr ? child->GetValue() : '\0';
}

double PTNSubTree::GetChildAsDouble(const char* name) const {
    auto* child = dynamic_cast<PTNDouble*>(GetChild(name));
    return child != nullptr ? child->GetValue() : 0.0;
}

const char* PTNSubTree::GetChildAsString(const char* name) const {
    static const char kEmpty[] = "";
    auto* child = dynamic_cast<PTNString*>(GetChild(name));
    return child != nullptr ? child->GetValue() : kEmpty;
}

char** PTNSubTree::GetChildAsStringList(const char* name) const {
    auto* child = dynamic_cast<PTNStringList*>(GetChild(name));
    return child != nullptr ? child->GetValue() : nullptr;
}

int PTNSubTree::GetNumberOfOccurence(const char* name) const {
    if (name == nullptr) {
        return 0;
    }
    if (const NameIndex* index = poIndex != nullptr ? poIndex : Index()) {
        const NameIndex::Entry* entry = index->Find(name);
        return entry != nullptr ? entry->count : 0;
    }
    int count = 0;
    DWXIter iter(&oChildren);
    for (DWXObject* object = iter.Current(); object != nullptr; object = iter.Next()) {
        if (NameMatches(static_cast<DWXParseTreeNode*>(object), name)) {
            ++count;
        }
    }
    return count;
}

// ---------------------------------------------------------------------------
// Paths

namespace {

// One step of a path: the name (not terminated; it ends at nameEnd) and the
// index, or -1 when the step has none. False for a malformed step.
bool ParseStep(const char* step, const char* stepEnd, const char** nameEnd, int* index) {
    const char* bracket = static_cast<const char*>(memchr(step, '[', stepEnd - step));
    *nameEnd = bracket ? bracket : stepEnd;
    *index = -1;
    if (*nameEnd == step) {
        return false;  // an empty name
    }
    if (!bracket) {
        return true;
    }
    // "[digits]" and nothing after it; the index must fit in int.
    const char* digit = bracket + 1;
    if (stepEnd - digit < 2 || stepEnd[-1] != ']') {
        return false;
    }
    long long value = 0;
    for (; digit < stepEnd - 1; ++digit) {
        if (*digit < '0' || *digit > '9') {
            return false;
        }
        value = value * 10 + (*digit - '0');
        if (value > INT_MAX) {
            return false;
        }
    }
    *index = static_cast<int>(value);
    return true;
}

}  // namespace

DWXParseTreeNode* PTNSubTree::Find(const char* path) const {
    if (path == nullptr || *path == '\0') {
        return nullptr;
    }
    const PTNSubTree* tree = this;
    std::string name;
    for (const char* step = path;;) {
        const char* stepEnd = strchr(step, '/');
        if (stepEnd == nullptr) {
            stepEnd = step + strlen(step);
        }
        const char* nameEnd;
        int index;
        if (!ParseStep(step, stepEnd, &nameEnd, &index)) {
            return nullptr;
        }
        name.assign(step, nameEnd);
        DWXParseTreeNode* node = nullptr;
        if (index <= 0) {
            node = tree->GetChild(name.c_str());
        } else if (index < tree->GetNumberOfOccurence(name.c_str())) {
            // The N-th namesake: one walk of the children.
            for (DWXParseTreeNode* child : *tree) {
                if (NameMatches(child, name.c_str()) && index-- == 0) {
                    node = child;
                    break;
                }
            }
        }
        if (node == nullptr || *stepEnd == '\0') {
            return node;
        }
        tree = dynamic_cast<const PTNSubTree*>(node);
        if (tree == nullptr) {
            return nullptr;  // a leaf has no children to step into
        }
        step = stepEnd + 1;
    }
}

// ---------------------------------------------------------------------------
// Merge

void PTNSubTree::SetFrom(PTNSubTree* other, const ExceptionList& exceptions) {
    if (other == nullptr) {
        return;
    }
    // Depth first in child order, as a recursion would go, with the open
    // subtree pairs on an explicit stack so that deep trees do not recurse.
    struct Level {
        PTNSubTree* tree;
        PTNSubTree* source;
        int next;
    };
    const ExceptionSet excepted(exceptions.ppcNames, exceptions.nCount);
    std::vector<Level> levels{{this, other, 0}};
    while (!levels.empty()) {
        Level& level = levels.back();
        if (level.next >= level.tree->oChildren.GetMaxIndex()) {
            levels.pop_back();
            continue;
        }
        auto* child = static_cast<DWXParseTreeNode*>(level.tree->oChildren[level.next++]);
        if (child == nullptr || child->GetName() == nullptr ||
            excepted.Contains(child->GetName())) {
            continue;  // an excepted subtree keeps everything below it too
        }
        // Only the first namesake in `source` counts, whatever its class;
        // found through the source's index when it is large.
        DWXParseTreeNode* source = level.source->GetChild(child->GetName());
        if (source == nullptr) {
            continue;
        }
        if (auto* subtree = dynamic_cast<PTNSubTree*>(child)) {
            if (auto* sourceSubtree = dynamic_cast<PTNSubTree*>(source)) {
                levels.push_back({subtree, sourceSubtree, 0});  // `level` is not used after this
            }
        } else {
            child->SetFrom(source);
        }
    }
}
