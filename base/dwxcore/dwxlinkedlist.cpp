#include <dwxcore/dwxobject.h>

#include "internal/dwxcontainer_internal.h"

#include <vector>

namespace {

// Takes `node` out of its ring; the caller deletes it.
void Unlink(DWXListNode* node) {
    node->poPrev->poNext = node->poNext;
    node->poNext->poPrev = node->poPrev;
}

}  // namespace

DWXLinkedList::DWXLinkedList() : poHead(new DWXListNode) {
    poHead->poNext = poHead;
    poHead->poPrev = poHead;
}

DWXLinkedList::DWXLinkedList(const DWXLinkedList& other) : DWXLinkedList() {
    // Node by node rather than through a walk, so null members are copied too.
    for (DWXListNode* node = other.StartNode(); node != other.EndNode(); node = node->poNext) {
        Append(node->poObject);
    }
}

DWXLinkedList& DWXLinkedList::operator=(const DWXLinkedList& other) {
    if (&other == this) {
        return *this;
    }
    Empty();
    for (DWXListNode* node = other.StartNode(); node != other.EndNode(); node = node->poNext) {
        Append(node->poObject);
    }
    return *this;
}

DWXLinkedList::~DWXLinkedList() {
    Empty();
    delete poHead;
}

void DWXLinkedList::Dump(FILE* stream) const {
    if (!stream) {
        return;
    }
    fprintf(stream, "nCount=%d\n", nCount);
    for (DWXListNode* node = StartNode(); node != EndNode(); node = node->poNext) {
        if (node->poObject) {
            node->poObject->Dump(stream);
        } else {
            fputs("NULL", stream);
        }
        fputs("\n", stream);
    }
}

const char* DWXLinkedList::GetClassName() const {
    return "DWXLinkedList";
}

// The walk keeps a pointer to the node last yielded; 0 means not started.
DWXObject* DWXLinkedList::Start(DWXIter* iter) const {
    DWXListNode* first = poHead->poNext;
    SetPosition(iter, reinterpret_cast<intptr_t>(first));
    return first->poObject;
}

DWXObject* DWXLinkedList::Next(DWXIter* iter) const {
    // An iterator's position is an integer in the public DWXIter, and a list
    // keeps its node's address there. NOLINTNEXTLINE(performance-no-int-to-ptr)
    DWXListNode* node = reinterpret_cast<DWXListNode*>(static_cast<intptr_t>(GetPosition(iter)));
    if (!node) {
        // Bound with SetTarget and never started: begin at the first node,
        // as a fresh array or bag walk does.
        return Start(iter);
    }
    if (node == poHead) {
        return nullptr;
    }
    node = node->poNext;
    SetPosition(iter, reinterpret_cast<intptr_t>(node));
    return node->poObject;
}

int DWXLinkedList::IsMember(const DWXObject* object) {
    return Find(object) ? 1 : 0;
}

void DWXLinkedList::Add(DWXObject* object) {
    Append(object);
}

int DWXLinkedList::Remove(const DWXObject* object) {
    DWXListNode* node = Find(object);
    if (!node) {
        return 0;
    }
    Remove(node);
    return 1;
}

void DWXLinkedList::Empty() {
    while (nCount != 0) {
        Remove(poHead->poNext);
    }
}

void DWXLinkedList::Insert(DWXObject* object, DWXListNode* before) {
    if (!before) {
        return;
    }
    DWXListNode* node = new DWXListNode;
    node->poObject = object;
    node->poNext = before;
    node->poPrev = before->poPrev;
    before->poPrev->poNext = node;
    before->poPrev = node;
    ++nCount;
}

void DWXLinkedList::Append(DWXObject* object) {
    Insert(object, poHead);
}

void DWXLinkedList::Prepend(DWXObject* object) {
    Insert(object, poHead->poNext);
}

DWXListNode* DWXLinkedList::StartNode() const {
    return poHead->poNext;
}

DWXListNode* DWXLinkedList::EndNode() const {
    return poHead;
}

DWXListNode* DWXLinkedList::Find(const DWXObject* object) const {
    for (DWXListNode* node = poHead->poNext; node != poHead; node = node->poNext) {
        if (node->poObject == object) {
            return node;
        }
    }
    return nullptr;
}

void DWXLinkedList::Remove(DWXListNode* node) {
    if (!node || node == poHead) {
        return;
    }
    Unlink(node);
    delete node;
    --nCount;
}

namespace dwxcore::internal {

void DestroyListContents(DWXLinkedList& list) {
    // A walk ends at the first null member: only the nodes before it count,
    // and of several nodes holding the same pointer only the first stays.
    std::vector<DWXListNode*> nodes;
    std::vector<DWXObject*> members;
    for (DWXListNode* node = list.StartNode(); node != list.EndNode() && node->poObject;
         node = node->poNext) {
        nodes.push_back(node);
        members.push_back(node->poObject);
    }
    if (ClearRepeats(members.data(), members.size()) > 0) {
        for (size_t i = 0; i < nodes.size(); ++i) {
            if (!members[i]) {
                list.Remove(nodes[i]);
            }
        }
    }
    for (;;) {
        DWXListNode* first = list.StartNode();
        DWXObject* member = first->poObject;
        if (first == list.EndNode() || !member) {
            break;
        }
        list.Remove(first);
        delete member;
    }
    list.Empty();
}

}  // namespace dwxcore::internal
