// Nesting far deeper than any configuration, worked on a thread with a small
// stack: nothing may crash, and nothing may use stack per level.
#include "container_test_util.h"
#include "report_capture.h"
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <pthread.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>

namespace {

// The innermost of nested subtrees named n, adding to `levels` one per level
// below `tree`; each must hold one child and have its level above as parent.
PTNSubTree* Innermost(PTNSubTree* tree, int& levels) {
    for (PTNSubTree* next; (next = dynamic_cast<PTNSubTree*>(tree->GetChild("n"))); ++levels) {
        EXPECT_TRUE(next->GetParentRef() == tree && next->GetChildren()->GetCount() == 1);
        tree = next;
    }
    return tree;
}

// "(n SubTree" lines `levels` deep, the leaf x = value, and the closing lines.
std::string Nested(int levels, int value) {
    std::string opening, closing;
    for (int i = 0; i < levels; ++i) {
        opening += "(n SubTree\n";
        closing += ")\n";
    }
    return opening + "(x Integer " + std::to_string(value) + ")\n" + closing;
}

// Nesting is bounded by memory, not by the stack. On a thread whose 256 KB
// stack leaves no room for stack per level, 100,000 levels read whole, and
// copying, merging, assigning, writing and deleting deep trees work.
TEST(RobustnessTest, NestingFarTooDeepOnASmallStack) {
    ReportCapture capture;
    const size_t d = 5000;  // the written text grows with the square of the depth
    std::string written, joined, whole;
    int levels = 0;
    std::function<void()> work = [&] {
        PTNSubTree tree("root"), shallow("root");
        tree.BuildFromString(
            ("(first Integer 1)\n" + Nested(100000, 1) + "(after Integer 2)\n").c_str());
        EXPECT_EQ(tree.GetChildAsInteger("after"), 2);
        std::unique_ptr<PTNSubTree> copy(tree.DeepCopy());
        static_cast<PTNInteger*>(Innermost(copy.get(), levels)->GetChild("x"))->SetValue(2);
        ExceptionList keepX;
        keepX.Add("X");
        tree.SetFrom(copy.get(), keepX);
        EXPECT_EQ(Innermost(&tree, levels)->GetChildAsInteger("x"), 1);
        tree.SetFrom(copy.get(), ExceptionList());
        PTNSubTree assigned("other");
        assigned = tree;
        EXPECT_EQ(Innermost(&assigned, levels)->GetChildAsInteger("x"), 2);

        shallow.BuildFromString(Nested(static_cast<int>(d), 7).c_str());
        auto* top = static_cast<PTNSubTree*>(shallow.GetChild("n"));
        written = Captured([&](FILE* f) { top->WriteToFile(f); });
        whole = HeapText(top->GetAsString()).get();
        char** list = top->GetAsStringList(0);
        joined = HeapText(StringListToBuffer(list)).get();
        DestroyStringList(list);
    };
    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    pthread_attr_setstacksize(&attributes, 256 * 1024);
    pthread_t thread;
    auto run = [](void* argument) -> void* {
        (*static_cast<std::function<void()>*>(argument))();
        return nullptr;
    };
    ASSERT_EQ(pthread_create(&thread, &attributes, run, &work), 0);
    pthread_join(thread, nullptr);
    pthread_attr_destroy(&attributes);
    EXPECT_TRUE(capture.Texts().empty());
    EXPECT_EQ(levels, 3 * 100000);  // every level of three trees

    // Each level indents two more; the text is the same on every path.
    EXPECT_EQ(written.size(), 2 * d * (d - 1) + 15 * d + 14);
    const std::string middle =
        std::string(2 * d, ' ') + "(x Integer 7)\n" + std::string(2 * d - 2, ' ') + ")\n";
    EXPECT_EQ(written.compare(d * (d - 1) + 11 * d, middle.size(), middle), 0);
    EXPECT_EQ(written.substr(0, 24) + written.substr(written.size() - 6),
              "(n SubTree\n  (n SubTree\n  )\n)\n");
    EXPECT_EQ(joined + whole, written + written);
}

}  // namespace
