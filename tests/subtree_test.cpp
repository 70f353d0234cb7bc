// The subtree: ownership, lookups and typed readers, deep copies, paths, and
// the merge under an exception list.
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>

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

TEST(SubTreeTest, OwnsEveryDescendantOnceAndNeverAnAncestor) {
    CountingNode::destroyed = 0;
    {
        PTNSubTree root("root");
        auto* leaf = new CountingNode("b", 2);
        auto* inner = With(new PTNSubTree("inner"), {leaf});
        With(&root, {new CountingNode("a", 1), inner, nullptr});
        EXPECT_EQ(root.GetChildren()->GetCount(), 2);
        EXPECT_EQ(leaf->GetParentRef(), inner);
        inner->AddChild(&root);
        inner->AddChild(inner);
        EXPECT_EQ(inner->GetChildren()->GetCount(), 1);
        PTNSubTree target("target");
        target.AddChild(inner);  // a whole subtree moves
        EXPECT_EQ(inner->GetParentRef(), &target);
        EXPECT_EQ(root.GetChildren()->GetCount(), 1);
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

    EXPECT_EQ(tree.GetChildAsBool("flag") + tree.GetChildAsInteger("flag"), 10);
    EXPECT_EQ(tree.GetChildAsBool("width"), 640);
    EXPECT_EQ(tree.GetChildAsChar("c"), 'q');
    EXPECT_EQ(tree.GetChildAsDouble("d"), 2.5);
    EXPECT_STREQ(tree.GetChildAsString("a"), "first");
    EXPECT_EQ(tree.GetChildAsString("nullString"), nullptr);
    EXPECT_STREQ(tree.GetChildAsStringList("list")[0], "x");
    // Absent, null, or a first namesake of another class: the defaults.
    for (const char* name : {"absent", static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(tree.GetChildAsInteger(name) + tree.GetChildAsBool(name), 0);
        EXPECT_EQ(tree.GetChildAsChar(name) + tree.GetChildAsDouble(name), 0);
        EXPECT_EQ(tree.GetChildAsStringList(name), nullptr);
        EXPECT_STREQ(tree.GetChildAsString(name), "");
    }
    EXPECT_EQ(tree.GetChildAsInteger("a") + tree.GetChildAsChar("a") + tree.GetChildAsDouble("a"),
              0);
    EXPECT_EQ(tree.GetChildAsStringList("a"), nullptr);
    EXPECT_STREQ(tree.GetChildAsString("d"), "");
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

TEST(MergeTest, ExceptionListsAndFirstMatches) {
    ExceptionList list;
    list.Add("color");
    list.Add(nullptr);
    for (int i = 0; i < 20; ++i) {
        list.Add(("name" + std::to_string(i)).c_str());
    }
    ExceptionList copy(list), assigned;
    assigned.Add("old");
    assigned = list;
    list = ExceptionList();
    EXPECT_EQ(list.IsMember("color"), 0);
    for (const ExceptionList* l : {&copy, &assigned}) {
        EXPECT_EQ(l->IsMember("COLOR") + l->IsMember("name19"), 2);
        EXPECT_EQ(l->IsMember("colors") + l->IsMember("old") + l->IsMember(nullptr), 0);
    }

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
    // Not there, through a leaf, and malformed; brackets are always an index.
    for (const char* path :
         {"viewer/window[3]", "viewer/title/x", "viewer/nothere/width", "", "/viewer", "viewer/",
          "viewer//window", "viewer/window[]", "viewer/window[x]", "viewer/window[-1]",
          "viewer/window[1", "viewer/window[1]x", "viewer/window[99999999999]", "viewer/[0]",
          "a[0]", static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(tree.Find(path), nullptr) << (path ? path : "(null)");
    }
    EXPECT_EQ(tree.FindAs<PTNString>("viewer/window/width"), nullptr);
    std::string names;
    for (DWXParseTreeNode* child : *tree.FindAs<PTNSubTree>("viewer")) {
        names += child->GetName();
    }
    EXPECT_EQ(names, "windowtitlewindowWindow");
}

}  // namespace
