// Huge and deep data: a 1 MB line, a million siblings, nesting far deeper
// than any configuration, and deep chains worked on a thread with a small
// stack. Nothing may crash, and nothing may use stack per level.
#include "container_test_util.h"
#include "report_capture.h"
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <pthread.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <stdlib.h>

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

TEST(RobustnessTest, MegabyteLine) {
    ReportCapture capture;
    // A 1 MB value with every escape in it reads back whole.
    std::string value;
    while (value.size() < (1u << 20)) {
        value += "text \"quoted\" back\\slash\nline ";
    }
    HeapText token(PTNString("big", value.c_str()).GetAsString());
    auto text = "(big String " + std::string(token.get()) + ")\n(after Integer 1)\n";
    PTNSubTree tree("root");
    tree.BuildFromString(text.c_str());
    EXPECT_EQ(tree.GetChildAsString("big"), value);
    EXPECT_EQ(tree.GetChildAsInteger("after"), 1);
    EXPECT_TRUE(capture.Texts().empty());

    // A 1 MB line that is no node line is a corrupt line like any other.
    text = "(ok Integer 1)\n" + std::string(1u << 20, 'x') + "\n(lost Integer 2)\n";
    PTNSubTree bad("bad");
    EXPECT_THROW(bad.BuildFromString(text.c_str()), tzn::Exception);
    EXPECT_EQ(Shape(&bad), "ok");
    ASSERT_EQ(capture.Texts().size(), 1u);
    EXPECT_EQ(capture.Texts()[0], "-1/1 Corrupt file Memory\n at line 2 ... missing tokens.\n");
}

TEST(RobustnessTest, AMillionSiblings) {
    // Memcheck runs this a few hundred times slower; the valgrind tests set
    // DWXCORE_UNDER_VALGRIND and check memory on a twentieth of the count.
    const int count = getenv("DWXCORE_UNDER_VALGRIND") ? 50000 : 1000000;
    std::string text = "(big SubTree\n";
    for (int i = 0; i < count; ++i) {
        text += "  (i" + std::to_string(i) + " Integer " + std::to_string(i) + ")\n";
    }
    PTNSubTree tree("root");
    tree.BuildFromString((text + ")\n(after Integer 1)\n").c_str());
    auto* big = dynamic_cast<PTNSubTree*>(tree.GetChild("big"));
    ASSERT_NE(big, nullptr);
    ASSERT_EQ(big->GetChildren()->GetCount(), count);
    EXPECT_EQ(big->GetChildAsInteger(("i" + std::to_string(count - 1)).c_str()), count - 1);
    EXPECT_EQ(tree.GetChildAsInteger("after"), 1);
    char** lines = big->GetAsStringList(0);
    EXPECT_EQ(CountStringList(lines), count + 2);
    DestroyStringList(lines);
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
        auto* leaf = dynamic_cast<PTNInteger*>(Innermost(copy.get(), levels)->GetChild("x"));
        ASSERT_NE(leaf, nullptr);
        leaf->SetValue(2);
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

    // Per level an opening line of 2L + 10 characters and a closing line of
    // 2L + 1, each with its '\n'; the leaf line 2 * depth + 13 and its '\n'.
    EXPECT_EQ(written.size(), 2 * d * (d - 1) + 15 * d + 14);
    const std::string middle =
        std::string(2 * d, ' ') + "(x Integer 7)\n" + std::string(2 * d - 2, ' ') + ")\n";
    EXPECT_EQ(written.compare(d * (d - 1) + 11 * d, middle.size(), middle), 0);
    EXPECT_EQ(written.substr(0, 24) + written.substr(written.size() - 6),
              "(n SubTree\n  (n SubTree\n  )\n)\n");
    EXPECT_EQ(joined + whole, written + written);
}

}  // namespace
