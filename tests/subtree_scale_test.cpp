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

// The answers of a walk of the children, in order.
DWXParseTreeNode* WalkFind(const PTNSubTree& tree, const char* name, const char* type) {
    for (DWXParseTreeNode* child : Children(tree)) {
        if (child->GetName() && _stricmp(child->GetName(), name) == 0 &&
            (!type || _stricmp(child->GetClassName(), type) == 0)) {
            return child;
        }
    }
    return nullptr;
}

int WalkCount(const PTNSubTree& tree, const char* name) {
    int count = 0;
    for (DWXParseTreeNode* child : Children(tree)) {
        count += child->GetName() && _stricmp(child->GetName(), name) == 0;
    }
    return count;
}

void ExpectLookupsAgree(const PTNSubTree& tree, const std::string& step) {
    for (const char* name : kNames) {
        ASSERT_EQ(tree.GetNumberOfOccurence(name), WalkCount(tree, name)) << step << " " << name;
        for (const char* type : kTypes) {
            ASSERT_EQ(tree.GetChild(name, type), WalkFind(tree, name, type))
                << step << " " << name << " " << (type ? type : "any");
        }
        auto* first = dynamic_cast<PTNInteger*>(WalkFind(tree, name, nullptr));
        ASSERT_EQ(tree.GetChildAsInteger(name), first ? first->GetValue() : 0) << step;
    }
}

DWXParseTreeNode* NewNode(std::mt19937& random, int value) {
    const char* name = kNames[random() % 8];
    switch (random() % 3) {
        case 0:
            return new PTNInteger(name, value);
        case 1:
            return new PTNString(name, "s");
        default:
            return new PTNSubTree(name);
    }
}

// Random appends, renames, deletions by hand, moves between two trees,
// copies and assignments, on trees below and far above the index threshold:
// after every step both trees answer as a walk does.
TEST(SubTreeIndexTest, LookupsAgreeWithAWalkThroughEveryChange) {
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
                        some->SetName(random() % 9 ? kNames[random() % 8] : nullptr);
                    }
                    break;
                case 3:
                    delete some;
                    break;
                case 4:
                    other.AddChild(some);  // moved, not shared
                    break;
                case 5:
                    if (step % 50 == 5) {
                        std::unique_ptr<PTNSubTree> copy(tree.DeepCopy());
                        ExpectLookupsAgree(*copy, "copy");
                        other = *copy;
                    }
                    break;
                default:
                    tree.AddChild(some);  // its own child goes to the end
                    break;
            }
            ExpectLookupsAgree(one, "one, step " + std::to_string(step));
            ExpectLookupsAgree(two, "two, step " + std::to_string(step));
        }
    }
}

// Names that keep arriving after the index is built, by append and by
// rename, outgrow its table again and again; every name is still found once.
TEST(SubTreeIndexTest, NewNamesAfterTheIndexIsBuiltAreAllFound) {
    PTNSubTree tree("t");
    std::vector<std::string> names;
    for (int i = 0; i < 600; ++i) {
        names.push_back("n" + std::to_string(i));
        tree.AddChild(new PTNInteger(i % 3 ? names.back().c_str() : "r", i));
        if (i % 3 == 0) {
            tree.GetChild("r")->SetName(names.back().c_str());  // the one just added
        }
        ASSERT_EQ(tree.GetChildAsInteger(names.back().c_str()), i);  // builds the index at 9
    }
    for (int i = 0; i < 600; ++i) {
        ASSERT_EQ(tree.GetChildAsInteger(names[static_cast<size_t>(i)].c_str()), i);
        ASSERT_EQ(tree.GetNumberOfOccurence(names[static_cast<size_t>(i)].c_str()), 1) << i;
    }
}

