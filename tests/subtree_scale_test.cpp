// Large subtrees: name lookups through the index must answer exactly as a
// walk of the children does, through every change a host can make; merges
// must do what a plain recursive merge does; and pooled nodes must be
// deleted, moved and freed safely, from any thread.
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <services/portability.h>

#include <gtest/gtest.h>

#if defined(__GLIBC__)
#include <malloc.h>
#endif

#include <ctype.h>

#include <random>
#include <string>
#include <thread>
#include <vector>

namespace {

const char* const kNames[] = {"a", "A", "b", "width", "WIDTH", "Width", "long_name_x", "c"};
const char* const kTypes[] = {nullptr, "PTNInteger", "ptnstring", "PTNSubTree", "Integer"};

std::vector<DWXParseTreeNode*> Children(const PTNSubTree& tree) {
    std::vector<DWXParseTreeNode*> children;
    DWXIter it(tree.GetChildren());
    for (DWXObject* o = it.Current(); o; o = it.Next()) {
        children.push_back(static_cast<DWXParseTreeNode*>(o));
    }
    return children;
}

std::string Upper(std::string text) {
    for (char& c : text) {
        c = static_cast<char>(toupper(static_cast<unsigned char>(c)));
    }
    return text;
}

// The answers of a walk of the children, in order.
DWXParseTreeNode* WalkFind(const PTNSubTree& tree, const char* name, const char* type) {
    for (DWXParseTreeNode* child : Children(tree)) {
        if (name && child->GetName() && _stricmp(child->GetName(), name) == 0 &&
            (!type || _stricmp(child->GetClassName(), type) == 0)) {
            return child;
        }
    }
    return nullptr;
}

// A few names and, with `all`, every name of a child in its own and in upper case:
// the index answers as a walk of the children does.
void ExpectLookupsAgree(const PTNSubTree& tree, const std::string& step, bool all = true) {
    std::vector<std::string> names(std::begin(kNames), std::end(kNames));
    for (DWXParseTreeNode* child : Children(tree)) {
        if (all && child->GetName()) {
            names.insert(names.end(), {child->GetName(), Upper(child->GetName())});
        }
    }
    for (const std::string& name : names) {
        int count = 0;
        for (DWXParseTreeNode* child : Children(tree)) {
            count += child->GetName() && _stricmp(child->GetName(), name.c_str()) == 0;
        }
        ASSERT_EQ(tree.GetNumberOfOccurence(name.c_str()), count) << step << " " << name;
        for (const char* type : kTypes) {
            ASSERT_EQ(tree.GetChild(name.c_str(), type), WalkFind(tree, name.c_str(), type))
                << step << " " << name << " " << (type ? type : "any");
        }
        auto* first = dynamic_cast<PTNInteger*>(WalkFind(tree, name.c_str(), nullptr));
        ASSERT_EQ(tree.GetChildAsInteger(name.c_str()), first ? first->GetValue() : 0) << step;
    }
}

// Names of the fixed set, or of 1 to 20 letters of three in mixed case, so
// that the index keeps meeting new names and names of every word length.
std::string NewName(std::mt19937& random) {
    if (random() % 2) {
        return kNames[random() % 8];
    }
    std::string name(random() % 20 + 1, 'x');
    for (char& c : name) {
        c = "abcABC"[random() % 6];
    }
    return name;
}

// A leaf, or a subtree holding `depth` levels of three such nodes.
DWXParseTreeNode* NewNode(std::mt19937& random, int value, int depth = 1) {
    const std::string name = NewName(random);
    switch (random() % 3) {
        case 0:
            return new PTNInteger(name.c_str(), value);
        case 1:
            return new PTNString(name.c_str(), std::to_string(value).c_str());
    }
    auto* tree = new PTNSubTree(name.c_str());
    for (int i = 0; i < depth * 3; ++i) {
        tree->AddChild(NewNode(random, value + i, depth - 1));
    }
    return tree;
}

// A merge as the plain recursive walk does it.
void ReferenceMerge(PTNSubTree& tree, PTNSubTree& other, const ExceptionList& exceptions) {
    for (DWXParseTreeNode* child : Children(tree)) {
        if (exceptions.IsMember(child->GetName())) {
            continue;
        }
        DWXParseTreeNode* source = WalkFind(other, child->GetName(), nullptr);
        auto* subtree = dynamic_cast<PTNSubTree*>(child);
        auto* sourceSubtree = dynamic_cast<PTNSubTree*>(source);
        if (subtree && sourceSubtree) {
            ReferenceMerge(*subtree, *sourceSubtree, exceptions);
        } else if (!subtree && source) {
            child->SetFrom(source);
        }
    }
}

// Random appends, renames, deletions by hand, moves between two trees,
// copies, merges and assignments, on trees below and far above the index
// threshold: after every step both trees answer as a walk does, and every
// merge does what the recursive walk does.
TEST(SubTreeIndexTest, LookupsAndMergesAgreeWithAWalkThroughEveryChange) {
    ExceptionList lists[3];  // none, a few, and more than a walk of the list suits
    for (const char* name : {"WIDTH", "one", "two"}) {  // the roots are never compared
        lists[1].Add(name);
    }
    for (const char* name : {"A", "B", "LONG_NAME_X", "f1", "f2", "f3", "f4", "f5", "f6", "f7"}) {
        lists[2].Add(name);
    }
    for (int size : {4, 12, 300}) {
        std::mt19937 random(static_cast<unsigned>(size));
        PTNSubTree one("one"), two("two");
        for (int i = 0; i < size; ++i) {
            one.AddChild(NewNode(random, i));
            two.AddChild(NewNode(random, -i));
        }
        for (int step = 0; step < 400; ++step) {
            PTNSubTree& tree = random() % 2 ? one : two;
            PTNSubTree& other = &tree == &one ? two : one;
            std::vector<DWXParseTreeNode*> children = Children(tree);
            DWXParseTreeNode* some =
                children.empty() ? nullptr : children[random() % children.size()];
            switch (random() % 7) {
                case 0:
                    tree.AddChild(NewNode(random, step));
                    break;
                case 1:
                case 2:
                    if (some) {
                        some->SetName(random() % 9 ? NewName(random).c_str() : nullptr);
                    }
                    break;
                case 3:
                    delete some;
                    break;
                case 4:
                    other.AddChild(some);  // moved, not shared
                    break;
                case 5:
                    if (step % 20 == 5) {  // merged into a copy, then assigned
                        const ExceptionList& exceptions = lists[step % 3];
                        std::unique_ptr<PTNSubTree> copy(tree.DeepCopy()),
                            expected(tree.DeepCopy());
                        ExpectLookupsAgree(*copy, "copy");
                        copy->SetFrom(&other, exceptions);
                        ReferenceMerge(*expected, other, exceptions);
                        ASSERT_EQ(Text(*copy), Text(*expected));
                        other = *copy;
                    }
                    break;
                default:
                    tree.AddChild(some);  // its own child goes to the end
                    break;
            }
            ExpectLookupsAgree(one, "one, step " + std::to_string(step), step % 20 == 0);
            ExpectLookupsAgree(two, "two, step " + std::to_string(step), step % 20 == 0);
        }
    }
}

struct BigNode : PTNInteger {  // larger than the pool carves
    BigNode() : PTNInteger("big", 7) { pad[sizeof pad - 1] = 1; }
    char pad[4096];
};

// Trees built on four threads, half of them deleted on the main thread; and
// a node made by a thread-local destructor that runs after the pool let go
// of the thread's slab.
struct LateMaker {
    ~LateMaker() { delete new PTNInteger("late", 1); }
};

TEST(NodePoolTest, TreesOnSeparateThreadsAndDeletedOnAnother) {
    std::vector<std::vector<PTNSubTree*>> handOver(4);
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([t, &trees = handOver[static_cast<size_t>(t)]] {
            thread_local LateMaker maker;
            (void)&maker;
            for (int round = 0; round < 20; ++round) {
                auto* tree = new PTNSubTree("t");
                for (int i = 0; i < 500; ++i) {
                    tree->AddChild(new PTNInteger(std::to_string(i).c_str(), t + i));
                }
                tree->AddChild(new BigNode);
                EXPECT_EQ(tree->GetChildAsInteger("499") + tree->GetChildAsInteger("big"), t + 506);
                round % 2 ? trees.push_back(tree) : delete tree;
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    for (auto& trees : handOver) {
        for (PTNSubTree* tree : trees) {
            delete tree;
        }
    }
}

#if defined(__GLIBC__)
// Reading and deleting a large tree again and again does not grow the heap.
TEST(NodePoolTest, DeletedTreesGiveTheirMemoryBack) {
    std::string text = "(root SubTree\n";
    for (int i = 0; i < 20000; ++i) {
        text += "  (n" + std::to_string(i) + " String \"value " + std::to_string(i) + "\")\n";
    }
    size_t before = 0;
    for (int i = 0; i < 6; ++i) {
        PTNSubTree(nullptr).BuildFromString(text.c_str());
        before = i == 0 ? mallinfo2().uordblks : before;
    }
    EXPECT_LT(mallinfo2().uordblks, before + 256 * 1024);
}
#endif

}  // namespace
