// Writes the benchmark tree in both formats:
//   dwxbench_gen OURS_FILE INFO_FILE [SUBTREES]
#include "tree_data.h"

#include <stdlib.h>

int main(int argc, char** argv) {
    if (argc < 3 || argc > 4) {
        fprintf(stderr, "usage: %s OURS_FILE INFO_FILE [SUBTREES]\n", argv[0]);
        return 2;
    }
    int count = argc == 4 ? atoi(argv[3]) : dwxbench::kTreeSubtrees;
    if (!dwxbench::WriteOursFile(argv[1], count) || !dwxbench::WriteInfoFile(argv[2], count)) {
        fprintf(stderr, "%s: cannot write the tree files\n", argv[0]);
        return 1;
    }
    return 0;
}
