// The subtree: lookups through the name index must answer exactly as a walk
// of the children does, through every change a host can make; merges must do
// what a plain recursive merge does; copies, typed readers and paths; and
// pooled nodes must be deleted, moved and freed safely, from any thread.
#include "tree_test_util.h"

#include <services/portability.h>

#if defined(__GLIBC__)
#include <malloc.h>
#endif

#include <ctype.h>

#include <algorithm>
#include <random>
#include <thread>
#include <vector>

namespace {

const char* const kNames[] = {"a", "A", "b", "width", "WIDTH", "Width", "long_name_x", "c"};
const char* const kTypes[] = {nullptr, "PTNInteger", "ptnstring", "PTNSubTree", "Integer"};

// The first child a walk finds by name, and class when given.
DWXParseTreeNode* WalkFind(const PTNSubTree& tree, const char* name, const char* type) {
    for (DWXParseTreeNode* child : tree) {
        if (name && child->GetName() && _stricmp(child->GetName(), name) == 0 &&
            (!type || _stricmp(child->GetClassName(), type) == 0)) {
            return child;
        }
    }
    return nullptr;
}

// Every parent link holds; a few names and, with `all`, every name of a child in its own and in
// upper case, and the same one level below: the index answers as a walk of the children does.
void ExpectLookupsAgree(const PTNSubTree& tree, const std::string& step, bool all = true) {
    std::vector<std::string> names(std::begin(kNames), std::end(kNames));
    for (DWXParseTreeNode* child : tree) {
        ASSERT_EQ(child->GetParentRef(), &tree);
        if (auto* subtree = dynamic_cast<PTNSubTree*>(child); subtree && all) {
            ExpectLookupsAgree(*subtree, step, false);  // the random subtrees nest one level
        }
        if (all && child->GetName()) {
            names.push_back(child->GetName());
            std::transform(names.back().begin(), names.back().end(), names.back().begin(), toupper);
        }
    }
    for (const std::string& name : names) {
        const auto count = std::count_if(tree.begin(), tree.end(), [&](DWXParseTreeNode* child) {
            return child->GetName() && _stricmp(child->GetName(), name.c_str()) == 0;
        });
        ASSERT_EQ(tree.GetNumberOfOccurence(name.c_str()), count) << step << " " << name;
        for (const char* type : kTypes) {
            ASSERT_EQ(tree.GetChild(name.c_str(), type), WalkFind(tree, name.c_str(), type))
                << step << " " << name << " " << (type ? type : "any");
        }
    }
}

// A name of the fixed set, or of 1 to 20 letters in mixed case, so that the
// index keeps meeting new names and names of every word length.
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
    for (DWXParseTreeNode* child : tree) {
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
// refused adoptions of an ancestor, copies, merges and assignments (also
// from itself and from its own child), on trees below and far above the index
// threshold: after every step both trees answer as a walk does, and every
// merge, with exception lists copied deeply, does what the recursive walk does.
TEST(SubTreeTest, LookupsAndMergesAgreeWithAWalkThroughEveryChange) {
    ExceptionList lists[3], many;  // none, a few, and more than a walk of the list suits
    for (const char* name : {"WIDTH", "one", "two"}) {  // the roots are never compared
        lists[1].Add(name);
    }
    many.Add(nullptr);
    for (const char* name : {"A", "B", "LONG_NAME_X", "f1", "f2", "f3", "f4", "f5", "f6", "f7"}) {
        many.Add(name);
    }
    lists[2].Add("old");
    lists[2] = many, lists[1] = ExceptionList(lists[1]), many = ExceptionList();  // deep copies
    EXPECT_EQ(lists[2].IsMember("long_name_x") + lists[1].IsMember("Width") + many.IsMember("A"),
              2);
    EXPECT_EQ(lists[2].IsMember("old") + lists[2].IsMember("LONG_NAME_"), 0);
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
            std::vector<DWXParseTreeNode*> children(tree.begin(), tree.end());
            DWXParseTreeNode* some =
                children.empty() ? nullptr : children[random() % children.size()];
            auto* subtree = dynamic_cast<PTNSubTree*>(some);
            const unsigned action = random() % 7;
            if (action == 0) {
                tree.AddChild(NewNode(random, step));
            } else if (action <= 2 && some) {
                some->SetName(random() % 9 ? NewName(random).c_str() : nullptr);
            } else if (action == 3) {
                delete some;
            } else if (action == 4) {
                other.AddChild(some);                    // moved, not shared
            } else if (action == 5 && step % 20 == 5) {  // merged into a copy, then assigned
                const ExceptionList& exceptions = lists[step % 3];
                std::unique_ptr<PTNSubTree> copy(tree.DeepCopy()), expected(tree.DeepCopy());
                ExpectLookupsAgree(*copy, "copy");
                copy->SetFrom(&other, exceptions);
                ReferenceMerge(*expected, other, exceptions);
                ASSERT_EQ(Text(*copy), Text(*expected));
                other = *copy;
            } else if (action == 5) {
                tree = subtree && step > 390 ? *subtree : tree;  // from its own child, or itself
            } else {
                if (subtree) {
                    subtree->AddChild(&tree);  // refused: an ancestor
                    subtree->AddChild(subtree);
                }
                tree.AddChild(some);  // its own child goes to the end
            }
            ExpectLookupsAgree(one, "one, step " + std::to_string(step), step % 20 == 0);
            ExpectLookupsAgree(two, "two, step " + std::to_string(step), step % 20 == 0);
        }
    }
}

