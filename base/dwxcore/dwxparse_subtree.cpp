// The subtree: ownership of children, lookups by name, deep copy and merge;
// and the exception list that steers the merge.
#include <dwxcore/dwxparse.h>

#include <services/rtprim.h>

#include <stdlib.h>

namespace {

// Whole names, ignoring case; a null name on either side matches nothing.
bool NameMatches(const DWXParseTreeNode* node, const char* name) {
    return name != nullptr && node->GetName() != nullptr && _stricmp(node->GetName(), name) == 0;
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
// PTNSubTree: ownership and copies

PTNSubTree::PTNSubTree(const char* name) : DWXParseTreeNode(name), oChildren() {}

PTNSubTree::PTNSubTree(const PTNSubTree& other) : DWXParseTreeNode(other), oChildren() {
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
    oChildren.DestroyContents();
    DWXIter iter(&copy.oChildren);
    for (DWXObject* child = iter.Current(); child != nullptr; child = iter.Next()) {
        AddChild(static_cast<DWXParseTreeNode*>(child));
    }
    copy.oChildren.Empty();  // the children now belong to this subtree
    return *this;
}

PTNSubTree::~PTNSubTree() {
    oChildren.DestroyContents();
}

void PTNSubTree::CopyChildrenFrom(const PTNSubTree& other) {
    DWXIter iter(&other.oChildren);
    for (DWXObject* child = iter.Current(); child != nullptr; child = iter.Next()) {
        AddChild(static_cast<DWXParseTreeNode*>(child)->Copy());
    }
}

void PTNSubTree::AddChild(DWXParseTreeNode* child) {
    if (child == nullptr) {
        return;
    }
    oChildren.Add(child);
    child->SetParent(this);
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
    return child != nullptr ? child->GetValue() : 0;
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
// Merge

void PTNSubTree::SetFrom(PTNSubTree* other, const ExceptionList& exceptions) {
    if (other == nullptr) {
        return;
    }
    DWXIter iter(&oChildren);
    for (DWXObject* object = iter.Current(); object != nullptr; object = iter.Next()) {
        auto* child = static_cast<DWXParseTreeNode*>(object);
        if (child->GetName() == nullptr || exceptions.IsMember(child->GetName())) {
            continue;  // an excepted subtree keeps everything below it too
        }
        // Only the first namesake in `other` counts, whatever its class.
        DWXParseTreeNode* source = other->GetChild(child->GetName());
        if (source == nullptr) {
            continue;
        }
        if (auto* subtree = dynamic_cast<PTNSubTree*>(child)) {
            if (auto* sourceSubtree = dynamic_cast<PTNSubTree*>(source)) {
                subtree->SetFrom(sourceSubtree, exceptions);
            }
        } else {
            child->SetFrom(source);
        }
    }
}
