// Quoting, unquoting and the value expansions of the token syntax.
#include "internal/dwxparse_token.h"

#include <services/rtprim.h>
#include <services/utilhub.h>

#include <stdlib.h>
#include <string.h>

namespace dwxcore::internal {
namespace {

const char kListKeyword[] = "MkTokenString";
const std::string::size_type kListKeywordLength = sizeof(kListKeyword) - 1;

// The '@' forms: "@@message" and "@context:message" become the translation of
// the message; anything else starting with '@' stays as it is.
void ExpandTranslationPrefix(std::string& value) {
    if (value.size() < 2 || value[0] != '@') {
        return;
    }
    // `_` may hand back its argument, so the message is copied out first.
    if (value[1] == '@') {
        const std::string message(value, 2);
        value = _(message.c_str());
        return;
    }
    const std::string::size_type mark = value.find_first_of(": @", 1);
    if (mark != std::string::npos && value[mark] == ':') {
        const std::string message(value, mark + 1);
        value = _(message.c_str());
    }
}

// Writes the value of `token` with unquoted quote marks dropped and escapes
// undone at `out` (room for the token's length) and returns its end; no
// terminator is written. Bytes are copied as they are scanned: tokens are
// mostly a few bytes long, too short for a call to memcpy to pay.
char* Unescape(const char* token, char* out) {
    const char* p = token;
    for (;;) {
        while (*p != '\0' && *p != '"' && *p != '\\') {
            *out++ = *p++;
        }
        if (*p == '\0') {
            return out;
        }
        if (*p++ == '"') {
            continue;
        }
        if (*p == '\0') {
            return out;  // a lone final backslash stands for nothing
        }
        *out++ = *p == 'q' ? '"' : *p == 'n' ? '\n' : *p;
        ++p;
    }
}

// Whether the expansions may change the value that runs from `value` to
// `end`. They never change a value whose first byte is visible ASCII other
// than '@' (the translation prefix), 'M' (MkTokenString as the first word)
// and '_' (a translation call): MkTokenString acts only as the first word, and
// a translation call only when '_' is the first non-white byte.
bool MayExpand(const char* value, const char* end) {
    if (value == end) {
        return false;
    }
    unsigned char first = static_cast<unsigned char>(value[0]);
    return first <= ' ' || first >= 0x7f || first == '@' || first == 'M' || first == '_';
}

// The expansions of an unescaped value, in their order.
void ExpandValue(std::string& value) {
    if (!MayExpand(value.data(), value.data() + value.size())) {
        return;
    }
    ExpandTranslationPrefix(value);
    ExpandMkTokenString(value);
}

}  // namespace

char* PutQuotedToken(char* out, const char* value) {
    *out++ = '"';
    for (const char* p = value; *p != '\0'; ++p) {
        switch (*p) {
            case '"':
                *out++ = '\\';
                *out++ = 'q';
                break;
            case '\n':
                *out++ = '\\';
                *out++ = 'n';
                break;
            case '\\':
                *out++ = '\\';
                *out++ = '\\';
                break;
            default:
                *out++ = *p;
        }
    }
    *out++ = '"';
    return out;
}

char* QuoteToken(const char* value) {
    if (value == nullptr) {
        return HString(kNullValueToken);
    }
    char* token = static_cast<char*>(HMalloc(2 * strlen(value) + 3));
    *PutQuotedToken(token, value) = '\0';
    return token;
}

std::string UnquoteToken(const char* token) {
    if (token == nullptr) {
        return std::string();
    }
    std::string value(strlen(token), '\0');
    value.resize(static_cast<size_t>(Unescape(token, &value[0]) - value.data()));
    ExpandValue(value);
    return value;
}

char* UnquoteTokenInto(const char* token, char* out) {
    char* end = Unescape(token, out);
    *end = '\0';
    return MayExpand(out, end) ? nullptr : end;
}

char* UnquoteTokenToHeap(const char* token, size_t length) {
    char* value = static_cast<char*>(HMalloc(length + 1));
    char* end = Unescape(token, value);
    *end = '\0';
    if (MayExpand(value, end)) {
        std::string expanded(value, end);
        free(value);
        ExpandValue(expanded);
        value = HString(expanded.c_str());
    }
    return value;
}

void ExpandMkTokenString(std::string& value) {
    const std::string::size_type first = FindFirstNonWhitespace(value, 0);
    if (first == std::string::npos) {
        return;  // blank: nothing to expand
    }
    const std::string::size_type keyword = value.find(kListKeyword, first);
    if (keyword == std::string::npos) {
        ExpandTranslationCall(value);
        return;
    }
    if (keyword != first) {
        return;  // the keyword must be the first word
    }
    const std::string::size_type last = FindLastNonWhitespace(value);
    const std::string::size_type open = FindFirstNonWhitespace(value, first + kListKeywordLength);
    if (open == std::string::npos || value[open] != '(' || value[last] != ')') {
        return;
    }
    const std::string arguments = value.substr(open + 1, last - open - 1);
    char** items = TokenizeDelim(arguments.c_str(), ",");
    value.clear();
    for (char** item = items; *item != nullptr; ++item) {
        std::string entry(*item);
        std::string trimmed(entry);
        if (TrimWhitespace(trimmed) == "NULL") {
            break;  // NULL ends the list
        }
        ExpandTranslationCall(entry);
        if (!value.empty()) {
            value += '|';
        }
        value += entry;
    }
    DestroyStringList(items);
}

void ExpandTranslationCall(std::string& value) {
    const std::string::size_type first = FindFirstNonWhitespace(value, 0);
    if (first == std::string::npos) {
        return;
    }
    const std::string::size_type last = FindLastNonWhitespace(value);
    if (value.size() <= first + 2 || value[first] != '_' || value[first + 1] != '(' ||
        value[last] != ')') {
        return;
    }
    // The message is not trimmed: white space inside the parentheses counts.
    const std::string message = value.substr(first + 2, last - first - 2);
    value = _(message.c_str());
}

}  // namespace dwxcore::internal
