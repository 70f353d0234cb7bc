// Deeply nested subtrees: deleting, copying, merging and writing a chain of
// subtrees, on a thread whose small stack leaves no room for stack per level.
#include "container_test_util.h"

#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <pthread.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <stdlib.h>

#include <functional>
#include <memory>
#include <string>
#include <typeinfo>

namespace {

// An integer leaf that counts its destructions and copies as its own class.
struct CountingLeaf : PTNInteger {
    static int destroyed;
    CountingLeaf(const char* name, int value) : PTNInteger(name, value) {}
    ~CountingLeaf() override { ++destroyed; }
    DWXParseTreeNode* Copy() override { return new CountingLeaf(GetName(), GetValue()); }
};
int CountingLeaf::destroyed = 0;

// `depth` nested subtrees named n, the innermost holding the leaf x = value.
PTNSubTree* Chain(int depth, int value) {
    auto* root = new PTNSubTree("n");
    PTNSubTree* inner = root;
    for (int level = 1; level < depth; ++level) {
        auto* next = new PTNSubTree("n");
        inner->AddChild(next);
        inner = next;
    }
    inner->AddChild(new CountingLeaf("x", value));
    return root;
}

// The innermost subtree, checking every level's shape and parent on the way.
PTNSubTree* Innermost(PTNSubTree* tree, int depth) {
    for (int level = 1; level < depth; ++level) {
        auto* next = static_cast<PTNSubTree*>((*tree->GetChildren())[0]);
        if (tree->GetChildren()->GetCount() != 1 || next == nullptr ||
            next->GetParentRef() != tree || typeid(*next) != typeid(PTNSubTree)) {
            ADD_FAILURE() << "broken level " << level;
            return tree;
        }
        tree = next;
    }
    return tree;
}

// Runs `work` on a thread with a 256 KB stack: any use of stack per level
// over some ten thousand levels shows up as a crash.
void OnSmallStack(const std::function<void()>& work) {
    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    pthread_attr_setstacksize(&attributes, 256 * 1024);
    pthread_t thread;
    auto run = [](void* argument) -> void* {
        (*static_cast<const std::function<void()>*>(argument))();
        return nullptr;
    };
    ASSERT_EQ(pthread_create(&thread, &attributes, run, const_cast<std::function<void()>*>(&work)),
              0);
    pthread_join(thread, nullptr);
    pthread_attr_destroy(&attributes);
}

TEST(DeepTreeTest, ChainCopiesMergesAndGoesAway) {
    const int depth = 50000;
    CountingLeaf::destroyed = 0;
    OnSmallStack([&] {
        std::unique_ptr<PTNSubTree> tree(Chain(depth, 1));
        std::unique_ptr<PTNSubTree> copy(tree->DeepCopy());
        auto* leaf = dynamic_cast<CountingLeaf*>(Innermost(copy.get(), depth)->GetChild("x"));
        ASSERT_NE(leaf, nullptr);
        leaf->SetValue(2);
        ExceptionList keepX;
        keepX.Add("X");
        tree->SetFrom(copy.get(), keepX);
        EXPECT_EQ(Innermost(tree.get(), depth)->GetChildAsInteger("x"), 1);
        tree->SetFrom(copy.get(), ExceptionList());
        EXPECT_EQ(Innermost(tree.get(), depth)->GetChildAsInteger("x"), 2);
        PTNSubTree assigned("other");
        assigned = *tree;
        EXPECT_EQ(Innermost(&assigned, depth)->GetChildAsInteger("x"), 2);
        EXPECT_EQ(CountingLeaf::destroyed, 0);
    });
    EXPECT_EQ(CountingLeaf::destroyed, 3);  // each leaf once
}

TEST(DeepTreeTest, WritingUsesNoStackPerLevel) {
    // The text grows with the square of the depth (every line is indented).
    const size_t d = 5000;
    std::string written, joined, text;
    size_t lines = 0;
    OnSmallStack([&] {
        std::unique_ptr<PTNSubTree> tree(Chain(static_cast<int>(d), 7));
        written = Captured([&](FILE* f) { tree->WriteToFile(f); });
        char** list = tree->GetAsStringList(0);
        lines = static_cast<size_t>(CountStringList(list));
        HeapText join(StringListToBuffer(list));
        joined = join.get();
        DestroyStringList(list);
        HeapText whole(tree->GetAsString());
        text = whole.get();
    });
    // Per level an opening line of 2L + 10 characters and a closing line of
    // 2L + 1, each with its '\n'; the leaf line 2 * depth + 13 and its '\n'.
    EXPECT_EQ(written.size(), 2 * d * (d - 1) + 15 * d + 14);
    EXPECT_EQ(lines, 2 * d + 1);
    EXPECT_EQ(written.compare(0, 24, "(n SubTree\n  (n SubTree\n"), 0);
    const std::string middle =
        std::string(2 * d, ' ') + "(x Integer 7)\n" + std::string(2 * d - 2, ' ') + ")\n";
    EXPECT_EQ(written.compare(d * (d - 1) + 11 * d, middle.size(), middle), 0);
    EXPECT_EQ(written.substr(written.size() - 6), "  )\n)\n");
    EXPECT_EQ(joined, written);
    EXPECT_EQ(text, written);
}

}  // namespace
