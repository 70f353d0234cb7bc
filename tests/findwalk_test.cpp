// Path lookups in a subtree, and range-for over every container and over a
// subtree's children.
#include "container_test_util.h"
#include "tree_test_util.h"

#include <dwxcore/dwxobject.h>
#include <dwxcore/dwxparse.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

namespace {

struct Item : DWXObject {
    const char* GetClassName() const override { return "Item"; }
};

TEST(FindTest, PathsWithIndexesCaseAndMalformedOnes) {
    PTNSubTree tree("root");
    tree.BuildFromString(
        "(viewer SubTree\n(window SubTree\n(width Integer 640)\n)\n(title String \"t\")\n"
        "(window SubTree\n(width Integer 800)\n)\n(Window Integer 3)\n)\n(a[0] Integer 9)\n");
    struct Row {
        const char* path;
        const char* found;  // Text of the node, "{}" for a subtree, null for none
    } rows[] = {
        {"viewer/window/width", "640"},
        {"VIEWER/Window/WIDTH", "640"},
        {"viewer/window[0]/width", "640"},
        {"viewer/window[1]/width", "800"},
        {"viewer/window[2]", "3"},  // namesakes count whatever their class
        {"viewer/window[01]/width", "800"},
        {"viewer/window[3]", nullptr},
        {"viewer/window[2]/width", nullptr},  // a leaf has no children
        {"viewer/title", "\"t\""},
        {"viewer/title/x", nullptr},
        {"viewer", "{}"},
        {"nothere", nullptr},
        {"viewer/nothere/width", nullptr},
        {"", nullptr},
        {"/viewer", nullptr},
        {"viewer/", nullptr},
        {"viewer//window", nullptr},
        {"viewer/window[]", nullptr},
        {"viewer/window[x]", nullptr},
        {"viewer/window[-1]", nullptr},
        {"viewer/window[+1]", nullptr},
        {"viewer/window[1", nullptr},
        {"viewer/window[1]x", nullptr},
        {"viewer/window[1][0]", nullptr},
        {"viewer/window[99999999999]", nullptr},
        {"viewer/[0]", nullptr},
        {"a[0]", nullptr},  // brackets are always an index
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.path);
        DWXParseTreeNode* node = tree.Find(row.path);
        if (!row.found || !node) {
            EXPECT_EQ(node, nullptr);
            EXPECT_EQ(row.found, nullptr);
        } else {
            EXPECT_EQ(dynamic_cast<PTNSubTree*>(node) ? "{}" : Text(*node), row.found);
        }
    }
    EXPECT_EQ(tree.Find(nullptr), nullptr);
    ASSERT_NE(tree.FindAs<PTNInteger>("viewer/window[1]/width"), nullptr);
    EXPECT_EQ(tree.FindAs<PTNInteger>("viewer/window[1]/width")->GetValue(), 800);
    EXPECT_EQ(tree.FindAs<PTNString>("viewer/window/width"), nullptr);
    EXPECT_EQ(tree.FindAs<PTNSubTree>("viewer/window[1]"),
              tree.FindAs<PTNSubTree>("viewer")->Find("window[1]"));
}

TEST(RangeForTest, VisitsWhatDWXIterVisits) {
    Item a, b, c, d;
    DWXArray array;
    DWXPackedArray packed;
    DWXBag bag;
    DWXLinkedList list;
    DWXArray empty;
    for (DWXContainer* container : std::vector<DWXContainer*>{&array, &packed, &bag, &list}) {
        AddAll(*container, {&a, &b, &c, &d});
        container->Remove(&b);  // a hole in the array, a move in the others
    }
    bag.Add(nullptr);  // a stored null ends a walk
    bag.Add(&b);
    list.Prepend(&d);
    list.Insert(nullptr, list.Find(&c));
    for (const DWXContainer* container :
         std::vector<const DWXContainer*>{&array, &packed, &bag, &list, &empty}) {
        SCOPED_TRACE(container->GetClassName());
        Members visited;
        for (DWXObject* o : *container) {
            visited.push_back(o);
        }
        EXPECT_EQ(visited, Walk(*container));
        EXPECT_EQ(container->begin() == container->end(), visited.empty());
    }
    EXPECT_EQ(std::count(array.begin(), array.end(), &c), 1);

    PTNSubTree tree("root");
    tree.BuildFromString("(x Integer 1)\n(s SubTree\n(in Integer 2)\n)\n(y Integer 3)\n");
    std::string names;
    for (DWXParseTreeNode* child : tree) {
        names += child->GetName();
    }
    EXPECT_EQ(names, "xsy");
}

}  // namespace
