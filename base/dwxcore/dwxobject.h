// The object root, the container and iteration protocol, and the containers
// of object pointers. Containers never own their members; only
// DestroyContents deletes them.
#pragma once

#include <dwxcore/dwxcore_export.h>

#include <stdint.h>
#include <stdio.h>

#include <cstddef>
#include <iterator>

class DWXIter;
template <class T>
class DWXRangeIter;

// Root of every class with an identity. Deleting through a DWXObject* is safe.
class DWXCORE_API DWXObject {
  public:
    DWXObject() {}
    DWXObject(const DWXObject&) {}
    DWXObject& operator=(const DWXObject&) { return *this; }
    virtual ~DWXObject();

    // Writes "ClassName:address\n". A null stream writes nothing.
    virtual void Dump(FILE* stream) const;
    // The class name as a literal; parse tree writers turn it into a keyword.
    virtual const char* GetClassName() const = 0;
};

// A collection of DWXObject pointers that it does not own. The same object may
// sit in several containers. Derived containers supply the walk (Start, Next,
// reserved to DWXIter) and the primitives IsMember, Add and Remove; the rest
// is built on them here.
class DWXCORE_API DWXContainer : public DWXObject {
    friend class DWXIter;

  public:
    DWXContainer() : nCount(0) {}
    // Copies the count only; each derived container copies its own storage.
    DWXContainer(const DWXContainer& other) : DWXObject(other), nCount(other.nCount) {}
    DWXContainer& operator=(const DWXContainer& other) {
        nCount = other.nCount;
        return *this;
    }
    ~DWXContainer() override;

    // Writes "ClassName:\n", then the dump of each member in walk order.
    void Dump(FILE* stream) const override;

  protected:
    // The first member, with the walk's position stored in `iter`; null when
    // there is none.
    virtual DWXObject* Start(DWXIter* iter) const = 0;
    // The member after the position stored in `iter`; null at the end, and
    // null again on every further call while the container is unchanged.
    virtual DWXObject* Next(DWXIter* iter) const = 0;

  private:
    // Reserved for containers that attach state to a walk; nothing calls it.
    virtual void DestroyIterator(DWXIter* iter) const;

  public:
    // 1 when a member is the same pointer, else 0.
    virtual int IsMember(const DWXObject* object) = 0;
    virtual void Add(DWXObject* object) = 0;
    // Takes out the first member that is this pointer; 1 when one was found,
    // else 0. Never deletes the object.
    virtual int Remove(const DWXObject* object) = 0;
    // Takes out every member without deleting it.
    virtual void Empty();
    // 1 unless a member that derives from DWXValidatable answers 0.
    virtual int Validate() const;

    // For range-for: for (DWXObject* o : container) visits what a DWXIter
    // visits, in the same order, and ends where it ends.
    DWXRangeIter<DWXObject> begin() const;
    DWXRangeIter<DWXObject> end() const;

    int GetCount() const { return nCount; }
    int IsEmpty() const { return nCount == 0 ? 1 : 0; }

    // Adds the members of `other` (shared, not copied) in its walk order.
    // A null `other` adds nothing; the container itself as `other` adds a
    // snapshot of its members, so they end up there twice.
    void AddContainer(const DWXContainer* other);
    // Deletes the members met by a walk, each distinct pointer once, then
    // empties the container. Each member is taken out before it is deleted,
    // so its destructor may remove, delete or add other members.
    void DestroyContents();

  protected:
    // The part of an iterator that belongs to the container it walks:
    // a slot index for arrays and bags, a node pointer for lists.
    static int64_t GetPosition(const DWXIter* iter);
    static void SetPosition(DWXIter* iter, int64_t position);

    int nCount;
};

// A walk over any container. The usual walk:
//   for (DWXObject* o = iter.Start(&container); o; o = iter.Next()) ...
// A null result ends the walk. An iterator holds no resources and may be
// dropped at any point; a copy goes on from the same place independently.
class DWXCORE_API DWXIter : public DWXObject {
    friend class DWXContainer;
    // The array walk reads and writes the position directly; it is the
    // library's hottest walk.
    friend class DWXArray;

  public:
    DWXIter();
    // Binds to `container` and, when it is not null, stands on its first
    // member. Implicit, so that hosts may write `DWXIter iter = &array;`.
    DWXIter(const DWXContainer* container);
    DWXIter(const DWXIter& other) = default;
    DWXIter& operator=(const DWXIter& other) = default;
    ~DWXIter() override;

    const char* GetClassName() const override;

    // Binds to `container` when it is not null (null keeps the bound one)
    // and returns its first member; null when nothing is bound or it is empty.
    DWXObject* Start(const DWXContainer* container = nullptr);
    // The next member; null at the end or when nothing is bound.
    DWXObject* Next();
    DWXIter& operator++();
    DWXObject* operator*() const { return poCurrent; }
    DWXObject* Current() const { return poCurrent; }
    // Binds without starting; call Start next. The position is kept only when
    // the container is the one already bound: a position belongs to the
    // container that set it, so another container begins from its first member.
    void SetTarget(const DWXContainer* container);

