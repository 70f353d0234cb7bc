// The subtree: ownership of children, lookups by name, deep copy and merge;
// and the exception list that steers the merge.
#include <dwxcore/dwxparse.h>

#include <services/rtprim.h>

#include <limits.h>
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

// A subtree of exactly this library's class. Deep trees are walked with
// explicit work lists rather than recursion; only these subtrees are walked
// that way, so a host's subclass keeps its own Copy and destructor.
bool IsPlainSubTree(const DWXObject* node) {
    return typeid(*node) == typeid(PTNSubTree);
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
    // Deleting a child subtree deletes its own children, so a deep tree would
    // recurse once per level. Instead every plain subtree below is listed,
    // each after its parent, and the list is emptied from its end: a subtree's
    // children go while it is still in place, and by the time it goes with its
    // parent it has no children left, so no destructor recurses.
    std::vector<PTNSubTree*> subtrees;
    auto listPlainChildren = [&subtrees](const PTNSubTree& parent) {
        const int top = parent.oChildren.GetMaxIndex();
        for (int i = 0; i < top; ++i) {
            DWXObject* child = parent.oChildren[i];
            if (child != nullptr && IsPlainSubTree(child)) {
                subtrees.push_back(static_cast<PTNSubTree*>(child));
            }
        }
    };
    listPlainChildren(*this);
    for (size_t i = 0; i < subtrees.size(); ++i) {
        listPlainChildren(*subtrees[i]);
    }
    for (auto subtree = subtrees.rbegin(); subtree != subtrees.rend(); ++subtree) {
        (*subtree)->oChildren.DestroyContents();
    }
    oChildren.DestroyContents();
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
                work.second->AddChild(copy);
                pending.emplace_back(source, copy);
            } else {
                work.second->AddChild(child->Copy());
            }
        }
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
    std::vector<Level> levels{{this, other, 0}};
    while (!levels.empty()) {
        Level& level = levels.back();
        if (level.next >= level.tree->oChildren.GetMaxIndex()) {
            levels.pop_back();
            continue;
        }
        auto* child = static_cast<DWXParseTreeNode*>(level.tree->oChildren[level.next++]);
        if (child == nullptr || child->GetName() == nullptr ||
            exceptions.IsMember(child->GetName())) {
            continue;  // an excepted subtree keeps everything below it too
        }
        // Only the first namesake in `source` counts, whatever its class.
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
