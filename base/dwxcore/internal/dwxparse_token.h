// The token syntax of string values in the parse tree text format, shared by
// the string leaves, the reader and the writer. Internal to the library.
#pragma once

#include <stddef.h>

#include <string>

namespace dwxcore::internal {

// The token for `value`: between double quotes, with '"', line feed and
// backslash written as \q, \n and \\. A null value gives \q\q without quotes.
// Caller frees with free().
char* QuoteToken(const char* value);

// The token of a null value.
constexpr char kNullValueToken[] = "\\q\\q";

// The token of `value`, which is not null, written at `out` with room for
// 2 * strlen(value) + 2 bytes; returns the end of what it wrote. O(length).
char* PutQuotedToken(char* out, const char* value);

// The value of `token`: unquoted quote marks dropped, escapes undone, then the
// '@' translation forms and ExpandMkTokenString applied. Null gives "".
std::string UnquoteToken(const char* token);

// The same value for the `length` bytes at `token`, in a heap buffer that the
// caller frees with free(); the reader hands it to its String leaf as it is.
char* UnquoteTokenToHeap(const char* token, size_t length);

// The value of `token` as UnquoteToken gives it, written with its terminator
// at `out` (room for the token's bytes and one more) without a string on the
// way; returns the terminator's position. Null for a value that an expansion
// may change, which UnquoteToken must read; `out` then holds nothing useful.
char* UnquoteTokenInto(const char* token, char* out);

// Rewrites MkTokenString(a,b,...) as a|b|..., dropping the items from the
// first NULL item on; a value without the keyword gets ExpandTranslationCall.
void ExpandMkTokenString(std::string& value);

// Replaces a value of the form _(message), white space around it allowed, by
// the translation of the message.
void ExpandTranslationCall(std::string& value);

}  // namespace dwxcore::internal
