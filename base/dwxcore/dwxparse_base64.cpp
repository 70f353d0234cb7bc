// The Base64 codec (RFC 4648 standard alphabet) and the Base64 leaf.
#include <dwxcore/dwxparse.h>

#include <services/rtprim.h>

#include <stdlib.h>
#include <string.h>

namespace {

constexpr char kAlphabet[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
const unsigned char kInvalid = 0x80;  // marks every byte outside the alphabet, '=' included

// The value of every byte: its index in the alphabet, or kInvalid.
struct DecodeTable {
    unsigned char value[256];
    constexpr DecodeTable() : value() {
        for (int i = 0; i < 256; ++i) {
            value[i] = kInvalid;
        }
        for (int i = 0; i < 64; ++i) {
            value[static_cast<unsigned char>(kAlphabet[i])] = static_cast<unsigned char>(i);
        }
    }
};
constexpr DecodeTable kDecode;

}  // namespace

std::string base64_encode(const unsigned char* bytes, unsigned int length) {
    std::string text;
    if (bytes == nullptr || length == 0) {
        return text;
    }
    text.resize(4 * ((static_cast<size_t>(length) + 2) / 3));
    char* out = &text[0];
    const unsigned char* in = bytes;
    const unsigned char* const whole_end = bytes + length / 3 * 3;
    for (; in != whole_end; in += 3, out += 4) {
        const unsigned int group = (in[0] << 16) | (in[1] << 8) | in[2];
        out[0] = kAlphabet[group >> 18];
        out[1] = kAlphabet[(group >> 12) & 0x3F];
        out[2] = kAlphabet[(group >> 6) & 0x3F];
        out[3] = kAlphabet[group & 0x3F];
    }
    // A final one or two bytes, completed with zero bits and padded.
    const unsigned int rest = length % 3;
    if (rest != 0) {
        const unsigned int group = (in[0] << 16) | (rest == 2 ? in[1] << 8 : 0);
        out[0] = kAlphabet[group >> 18];
        out[1] = kAlphabet[(group >> 12) & 0x3F];
        out[2] = rest == 2 ? kAlphabet[(group >> 6) & 0x3F] : '=';
        out[3] = '=';
    }
    return text;
}

std::string base64_decode(const std::string& text) {
    const unsigned char* in = reinterpret_cast<const unsigned char*>(text.data());
    const size_t size = text.size();
    std::string bytes;
    bytes.resize(size / 4 * 3 + 2);  // room for every whole group and a final partial one
    unsigned char* const begin = reinterpret_cast<unsigned char*>(&bytes[0]);
    unsigned char* out = begin;

    // Whole groups of four valid characters; the first group holding a byte
    // outside the alphabet ends the loop.
    size_t pos = 0;
    for (; pos + 4 <= size; pos += 4, out += 3) {
        const unsigned int a = kDecode.value[in[pos]];
        const unsigned int b = kDecode.value[in[pos + 1]];
        const unsigned int c = kDecode.value[in[pos + 2]];
        const unsigned int d = kDecode.value[in[pos + 3]];
        if ((a | b | c | d) & kInvalid) {
            break;
        }
        const unsigned int group = (a << 18) | (b << 12) | (c << 6) | d;
        out[0] = static_cast<unsigned char>(group >> 16);
        out[1] = static_cast<unsigned char>(group >> 8);
        out[2] = static_cast<unsigned char>(group);
    }

    // The valid characters left before the end or the first invalid byte: [0, 3].
    unsigned int tail[3] = {0, 0, 0};
    size_t valid = 0;
    while (valid < 3 && pos + valid < size && !(kDecode.value[in[pos + valid]] & kInvalid)) {
        tail[valid] = kDecode.value[in[pos + valid]];
        ++valid;
    }
    // Two characters give one byte, three give two; one gives nothing.
    // Surplus bits of the last character are not tested.
    if (valid >= 2) {
        const unsigned int group = (tail[0] << 18) | (tail[1] << 12) | (tail[2] << 6);
        *out++ = static_cast<unsigned char>(group >> 16);
        if (valid == 3) {
            *out++ = static_cast<unsigned char>(group >> 8);
        }
    }
    bytes.resize(static_cast<size_t>(out - begin));
    return bytes;
}

// ---------------------------------------------------------------------------
// PTNBase64

PTNBase64::PTNBase64(const char* name, const unsigned char* data, unsigned int length)
    : DWXParseTreeNode(name), pcText(nullptr) {
    if (data != nullptr && length != 0) {
        pcText = Encode(data, length);
    }
}

PTNBase64::PTNBase64(const PTNBase64& other)
    : DWXParseTreeNode(other), pcText(HString(other.pcText)) {}

PTNBase64& PTNBase64::operator=(const PTNBase64& other) {
    if (this != &other) {
        DWXParseTreeNode::operator=(other);
        SetAsString(other.pcText);
    }
    return *this;
}

PTNBase64::~PTNBase64() {
    free(pcText);
}

char* PTNBase64::Encode(const unsigned char* data, unsigned int length) {
    return HString(base64_encode(data, length).c_str());
}

unsigned char* PTNBase64::Decode(const char* text, unsigned int* length) const {
    const char* source = text != nullptr ? text : pcText;
    const std::string bytes = base64_decode(source != nullptr ? source : "");
    // HMalloc(0) is a valid block, so 0 bytes still give something free() takes.
    unsigned char* buffer = static_cast<unsigned char*>(HMalloc(bytes.size()));
    if (!bytes.empty()) {
        memcpy(buffer, bytes.data(), bytes.size());
    }
    if (length != nullptr) {
        *length = static_cast<unsigned int>(bytes.size());
    }
    return buffer;
}

void PTNBase64::SetAsString(const char* text) {
    char* copy = HString(text);  // copied first: `text` may be our own buffer
    free(pcText);
    pcText = copy;
}

const char* PTNBase64::GetClassName() const {
    return "PTNBase64";
}

DWXParseTreeNode* PTNBase64::Copy() {
    unsigned int length = 0;
    unsigned char* bytes = Decode(nullptr, &length);
    DWXParseTreeNode* copy = new PTNBase64(GetName(), bytes, length);
    free(bytes);
    return copy;
}

char* PTNBase64::GetAsString() const {
    return HString(pcText != nullptr ? pcText : "");
}

void PTNBase64::SetFrom(DWXParseTreeNode* other) {
    auto* source = dynamic_cast<PTNBase64*>(other);
    if (source == nullptr) {
        return;
    }
    // Decoded before the old text goes, so taking from itself keeps the data.
    const std::string bytes = base64_decode(source->pcText != nullptr ? source->pcText : "");
    free(pcText);
    pcText = bytes.empty() ? nullptr
                           : Encode(reinterpret_cast<const unsigned char*>(bytes.data()),
                                    static_cast<unsigned int>(bytes.size()));
}