// Typed readers take the first namesake and read it only when it is of their
// class; paths step through subtrees by name and index, and brackets are always an index.
TEST(SubTreeTest, TypedReadersAndPaths) {
    PTNSubTree tree("root");
    tree.BuildFromString(
        "(viewer SubTree\n(window SubTree\n(width Integer 640)\n)\n(title String \"t\")\n"
        "(window SubTree\n(width Integer 800)\n)\n(Window Integer 3)\n)\n(a[0] Integer 9)\n"
        "(a String \"first\")\n(a Integer 2)\n(flag Bool TRUE)\n(WIDTH Integer 640)\n(c Char q)\n"
        "(d Double 2.5)\n(list StringList \"x\")\n");
    tree.AddChild(new PTNInteger(nullptr, 1));
    PTNSubTree source("s");  // a merge from nothing, or as a leaf would, changes nothing
    source.AddChild(new PTNChar("c", 'z'));
    tree.SetFrom(nullptr, ExceptionList()), tree.SetFrom(static_cast<DWXParseTreeNode*>(&source));
    EXPECT_EQ(tree.GetChildAsBool("flag") + tree.GetChildAsInteger("flag"), 2);
    EXPECT_EQ(tree.GetChildAsBool("width"), 640);
    EXPECT_EQ(tree.GetChildAsChar("c") + tree.GetChildAsDouble("d"), 'q' + 2.5);
    EXPECT_STREQ(tree.GetChildAsStringList("list")[0], "x");
    // Absent, null, or a first namesake of another class: the defaults.
    for (const char* name : {"absent", static_cast<const char*>(nullptr), "a"}) {
        EXPECT_EQ(tree.GetChildAsChar(name) + tree.GetChildAsDouble(name), 0);
        EXPECT_EQ(tree.GetChildAsStringList(name), nullptr);
    }
    EXPECT_EQ(tree.GetChildAsBool("absent") + tree.GetChildAsBool(nullptr), 0);
    EXPECT_EQ(tree.GetNumberOfOccurence(nullptr) + (tree.GetChild(nullptr) != nullptr), 0);
    EXPECT_STREQ(tree.GetChildAsString("d"), "");

    std::string found;
    for (const char* path :
         {"VIEWER/Window/WIDTH", "viewer/window[0]/width", "viewer/window[1]/width",
          "viewer/window[01]/width", "viewer/window[2]", "viewer/title", "a[0]"}) {
        DWXParseTreeNode* node = tree.Find(path);
        found += (node ? Text(*node) : "null") + " ";
    }
    EXPECT_EQ(found, "640 640 800 800 3 \"t\" \"first\" ");  // namesakes of any class count
    // Not there, through a leaf, and malformed; brackets are always an index.
    for (const char* path :
         {"viewer/window[3]", "viewer/title/x", "viewer/nothere/width", "", "/viewer", "viewer/",
          "viewer//window", "viewer/window[]", "viewer/window[x]", "viewer/window[-1]",
          "viewer/window[1", "viewer/window[1]x", "viewer/window[99999999999]", "viewer/[0]",
          static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(tree.Find(path), nullptr) << (path ? path : "(null)");
    }
}

struct BigNode : PTNInteger {  // larger than the pool carves
    BigNode() : PTNInteger("big", 7) { pad[sizeof pad - 1] = 1; }
    char pad[4096];
};

// Made by a thread-local destructor that runs after the pool let go of the
// thread's slab.
struct LateMaker {
    ~LateMaker() { delete new PTNInteger("late", 1); }
};

// Trees built on four threads, half of them deleted on the main thread.
TEST(NodePoolTest, TreesOnSeparateThreadsAndDeletedOnAnother) {
    std::vector<std::unique_ptr<PTNSubTree>> handOver[4];
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([t, &trees = handOver[t]] {
            thread_local LateMaker maker;
            (void)&maker;
            for (int round = 0; round < 20; ++round) {
                std::unique_ptr<PTNSubTree> tree(new PTNSubTree("t"));
                for (int i = 0; i < 500; ++i) {
                    tree->AddChild(new PTNInteger(std::to_string(i).c_str(), t + i));
                }
                tree->AddChild(new BigNode);
                EXPECT_EQ(tree->GetChildAsInteger("499") + tree->GetChildAsInteger("big"), t + 506);
                if (round % 2) {
                    trees.push_back(std::move(tree));
                }
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
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
