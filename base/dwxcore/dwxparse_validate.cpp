// A quick test that a stream holds a parse tree of a given name.
#include <dwxcore/dwxparse.h>

#include <services/portability.h>
#include <services/utilhub.h>

#include <stdio.h>
#include <string.h>

int PTNSubTree::PTNValidateFile(FILE* stream, const char* name) {
    if (!stream || !name) {
        return 0;
    }
    rewind(stream);
    const char* line = nullptr;
    bool first = true;
    while (const char* read = DKReadLine(stream)) {
        // A UTF-8 byte order mark is no part of the first line, as for the reader.
        if (first && strncmp(read, "\xEF\xBB\xBF", 3) == 0) {
            read += 3;
        }
        first = false;
        if (!IsCommentOrEmptyLine(read)) {
            line = read;
            break;
        }
    }
    // The caller may go on reading the stream (BuildFromFile, for one), so
    // it is left at its start whatever the answer.
    rewind(stream);
    if (!line) {
        return 0;
    }

    const char* p = LSCGetFirstNonWhiteSpace(line);
    if (*p != '(') {
        return 0;
    }
    p = LSCGetFirstNonWhiteSpace(p + 1);
    size_t length = strlen(name);
    if (_strnicmp(p, name, length) != 0) {
        return 0;
    }
    // White space must end the name, so that a longer name that merely
    // begins with the given one does not pass.
    const char* after = p + length;
    const char* keyword = LSCGetFirstNonWhiteSpace(after);
    if (keyword == after) {
        return 0;
    }
    return _strnicmp(keyword, "SubTree", 7) == 0 ? 1 : 0;
}
