// The reference of the text format: a tree written, its children read back
// into a new root of the same name (so that the new tree nests exactly as
// deep), and written again, gives the same text. Shared by the writer test
// and the reader fuzz target.
#pragma once

#include <dwxcore/dwxparse.h>
#include <services/rtprim.h>

#include <string>

// The text of `tree` after that read; throws when the reader finds it corrupt.
inline std::string Rewritten(const PTNSubTree& tree) {
    HeapText text(tree.GetAsString());
    const std::string lines(text.get());
    const size_t bodyStart = lines.find('\n') + 1;
    const size_t bodyEnd = lines.rfind('\n', lines.size() - 2) + 1;
    PTNSubTree reread(tree.GetName());
    reread.BuildFromString(lines.substr(bodyStart, bodyEnd - bodyStart).c_str());
    HeapText again(reread.GetAsString());
    return again.get();
}