  protected:
    const DWXContainer* poTarget;
    DWXObject* poCurrent;
    int64_t nPosition;
};

// The walk of a DWXIter as an input iterator, for range-for and algorithms.
// T is the class the container's owner guarantees for its members (members
// are handed out with static_cast). The end iterator is default-constructed;
// a walk is at its end when its DWXIter yields null.
template <class T>
class DWXRangeIter : private DWXIter {
  public:
    using iterator_category = std::input_iterator_tag;
    using value_type = T*;
    using difference_type = std::ptrdiff_t;
    using pointer = T* const*;
    using reference = T*;

    DWXRangeIter() {}
    // Stands on the first member of `container` (null: at the end).
    explicit DWXRangeIter(const DWXContainer* container) : DWXIter(container) {}

    T* operator*() const { return static_cast<T*>(poCurrent); }
    DWXRangeIter& operator++() {
        Next();
        return *this;
    }
    // Two walks are equal when both are at their end, or when they stand on
    // the same place of the same container.
    bool operator==(const DWXRangeIter& other) const {
        if (!poCurrent || !other.poCurrent) {
            return !poCurrent && !other.poCurrent;
        }
        return poTarget == other.poTarget && nPosition == other.nPosition &&
               poCurrent == other.poCurrent;
    }
    bool operator!=(const DWXRangeIter& other) const { return !(*this == other); }
};

inline DWXRangeIter<DWXObject> DWXContainer::begin() const {
    return DWXRangeIter<DWXObject>(this);
}
inline DWXRangeIter<DWXObject> DWXContainer::end() const {
    return DWXRangeIter<DWXObject>();
}

// Mix-in for objects that can check themselves. A member of a container takes
// part in DWXContainer::Validate when its class derives from both DWXObject
// and this class.
class DWXCORE_API DWXValidatable {
  public:
    DWXValidatable() {}
    DWXValidatable(const DWXValidatable&) {}
    DWXValidatable& operator=(const DWXValidatable&) { return *this; }
    virtual ~DWXValidatable();

    // Non-zero when the object is valid.
    virtual int Validate() const = 0;
};

// A growable array of object pointers addressed by slot index. Removing a
// member leaves an empty slot; walks, searches and counts skip empty slots.
// Owns its slot buffer (from the allocation service, released with free),
// never its members.
class DWXCORE_API DWXArray : public DWXContainer {
  public:
    DWXArray();
    // The members of `container` in its walk order, without holes. A null
    // `container` gives an empty array.
    DWXArray(const DWXContainer* container);
    // An own buffer with the members of `other` in order, without holes.
    DWXArray(const DWXArray& other);
    DWXArray& operator=(const DWXArray& other);
    ~DWXArray() override;

    // For each occupied slot: "ClassName[index]:" followed by the member's dump.
    void Dump(FILE* stream) const override;
    const char* GetClassName() const override;

  protected:
    DWXObject* Start(DWXIter* iter) const override;
    DWXObject* Next(DWXIter* iter) const override;

  public:
    // A null pointer is never a member.
    int IsMember(const DWXObject* object) override;
    // Appends after the highest occupied slot; a null pointer is ignored.
    // Inline for the usual case of room above an occupied top slot (or an
    // empty buffer with room); every other case takes AddSlowly.
    void Add(DWXObject* object) override {
        int top = nTop;
        if (object && top < nCapacity && (top == 0 || ppoItems[top - 1])) {
            ppoItems[top] = object;
            nTop = top + 1;
            ++nCount;
        } else {
            AddSlowly(object);
        }
    }
    // Clears the first slot holding the pointer; frees the buffer when the
    // last member goes. 0 for a null pointer or a non-member.
    int Remove(const DWXObject* object) override;
    // Forgets every member and frees the buffer.
    void Empty() override;
    // Deletes the member of each occupied slot (each distinct pointer once),
    // then empties the array.
    virtual void DestroyContents();

    // The content of slot `index`; null for an empty slot or an index outside
    // the buffer.
    DWXObject* operator[](int index) const;
    // The lowest slot holding the pointer, or -1 (also for a null pointer).
    int GetIndex(const DWXObject* object) const;
    // One more than the index of the highest occupied slot; 0 when empty.
    int GetMaxIndex() const;

    // Moves the slots from `index` up by one and stores `object` at `index`
    // (a null `object` inserts an empty slot). A negative index changes nothing.
    void InsertAt(int index, DWXObject* object);
    // Stores `object` at `index`, forgetting (not deleting) a former occupant.
    // A negative index changes nothing.
    void SetAt(int index, DWXObject* object);

