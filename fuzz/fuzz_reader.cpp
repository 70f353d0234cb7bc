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

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

namespace {

char gScratch[] = "/tmp/dwxcore-fuzz-reader-XXXXXX";

void RemoveScratch() {
    rmdir(gScratch);
}

void Quiet(int, int, const char*) {}

bool NamesOutsideFile(const std::string& text) {
    std::string lower(text);
    std::transform(lower.begin(), lower.end(), lower.begin(), [](unsigned char c) {
        return static_cast<char>(c | (c >= 'A' && c <= 'Z' ? 0x20 : 0));
    });
    return lower.find("include") != std::string::npos &&
           lower.find_first_of("/$~\\") != std::string::npos;
}

// Checks the parent links; true when a string value is one that reading
// expands on purpose.
bool Inspect(const PTNSubTree* tree) {
    bool expands = false;
    std::vector<const PTNSubTree*> pending{tree};
    while (!pending.empty()) {
        const PTNSubTree* subtree = pending.back();
        pending.pop_back();
        DWXIter iter(subtree->GetChildren());
        for (DWXObject* object = iter.Current(); object; object = iter.Next()) {
            auto* node = dynamic_cast<DWXParseTreeNode*>(object);
            FUZZ_CHECK(node != nullptr && node->GetParentRef() == subtree);
            if (PTNKindOf(node) == PTNKind::kSubTree) {
                pending.push_back(static_cast<const PTNSubTree*>(node));
            } else if (PTNKindOf(node) == PTNKind::kString) {
                const char* value = static_cast<PTNString*>(node)->GetValue();
                expands |= value && ExpandsOnReading(value);
            } else if (PTNKindOf(node) == PTNKind::kStringList) {
                for (char** entry = static_cast<PTNStringList*>(node)->GetValue(); entry && *entry;
                     ++entry) {
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
        atexit(RemoveScratch);
    }
    unsetenv(DWX_ETC_PATH_VARIABLE);
    unsetenv(DWX_PRO_PATH_VARIABLE);
    IMPSetErrorHandler(Quiet);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    if (NamesOutsideFile(text)) {
        return 0;
    }
    PTNSubTree tree("root");
    try {
        tree.BuildFromString(text.c_str());
    } catch (const tzn::Exception&) {
        // A corrupt line outside every subtree; what was read stays.
    }
    const bool expands = Inspect(&tree);
    HeapText written(tree.GetAsString());
    FUZZ_CHECK(written != nullptr);

    // A read with a log throws nothing and builds the same tree.
    PTNSubTree logged("root");
    PTNReadLog log;
    logged.BuildFromString(text.c_str(), &log);
    FUZZ_CHECK(strcmp(written.get(), HeapText(logged.GetAsString()).get()) == 0);

    // A copy, merged with its source, comes and goes safely.
    std::unique_ptr<PTNSubTree> copy(tree.DeepCopy());
    copy->SetFrom(&tree, ExceptionList());

    if (!expands) {
        // The children read back into a new root, so that the new tree nests
        // exactly as deep; an exception (corrupt text) ends the run too.
        const std::string lines(written.get());
        const size_t bodyStart = lines.find('\n') + 1;
        const size_t bodyEnd = lines.rfind('\n', lines.size() - 2) + 1;
        PTNSubTree reread("root");
        reread.BuildFromString(lines.substr(bodyStart, bodyEnd - bodyStart).c_str());
        HeapText rewritten(reread.GetAsString());
        if (lines != rewritten.get()) {
            fprintf(stderr, "first:\n%s\nsecond:\n%s\n", written.get(), rewritten.get());
            FUZZ_CHECK(!"written, read and written again differs");
        }
    }
    return 0;
}