// The index reads names a word at a time with a tail of up to seven bytes:
// names of every length that differ in a single byte, wherever it lies, are
// told apart, and found again whatever the case of their letters.
TEST(SubTreeIndexTest, NamesOfEveryLengthDifferingInAnyOneByte) {
    const std::string letters = "abcdefghijklmnopqrstu";
    PTNSubTree tree("t");
    std::vector<std::pair<std::string, int>> names;
    for (int length = 1; length <= 20; ++length) {
        const std::string name = letters.substr(0, static_cast<size_t>(length));
        names.emplace_back(name, length * 100);
        for (int at = 0; at < length; ++at) {
            std::string changed = name;
            changed[static_cast<size_t>(at)] = '#';
            names.emplace_back(changed, length * 100 + at + 1);
        }
    }
    for (const auto& name : names) {
        tree.AddChild(new PTNInteger(name.first.c_str(), name.second));
    }
    for (const auto& name : names) {
        std::string upper = name.first;
        for (char& c : upper) {
            c = static_cast<char>(toupper(static_cast<unsigned char>(c)));
        }
        EXPECT_EQ(tree.GetChildAsInteger(name.first.c_str()), name.second) << name.first;
        EXPECT_EQ(tree.GetChildAsInteger(upper.c_str()), name.second) << upper;
        EXPECT_EQ(tree.GetNumberOfOccurence(upper.c_str()), 1) << upper;
    }
    EXPECT_EQ(tree.GetChild("abcdefgh$"), nullptr);
}

