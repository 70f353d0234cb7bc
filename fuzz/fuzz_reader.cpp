// The text reader on arbitrary bytes: no crash, leak or endless loop; every
// node read is held by its parent; and a tree read from any text is written,
// read back and written again to the same text. Trees holding string values
// that reading expands on purpose skip that last check.
//
// Includes resolve against an empty scratch directory (the working directory
// of the run) with the search paths unset; inputs that name an include by an
// absolute path or through the environment are skipped, so that no file of
// the machine is read.
#include <dwxcore/dwxparse.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include "fuzz_expand.h"
#include "fuzz_input.h"

#include <stdlib.h>
#include <string.h>
#include <unistd.h>

#include <memory>
#include <string>
#include <vector>

namespace {

char gScratch[] = "/tmp/dwxcore-fuzz-reader-XXXXXX";

// Checks the parent links, without recursion however deep the tree; true when
// a string value is one that reading expands on purpose.
bool Inspect(const PTNSubTree* tree) {
    bool expands = false;
    std::vector<const PTNSubTree*> pending{tree};
    while (!pending.empty()) {
        const PTNSubTree* subtree = pending.back();
        pending.pop_back();
        for (DWXParseTreeNode* node : *subtree) {
            FUZZ_CHECK(node->GetParentRef() == subtree);
            if (PTNKindOf(node) == PTNKind::kSubTree) {
                pending.push_back(static_cast<const PTNSubTree*>(node));
            } else if (auto* text = dynamic_cast<PTNString*>(node)) {
                expands |= text->GetValue() && ExpandsOnReading(text->GetValue());
            } else if (auto* list = dynamic_cast<PTNStringList*>(node)) {
                for (char** entry = list->GetValue(); entry && *entry; ++entry) {
                    expands |= ExpandsOnReading(*entry);
                }
            }
        }
    }
    return expands;
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    if (mkdtemp(gScratch) && chdir(gScratch) == 0) {
        atexit([] { rmdir(gScratch); });
    }
    unsetenv(DWX_ETC_PATH_VARIABLE);
    unsetenv(DWX_PRO_PATH_VARIABLE);
    IMPSetErrorHandler([](int, int, const char*) {});
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    if (strcasestr(text.c_str(), "include") && text.find_first_of("/$~\\") != std::string::npos) {
        return 0;  // an include by an absolute path or through the environment
    }
    PTNSubTree tree("root");
    try {
        tree.BuildFromString(text.c_str());
    } catch (const tzn::Exception&) {
        // A corrupt line outside every subtree; what was read stays.
    }
    const bool expands = Inspect(&tree);

    // A copy, merged with its source, comes and goes safely.
    std::unique_ptr<PTNSubTree>(tree.DeepCopy())->SetFrom(&tree, ExceptionList());

    if (!expands) {
        // The children read back into a new root, so that the new tree nests
        // exactly as deep; an exception (corrupt text) ends the run too.
        const std::string lines(HeapText(tree.GetAsString()).get());
        const size_t bodyStart = lines.find('\n') + 1;
        const size_t bodyEnd = lines.rfind('\n', lines.size() - 2) + 1;
        PTNSubTree reread("root");
        reread.BuildFromString(lines.substr(bodyStart, bodyEnd - bodyStart).c_str());
        HeapText rewritten(reread.GetAsString());
        FUZZ_CHECK(lines == rewritten.get());  // written, read and written again
    }
    return 0;
}
