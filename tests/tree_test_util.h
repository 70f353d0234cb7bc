// Helpers shared by the parse tree tests: a node's value as text, the shape
// of a tree in one line, and a file read the way hosts read one.
#pragma once

#include <dwxcore/dwxparse.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <stdio.h>
#include <stdlib.h>

#include <memory>
#include <string>

// The value of `node` as GetAsString gives it; "(null)" when it gives none.
inline std::string Text(const DWXParseTreeNode& node) {
    HeapText text(node.GetAsString());
    return text ? text.get() : "(null)";
}

// The names of the children, joined with blanks, subtrees as name{...}; with
// `values`, each leaf also as :Class=value.
inline std::string Shape(const PTNSubTree* tree, bool values = false) {
    std::string shape;
    DWXIter it(tree->GetChildren());
    for (DWXObject* object = it.Current(); object; object = it.Next()) {
        auto* node = static_cast<DWXParseTreeNode*>(object);
        shape += (shape.empty() ? "" : " ") + std::string(node->GetName());
        if (auto* sub = dynamic_cast<PTNSubTree*>(node)) {
            shape += "{" + Shape(sub, values) + "}";
        } else if (values) {
            shape += std::string(":") + node->GetClassName() + "=" + Text(*node);
        }
    }
    return shape;
}

// Reads a file opened the way hosts open it; closed also when the read throws.
inline void ReadFile(PTNSubTree& tree, const std::string& path) {
    std::unique_ptr<FILE, int (*)(FILE*)> stream(DKOpen(path.c_str(), 4, "r"), DKClose);
    ASSERT_NE(stream, nullptr);
    tree.BuildFromFile(stream.get());
}
