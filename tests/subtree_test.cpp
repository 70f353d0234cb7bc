// The subtree: ownership of children, lookups by name and class, the typed
// readers, deep copies, and the merge under an exception list.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/utilhub.h>

#include <stdlib.h>

#include <memory>
#include <string>
#include <vector>

namespace {

// An integer leaf that counts its destructions.
class CountingNode : public PTNInteger {
  public:
    static int destroyed;
    CountingNode(const char* name, int value) : PTNInteger(name, value) {}
    ~CountingNode() override { ++destroyed; }
};
int CountingNode::destroyed = 0;

int IntegerOf(const PTNSubTree& tree, const char* name) {
    auto* node = dynamic_cast<PTNInteger*>(tree.GetChild(name, "PTNInteger"));
    return node != nullptr ? node->GetValue() : -999;
}

std::vector<DWXParseTreeNode*> Children(const PTNSubTree& tree) {
    std::vector<DWXParseTreeNode*> result;
    DWXIter iter(tree.GetChildren());
    for (DWXObject* o = iter.Current(); o != nullptr; o = iter.Next()) {
        result.push_back(static_cast<DWXParseTreeNode*>(o));
    }
    return result;
}

TEST(SubTreeTest, OwnsAndDeletesEveryDescendantOnce) {
    CountingNode::destroyed = 0;
    {
        PTNSubTree root("root");
        auto* inner = new PTNSubTree("inner");
        root.AddChild(new CountingNode("a", 1));
        root.AddChild(inner);
        inner->AddChild(new CountingNode("b", 2));
        inner->AddChild(new CountingNode("b", 3));
        root.AddChild(nullptr);
        EXPECT_EQ(root.GetChildren()->GetCount(), 2);
        EXPECT_EQ(inner->GetParentRef(), &root);
        EXPECT_EQ(Children(*inner)[1]->GetParentRef(), inner);
    }
    EXPECT_EQ(CountingNode::destroyed, 3);
}

TEST(SubTreeTest, GetChildMatchesWholeNamesIgnoringCaseAndOptionalClass) {
    PTNSubTree tree("t");
    auto* text = new PTNString("a", "first");
    auto* number = new PTNInteger("a", 2);
    auto* width = new PTNInteger("WIDTH", 640);
    tree.AddChild(text);
    tree.AddChild(number);
    tree.AddChild(width);
    tree.AddChild(new PTNInteger(nullptr, 0));  // a nameless child is never found

    EXPECT_EQ(tree.GetChild("width"), width);
    EXPECT_EQ(tree.GetChild("a"), text);
    EXPECT_EQ(tree.GetChild("a", "PTNInteger"), number);
    EXPECT_EQ(tree.GetChild("a", "PTNinteger"), number);
    EXPECT_EQ(tree.GetChild("a", "Integer"), nullptr);  // a class name, not a keyword
    EXPECT_EQ(tree.GetChild("wid"), nullptr);
    EXPECT_EQ(tree.GetChild("width "), nullptr);
    EXPECT_EQ(tree.GetChild(nullptr), nullptr);
    EXPECT_EQ(tree.GetChild(""), nullptr);
    EXPECT_STREQ(tree.GetChildAsString("a"), "first");
}

TEST(SubTreeTest, TypedReadersReturnTheFirstNamesakeOrTheDefault) {
    char* list[] = {const_cast<char*>("x"), nullptr};
    PTNSubTree tree("t");
    tree.AddChild(new PTNBool("flag", 5));
    tree.AddChild(new PTNInteger("count", 7));
    tree.AddChild(new PTNChar("c", 'q'));
    tree.AddChild(new PTNDouble("d", 2.5));
    tree.AddChild(new PTNString("s", "text"));
    tree.AddChild(new PTNString("nullString", nullptr));
    tree.AddChild(new PTNStringList("list", list));
    tree.AddChild(new PTNInteger("s", 99));  // a later namesake is never read

    EXPECT_EQ(tree.GetChildAsBool("FLAG"), 5);
    EXPECT_EQ(tree.GetChildAsInteger("flag"), 5);
    EXPECT_EQ(tree.GetChildAsBool("count"), 7);
    EXPECT_EQ(tree.GetChildAsInteger("count"), 7);
    EXPECT_EQ(tree.GetChildAsChar("c"), 'q');
    EXPECT_EQ(tree.GetChildAsDouble("d"), 2.5);
    EXPECT_STREQ(tree.GetChildAsString("s"), "text");
    EXPECT_EQ(tree.GetChildAsString("nullString"), nullptr);
    ASSERT_NE(tree.GetChildAsStringList("list"), nullptr);
    EXPECT_STREQ(tree.GetChildAsStringList("list")[0], "x");

    for (const char* missing : {"absent", static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(tree.GetChildAsBool(missing), 0);
        EXPECT_EQ(tree.GetChildAsInteger(missing), 0);
        EXPECT_EQ(tree.GetChildAsChar(missing), 0);
        EXPECT_EQ(tree.GetChildAsDouble(missing), 0.0);
        ASSERT_NE(tree.GetChildAsString(missing), nullptr);
        EXPECT_STREQ(tree.GetChildAsString(missing), "");
        EXPECT_EQ(tree.GetChildAsStringList(missing), nullptr);
    }
}

TEST(SubTreeTest, TypedReadersNeverReadAChildOfAnotherClass) {
    PTNSubTree tree("t");
    tree.AddChild(new PTNString("v", "12"));
    tree.AddChild(new PTNInteger("v", 12));  // would fit, but is not the first
    tree.AddChild(new PTNDouble("n", 1.5));
    tree.AddChild(new PTNFloat("f", 1.5f));
    EXPECT_EQ(tree.GetChildAsInteger("v"), 0);
    EXPECT_EQ(tree.GetChildAsBool("v"), 0);
    EXPECT_EQ(tree.GetChildAsChar("v"), 0);
    EXPECT_EQ(tree.GetChildAsDouble("v"), 0.0);
    EXPECT_EQ(tree.GetChildAsStringList("v"), nullptr);
    EXPECT_STREQ(tree.GetChildAsString("n"), "");
    EXPECT_EQ(tree.GetChildAsInteger("n"), 0);
    EXPECT_EQ(tree.GetChildAsDouble("f"), 0.0);
}

TEST(SubTreeTest, GetNumberOfOccurenceCountsDirectChildrenOnly) {
    PTNSubTree tree("t");
    auto* inner = new PTNSubTree("inner");
    tree.AddChild(new PTNInteger("x", 1));
    tree.AddChild(new PTNString("X", "2"));
    tree.AddChild(inner);
    tree.AddChild(new PTNInteger(nullptr, 0));
    inner->AddChild(new PTNInteger("x", 3));
    EXPECT_EQ(tree.GetNumberOfOccurence("x"), 2);
    EXPECT_EQ(tree.GetNumberOfOccurence("inner"), 1);
    EXPECT_EQ(tree.GetNumberOfOccurence("y"), 0);
    EXPECT_EQ(tree.GetNumberOfOccurence(nullptr), 0);
}

std::unique_ptr<PTNSubTree> SampleTree() {
    auto tree = std::make_unique<PTNSubTree>("config");
    auto* colors = new PTNSubTree("colors");
    tree->AddChild(new PTNInteger("width", 640));
    tree->AddChild(new PTNString("title", "Main window"));
    tree->AddChild(colors);
    colors->AddChild(new PTNString("fg", "red"));
    colors->AddChild(new PTNSubTree("empty"));
    return tree;
}

std::string Text(const DWXParseTreeNode& node) {
    char* text = node.GetAsString();
    std::string result(text != nullptr ? text : "<null>");
    free(text);
    return result;
}

void ExpectDetachedCopy(const PTNSubTree& copy, const std::string& expectedText) {
    EXPECT_EQ(copy.GetParentRef(), nullptr);
    EXPECT_EQ(Text(copy), expectedText);
    for (DWXParseTreeNode* child : Children(copy)) {
        EXPECT_EQ(child->GetParentRef(), &copy);
    }
    auto* colors = static_cast<PTNSubTree*>(copy.GetChild("colors"));
    for (DWXParseTreeNode* child : Children(*colors)) {
        EXPECT_EQ(child->GetParentRef(), colors);
    }
}

TEST(SubTreeTest, CopiesAreDeepAndSurviveTheSource) {
    auto source = SampleTree();
    const std::string text = Text(*source);
    std::unique_ptr<PTNSubTree> deep(source->DeepCopy());
    std::unique_ptr<DWXParseTreeNode> copied(source->Copy());
    PTNSubTree constructed(*source);
    PTNSubTree assigned("x");
    assigned.AddChild(new PTNInteger("gone", 1));
    assigned = *source;
    source.reset();
    ExpectDetachedCopy(*deep, text);
    ExpectDetachedCopy(*static_cast<PTNSubTree*>(copied.get()), text);
    ExpectDetachedCopy(constructed, text);
    ExpectDetachedCopy(assigned, text);

    const PTNSubTree& alias = assigned;
    assigned = alias;
    EXPECT_EQ(Text(assigned), text);
    // Assigning a subtree from one of its own descendants.
    auto* colors = static_cast<PTNSubTree*>(assigned.GetChild("colors"));
    assigned = *colors;
    EXPECT_STREQ(assigned.GetName(), "colors");
    EXPECT_EQ(assigned.GetChildren()->GetCount(), 2);
    EXPECT_STREQ(assigned.GetChildAsString("fg"), "red");
}

TEST(SubTreeTest, SingleArgumentSetFromChangesNothing) {
    auto tree = SampleTree();
    auto other = SampleTree();
    static_cast<PTNInteger*>(other->GetChild("width"))->SetValue(1);
    tree->SetFrom(static_cast<DWXParseTreeNode*>(other.get()));
    EXPECT_EQ(tree->GetChildAsInteger("width"), 640);
}

TEST(ExceptionListTest, MembershipIgnoresCaseAndKeepsDuplicates) {
    ExceptionList list;
    EXPECT_EQ(list.IsMember("color"), 0);
    list.Add("color");
    list.Add("color");
    list.Add(nullptr);
    for (int i = 0; i < 20; ++i) {
        list.Add(("name" + std::to_string(i)).c_str());
    }
    EXPECT_EQ(list.IsMember("COLOR"), 1);
    EXPECT_EQ(list.IsMember("name19"), 1);
    EXPECT_EQ(list.IsMember("colo"), 0);
    EXPECT_EQ(list.IsMember("colors"), 0);
    EXPECT_EQ(list.IsMember(nullptr), 0);

    ExceptionList copy(list);
    ExceptionList assigned;
    assigned.Add("old");
    assigned = list;
    const ExceptionList& alias = assigned;
    assigned = alias;
    list = ExceptionList();
    EXPECT_EQ(list.IsMember("color"), 0);
    EXPECT_EQ(copy.IsMember("Color"), 1);
    EXPECT_EQ(assigned.IsMember("name0"), 1);
    EXPECT_EQ(assigned.IsMember("old"), 0);
}

// Merge fixtures: this tree and other, built from the same shape.
class MergeTest : public ::testing::Test {
  protected:
    static std::unique_ptr<PTNSubTree> Build(int base) {
        auto tree = std::make_unique<PTNSubTree>(base == 0 ? "mine" : "theirs");
        auto* inner = new PTNSubTree("inner");
        auto* color = new PTNSubTree("Color");
        tree->AddChild(new PTNInteger("a", base + 1));
        tree->AddChild(new PTNInteger("color", base + 2));
        tree->AddChild(inner);
        inner->AddChild(new PTNInteger("b", base + 3));
        inner->AddChild(color);
        inner->AddChild(new PTNInteger("COLOR", base + 4));
        color->AddChild(new PTNInteger("c", base + 5));
        return tree;
    }
    static int Inner(const PTNSubTree& tree, const char* name) {
        return IntegerOf(*static_cast<PTNSubTree*>(tree.GetChild("inner")), name);
    }
    static int InColor(const PTNSubTree& tree) {
        auto* inner = static_cast<PTNSubTree*>(tree.GetChild("inner"));
        return IntegerOf(*static_cast<PTNSubTree*>(inner->GetChild("Color", "PTNSubTree")), "c");
    }
};

TEST_F(MergeTest, TakesLeafValuesAtEveryDepth) {
    auto mine = Build(0);
    auto theirs = Build(100);
    ExceptionList none;
    mine->SetFrom(theirs.get(), none);
    EXPECT_EQ(IntegerOf(*mine, "a"), 101);
    EXPECT_EQ(IntegerOf(*mine, "color"), 102);
    EXPECT_EQ(Inner(*mine, "b"), 103);
    EXPECT_EQ(InColor(*mine), 105);
    // Its first namesake in `other` is the subtree Color, which a leaf cannot take.
    EXPECT_EQ(Inner(*mine, "color"), 4);
    mine->SetFrom(nullptr, none);
    EXPECT_EQ(IntegerOf(*mine, "a"), 101);
}

TEST_F(MergeTest, ExceptionNamesApplyAtEveryDepthAndCoverWholeSubtrees) {
    auto mine = Build(0);
    auto theirs = Build(100);
    ExceptionList exceptions;
    exceptions.Add("color");
    mine->SetFrom(theirs.get(), exceptions);
    EXPECT_EQ(IntegerOf(*mine, "a"), 101);
    EXPECT_EQ(IntegerOf(*mine, "color"), 2);
    EXPECT_EQ(Inner(*mine, "b"), 103);
    EXPECT_EQ(Inner(*mine, "color"), 4);
    EXPECT_EQ(InColor(*mine), 5);  // nothing below an excepted subtree

    ExceptionList rootName;
    rootName.Add("mine");  // the roots' names are never compared
    mine->SetFrom(theirs.get(), rootName);
    EXPECT_EQ(IntegerOf(*mine, "color"), 102);
}

TEST_F(MergeTest, FirstNamesakeDecidesEvenWhenItsClassDoesNotFit) {
    PTNSubTree mine("m");
    mine.AddChild(new PTNInteger("x", 0));
    mine.AddChild(new PTNInteger("X", 0));
    mine.AddChild(new PTNInteger("y", 0));
    PTNSubTree theirs("t");
    theirs.AddChild(new PTNInteger("x", 1));
    theirs.AddChild(new PTNInteger("x", 2));
    theirs.AddChild(new PTNString("y", "7"));
    theirs.AddChild(new PTNInteger("y", 7));
    theirs.AddChild(new PTNInteger("z", 9));  // no counterpart: ignored
    mine.SetFrom(&theirs, ExceptionList());
    const std::vector<DWXParseTreeNode*> children = Children(mine);
    ASSERT_EQ(children.size(), 3u);
    EXPECT_EQ(static_cast<PTNInteger*>(children[0])->GetValue(), 1);
    EXPECT_EQ(static_cast<PTNInteger*>(children[1])->GetValue(), 1);
    EXPECT_EQ(static_cast<PTNInteger*>(children[2])->GetValue(), 0);
    EXPECT_EQ(mine.GetChild("z"), nullptr);
}

TEST_F(MergeTest, SubtreesAndLeavesDoNotMergeIntoEachOther) {
    PTNSubTree mine("m");
    auto* s = new PTNSubTree("s");
    s->AddChild(new PTNInteger("v", 1));
    mine.AddChild(s);
    mine.AddChild(new PTNInteger("leaf", 2));
    mine.AddChild(new PTNString(nullptr, "nameless"));
    PTNSubTree theirs("t");
    theirs.AddChild(new PTNInteger("s", 10));
    auto* leaf = new PTNSubTree("leaf");
    leaf->AddChild(new PTNInteger("leaf", 20));
    theirs.AddChild(leaf);
    theirs.AddChild(new PTNString(nullptr, "other"));
    mine.SetFrom(&theirs, ExceptionList());
    EXPECT_EQ(IntegerOf(*s, "v"), 1);
    EXPECT_EQ(IntegerOf(mine, "leaf"), 2);
    EXPECT_STREQ(static_cast<PTNString*>(Children(mine)[2])->GetValue(), "nameless");
    EXPECT_EQ(Text(mine),
              "(m SubTree\n  (s SubTree\n    (v Integer 1)\n  )\n"
              "  (leaf Integer 2)\n  ( String \"nameless\")\n)\n");
}

TEST_F(MergeTest, MergingATreeIntoItselfChangesNothing) {
    auto mine = Build(0);
    const std::string before = Text(*mine);
    mine->SetFrom(mine.get(), ExceptionList());
    EXPECT_EQ(Text(*mine), before);
}

}  // namespace
