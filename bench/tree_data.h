// The generated configuration tree that the tree benchmarks read, write and
// walk: a root subtree of `count` subtrees named "item", each holding the
// same eight leaves with values that vary by index. It is written twice, in
// our text format and in the peer's INFO format, with the same names and
// values, so both readers build the same tree.
#pragma once

#include <stdio.h>

#include <string>

namespace dwxbench {

// The subtrees of the standard tree: with their opening and closing lines,
// about a million lines.
constexpr int kTreeSubtrees = 100000;

// The leaf every walk reads, the seventh of eight.
constexpr const char* kWalkLeaf = "count";

// One subtree's leaves as (name, our keyword, value text); strings are
// written quoted in both formats.
struct Leaf {
    const char* name;
    const char* keyword;
    std::string value;
};

inline void ItemLeaves(int i, Leaf (&leaves)[8]) {
    char text[64];
    snprintf(text, sizeof text, "\"item %d\"", i);
    leaves[0] = {"id", "Integer", std::to_string(i)};
    leaves[1] = {"name", "String", text};
    leaves[2] = {"width", "Integer", std::to_string(100 + i % 900)};
    leaves[3] = {"height", "Integer", std::to_string(50 + i % 700)};
    snprintf(text, sizeof text, "%.2f", (i % 400) / 4.0);
    leaves[4] = {"scale", "Double", text};
    leaves[5] = {"visible", "Bool", i % 3 ? "TRUE" : "FALSE"};
    leaves[6] = {"count", "Integer", std::to_string(i % 1000)};
    leaves[7] = {"label", "String", i % 2 ? "\"north\"" : "\"south west\""};
}

// Our format, laid out as the writer lays it out.
inline bool WriteOursFile(const char* path, int count) {
    FILE* out = fopen(path, "w");
    if (!out) {
        return false;
    }
    Leaf leaves[8];
    fputs("(config SubTree\n", out);
    for (int i = 0; i < count; ++i) {
        ItemLeaves(i, leaves);
        fputs("  (item SubTree\n", out);
        for (const Leaf& leaf : leaves) {
            fprintf(out, "    (%s %s %s)\n", leaf.name, leaf.keyword, leaf.value.c_str());
        }
        fputs("  )\n", out);
    }
    fputs(")\n", out);
    return fclose(out) == 0;
}

// The same tree in the INFO format of the peer.
inline bool WriteInfoFile(const char* path, int count) {
    FILE* out = fopen(path, "w");
    if (!out) {
        return false;
    }
    Leaf leaves[8];
    fputs("config\n{\n", out);
    for (int i = 0; i < count; ++i) {
        ItemLeaves(i, leaves);
        fputs("    item\n    {\n", out);
        for (const Leaf& leaf : leaves) {
            fprintf(out, "        %s %s\n", leaf.name, leaf.value.c_str());
        }
        fputs("    }\n", out);
    }
    fputs("}\n", out);
    return fclose(out) == 0;
}

}  // namespace dwxbench