    // Closes the holes, keeping the order of the members.
    void Pack();
    // Reverses the order of the members and closes the holes.
    void Reverse();
    // Packs, then sorts with the library's quicksort. `compare` receives two
    // pointers to DWXObject* slots, as for qsort; equal members may move. A
    // null `compare` only packs (likewise for StandartSort).
    void Sort(int (*compare)(const void*, const void*));
    // Packs, then sorts with the service layer's TZN_qsort.
    void StandartSort(int (*compare)(const void*, const void*));

  protected:
    // Grows the buffer when `index` is not below the capacity: to twice
    // `index` slots, or 64 when `index` is 0; new slots are null.
    void ExpandToHold(int index);

    int nCapacity;
    // One past the highest slot written; may cover trailing empty slots.
    mutable int nTop;
    DWXObject** ppoItems;

  private:
    // The rest of Add: a null pointer, a full buffer, or trailing empty
    // slots to reuse.
    void AddSlowly(DWXObject* object);
};

// A DWXArray whose Remove leaves no hole: the last member moves into the
// freed slot.
class DWXCORE_API DWXPackedArray : public DWXArray {
  public:
    DWXPackedArray();
    // A null `container` gives an empty array.
    DWXPackedArray(const DWXContainer* container);
    DWXPackedArray(const DWXPackedArray& other);
    DWXPackedArray& operator=(const DWXPackedArray& other);
    ~DWXPackedArray() override;

    const char* GetClassName() const override;
    int Remove(const DWXObject* object) override;
};

// An unordered counted buffer of object pointers that grows by a factor of
// 1.3 plus 5. Stores null pointers too; a walk ends at the first null member.
// Owns its buffer, never its members.
class DWXCORE_API DWXBag : public DWXContainer {
    friend class DWXContainer;

  public:
    DWXBag();
    // The members of `container` in its walk order. A null `container` gives
    // an empty bag.
    DWXBag(const DWXContainer* container);
    DWXBag(const DWXBag& other);
    DWXBag& operator=(const DWXBag& other);
    ~DWXBag() override;

    const char* GetClassName() const override;

  private:
    DWXObject* Start(DWXIter* iter) const override;
    DWXObject* Next(DWXIter* iter) const override;

  public:
    int IsMember(const DWXObject* object) override;
    void Add(DWXObject* object) override;
    // The last member moves into the freed slot; the buffer stays.
    int Remove(const DWXObject* object) override;
    // Forgets every member and frees the buffer.
    void Empty() override;

  protected:
    int nCapacity;
    DWXObject** ppoItems;

  private:
    // DestroyContents of a bag: in slot order, each slot is cleared before its
    // member is deleted.
    void DestroyInOrder();
};

// A node of a DWXLinkedList; created and deleted by the list alone.
struct DWXCORE_API DWXListNode {
    DWXObject* poObject = nullptr;
    DWXListNode* poNext = nullptr;
    DWXListNode* poPrev = nullptr;
};

// A circular doubly linked list of nodes around one sentinel node. Owns its
// nodes, never its members. Stores null pointers too; a walk through DWXIter
// ends at the first null member, node walks (StartNode to EndNode) do not.
// A walk must be started again after the node it stands on was removed.
class DWXCORE_API DWXLinkedList : public DWXContainer {
  public:
    DWXLinkedList();
    // Own nodes holding the same member pointers in the same order.
    DWXLinkedList(const DWXLinkedList& other);
    DWXLinkedList& operator=(const DWXLinkedList& other);
    ~DWXLinkedList() override;

    // "nCount=N\n", then per node the member's dump or "NULL", each followed
    // by "\n".
    void Dump(FILE* stream) const override;
    const char* GetClassName() const override;

  private:
    DWXObject* Start(DWXIter* iter) const override;
    DWXObject* Next(DWXIter* iter) const override;

  public:
    int IsMember(const DWXObject* object) override;
    // Appends.
    void Add(DWXObject* object) override;
    // Unlinks and deletes the first node holding the pointer; 1 when found.
    int Remove(const DWXObject* object) override;
    // Deletes every node; the list stays usable.
    void Empty() override;

    // Links a new node holding `object` in just before `before`, a node of
    // this list or EndNode() (which appends). A null `before` is ignored.
    void Insert(DWXObject* object, DWXListNode* before);
    void Append(DWXObject* object);
    void Prepend(DWXObject* object);
    // The first node; EndNode() when the list is empty.
    DWXListNode* StartNode() const;
    // The sentinel that ends a node walk; not the node of the last member.
    DWXListNode* EndNode() const;
    // The first node holding the pointer, or null.
    DWXListNode* Find(const DWXObject* object) const;
    // Unlinks and deletes `node`, a node of this list. A null node and the
    // sentinel are ignored. The member is not deleted.
    void Remove(DWXListNode* node);

  protected:
    DWXListNode* poHead;
};
