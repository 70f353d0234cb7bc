// Base64 over streams in constant memory: input is taken in blocks of
// kBase64Block bytes, so at most a few blocks are held whatever the size.
#pragma once

#include <stddef.h>
#include <stdio.h>

#include <string>

namespace dwxtree {

enum class StreamResult { kOk, kBadInput, kReadFailed, kWriteFailed };

// A multiple of 3, so that each block encodes to whole groups.
constexpr size_t kBase64Block = size_t{3} * 64 * 1024;

// Writes the Base64 text of everything `in` holds to `out` as one line.
// On failure `error` holds the reason.
StreamResult EncodeBase64Stream(FILE* in, FILE* out, std::string& error);

// Decodes Base64 text from `in` to `out`. White space (blank, tab, line
// breaks, vertical tab, form feed) is skipped anywhere. Any other byte
// outside the alphabet, a third '=', data after '=', or a last group of a
// single character is refused (kBadInput, with the byte and its offset in
// `error`). Pad characters are optional. Of the bytes decoded before a
// refusal, those more than one block before it have been written already. The result equals
// decoding the whole text at once, wherever the blocks fall.
StreamResult DecodeBase64Stream(FILE* in, FILE* out, std::string& error);

}  // namespace dwxtree
