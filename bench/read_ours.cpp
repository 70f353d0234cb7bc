// Reads a tree file with BuildFromFile, as a host does, and deletes it.
#include "driver_common.h"

#include <dwxcore/dwxparse.h>
#include <services/utilhub.h>

#include <memory>

namespace {

long CountNodes(const PTNSubTree& tree) {
    long count = 0;
    DWXIter iter(tree.GetChildren());
    for (DWXObject* object = iter.Current(); object; object = iter.Next()) {
        ++count;
        if (auto* subtree = dynamic_cast<const PTNSubTree*>(object)) {
            count += CountNodes(*subtree);
        }
    }
    return count;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2) {
        fprintf(stderr, "usage: %s FILE\n", argv[0]);
        return 2;
    }
    auto root = std::make_unique<PTNSubTree>("root");
    return dwxbench::RunDriver(
        "ours", argv[1],
        [&root](const char* path) -> long {
            FILE* stream = DKOpen(path, 4, "r");
            if (!stream) {
                return -1;
            }
            root->BuildFromFile(stream);
            DKClose(stream);
            return 1;
        },
        // A check that the whole tree was read.
        [&root] { fprintf(stderr, "ours: %ld nodes\n", CountNodes(*root)); },
        [&root] { root.reset(); });
}
