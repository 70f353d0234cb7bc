// The subtree: ownership, lookups and typed readers, deep copies, and the
// merge under an exception list.
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>

#include <stdlib.h>

#include <initializer_list>
#include <memory>
#include <string>

namespace {

// An integer leaf that counts its destructions.
struct CountingNode : PTNInteger {
    static int destroyed;
    CountingNode(const char* name, int value) : PTNInteger(name, value) {}
    ~CountingNode() override { ++destroyed; }
};
int CountingNode::destroyed = 0;

template <class Tree>
Tree* With(Tree* tree, std::initializer_list<DWXParseTreeNode*> children) {
    for (DWXParseTreeNode* child : children) {
        tree->AddChild(child);
    }
    return tree;
}

TEST(SubTreeTest, OwnsAndDeletesEveryDescendantOnce) {
    CountingNode::destroyed = 0;
    {
        PTNSubTree root("root");
        auto* leaf = new CountingNode("b", 2);
        auto* inner = With(new PTNSubTree("inner"), {leaf});
        With(&root, {new CountingNode("a", 1), inner, nullptr});
        EXPECT_EQ(root.GetChildren()->GetCount(), 2);
        EXPECT_EQ(inner->GetParentRef(), &root);
        EXPECT_EQ(leaf->GetParentRef(), inner);
    }
    EXPECT_EQ(CountingNode::destroyed, 2);
}

TEST(SubTreeTest, LookupsTakeTheFirstNamesake) {
    char* list[] = {const_cast<char*>("x"), nullptr};
    auto* text = new PTNString("a", "first");
    auto* number = new PTNInteger("a", 2);
    PTNSubTree tree("t");
    With(&tree, {text, number, new PTNInteger(nullptr, 0),  // a nameless child is never found
                 new PTNBool("flag", 5), new PTNInteger("WIDTH", 640), new PTNChar("c", 'q'),
                 new PTNDouble("d", 2.5), new PTNString("nullString", nullptr),
                 new PTNStringList("list", list),
                 With(new PTNSubTree("inner"), {new PTNInteger("a", 3)})});

    EXPECT_EQ(tree.GetChild("a"), text);
    EXPECT_EQ(tree.GetChild("a", "PTNinteger"), number);
    EXPECT_EQ(tree.GetChild("a", "Integer"), nullptr);  // a class name, not a keyword
    EXPECT_EQ(tree.GetChild("wid"), nullptr);
    EXPECT_EQ(tree.GetChild(nullptr), nullptr);
    EXPECT_EQ(tree.GetNumberOfOccurence("A"), 2);  // grandchildren are not counted
    EXPECT_EQ(tree.GetNumberOfOccurence(nullptr), 0);

    EXPECT_EQ(tree.GetChildAsBool("flag"), 5);
    EXPECT_EQ(tree.GetChildAsInteger("flag"), 5);
    EXPECT_EQ(tree.GetChildAsBool("width"), 640);
    EXPECT_EQ(tree.GetChildAsChar("c"), 'q');
    EXPECT_EQ(tree.GetChildAsDouble("d"), 2.5);
    EXPECT_STREQ(tree.GetChildAsString("a"), "first");
    EXPECT_EQ(tree.GetChildAsString("nullString"), nullptr);
    EXPECT_STREQ(tree.GetChildAsStringList("list")[0], "x");
    // Absent, null, or a first namesake of another class: the defaults.
    for (const char* name : {"absent", static_cast<const char*>(nullptr), "a"}) {
        EXPECT_EQ(tree.GetChildAsChar(name) + tree.GetChildAsDouble(name), 0);
        EXPECT_EQ(tree.GetChildAsStringList(name), nullptr);
    }
    for (const char* name : {"absent", static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(tree.GetChildAsInteger(name) + tree.GetChildAsBool(name), 0);
    }
    EXPECT_EQ(tree.GetChildAsInteger("a"), 0);
    for (const char* name : {"absent", static_cast<const char*>(nullptr), "d"}) {
        EXPECT_STREQ(tree.GetChildAsString(name), "");
    }
}

TEST(SubTreeTest, CopiesAreDeepAndSurviveTheSource) {
    auto source = std::make_unique<PTNSubTree>("config");
    With(source.get(), {new PTNInteger("width", 640),
                        With(new PTNSubTree("colors"), {new PTNString("fg", "red")})});
    const std::string text = Text(*source);
    std::unique_ptr<PTNSubTree> deep(source->DeepCopy());
    PTNSubTree constructed(*source);
    PTNSubTree assigned("x");
    assigned.AddChild(new PTNInteger("gone", 1));
    assigned = *source;
    source.reset();
    for (PTNSubTree* copy : {deep.get(), &constructed, &assigned}) {
        EXPECT_EQ(Text(*copy), text);
        EXPECT_EQ(copy->GetParentRef(), nullptr);
        auto* colors = static_cast<PTNSubTree*>(copy->GetChild("colors"));
        EXPECT_EQ(colors->GetParentRef(), copy);
        EXPECT_EQ(colors->GetChild("fg")->GetParentRef(), colors);
    }
    // Assigning a subtree from its own descendant, and from itself.
    assigned = *static_cast<PTNSubTree*>(assigned.GetChild("colors"));
    const PTNSubTree& alias = assigned;
    assigned = alias;
    EXPECT_EQ(Text(assigned), "(colors SubTree\n  (fg String \"red\")\n)\n");
}

TEST(ExceptionListTest, MembershipIgnoresCaseAndCopiesAreDeep) {
    ExceptionList list;
    list.Add("color");
    list.Add(nullptr);
    for (int i = 0; i < 20; ++i) {
        list.Add(("name" + std::to_string(i)).c_str());
    }
    ExceptionList copy(list);
    ExceptionList assigned;
    assigned.Add("old");
    assigned = list;
    list = ExceptionList();
    EXPECT_EQ(list.IsMember("color"), 0);
    for (const ExceptionList* l : {&copy, &assigned}) {
        EXPECT_EQ(l->IsMember("COLOR") + l->IsMember("name19"), 2);
        EXPECT_EQ(l->IsMember("colors") + l->IsMember("old") + l->IsMember(nullptr), 0);
    }
}

// Both trees: a, color, inner { b, Color { c }, COLOR }, values base + 1..5.
std::unique_ptr<PTNSubTree> MergeTree(int base) {
    auto* color = With(new PTNSubTree("Color"), {new PTNInteger("c", base + 5)});
    auto* inner = With(new PTNSubTree("inner"),
                       {new PTNInteger("b", base + 3), color, new PTNInteger("COLOR", base + 4)});
    return std::unique_ptr<PTNSubTree>(
        With(new PTNSubTree(base == 0 ? "mine" : "theirs"),
             {new PTNInteger("a", base + 1), new PTNInteger("color", base + 2), inner}));
}

std::string MergedValues(const char* exception, const char* exception2 = nullptr) {
    auto mine = MergeTree(0);
    ExceptionList exceptions;
    exceptions.Add(exception);
    exceptions.Add(exception2);
    mine->SetFrom(MergeTree(100).get(), exceptions);
    std::string text = Text(*mine);
    std::string values;
    for (size_t at = text.find("Integer "); at != std::string::npos;
         at = text.find("Integer ", at + 1)) {
        values += text.substr(at + 8, text.find(')', at) - at - 8) + " ";
    }
    return values;
}

TEST(MergeTest, ExceptionsFirstMatchesAndClasses) {
    // COLOR keeps 4: its first namesake in the other tree is a subtree.
    EXPECT_EQ(MergedValues(nullptr), "101 102 103 105 4 ");
    EXPECT_EQ(MergedValues("color"), "101 2 103 5 4 ");          // at every depth, whole subtrees
    EXPECT_EQ(MergedValues("inner", "mine"), "101 102 3 5 4 ");  // roots never compared

    PTNSubTree mine("m"), theirs("t");
    With(&mine, {new PTNInteger("x", 0), new PTNInteger("X", 0), new PTNInteger("y", 0),
                 new PTNInteger(nullptr, 0), new PTNSubTree("s")});
    With(&theirs, {new PTNInteger("x", 1), new PTNInteger("x", 2), new PTNString("y", "7"),
                   new PTNInteger("y", 7), new PTNInteger(nullptr, 8), new PTNInteger("s", 9),
                   new PTNInteger("z", 9)});
    mine.SetFrom(&theirs, ExceptionList());
    mine.SetFrom(nullptr, ExceptionList());
    mine.SetFrom(static_cast<DWXParseTreeNode*>(&theirs));  // no effect on a subtree
    EXPECT_EQ(Text(mine),
              "(m SubTree\n  (x Integer 1)\n  (X Integer 1)\n  (y Integer 0)\n"
              "  ( Integer 0)\n  (s SubTree\n  )\n)\n");
}

TEST(SubTreeTest, PathsAndRangeFor) {
    PTNSubTree tree("root");
    tree.BuildFromString(
        "(viewer SubTree\n(window SubTree\n(width Integer 640)\n)\n(title String \"t\")\n"
        "(window SubTree\n(width Integer 800)\n)\n(Window Integer 3)\n)\n(a[0] Integer 9)\n");
    std::string found;
    for (const char* path :
         {"VIEWER/Window/WIDTH", "viewer/window[0]/width", "viewer/window[1]/width",
          "viewer/window[01]/width", "viewer/window[2]", "viewer/title"}) {
        DWXParseTreeNode* node = tree.Find(path);
        found += (node ? Text(*node) : "null") + " ";
    }
    EXPECT_EQ(found, "640 640 800 800 3 \"t\" ");  // namesakes count whatever their class
    EXPECT_EQ(tree.Find("viewer"), tree.GetChild("viewer"));
    // Not there, through a leaf, and malformed; brackets are always an index.
    for (const char* path :
         {"viewer/window[3]", "viewer/title/x", "viewer/nothere/width", "", "/viewer", "viewer/",
          "viewer//window", "viewer/window[]", "viewer/window[x]", "viewer/window[-1]",
          "viewer/window[1", "viewer/window[1]x", "viewer/window[99999999999]", "viewer/[0]",
          "a[0]"}) {
        EXPECT_EQ(tree.Find(path), nullptr) << path;
    }
    EXPECT_EQ(tree.Find(nullptr), nullptr);
    EXPECT_EQ(tree.FindAs<PTNInteger>("viewer/window[1]/width")->GetValue(), 800);
    EXPECT_EQ(tree.FindAs<PTNString>("viewer/window/width"), nullptr);

    std::string names;
    for (DWXParseTreeNode* child : *tree.FindAs<PTNSubTree>("viewer")) {
        names += child->GetName();
    }
    EXPECT_EQ(names, "windowtitlewindowWindow");
}

}  // namespace
