// Deeply nested subtrees: deleting, copying, merging and writing a chain of
// subtrees as deep as the reader can build must not use stack per level.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <pthread.h>
#include <services/utilhub.h>

#include <stdio.h>
#include <stdlib.h>

#include <functional>
#include <memory>
#include <string>
#include <typeinfo>

#if defined(__has_include)
#if __has_include(<valgrind/valgrind.h>)
#include <valgrind/valgrind.h>
#endif
#endif

namespace {

// An integer leaf that counts its destructions and copies as its own class.
struct CountingLeaf : PTNInteger {
    static int destroyed;
    CountingLeaf(const char* name, int value) : PTNInteger(name, value) {}
    ~CountingLeaf() override { ++destroyed; }
    DWXParseTreeNode* Copy() override { return new CountingLeaf(GetName(), GetValue()); }
};
int CountingLeaf::destroyed = 0;

// A million levels; fewer where every allocation costs far more.
int DeepLevels() {
#if defined(RUNNING_ON_VALGRIND)
    if (RUNNING_ON_VALGRIND) {
        return 20000;
    }
#endif
#if defined(__SANITIZE_ADDRESS__)
    return 200000;
#else
    return 1000000;
#endif
}

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

TEST(DeepTreeTest, ChainCopiesMergesAndGoesAway) {
    const int depth = DeepLevels();
    CountingLeaf::destroyed = 0;
    {
        std::unique_ptr<PTNSubTree> tree(Chain(depth, 1));
        std::unique_ptr<PTNSubTree> copy(tree->DeepCopy());
        auto* leaf = dynamic_cast<CountingLeaf*>(Innermost(copy.get(), depth)->GetChild("x"));
        ASSERT_NE(leaf, nullptr);
        EXPECT_EQ(leaf->GetValue(), 1);

        leaf->SetValue(2);
        ExceptionList keepX;
        keepX.Add("X");
        tree->SetFrom(copy.get(), keepX);
        EXPECT_EQ(Innermost(tree.get(), depth)->GetChildAsInteger("x"), 1);
        tree->SetFrom(copy.get(), ExceptionList());
        EXPECT_EQ(Innermost(tree.get(), depth)->GetChildAsInteger("x"), 2);
        EXPECT_EQ(CountingLeaf::destroyed, 0);
    }
    EXPECT_EQ(CountingLeaf::destroyed, 2);  // each leaf once
}

// Runs `work` on a thread with a small stack, so that any use of stack per
// level of a few thousand shows up as a crash.
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

TEST(DeepTreeTest, WritingAndCopyingUseNoStackPerLevel) {
    // The text grows with the square of the depth (every line is indented),
    // so writing is tried a few thousand levels deep.
    const int depth = 5000;
    std::string written, joined, text, copied;
    size_t lines = 0;
    OnSmallStack([&] {
        std::unique_ptr<PTNSubTree> tree(Chain(depth, 7));
        char* buffer = nullptr;
        size_t size = 0;
        FILE* stream = open_memstream(&buffer, &size);
        tree->WriteToFile(stream);
        fclose(stream);
        written.assign(buffer, size);
        free(buffer);

        char** list = tree->GetAsStringList(0);
        lines = static_cast<size_t>(CountStringList(list));
        char* join = StringListToBuffer(list);
        joined = join;
        free(join);
        DestroyStringList(list);

        char* whole = tree->GetAsString();
        text = whole;
        free(whole);

        PTNSubTree copy("other");
        copy = *tree;
        static_cast<PTNInteger*>(Innermost(&copy, depth)->GetChild("x"))->SetValue(9);
        copy.SetFrom(tree.get(), ExceptionList());
        char* again = copy.GetAsString();
        copied = again;
        free(again);
    });
    // Per level an opening line of 2L + 10 characters and a closing line of
    // 2L + 1, each with its '\n'; the leaf line 2 * depth + 13 and its '\n'.
    const size_t d = depth;
    EXPECT_EQ(written.size(), 2 * d * (d - 1) + 15 * d + 14);
    EXPECT_EQ(lines, 2 * d + 1);
    EXPECT_EQ(written.compare(0, 24, "(n SubTree\n  (n SubTree\n"), 0);
    const std::string middle =
        std::string(2 * d, ' ') + "(x Integer 7)\n" + std::string(2 * d - 2, ' ') + ")\n";
    EXPECT_EQ(written.compare(d * (d - 1) + 11 * d, middle.size(), middle), 0);
    EXPECT_EQ(written.substr(written.size() - 6), "  )\n)\n");
    EXPECT_EQ(joined, written);
    EXPECT_EQ(text, written);
    EXPECT_EQ(copied, written);
}

}  // namespace
