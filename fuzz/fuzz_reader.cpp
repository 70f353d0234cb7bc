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

struct Findings {
    bool expands = false;    // a string value that reading expands
    bool rawBase64 = false;  // Base64 text that a copy writes differently
};

// Checks the parent links and notes the values whose text is not kept by
// reading or by copying.
Findings Inspect(const PTNSubTree* tree) {
    Findings found;
    bool& expands = found.expands;
    std::vector<const PTNSubTree*> pending{tree};
    while (!pending.empty()) {
        const PTNSubTree* subtree = pending.back();
        pending.pop_back();
        DWXIter iter(subtree->GetChildren());
        for (DWXObject* object = iter.Current(); object; object = iter.Next()) {
            auto* node = dynamic_cast<DWXParseTreeNode*>(object);
            FUZZ_CHECK(node != nullptr);
            FUZZ_CHECK(node->GetParentRef() == subtree);
            switch (PTNKindOf(node)) {
                case PTNKind::kSubTree:
                    pending.push_back(static_cast<const PTNSubTree*>(node));
                    break;
                case PTNKind::kString: {
                    const char* value = static_cast<PTNString*>(node)->GetValue();
                    expands |= value && ExpandsOnReading(value);
                    break;
                }
                case PTNKind::kStringList:
                    for (char** entry = static_cast<PTNStringList*>(node)->GetValue();
                         entry && *entry; ++entry) {
                        expands |= ExpandsOnReading(*entry);
                    }
                    break;
                case PTNKind::kBase64: {
                    // Copies decode and encode afresh.
                    auto* data = static_cast<PTNBase64*>(node);
                    HeapText text(data->GetAsString());
                    unsigned length = 0;
                    HeapPtr<unsigned char> bytes(data->Decode(nullptr, &length));
                    found.rawBase64 |= base64_encode(bytes.get(), length) != text.get();
                    break;
                }
                default:
                    break;
            }
        }
    }
    return found;
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
    const Findings found = Inspect(&tree);

    char* written = tree.GetAsString();
    FUZZ_CHECK(written != nullptr);

    // A read with a log throws nothing and builds the same tree.
    PTNSubTree logged("root");
    PTNReadLog log;
    logged.BuildFromString(text.c_str(), &log);
    char* loggedText = logged.GetAsString();
    FUZZ_CHECK(strcmp(written, loggedText) == 0);
    free(loggedText);

    PTNSubTree* copy = tree.DeepCopy();
    char* copied = copy->GetAsString();
    FUZZ_CHECK(found.rawBase64 || strcmp(written, copied) == 0);
    free(copied);
    copy->SetFrom(&tree, ExceptionList());
    delete copy;

    if (!found.expands) {
        // The lines between the opening and the closing line of the root are
        // its children: read them into a new root, so that the new tree nests
        // exactly as deep as the first one.
        const std::string lines(written);
        const size_t bodyStart = lines.find('\n') + 1;
        const size_t bodyEnd = lines.rfind('\n', lines.size() - 2) + 1;
        FUZZ_CHECK(lines.compare(0, bodyStart, "(root SubTree\n") == 0);
        FUZZ_CHECK(lines.compare(bodyEnd, std::string::npos, ")\n") == 0);
        PTNSubTree reread("root");
        try {
            reread.BuildFromString(lines.substr(bodyStart, bodyEnd - bodyStart).c_str());
        } catch (const tzn::Exception&) {
            FUZZ_CHECK(!"written text read back as corrupt");
        }
        char* rewritten = reread.GetAsString();
        if (strcmp(written, rewritten) != 0) {
            fprintf(stderr, "first:\n%s\nsecond:\n%s\n", written, rewritten);
            FUZZ_CHECK(!"written, read and written again differs");
        }
        free(rewritten);
    }
    free(written);
    return 0;
}