TEST(SubTreeIndexTest, MovedAndDeletedNodesLeaveNoDanglingPointers) {
    auto* source = new PTNSubTree("source");
    PTNSubTree target("target");
    for (int i = 0; i < 20; ++i) {
        source->AddChild(new PTNInteger(i % 2 ? "odd" : "even", i));
    }
    DWXParseTreeNode* moved = source->GetChild("odd");
    target.AddChild(moved);
    EXPECT_EQ(moved->GetParentRef(), &target);
    EXPECT_EQ(source->GetNumberOfOccurence("odd"), 9);
    EXPECT_EQ(source->GetChildAsInteger("odd"), 3);

    delete source->GetChild("even");  // by hand: the parent lets go of it
    EXPECT_EQ(source->GetChildAsInteger("even"), 2);
    EXPECT_EQ(source->GetChildren()->GetCount(), 18);

    // A subtree cannot hold itself or an ancestor.
    auto* inner = new PTNSubTree("inner");
    source->AddChild(inner);
    inner->AddChild(source);
    inner->AddChild(inner);
    EXPECT_EQ(inner->GetChildren()->GetCount(), 0);

    target.AddChild(source);  // a whole subtree moves too
    delete source;
    EXPECT_EQ(target.GetChildAsInteger("odd"), 1);
    EXPECT_EQ(target.GetChildren()->GetCount(), 1);
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

// Two levels of `width` children with namesakes of mixed case and class.
std::unique_ptr<PTNSubTree> MergeTree(int width, int seed, int depth = 2) {
    std::mt19937 random(static_cast<unsigned>(seed));
    auto tree = std::make_unique<PTNSubTree>("root");
    for (int i = 0; i < width; ++i) {
        std::string name = std::string(kNames[random() % 8]) + std::to_string(random() % 4);
        if (depth > 1 && random() % 4 == 0) {
            std::unique_ptr<PTNSubTree> below = MergeTree(width, seed + i, depth - 1);
            below->SetName(name.c_str());
            tree->AddChild(below.release());
        } else if (random() % 2) {
            tree->AddChild(new PTNInteger(name.c_str(), static_cast<int>(random() % 100)));
        } else {
            tree->AddChild(new PTNString(name.c_str(), std::to_string(seed).c_str()));
        }
    }
    return tree;
}

TEST(SubTreeMergeTest, AgreesWithARecursiveWalkOnSmallAndLargeTrees) {
    ExceptionList none, few, many;
    few.Add("B1");
    for (const char* name : kNames) {  // more names than a walk of the list suits
        std::string upper(name);
        for (char& c : upper) {
            c = static_cast<char>(toupper(static_cast<unsigned char>(c)));
        }
        many.Add((upper + "2").c_str());
        many.Add((upper + "9").c_str());
    }
    for (int width : {5, 60}) {
        for (const ExceptionList* exceptions : {&none, &few, &many}) {
            std::unique_ptr<PTNSubTree> mine = MergeTree(width, 1), expected = MergeTree(width, 1);
            std::unique_ptr<PTNSubTree> theirs = MergeTree(width, 2);
            mine->SetFrom(theirs.get(), *exceptions);
            ReferenceMerge(*expected, *theirs, *exceptions);
            EXPECT_EQ(Shape(mine.get(), true), Shape(expected.get(), true)) << width;
            if (width > 5) {  // the large trees share names, so the merge changes them
                EXPECT_NE(Shape(mine.get(), true), Shape(MergeTree(width, 1).get(), true));
            }
        }
    }
}

// Short string values live in the node: every length around the boundary
// must survive setting, copying and setting from the node's own value.
TEST(NodePoolTest, StringValuesOfEveryLengthAroundTheInlineSize) {
    for (size_t length = 0; length < 40; ++length) {
        std::string value(length, 'v');
        PTNString node("s", value.c_str());
        std::unique_ptr<DWXParseTreeNode> copy(node.Copy());
        EXPECT_EQ(static_cast<PTNString*>(copy.get())->GetValue(), value);
        node.SetValue(node.GetValue() + (length > 0));  // a tail of its own value
        EXPECT_EQ(std::string(node.GetValue()), value.substr(length > 0));
    }
}

struct BigNode : PTNInteger {  // larger than the pool carves
    BigNode() : PTNInteger("big", 7) { pad[sizeof pad - 1] = 1; }
    char pad[4096];
};

// Builds, checks and deletes trees; half of them are deleted by another thread.
void BuildAndDelete(int seed, std::vector<PTNSubTree*>& handOver) {
    for (int round = 0; round < 20; ++round) {
        auto* tree = new PTNSubTree("t");
        for (int i = 0; i < 500; ++i) {
            tree->AddChild(new PTNInteger(std::to_string(i).c_str(), seed + i));
        }
        tree->AddChild(new BigNode);
        ASSERT_EQ(tree->GetChildAsInteger("499"), seed + 499);
        ASSERT_EQ(tree->GetChildAsInteger("big"), 7);
        if (round % 2) {
            handOver.push_back(tree);
        } else {
            delete tree;
        }
    }
}

TEST(NodePoolTest, TreesOnSeparateThreadsAndDeletedOnAnother) {
    std::vector<std::vector<PTNSubTree*>> handOver(4);
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back(BuildAndDelete, t * 1000, std::ref(handOver[static_cast<size_t>(t)]));
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

// A node made by a thread-local destructor that runs after the pool let go
// of the thread's slab still comes and goes safely.
struct LateMaker {
    ~LateMaker() { delete new PTNInteger("late", 1); }
};

TEST(NodePoolTest, NodesMadeAsAThreadEnds) {
    std::thread([] {
        thread_local LateMaker maker;
        (void)&maker;
        delete new PTNInteger("early", 1);
    }).join();
}

#if defined(__GLIBC__)
// Deleting a tree gives its memory back to the C heap: reading and deleting
// a large tree again and again does not grow the heap.
TEST(NodePoolTest, DeletedTreesGiveTheirMemoryBack) {
    std::string text = "(root SubTree\n";
    for (int i = 0; i < 20000; ++i) {
        text += "  (n" + std::to_string(i) + " String \"value " + std::to_string(i) + "\")\n";
    }
    auto cycle = [&text] {
        PTNSubTree tree("t");
        tree.BuildFromString(text.c_str());
        ASSERT_EQ(tree.GetChildren()->GetCount(), 1);
    };
    cycle();
    const size_t before = mallinfo2().uordblks;
    for (int i = 0; i < 5; ++i) {
        cycle();
    }
    EXPECT_LT(mallinfo2().uordblks, before + 256 * 1024);
}
#endif

}  // namespace
