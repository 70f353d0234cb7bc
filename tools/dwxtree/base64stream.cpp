#include "base64stream.h"

#include "iofiles.h"

#include <dwxcore/dwxparse.h>

#include <errno.h>

#include <vector>

namespace dwxtree {

namespace {

enum ByteClass : unsigned char { kAlphabet, kSpace, kPad, kOther };

// The class of every byte value, built once.
struct ByteClasses {
    ByteClass of[256];
    ByteClasses() {
        for (int c = 0; c < 256; ++c) {
            bool alphabet = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') ||
                            (c >= '0' && c <= '9') || c == '+' || c == '/';
            bool space = c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\v' || c == '\f';
            of[c] = alphabet ? kAlphabet : space ? kSpace : c == '=' ? kPad : kOther;
        }
    }
};
const ByteClasses kClasses;

bool Write(const std::string& bytes, FILE* out, std::string& error) {
    if (!bytes.empty() && fwrite(bytes.data(), 1, bytes.size(), out) != bytes.size()) {
        error = ErrorText(errno);
        return false;
    }
    return true;
}

bool ReadFailed(FILE* in, std::string& error) {
    if (ferror(in)) {
        error = ErrorText(errno);
        return true;
    }
    return false;
}

StreamResult Refuse(unsigned char c, size_t offset, std::string& error) {
    char text[80];
    snprintf(text, sizeof text, "not Base64: byte 0x%02x at offset %zu", c, offset);
    error = text;
    return StreamResult::kBadInput;
}

}  // namespace

StreamResult EncodeBase64Stream(FILE* in, FILE* out, std::string& error) {
    std::vector<unsigned char> block(kBase64Block);
    size_t got;
    while ((got = fread(block.data(), 1, block.size(), in)) > 0) {
        if (!Write(base64_encode(block.data(), static_cast<unsigned int>(got)), out, error)) {
            return StreamResult::kWriteFailed;
        }
    }
    if (ReadFailed(in, error)) {
        return StreamResult::kReadFailed;
    }
    return Write("\n", out, error) ? StreamResult::kOk : StreamResult::kWriteFailed;
}

StreamResult DecodeBase64Stream(FILE* in, FILE* out, std::string& error) {
    std::vector<unsigned char> block(kBase64Block);
    // Characters of the alphabet (then at most two '=') not yet decoded:
    // fewer than four between blocks, since whole groups go out at once.
    std::string pending;
    // The bytes of the last block, written once the next block (or the
    // end) shows no fault, so input of one block is refused whole.
    std::string held;
    size_t characters = 0;  // alphabet characters so far
    int pads = 0;
    size_t offset = 0;  // of block[0] in the input
    size_t got;
    while ((got = fread(block.data(), 1, block.size(), in)) > 0) {
        const unsigned char* bytes = block.data();
        for (size_t i = 0; i < got;) {
            // Runs of alphabet characters, the bulk of any input, are
            // copied whole.
            size_t run = i;
            while (run < got && kClasses.of[bytes[run]] == kAlphabet) {
                ++run;
            }
            if (run > i) {
                if (pads > 0) {
                    return Refuse(bytes[i], offset + i, error);
                }
                pending.append(reinterpret_cast<const char*>(bytes + i), run - i);
                characters += run - i;
                i = run;
                continue;
            }
            unsigned char c = bytes[i];
            ByteClass kind = kClasses.of[c];
            if (kind == kPad && pads < 2) {
                ++pads;
                pending.push_back('=');
            } else if (kind != kSpace) {
                return Refuse(c, offset + i, error);
            }
            ++i;
        }
        offset += got;
        if (!Write(held, out, error)) {
            return StreamResult::kWriteFailed;
        }
        // Whole groups decode alone; the library's decoder stops at '=',
        // which only a last group holds.
        size_t whole = pending.size() - pending.size() % 4;
        held = base64_decode(pending.substr(0, whole));
        pending.erase(0, whole);
    }
    if (ReadFailed(in, error)) {
        return StreamResult::kReadFailed;
    }
    // A lone character in the final group carries no whole byte.
    if (characters % 4 == 1) {
        error = "not Base64: the last group has a single character";
        return StreamResult::kBadInput;
    }
    bool written = Write(held, out, error) && Write(base64_decode(pending), out, error);
    return written ? StreamResult::kOk : StreamResult::kWriteFailed;
}

}  // namespace dwxtree
